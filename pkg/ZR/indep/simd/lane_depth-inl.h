// Channel arithmetic of the three depths on lanes: what <ZR/depth.h> says of single numbers, to the last bit.
// Integer channels are legal ones: whoever loads 16-bit pixels has looked.
#if defined(ZR_SIMD_LANE_DEPTH_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SIMD_LANE_DEPTH_INL_H
#undef ZR_SIMD_LANE_DEPTH_INL_H
#else
#define ZR_SIMD_LANE_DEPTH_INL_H
#endif

#include "simd/lanes-inl.h"

#if ZR_HAS_LANES
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// 8-bit pixels of which each channel takes a lane of 16 bits: see lane_bytes-inl.h.
struct NarrowPixel8;

template <class T>
using Number = Lane<std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, f32,
                                       std::conditional_t<std::is_same_v<T, NarrowPixel8>, i16, i32>>>;

HWY_INLINE Floats magnitude_of(Floats v) { return hn::Abs(v.v); }
HWY_INLINE Ints held(Ints v, i32 low, i32 high) { return hn::Min(hn::Max(v.v, Ints(low).v), Ints(high).v); }
// The table has an entry for every index.
template <class N>
HWY_INLINE Lane<N> entry_of(const N* table, Ints index) {
  return hn::GatherIndex(Tag<N>(), table, index.v);
}
// An entry and the one behind it, in one read of both.
template <class N>
struct Entries {
  Lane<N> first, next;
};
template <class N>
HWY_INLINE Entries<N> entries_of(const N* table, Ints index) {
  const Tag<i64> wide;
  const Tag<N> d;
  const auto both = [&](auto at) HWY_ATTR { return hn::GatherOffset(wide, reinterpret_cast<const i64*>(table), at); };
  const auto pairs = hn::BitCast(wide, hn::ShiftLeft<2>(index.v));  // of offsets, as they are positive
  const auto even = both(hn::And(pairs, hn::Set(wide, 0xffffffff)));
  const auto odd = both(hn::BitCast(wide, hn::ShiftRight<32>(hn::BitCast(Tag<u64>(), pairs))));
  return {hn::OddEven(hn::BitCast(d, hn::ShiftLeft<32>(odd)), hn::BitCast(d, even)),
          hn::OddEven(hn::BitCast(d, odd), hn::BitCast(d, hn::ShiftRight<32>(hn::BitCast(Tag<u64>(), even))))};
}
// A condition on floats, for choices between integers.
HWY_INLINE Bools<i32> of_ints(Bools<f32> condition) { return {hn::RebindMask(Tag<i32>(), condition.mask)}; }

// a * b / c toward zero for c > 0; the product wraps. By doubles, whose quotient is never off by an integer.
HWY_INLINE Ints product_ratio(Ints a, Ints b, Ints c) {
  using Half = hn::Rebind<f64, hn::Half<Tag<i32>>>;
  const Half d;
  const hn::Rebind<i32, Half> di;
  const Ints n = a * b;
  const auto lower = hn::Div(hn::PromoteTo(d, hn::LowerHalf(di, n.v)), hn::PromoteTo(d, hn::LowerHalf(di, c.v)));
  const auto upper = hn::Div(hn::PromoteTo(d, hn::UpperHalf(di, n.v)), hn::PromoteTo(d, hn::UpperHalf(di, c.v)));
  return hn::Combine(Tag<i32>(), hn::DemoteTo(di, upper), hn::DemoteTo(di, lower));
}

template <class T>
struct Primitive;

template <>
struct Primitive<ZR_Pixel8> {
  static constexpr i32 white = 255, half = 128;

  static HWY_INLINE Ints stored(Ints v) { return masked(v, 255); }
  static HWY_INLINE Ints fold(Ints t) { return shifted_right<8>(t + shifted_right<8>(t + 128) + 128); }
  static HWY_INLINE Ints mul(Ints a, Ints b) { return fold(a * b); }
  static HWY_INLINE Ints smul(Ints k, Ints x) { return fold(k * x); }
  static HWY_INLINE Ints inv(Ints a) { return white - a; }
  // One division serves three channels. The quotient lies half of 1/r or more away from what would round to
  // another integer, and is off by less than 1/r / 100.
  static HWY_INLINE Ints div(Ints n, Ints r) {
    const Bools<i32> full = n >= r;
    if (all(full || r == white)) return pick(full, white, n);
    const Floats numerator = to_float(n * white + shifted_right<1>(r)) + 0.5f;
    return pick(full, white, fitting_int(numerator * (1.0f / to_float(r))));
  }
  static HWY_INLINE Ints luma(Ints r, Ints g, Ints b) {
    return shifted_right<15>(luma_red * r + luma_green * g + luma_blue * b + 16384);
  }
};

