// The curves of soft light as tables: how far a destination moves toward light (high) or dark (low).
//
// With x a fraction of white: low(x) = x (1 - x); high(x) = g(x) - x, g(x) = ((16x - 12)x + 4)x up to a
// quarter and the square root above. The 8-bit tables are constants; the others are built at birth, are
// read only afterwards, and are zero before.
#pragma once

#include <ZR/zr.h>

#include <array>

namespace zr {

// All tables have the curve of dark sources (low) in front of that of light ones (high), which begins `reach` later:
// one look-up serves a row of both. Entry k of a curve at 16 bits and of floats stands for x = k / 4096; entry 4096
// is 0. The float curves have one slot more, also 0, which what lies above 1 reads. At 16 bits the upper half of an
// entry is the curve, the lower half how far it goes to the next one.
inline constexpr i32 soft_light_reach = 4098, soft_light_reach_8 = 256;
extern i32 soft_light_16[2 * soft_light_reach];
extern f32 soft_light_float[2 * soft_light_reach];

void build_soft_light_tables();

namespace soft_light_detail {

// round(255 * low(i / 255)) and round(255 * high(i / 255)) in integers: no value lies on a tie.
constexpr u32 low_8(u32 i) { return (2 * i * (255 - i) + 255) / (2 * 255); }
constexpr u32 high_8(u32 i) {
  if (4 * i <= 255) {
    const u32 cubic = 16 * i * i * i + 3 * 255 * 255 * i - 12 * 255 * i * i;  // times 255 * 255
    return (2 * cubic + 255 * 255) / (2 * 255 * 255);
  }
  u32 root = i;  // the square root of 255 * i, rounded, lies at or above i
  while (root * root + root < 255 * i) ++root;
  return root - i;
}

}  // namespace soft_light_detail

inline constexpr auto soft_light_8 = [] {
  std::array<i32, 2 * soft_light_reach_8> table{};
  for (u32 i = 0; i < soft_light_reach_8; ++i) {
    table[i] = static_cast<i32>(soft_light_detail::low_8(i));
    table[i + soft_light_reach_8] = static_cast<i32>(soft_light_detail::high_8(i));
  }
  return table;
}();
static_assert(soft_light_8[1] == 1 && soft_light_8[256 + 1] == 3);
static_assert(soft_light_8[255] == 0 && soft_light_8[256 + 255] == 0);

}  // namespace zr
