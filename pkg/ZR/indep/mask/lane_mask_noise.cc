// The noise of the dithered screen of masks on lanes: the same numbers, two vectors at a time.
#include "mask/mask_noise.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "mask/lane_mask_noise.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

using NoiseTag = Tag<u32>;
using Numbers = hn::Vec<NoiseTag>;

HWY_INLINE Numbers products(Numbers a, Numbers b) {
  const NoiseTag d;
  const Tag<u64> wide;
  const auto folded = [&](auto full) HWY_ATTR {
    return hn::BitCast(d, hn::Add(hn::And(full, hn::Set(wide, noise_modulus)), hn::ShiftRight<31>(full)));
  };
  const auto upper = [&](Numbers v) HWY_ATTR { return hn::BitCast(d, hn::ShiftRight<32>(hn::BitCast(wide, v))); };
  const Numbers even = folded(hn::MulEven(a, b)), odd = folded(hn::MulEven(upper(a), upper(b)));
  const Numbers sum = hn::OddEven(hn::BitCast(d, hn::ShiftLeft<32>(hn::BitCast(wide, odd))), even);
  return hn::Min(sum, hn::Sub(sum, hn::Set(d, noise_modulus)));  // what is below the modulus wraps
}

u32 draw_noise(u32 state, i32 count, u16 bits, u16* noise) {
  constexpr i32 lanes = lane_count(), together = 2 * lanes;
  static constexpr NoiseSteps<together> steps;
  const NoiseTag d;
  const hn::Rebind<u16, NoiseTag> narrow;
  if (count <= 0) return state;
  const auto at = [&](const u32* factors) HWY_ATTR { return products(hn::Set(d, state), hn::LoadU(d, factors)); };
  Numbers first = at(steps.factor), second = at(steps.factor + lanes);
  const Numbers leap = hn::Set(d, steps.factor[together - 1]);
  const auto put = [&](Numbers v, u16* to) HWY_ATTR {
    hn::StoreU(hn::DemoteTo(narrow, hn::BitCast(Tag<i32>(), hn::And(v, hn::Set(d, bits)))), narrow, to);
  };
  i32 i = 0;
  for (; count - i > together; i += together) {
    put(first, noise + i), put(second, noise + i + lanes);
    first = products(first, leap), second = products(second, leap);
  }
  u32 last[together];
  hn::StoreU(first, d, last), hn::StoreU(second, d, last + lanes);
  for (i32 k = 0; k < count - i; ++k) noise[i + k] = static_cast<u16>(last[k] & bits);
  return last[count - i - 1];
}

NoiseFunc* noise() { return &draw_noise; }

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_CHOICE(NoiseFunc*, noise)
#endif
