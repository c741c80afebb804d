// The noise of the dithered screen of masks.
#include "mask/mask_noise_state.h"

#include <atomic>

namespace zr {
namespace {

// Multiplication modulo 2^31 - 1: unlike modulo a power of two, its low bits do not repeat within a picture, where
// they would show as columns. Eight numbers step together.
constexpr u32 modulus = 0x7fffffff;
constexpr i32 together = 8;

constexpr u32 product(u32 a, u32 b) {
  const u64 full = u64{a} * b;
  const u32 sum = static_cast<u32>(full & modulus) + static_cast<u32>(full >> 31);
  return sum >= modulus ? sum - modulus : sum;
}

struct Steps {
  u32 factor[together];  // one step, two steps, ...
  constexpr Steps() : factor{} {
    factor[0] = 48271;
    for (i32 i = 1; i < together; ++i) factor[i] = product(factor[i - 1], factor[0]);
  }
};
constexpr Steps steps;

constinit std::atomic<u32> ZR_MaskNoiseState = 1;  // relaxed: a torn state would be the one race that matters

}  // namespace

MaskNoise::MaskNoise() : state_(ZR_MaskNoiseState.load(std::memory_order_relaxed)) {}
MaskNoise::~MaskNoise() { ZR_MaskNoiseState.store(state_, std::memory_order_relaxed); }

void MaskNoise::draw(i32 count, u16 bits, u16* noise) {
  for (i32 i = 0; i < count; i += together) {
    u32 next[together];
    for (i32 k = 0; k < together; ++k) next[k] = product(state_, steps.factor[k]);
    const i32 left = count - i < together ? count - i : together;
    for (i32 k = 0; k < left; ++k) noise[i + k] = static_cast<u16>(next[k] & bits);
    state_ = next[left - 1];
  }
}

}  // namespace zr
