// The generator behind ZR_Rand, for rows that draw many numbers.
#pragma once

#include <ZR/zr.h>

namespace zr {

// Not the textbook generator: the high part is added, and the sum wraps at 32 bits. What plug-ins render from a seed
// depends on it. Seeds follow each other as fast as this is: one quotient, with both products beside it.
constexpr u32 next_seed(u32 seed) {
  constexpr u32 step = 44488, factor = 48271, high_factor = 3399;
  const u32 next = seed * factor - seed / step * (step * factor - high_factor);
  if (next == 0) [[unlikely]]
    return 0x7fffffffu;
  return next;
}
// What a seed stands for, 0 to 32767.
constexpr i32 random_number(u32 seed) { return static_cast<i32>((seed >> 7) & 0x7fffu); }

}  // namespace zr