template <>
struct Primitive<ZR_Pixel16> {
  static constexpr i32 white = 32768, half = 16384;

  static HWY_INLINE Ints stored(Ints v) { return masked(v, 65535); }
  static HWY_INLINE Ints mul(Ints a, Ints b) { return shifted_right<15>(a * b + 16383); }
  static HWY_INLINE Ints smul(Ints k, Ints x) { return shifted_right<15>(k * x); }
  static HWY_INLINE Ints inv(Ints a) { return white - a; }
  static HWY_INLINE Ints div(Ints n, Ints r) { return Divisor(r)(n); }
  static HWY_INLINE Ints luma(Ints r, Ints g, Ints b) {
    return shifted_right<15>(luma_red * r + luma_green * g + luma_blue * b + 16384);
  }

  class Divisor {
   public:
#if HWY_NATIVE_FMA
    HWY_INLINE explicit Divisor(Ints r)
        : r_(r), unit_(to_float(r) * 0x1p-15f), half_(unit_ * 0.5f), per_(reciprocal(to_float(r)) * scale) {}
#else
    HWY_INLINE explicit Divisor(Ints r) : r_(r), per_(1.0f / to_float(r)) {}
#endif
    HWY_INLINE Ints operator()(Ints n) const { return pick(at_least(n, r_), white, quotient(n)); }
    static HWY_INLINE Ints by_white(Ints n) { return pick(at_least(n, white), white, n); }

   private:
#if HWY_NATIVE_FMA
    static constexpr f32 no_fraction = 8388608.0f, scale = 32768.0f * (1.0f - 0x1p-20f);
    // The quotient to the nearest integer, for n < r: an estimate that is never too great and too small by less than
    // 1/16, rounded by a sum in which floats have no fraction left, is the quotient or one less. What is left of n
    // then, in 1/32768, has few enough bits to come out exactly.
    HWY_INLINE Ints quotient(Ints n) const {
      const Floats dividend = to_float(n);
      const Floats snapped = hn::MulAdd(dividend.v, per_.v, hn::Set(Tag<f32>(), no_fraction));
      const Floats rest = hn::NegMulAdd((snapped - no_fraction).v, unit_.v, dividend.v);
      const Ints least = masked(hn::BitCast(Tag<i32>(), snapped.v), 65535);
      return pick(of_ints(rest >= half_), least + 1, least);
    }
    // Off by less than 2^-22 of itself.
    static HWY_INLINE Floats reciprocal(Floats r) {
#if HWY_ARCH_X86
      const Floats estimate = hn::ApproximateReciprocal(r.v);
      return estimate * Floats(hn::NegMulAdd(r.v, estimate.v, hn::Set(Tag<f32>(), 2.0f)));
#else
      return 1.0f / r;
#endif
    }
    Ints r_;
    Floats unit_, half_, per_;
#else
    // The estimate is off by less than 1/64; made a little small, it is the quotient or one less.
    HWY_INLINE Ints quotient(Ints n) const {
      const Ints numerator = shifted_left<15>(n) + shifted_right<1>(r_);
      const Ints least = fitting_int(to_float(numerator) * per_ - 0.03125f);
      return pick(numerator - least * r_ >= r_, least + 1, least);
    }
    Ints r_;
    Floats per_;
#endif
  };

 private:
  // Negative numbers count as the greatest.
  static HWY_INLINE Bools<i32> at_least(Ints n, Ints r) {
    const hn::Rebind<u32, Tag<i32>> unsigned_tag;
    const auto a = hn::BitCast(unsigned_tag, n.v), b = hn::BitCast(unsigned_tag, r.v);
    return {hn::RebindMask(Tag<i32>(), hn::Not(hn::Lt(a, b)))};
  }
};

template <>
struct Primitive<ZR_PixelFloat> {
  static constexpr f32 white = 1.0f, half = 0.5f;

