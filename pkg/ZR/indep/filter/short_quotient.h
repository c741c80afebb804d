// Division of floats by a whole number as a product.
#pragma once

#include <ZR/types.h>

#include <cmath>

namespace zr {

// x / divisor, rounded as a division rounds it, is fma(x, upper, x * lower): both together are 1 / divisor to 47 bits.
// No quotient of 24 bits lies closer to the middle between two neighbours than 1 / (2 * divisor) of their distance,
// which is more than what is lost, where the divisor's odd part stays below 2^20. Products have to stay clear of
// overflow and of denormals.
struct ShortQuotient {
  f32 upper, lower;

  static bool serves(f32 divisor) {
    if (!(divisor >= 0x1p-20f && divisor <= 0x1p40f)) return false;
    int exponent = 0;
    const f32 bits = std::frexp(divisor, &exponent) * 0x1p20f;  // the first 20 of them in front of the point
    return bits == std::floor(bits);
  }
  static ShortQuotient of(f32 divisor) {
    const f64 reciprocal = 1 / static_cast<f64>(divisor);
    const f32 upper = static_cast<f32>(reciprocal);
    return {upper, static_cast<f32>(reciprocal - static_cast<f64>(upper))};
  }
};

}  // namespace zr
