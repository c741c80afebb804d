// Channel arithmetic of 8-bit pixels on 16-bit lanes: to the last bit what lane_depth-inl.h says of them on 32-bit
// lanes, for twice as many pixels at a time.
//
// Legal operands stay below 2^16, as products and sums that are read without a sign.
#if defined(ZR_SIMD_LANE_BYTES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SIMD_LANE_BYTES_INL_H
#undef ZR_SIMD_LANE_BYTES_INL_H
#else
#define ZR_SIMD_LANE_BYTES_INL_H
#endif

#include "simd/lane_depth-inl.h"

#if ZR_HAS_LANES
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// The lanes of 16 bits lie in pairs in words of 32: the even one below.
using PairTag = Tag<u32>;
using Pairs = hn::Vec<PairTag>;
template <class V>
HWY_INLINE Pairs pairs_of(V v) {
  return hn::BitCast(PairTag(), v);
}
HWY_INLINE Shorts joined(Pairs even, Pairs odd) {
  const Tag<i16> d;
  return hn::OddEven(hn::BitCast(d, odd), hn::BitCast(d, even));
}

template <>
struct Primitive<NarrowPixel8> {
  static constexpr i16 white = 255, half = 128;

  static HWY_INLINE Shorts stored(Shorts v) { return masked(v, 255); }
  static HWY_INLINE Shorts mul(Shorts a, Shorts b) { return fold(a * b, 128); }
  // x from -255 to 255. The fold of a negative product is that of its magnitude, rounded the other way.
  static HWY_INLINE Shorts smul(Shorts k, Shorts x) {
    const auto sign = hn::ShiftRight<15>(x.v);
    const Shorts magnitude = fold(k * Shorts(hn::Abs(x.v)), Shorts(sign) + 128);
    return hn::Sub(hn::Xor(magnitude.v, sign), sign);
  }
  static HWY_INLINE Shorts inv(Shorts a) { return white - a; }
  // The estimate is the quotient or one less.
  static HWY_INLINE Shorts div(Shorts n, Shorts r) {
    if (all(r == white)) return hn::Min(n.v, r.v);
    const Shorts held = hn::Min(n.v, r.v);  // what is as great as r has the quotient white
    const Shorts numerator = shifted_left<8>(held) - held + shifted_right<1>(r);
    const Shorts least = high(numerator, reciprocal(r));
    const Shorts quotient = pick(numerator - least * r >= r, least + 1, least);
    const Bools<i16> by_zero = r == 0;
    return none(by_zero) ? quotient : pick(by_zero, white, quotient);
  }

 private:
  // The upper half of a product without signs.
  static HWY_INLINE Shorts high(Shorts a, Shorts b) {
    const Tag<u16> d;
    return hn::BitCast(Tag<i16>(), hn::MulHigh(hn::BitCast(d, a.v), hn::BitCast(d, b.v)));
  }
  // With u = t + rounding: (u + (u >> 8)) >> 8, which is u * 257 >> 16.
  static HWY_INLINE Shorts fold(Shorts t, Shorts rounding) { return high(t + rounding, 257); }
  // 65536 / r less at most 1 and 1 / (8 r), never more, and below 65536; any number for r = 0.
  static HWY_INLINE Shorts reciprocal(Shorts r) {
    const Pairs pairs = pairs_of(r.v);
    const Pairs even = rounded_reciprocal(hn::And(pairs, hn::Set(PairTag(), 65535)));
    const Pairs odd = rounded_reciprocal(hn::ShiftRight<16>(pairs));
    return joined(even, hn::ShiftLeft<16>(odd));
  }
  // In the lower 16 bits: above 2^23 a float has no fraction left, and adding rounds.
  static HWY_INLINE Pairs rounded_reciprocal(Pairs r) {
    const Tag<f32> d;
    const auto v = hn::ConvertTo(d, hn::BitCast(Tag<i32>(), r));
#if HWY_ARCH_X86
    const auto estimate = hn::ApproximateReciprocal(v);
    const auto y = hn::Mul(estimate, hn::NegMulAdd(v, estimate, hn::Set(d, 2.0f)));
#else
    const auto y = hn::Div(hn::Set(d, 1.0f), v);
#endif
    return pairs_of(hn::MulAdd(y, hn::Set(d, 65535.9f), hn::Set(d, 8388607.5f)));
  }
};

// The table has an entry for every index.
HWY_INLINE Shorts entry_of(const i32* table, Shorts index) {
  const auto entries = [table](Pairs at) HWY_ATTR {
    return pairs_of(hn::GatherIndex(Tag<i32>(), table, hn::BitCast(Tag<i32>(), at)));
  };
  const Pairs pairs = pairs_of(index.v);
  const Pairs odd = entries(hn::ShiftRight<16>(pairs));
  return joined(entries(hn::And(pairs, hn::Set(PairTag(), 65535))), hn::ShiftLeft<16>(odd));
}

// Two vectors of pixels: those of the first in the even lanes.
struct Narrow {
  static constexpr i32 pixels = 2 * lane_count();

  template <class M>
  static HWY_INLINE Px<M> load(const ZR_Pixel8* p) {
    const Pairs first = words(p), second = words(p + lane_count());
    const auto low = [](Pairs v) HWY_ATTR { return hn::And(v, hn::Set(PairTag(), 0x00ff00ff)); };
    const auto high = [](Pairs v) HWY_ATTR { return pairs_of(hn::ShiftRight<8>(hn::BitCast(Tag<u16>(), v))); };
    const auto lower = [](Pairs a, Pairs b) HWY_ATTR { return joined(a, hn::ShiftLeft<16>(b)); };
    const auto upper = [](Pairs a, Pairs b) HWY_ATTR { return joined(hn::ShiftRight<16>(a), b); };
    return {lower(low(first), low(second)), lower(high(first), high(second)), upper(low(first), low(second)),
            upper(high(first), high(second))};
  }
  template <class M>
  static HWY_INLINE void store(const Px<M>& v, ZR_Pixel8* p) {
    const auto first = [](Shorts low, Shorts high) HWY_ATTR {
      return pairs_of(joined(pairs_of(low.v), hn::ShiftLeft<16>(pairs_of(high.v))).v);
    };
    const auto second = [](Shorts low, Shorts high) HWY_ATTR {
      return pairs_of(joined(hn::ShiftRight<16>(pairs_of(low.v)), pairs_of(high.v)).v);
    };
    const auto put = [](Pairs ag, Pairs rb, ZR_Pixel8* to) HWY_ATTR {
      hn::StoreU(hn::Or(ag, hn::ShiftLeft<8>(rb)), PairTag(), reinterpret_cast<u32*>(to));
    };
    put(first(v.alpha, v.green), first(v.red, v.blue), p);
    put(second(v.alpha, v.green), second(v.red, v.blue), p + lane_count());
  }

 private:
  static HWY_INLINE Pairs words(const ZR_Pixel8* p) { return hn::LoadU(PairTag(), reinterpret_cast<const u32*>(p)); }
};

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif  // ZR_HAS_LANES

#endif
