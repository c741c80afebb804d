// The curves of soft light as tables: how far a destination moves toward light (high) or dark (low).
//
// With x a fraction of white: low(x) = x (1 - x); high(x) = g(x) - x, g(x) = ((16x - 12)x + 4)x up to a
// quarter and the square root above. The 8-bit tables are constants; the others are built at birth, are
// read only afterwards, and are zero before.
#pragma once

#include <ZR/zr.h>

#include <array>

namespace zr {

// Entry k of the 16-bit and float tables stands for x = k / 4096; entry 4096 is 0. The float tables have
// one slot more, also 0, which what lies above 1 reads; so have the 16-bit ones, which is read and not used.
extern i32 soft_light_low_16[4098], soft_light_high_16[4098];
extern f32 soft_light_low_float[4098], soft_light_high_float[4098];

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
template <class Rule>
constexpr std::array<i32, 256> table_8(Rule rule) {
  std::array<i32, 256> table{};
  for (u32 i = 0; i < 256; ++i) table[i] = static_cast<i32>(rule(i));
  return table;
}

}  // namespace soft_light_detail

inline constexpr std::array<i32, 256> soft_light_low_8 = soft_light_detail::table_8(soft_light_detail::low_8);
inline constexpr std::array<i32, 256> soft_light_high_8 = soft_light_detail::table_8(soft_light_detail::high_8);
static_assert(soft_light_low_8[1] == 1 && soft_light_high_8[1] == 3);
static_assert(soft_light_low_8[255] == 0 && soft_light_high_8[255] == 0);

}  // namespace zr
