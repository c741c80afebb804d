// What filters do with lanes: channels as they lie in memory, one lane each, and exact quotients of whole numbers.
// Filters work on whole groups of eight pixels, which vectors of every channel fill.
#if defined(ZR_FILTER_LANE_PIXELS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_FILTER_LANE_PIXELS_INL_H
#undef ZR_FILTER_LANE_PIXELS_INL_H
#else
#define ZR_FILTER_LANE_PIXELS_INL_H
#endif

#include "filter/exact_reciprocal.h"
#include "simd/lanes-inl.h"

#if ZR_HAS_LANES
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// As many channels as there are lanes, from channel c of the pixels on.
template <class Number, class T>
HWY_INLINE Lane<Number> channels_at(const T* pixels, i32 c) {
  using C = Channel<T>;
  const C* const p = reinterpret_cast<const C*>(pixels) + c;
  if constexpr (std::is_same_v<C, f32>) {
    return hn::LoadU(Tag<f32>(), p);
  } else {
    const Ints wide = hn::PromoteTo(Tag<i32>(), hn::LoadU(hn::Rebind<C, Tag<i32>>(), p));
    if constexpr (std::is_same_v<Number, f32>)
      return to_float(wide);
    else
      return wide;
  }
}

// Numbers into the channels of a depth. Bytes are 0..255; 16-bit ones are taken modulo 65536.
HWY_INLINE void store_channels(Ints v, ZR_Pixel8* pixels, i32 c) {
  const hn::Rebind<u8, Tag<i32>> d;
  hn::StoreU(hn::DemoteTo(d, v.v), d, reinterpret_cast<u8*>(pixels) + c);
}
HWY_INLINE void store_channels(Floats v, ZR_Pixel16* pixels, i32 c) {
  const hn::Rebind<u16, Tag<i32>> d;
  hn::StoreU(hn::DemoteTo(d, masked(to_int(v), 65535).v), d, reinterpret_cast<u16*>(pixels) + c);
}
HWY_INLINE void store_channels(Floats v, ZR_PixelFloat* pixels, i32 c) {
  hn::StoreU(v.v, Tag<f32>(), reinterpret_cast<f32*>(pixels) + c);
}

// The lanes that are a pixel's first channel.
template <class Number>
HWY_INLINE Bools<Number> alpha_lanes() {
  const Bools<i32> first = masked(hn::Iota(Tag<i32>(), 0), 3) == 0;
  return {hn::RebindMask(Tag<Number>(), first.mask)};
}

// Each lane as two 16-bit numbers: the sum of both products.
HWY_INLINE Ints pair_products(Ints a, Ints b) {
  const hn::Repartition<i16, Tag<i32>> d16;
  auto others = hn::Zero(Tag<i32>());
  const auto sums = hn::ReorderWidenMulAccumulate(Tag<i32>(), hn::BitCast(d16, a.v), hn::BitCast(d16, b.v),
                                                  hn::Zero(Tag<i32>()), others);
  return hn::RearrangeToOddPlusEven(sums, others);
}

// n / divisor for 0 <= n < 2^31.
struct ExactDivision {
  hn::Vec<hn::Repartition<u32, Tag<i32>>> factor;
  int shift;

  HWY_INLINE explicit ExactDivision(ExactReciprocal by)
      : factor(hn::Set(hn::Repartition<u32, Tag<i32>>(), by.factor)), shift(by.bits - 1) {}
  HWY_INLINE Ints quotient(Ints n) const {
    const hn::Repartition<u32, Tag<i32>> d32;
    const hn::Repartition<u64, Tag<i32>> d64;
    const auto even = hn::BitCast(d32, n.v);
    const auto odd = hn::BitCast(d32, hn::ShiftRight<32>(hn::BitCast(d64, n.v)));
    const auto low = hn::BitCast(d32, hn::ShiftRight<32>(hn::MulEven(even, factor)));
    const auto high = hn::BitCast(d32, hn::MulEven(odd, factor));
    return hn::BitCast(Tag<i32>(), hn::ShiftRightSame(hn::OddEven(high, low), shift));
  }
};

// min(n / q, 255) for 0 <= n and 255 * q below 2^31. The estimate is off by less than 1/1000; q of 0 gives anything.
HWY_INLINE Ints byte_quotient(Ints n, Ints q) {
  const Floats most = 255.0f, estimate = to_float(n) * (1.0f / to_float(q));
  const Ints near = fitting_int(pick(estimate < most, estimate, most));
  const Ints rest = n - near * q;
  const Ints lower = pick(rest < 0, near - 1, near), upper = pick(rest >= q, lower + 1, lower);
  return hn::Min(upper.v, Ints(255).v);
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif  // ZR_HAS_LANES

#endif
