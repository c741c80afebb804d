// Radii that the filters take.
#pragma once

#include <ZR/types.h>

namespace zr {

inline constexpr f64 bell_radius_limit = 32767;    // the reach is a 16-bit number
inline constexpr f64 bell_radius_limit_8 = 32000;  // sums of 8-bit channels stay within 32 bits
inline constexpr f64 box_radius_limit = 1048575;   // single precision counts pixels exactly, weights fit 32 bits

}  // namespace zr
