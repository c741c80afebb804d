// Where the measured layers are placed; ours and the peers' take the same matrices.
#pragma once

#include <ZR/types.h>

#include <cmath>

namespace bench {

// Source to destination: turned and scaled around the middles of two pictures of one size, then moved.
inline GX_Matrix3 placement(f64 degrees, f64 scale, i32 width, i32 height, f64 dx = 0, f64 dy = 0) {
  const f64 angle = degrees * 3.14159265358979323846 / 180, c = scale * std::cos(angle), s = scale * std::sin(angle);
  const f64 x = width / 2.0, y = height / 2.0;
  return {{{c, -s, x - c * x + s * y + dx}, {s, c, y - s * x - c * y + dy}, {0, 0, 1}}};
}

inline constexpr f64 turned_degrees = 30, enlarged = 1.3, reduced = 0.37;

}  // namespace bench
