// The generator behind the dithered screen of masks.
#pragma once

#include <ZR/zr.h>

namespace zr {

// Multiplication modulo 2^31 - 1: unlike modulo a power of two, its low bits do not repeat within a picture, where
// they would show as columns. A power of the factor leaps over as many numbers, so that several are drawn together.
inline constexpr u32 noise_modulus = 0x7fffffff, noise_factor = 48271;

constexpr u32 noise_product(u32 a, u32 b) {
  const u64 full = u64{a} * b;
  const u32 sum = static_cast<u32>(full & noise_modulus) + static_cast<u32>(full >> 31);
  return sum >= noise_modulus ? sum - noise_modulus : sum;
}

// Of 1 to `count` steps.
template <i32 count>
struct NoiseSteps {
  u32 factor[count];
  constexpr NoiseSteps() : factor{noise_factor} {
    for (i32 i = 1; i < count; ++i) factor[i] = noise_product(factor[i - 1], noise_factor);
  }
};

// The low `bits` (a mask) of the `count` numbers behind `state`. Returns the last number, or `state` if there is none.
using NoiseFunc = u32(u32 state, i32 count, u16 bits, u16* noise);
// On lanes, or null.
NoiseFunc* lane_noise();

}  // namespace zr