  static HWY_INLINE Floats stored(Floats v) { return v; }
  static HWY_INLINE Floats mul(Floats a, Floats b) { return a * b; }
  static HWY_INLINE Floats smul(Floats k, Floats x) { return k * x; }
  static HWY_INLINE Floats inv(Floats a) { return 1.0f - a; }
  static HWY_INLINE Floats div(Floats n, Floats r) {
    if (all(r == white)) return n;
    const Ints exponent = masked(hn::BitCast(Tag<i32>(), r.v), 0x7f800000);
    const Bools<f32> tiny = {hn::RebindMask(Tag<f32>(), (exponent == 0).mask)};
    return pick(tiny, 1.0f, n / r);
  }
  static HWY_INLINE Floats luma(Floats r, Floats g, Floats b) { return 0.299f * r + 0.587f * g + 0.114f * b; }
};

// ------------------------------------------------------------------------------ pixels

template <class M>
struct Px {
  typename M::Wide alpha, red, green, blue;
};
template <class M, class N>
HWY_INLINE Px<M> pick(Bools<N> c, const Px<M>& a, const Px<M>& b) {
  return {pick(c, a.alpha, b.alpha), pick(c, a.red, b.red), pick(c, a.green, b.green), pick(c, a.blue, b.blue)};
}

// Division by one r: what is known of it is worked out once.
template <class M>
HWY_INLINE auto divisor_of(typename M::Wide r) {
  if constexpr (requires { typename M::Divisor; })
    return typename M::Divisor(r);
  else
    return [r](typename M::Wide n) HWY_ATTR { return M::div(n, r); };
}
// The colours of p over r.
template <class M>
HWY_INLINE Px<M> divided(const Px<M>& p, typename M::Wide r) {
  const auto each = [&p](auto quotient) HWY_ATTR {
    return Px<M>{p.alpha, quotient(p.red), quotient(p.green), quotient(p.blue)};
  };
  if constexpr (requires { typename M::Divisor; })
    if (all(r == M::white)) return each([](typename M::Wide n) HWY_ATTR { return M::Divisor::by_white(n); });
  return each(divisor_of<M>(r));
}

// As many pixels as there are lanes, from and to memory without alignment.
template <class M>
HWY_INLINE Px<M> load(const ZR_Pixel8* p) {
  const Ints words = hn::LoadU(Tag<i32>(), reinterpret_cast<const i32*>(p));
  const hn::Rebind<u32, Tag<i32>> unsigned_tag;
  const Ints last = hn::BitCast(Tag<i32>(), hn::ShiftRight<24>(hn::BitCast(unsigned_tag, words.v)));
  return {masked(words, 255), masked(shifted_right<8>(words), 255), masked(shifted_right<16>(words), 255), last};
}
template <class M>
HWY_INLINE void store(const Px<M>& v, ZR_Pixel8* p) {
  const auto both = hn::Or(masked(v.alpha, 255).v, shifted_left<8>(masked(v.red, 255)).v);
  const auto rest = hn::Or(shifted_left<16>(masked(v.green, 255)).v, shifted_left<24>(v.blue).v);
  hn::StoreU(hn::Or(both, rest), Tag<i32>(), reinterpret_cast<i32*>(p));
}
template <class M>
HWY_INLINE Px<M> load(const ZR_Pixel16* p) {
  const hn::Rebind<u32, Tag<i32>> d;
  hn::Vec<decltype(d)> front, back;
  hn::LoadInterleaved2(d, reinterpret_cast<const u32*>(p), front, back);
  const auto low = [&](auto v) HWY_ATTR { return Ints(hn::BitCast(Tag<i32>(), hn::And(v, hn::Set(d, 65535)))); };
  const auto high = [&](auto v) HWY_ATTR { return Ints(hn::BitCast(Tag<i32>(), hn::ShiftRight<16>(v))); };
  return {low(front), high(front), low(back), high(back)};
}
template <class M>
HWY_INLINE void store(const Px<M>& v, ZR_Pixel16* p) {
  const hn::Rebind<u32, Tag<i32>> d;
  const auto pair = [&](Ints low, Ints high)
                        HWY_ATTR { return hn::BitCast(d, hn::Or(masked(low, 65535).v, shifted_left<16>(high).v)); };
  hn::StoreInterleaved2(pair(v.alpha, v.red), pair(v.green, v.blue), d, reinterpret_cast<u32*>(p));
}
template <class M>
HWY_INLINE Px<M> load(const ZR_PixelFloat* p) {
  Px<M> v;
  hn::LoadInterleaved4(Tag<f32>(), reinterpret_cast<const f32*>(p), v.alpha.v, v.red.v, v.green.v, v.blue.v);
  return v;
}
template <class M>
HWY_INLINE void store(const Px<M>& v, ZR_PixelFloat* p) {
  hn::StoreInterleaved4(v.alpha.v, v.red.v, v.green.v, v.blue.v, Tag<f32>(), reinterpret_cast<f32*>(p));
}

