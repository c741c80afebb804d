// The noise of the dithered screen of masks.
#include "mask/mask_noise_state.h"

#include <atomic>

#include "mask/mask_noise.h"

namespace zr {
namespace {

constinit std::atomic<u32> ZR_MaskNoiseState = 1;  // relaxed: a torn state would be the one race that matters

u32 single_noise(u32 state, i32 count, u16 bits, u16* noise) {
  constexpr i32 together = 8;
  static constexpr NoiseSteps<together> steps;
  for (i32 i = 0; i < count; i += together) {
    u32 next[together];
    for (i32 k = 0; k < together; ++k) next[k] = noise_product(state, steps.factor[k]);
    const i32 left = count - i < together ? count - i : together;
    for (i32 k = 0; k < left; ++k) noise[i + k] = static_cast<u16>(next[k] & bits);
    state = next[left - 1];
  }
  return state;
}

}  // namespace

MaskNoise::MaskNoise() : state_(ZR_MaskNoiseState.load(std::memory_order_relaxed)) {}
MaskNoise::~MaskNoise() { ZR_MaskNoiseState.store(state_, std::memory_order_relaxed); }

void MaskNoise::draw(i32 count, u16 bits, u16* noise) {
  NoiseFunc* const lanes = lane_noise();
  state_ = (lanes != nullptr ? lanes : &single_noise)(state_, count, bits, noise);
}

}  // namespace zr
