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
  static HWY_INLINE Shorts div(Shorts n, Shorts r) { return Divisor(r)(n); }
  // Takes n to a fraction of r in 1/65536, and that times white. The reciprocal F of r has 16 bits only, but what it
  // lacks, 65536 - r * F, is 1 to r, and a factor as much greater than 255 * 256 makes up for it: no pair of bytes
  // comes out another number. The sum ends at 65535 for n = r, which gives white; so it does for r = 0.
  class Divisor {
   public:
    HWY_INLINE explicit Divisor(Shorts r)
        : r_(r),
          per_(reciprocal(r)),
          factor_(highest(bits_16(255 * 256) - r * per_, bits_16(255 * 256 + 1))),
          rounding_(pick(r == 0, -1, 129 - masked(r, 1))) {}
    HWY_INLINE Shorts operator()(Shorts n) const {
      const Shorts held = hn::Min(n.v, r_.v);
      return shifted_down_8(high(saturated_sum(held * per_, rounding_), factor_));
    }
    static HWY_INLINE Shorts by_white(Shorts n) { return n; }  // which no byte is above

   private:
    Shorts r_, per_, factor_, rounding_;
  };
  // from + smul(k, to - from), of bytes: a product below 0 rounds as if it were 1 greater.
  static HWY_INLINE Shorts toward(Shorts from, Shorts to, Shorts k) {
    const Shorts sum = from * inv(k) + to * k;
    return fold(pick(to < from, sum + 1, sum), 128);
  }
  // The same, with roundings that are alike on both sides.
  static HWY_INLINE Shorts mixed(Shorts from, Shorts to, Shorts k) { return fold(from * inv(k) + to * k, 128); }

 private:
  // The upper half of a product without signs.
  static HWY_INLINE Shorts high(Shorts a, Shorts b) {
    const Tag<u16> d;
    return hn::BitCast(Tag<i16>(), hn::MulHigh(hn::BitCast(d, a.v), hn::BitCast(d, b.v)));
  }
  // With u = t + rounding: (u + (u >> 8)) >> 8, which is u * 257 >> 16.
  static HWY_INLINE Shorts fold(Shorts t, Shorts rounding) { return high(t + rounding, 257); }
  // Numbers from 0 to 65535 as lanes that are read without a sign.
  static HWY_INLINE Shorts bits_16(u16 number) { return hn::BitCast(Tag<i16>(), hn::Set(Tag<u16>(), number)); }
  static HWY_INLINE Shorts highest(Shorts a, Shorts b) {
    const Tag<u16> d;
    return hn::BitCast(Tag<i16>(), hn::Max(hn::BitCast(d, a.v), hn::BitCast(d, b.v)));
  }
  static HWY_INLINE Shorts saturated_sum(Shorts a, Shorts b) {
    const Tag<u16> d;
    return hn::BitCast(Tag<i16>(), hn::SaturatedAdd(hn::BitCast(d, a.v), hn::BitCast(d, b.v)));
  }
  static HWY_INLINE Shorts shifted_down_8(Shorts a) {
    return hn::BitCast(Tag<i16>(), hn::ShiftRight<8>(hn::BitCast(Tag<u16>(), a.v)));
  }
  // The integer part of 65535 / r; any number for r = 0.
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

  // Alpha and red, green and blue share a lane on the way.
  template <class M>
  static HWY_INLINE Px<M> load(const ZR_Pixel8* p) {
    const Pairs first = words(p), second = words(p + lane_count());
    const Shorts front = joined(first, hn::ShiftLeft<16>(second)), back = joined(hn::ShiftRight<16>(first), second);
    const auto upper = [](Shorts v) HWY_ATTR {
      return hn::BitCast(Tag<i16>(), hn::ShiftRight<8>(hn::BitCast(Tag<u16>(), v.v)));
    };
    return {masked(front, 255), upper(front), masked(back, 255), upper(back)};
  }
  template <class M>
  static HWY_INLINE void store(const Px<M>& v, ZR_Pixel8* p) {
    const Pairs front = pairs_of(hn::Or(v.alpha.v, shifted_left<8>(v.red).v));
    const Pairs back = pairs_of(hn::Or(v.green.v, shifted_left<8>(v.blue).v));
    put(joined(front, hn::ShiftLeft<16>(back)), p);
    put(joined(hn::ShiftRight<16>(front), back), p + lane_count());
  }

 private:
  static HWY_INLINE Pairs words(const ZR_Pixel8* p) { return hn::LoadU(PairTag(), reinterpret_cast<const u32*>(p)); }
  static HWY_INLINE void put(Shorts v, ZR_Pixel8* p) {
    hn::StoreU(pairs_of(v.v), PairTag(), reinterpret_cast<u32*>(p));
  }
};

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif  // ZR_HAS_LANES

#endif
