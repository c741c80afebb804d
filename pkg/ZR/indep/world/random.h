// The generator behind ZR_Rand, for rows that draw many numbers.
#pragma once

#include <ZR/zr.h>

namespace zr {

// Not the textbook generator: the high part is added. What plug-ins render from a seed depends on it.
inline constexpr u32 seed_step = 44488, seed_factor = 48271, seed_high_factor = 3399;
// A seed is followed by seed_factor times itself modulo this, or by as much more.
inline constexpr u32 seed_modulus = seed_step * seed_factor - seed_high_factor;

// Seeds follow each other as fast as this is: one quotient, with both products beside it.
constexpr u32 next_seed(u32 seed) {
  const u32 next = seed * seed_factor - seed / seed_step * seed_modulus;
  if (next == 0) [[unlikely]]
    return 0x7fffffffu;
  return next;
}
// What a seed stands for, 0 to 32767.
constexpr i32 random_number(u32 seed) { return static_cast<i32>((seed >> 7) & 0x7fffu); }

}  // namespace zr