// How pixels lie in a Px. Apart: each channel in a vector of its own.
struct Apart {
  static constexpr i32 pixels = lane_count();
  template <class M, class T>
  static HWY_INLINE Px<M> load(const T* p) {
    return HWY_NAMESPACE::load<M>(p);
  }
  template <class M, class T>
  static HWY_INLINE void store(const Px<M>& v, T* p) {
    HWY_NAMESPACE::store<M>(v, p);
  }
};
// As Apart, of floats, in the order that takes fewest shuffles: for formulas to which a pixel's place is nothing.
struct ApartInAnyOrder {
  static constexpr i32 pixels = lane_count();
  template <class M>
  static HWY_INLINE Px<M> load(const ZR_PixelFloat* p) {
    const auto* const from = reinterpret_cast<const f32*>(p);
    const auto row = [from](int i) HWY_ATTR { return hn::LoadU(Tag<f32>(), from + i * lane_count()); };
    Px<M> v;
    turned(row(0), row(1), row(2), row(3), v.alpha.v, v.red.v, v.green.v, v.blue.v);
    return v;
  }
  template <class M>
  static HWY_INLINE void store(const Px<M>& v, ZR_PixelFloat* p) {
    auto* const to = reinterpret_cast<f32*>(p);
    Floats::V rows[4];
    turned(v.alpha.v, v.red.v, v.green.v, v.blue.v, rows[0], rows[1], rows[2], rows[3]);
    for (int i = 0; i < 4; ++i) hn::StoreU(rows[i], Tag<f32>(), to + i * lane_count());
  }

 private:
  // Rows to columns within each four lanes, which is its own inverse.
  static HWY_INLINE void turned(Floats::V a, Floats::V b, Floats::V c, Floats::V d, Floats::V& first, Floats::V& second,
                                Floats::V& third, Floats::V& fourth) {
    const auto lower = [](Floats::V x, Floats::V y) HWY_ATTR { return hn::InterleaveLower(Tag<f32>(), x, y); };
    const auto upper = [](Floats::V x, Floats::V y) HWY_ATTR { return hn::InterleaveUpper(Tag<f32>(), x, y); };
    const auto ac_front = lower(a, c), ac_back = upper(a, c), bd_front = lower(b, d), bd_back = upper(b, d);
    first = lower(ac_front, bd_front);
    second = upper(ac_front, bd_front);
    third = lower(ac_back, bd_back);
    fourth = upper(ac_back, bd_back);
  }
};
template <class T>
using ApartPack = std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, ApartInAnyOrder, Apart>;

// Together: whole float pixels as they lie in memory, for formulas that treat the three colours alike. All three
// colours are that one vector, so that the compiler works them out once; alpha is spread over its pixel's lanes.
struct Together {
  static constexpr i32 pixels = lane_count() / 4;
  template <class M>
  static HWY_INLINE Px<M> load(const ZR_PixelFloat* p) {
    const Floats v = hn::LoadU(Tag<f32>(), reinterpret_cast<const f32*>(p));
    return {hn::Broadcast<0>(v.v), v, v, v};
  }
  template <class M>
  static HWY_INLINE void store(const Px<M>& v, ZR_PixelFloat* p) {
    const Ints place = hn::Iota(Tag<i32>(), 0);
    const Bools<f32> first = {hn::RebindMask(Tag<f32>(), (masked(place, 3) == 0).mask)};
    hn::StoreU(pick(first, v.alpha, v.red).v, Tag<f32>(), reinterpret_cast<f32*>(p));
  }
};
template <class T>
using AlikePack = std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, Together, Apart>;

// Whether no alpha is above white, of depths where one may be.
template <class M>
HWY_INLINE bool legal_alpha(typename M::Wide a) {
  if constexpr (std::is_same_v<typename M::Wide, Ints>)
    return none(a > M::white);
  else
    return true;
}
// Whether no channel is above white; of 8 bits and floats none is.
template <class M>
HWY_INLINE bool legal(const Px<M>& p) {
  if constexpr (M::white == 32768) {
    const auto most = hn::Max(hn::Max(p.alpha.v, p.red.v), hn::Max(p.green.v, p.blue.v));
    return none(Ints(most) > M::white);
  } else {
    return true;
  }
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif  // ZR_HAS_LANES

#endif
