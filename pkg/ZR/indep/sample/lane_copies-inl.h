// What copies on lanes share: numbers that are rounded once more than the sampler's, and where that is in doubt.
#if defined(ZR_SAMPLE_LANE_COPIES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SAMPLE_LANE_COPIES_INL_H
#undef ZR_SAMPLE_LANE_COPIES_INL_H
#else
#define ZR_SAMPLE_LANE_COPIES_INL_H
#endif

#include <hwy/cache_control.h>

#include "sample/lane_samples-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class T>
using RealOf = std::conditional_t<std::is_same_v<T, ZR_Pixel16>, Doubles, Floats>;

// Fused where the processor can: bounds allow for either.
HWY_INLINE Floats mul_add(Floats a, Floats b, Floats c) { return hn::MulAdd(a.v, b.v, c.v); }
HWY_INLINE Doubles mul_add(Doubles a, Doubles b, Doubles c) {
  return {hn::MulAdd(a.low, b.low, c.low), hn::MulAdd(a.high, b.high, c.high)};
}

// Off by 3u at most.
HWY_INLINE Floats inverse_of(Floats v) {
#if HWY_ARCH_X86
  const Floats estimate = hn::ApproximateReciprocal(v.v);
  return estimate * Floats(hn::NegMulAdd(v.v, estimate.v, hn::Set(Tag<f32>(), 2.0f)));
#else
  return 1.0f / v;
#endif
}
// Off by less than 2^-44 of itself.
HWY_INLINE Doubles inverse_of(Doubles v) {
#if HWY_ARCH_X86
  Doubles inverse = to_double(Floats(hn::ApproximateReciprocal(narrowed(v).v)));
  for (i32 i = 0; i < 2; ++i) inverse = inverse * (Doubles(2.0) - v * inverse);
  return inverse;
#else
  return Doubles(1.0) / v;
#endif
}

HWY_INLINE Floats at_least(Floats v, f32 least) { return hn::Max(v.v, hn::Set(Tag<f32>(), least)); }
HWY_INLINE Doubles at_least(Doubles v, f64 least) {
  const auto limit = hn::Set(Tag<f64>(), least);
  return {hn::Max(v.low, limit), hn::Max(v.high, limit)};
}

// Numbers to the nearest integers, and the lanes where they lie too near to the middle between two.
class FloatRounding {
 public:
  HWY_INLINE FloatRounding() : differences_(0) {}
  // Of v * by.
  HWY_INLINE Ints nearest(Floats v, Floats by, Floats doubt) {
    const Ints least = fitting_int(mul_add(v, by, 0.5f - doubt));
    differences_ = differences_ | (least ^ fitting_int(mul_add(v, by, 0.5f + doubt)));
    return least;
  }
  HWY_INLINE Bools<i32> unsure() const { return differences_ != 0; }
  HWY_INLINE bool all_sure() const { return none(unsure()); }

 private:
  Ints differences_;
};

// 8-bit pixels in 65536ths of a step.
class FixedPixels {
  using Halves = hn::Repartition<u16, Tag<i32>>;
  static HWY_INLINE hn::Vec<Halves> half(Ints v) { return hn::BitCast(Halves(), v.v); }

 public:
  Ints alpha, red, green, blue;

  // The whole steps.
  HWY_INLINE Raw<ZR_Pixel8> whole() const {
    const auto outer = hn::OddEven(half(green), half(shifted_right<16>(alpha)));
    const auto inner = hn::OddEven(half(blue), half(shifted_right<16>(red)));
    return {{Ints(hn::BitCast(Tag<i32>(), hn::Or(outer, hn::ShiftLeft<8>(inner))))}};
  }
  HWY_INLINE Ints least_fraction() const {
    const auto least = hn::Min(hn::Min(half(alpha), half(red)), hn::Min(half(green), half(blue)));
    return masked(Ints(hn::BitCast(Tag<i32>(), least)), 65535);
  }
};
// The same for four channels under one doubt: what lies two doubts or more above a step is above it for certain, and
// below the next. Numbers below 256 steps are rounded to a 65536th at most, which is added.
class FixedRounding {
 public:
  explicit HWY_INLINE FixedRounding(Floats doubt) : units_(mul_add(doubt, 65536.0f, 1.0f)), half_(units_ + 32768.0f) {}
  // Of v * by / 65536.
  HWY_INLINE Ints nearest(Floats v, Floats by) const { return fitting_int(mul_add(v, by, half_)); }
  HWY_INLINE Bools<i32> unsure(const FixedPixels& p) const {
    return !(p.least_fraction() > fitting_int(units_ + units_));
  }

