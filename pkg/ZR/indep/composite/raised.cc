// Float colours by exponent, one at a time.
#include "composite/raised.h"

#include <cmath>

#include "simd/power-inl.h"

namespace zr {

f32 raised(f32 c, f32 exponent) {
  if (has_power(exponent)) return signed_power(c, PowerExponent(exponent));
  return c < 0.0f ? -std::pow(-c, exponent) : std::pow(c, exponent);
}

}  // namespace zr
