// Remainder and rounding.
#include <GX/gx.h>

#include <cmath>
#include <limits>

f64 GX_fmod(f64 x, f64 y) { return std::fmod(x, y); }

i32 GX_RoundDouble(f64 value) {
  const f64 rounded = std::round(value);
  const bool fits = rounded >= -2147483648.0 && rounded <= 2147483647.0;  // false for NaN
  return fits ? static_cast<i32>(rounded) : std::numeric_limits<i32>::min();
}
