// The C library's functions as plug-ins receive them, in a fixed order.
#pragma once

namespace zr {

inline constexpr int ansi_function_count = 19;
// atan, atan2, ceil, cos, exp, fabs, floor, fmod, hypot, log, log10, pow, sin, sqrt, tan, sprintf,
// strcpy, asin, acos.
void fill_ansi_functions(void* out[ansi_function_count]);

}  // namespace zr