 private:
  Floats units_, half_;
};

class DoubleRounding {
 public:
  HWY_INLINE DoubleRounding() : most_(0.0) {}
  HWY_INLINE Ints nearest(Doubles v, Doubles by, Doubles) {
    const Doubles product = v * by, above = product + no_fraction, off = product - (above - no_fraction);
    most_ = {hn::Max(most_.low, hn::Abs(off.low)), hn::Max(most_.high, hn::Abs(off.high))};
    return low_words(above);
  }
  HWY_INLINE Bools<i32> unsure() const {
    const Tag<i32> d;
    const auto words = [&](auto v) HWY_ATTR { return hn::BitCast(d, hn::VecFromMask(Tag<f64>(), too_far(v))); };
    return Ints(hn::ConcatEven(d, words(most_.high), words(most_.low))) != 0;
  }
  HWY_INLINE bool all_sure() const { return hn::AllFalse(Tag<f64>(), too_far(hn::Max(most_.low, most_.high))); }
  // Of exact numbers of 32 bits of fraction, halves upward.
  static HWY_INLINE Ints half_up(Doubles v) { return low_words((v + 0x1p-34) + no_fraction); }

 private:
  static constexpr f64 no_fraction = 0x1p52;
  static HWY_INLINE hn::Mask<Tag<f64>> too_far(hn::Vec<Tag<f64>> v) {
    return hn::Gt(v, hn::Set(Tag<f64>(), 0.5 - 0x1p-24));
  }
  static HWY_INLINE Ints low_words(Doubles v) {
    const Tag<i32> d;
    return hn::ConcatEven(d, hn::BitCast(d, v.high), hn::BitCast(d, v.low));
  }
  Doubles most_;
};
template <class T>
using Rounding = std::conditional_t<std::is_same_v<T, ZR_Pixel16>, DoubleRounding, FloatRounding>;

// As many channels as there are lanes, side by side as pixels hold them.
template <class T>
HWY_INLINE void store_channels(Ints v, T* to) {
  const hn::Rebind<Channel<T>, Tag<i32>> d;
  const hn::Rebind<u32, Tag<i32>> words;
  hn::StoreU(hn::TruncateTo(d, hn::BitCast(words, v.v)), d, reinterpret_cast<Channel<T>*>(to));
}

enum class Alphas { any, white, clear, illegal };

// What the alphas of pixels are; there are as many as a vector has lanes or more.
template <class T>
HWY_INLINE Alphas alphas_of(const T* pixels, i32 count) {
  constexpr i32 lanes = lane_count(), white = Depth<T>::white;
  Ints every(-1), any(0);
  const auto look = [&](i32 first, i32 vectors) HWY_ATTR {
    for (i32 k = 0; k < vectors * Raw<T>::words; ++k) {
      const Ints words = hn::LoadU(Tag<i32>(), reinterpret_cast<const i32*>(pixels + first) + k * lanes);
      every = every & words, any = any | words;
    }
  };
  i32 i = 0;
  for (; count - i >= 4 * lanes; i += 4 * lanes) look(i, 4);
  for (; count - i >= lanes; i += lanes) look(i, 1);
  look(count - lanes, 1);
  if constexpr (Raw<T>::words == 2) every = hn::DupEven(every.v), any = hn::DupEven(any.v);
  constexpr i32 channel = std::numeric_limits<Channel<T>>::max();
  every = masked(every, channel), any = masked(any, channel);
  return all(any == 0) ? Alphas::clear : all(any == white && every == white) ? Alphas::white : Alphas::any;
}

// Reads bytes ahead of their use: short parts of rows are no pattern that processors see.
HWY_INLINE void fetch_ahead(const void* from, i32 bytes) {
  constexpr i32 cache_line = 64;
  for (i32 i = 0; i < bytes; i += cache_line) hwy::Prefetch(static_cast<const char*>(from) + i);
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
