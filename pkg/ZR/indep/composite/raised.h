// Float colours by exponent, for linear light.
#pragma once

#include <ZR/zr.h>

namespace zr {

// |c| to the exponent with the sign of c, by the formula of <simd/power-inl.h> for finite exponents above 0, else
// by the C library. Rows of lanes use the same formula.
f32 raised(f32 c, f32 exponent);
// Whether the formula is good for an exponent.
inline bool has_power(f32 exponent) { return exponent > 0.0f && exponent < __builtin_inff(); }

}  // namespace zr
