// Lanes: vectors of numbers that read like single ones, and pixels of which each channel is a vector.
//
// Integer channels of 8 and 16 bits are worked on in 32-bit lanes, exactly as single numbers are; those of 8 bits
// have 16-bit lanes too. Included once for each instruction set.
#if defined(ZR_SIMD_LANES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SIMD_LANES_INL_H
#undef ZR_SIMD_LANES_INL_H
#else
#define ZR_SIMD_LANES_INL_H
#endif

#include <ZR/depth.h>
#include <hwy/highway.h>

#include <cstring>
#include <limits>
#include <type_traits>

#include "simd/variant.h"

#ifndef ZR_IN_LANES
#define ZR_IN_LANES
#endif
// False in the pass that compiles for a processor without vectors.
#undef ZR_HAS_LANES
#define ZR_HAS_LANES (HWY_TARGET != HWY_SCALAR && HWY_TARGET != HWY_EMU128)

#if ZR_HAS_LANES
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {
namespace hn = hwy::HWY_NAMESPACE;

template <class N>
using Tag = hn::ScalableTag<N>;
HWY_INLINE constexpr i32 lane_count() { return static_cast<i32>(HWY_LANES(i32)); }

template <class N>
struct Bools {
  hn::Mask<Tag<N>> mask;

  friend HWY_INLINE Bools operator&&(Bools a, Bools b) { return {hn::And(a.mask, b.mask)}; }
  friend HWY_INLINE Bools operator||(Bools a, Bools b) { return {hn::Or(a.mask, b.mask)}; }
  friend HWY_INLINE Bools operator!(Bools a) { return {hn::Not(a.mask)}; }
};
template <class N>
HWY_INLINE bool all(Bools<N> b) {
  return hn::AllTrue(Tag<N>(), b.mask);
}
template <class N>
HWY_INLINE bool none(Bools<N> b) {
  return hn::AllFalse(Tag<N>(), b.mask);
}

template <class N>
struct Lane {
  using Number = N;
  using V = hn::Vec<Tag<N>>;
  V v;

  Lane() = default;
  HWY_INLINE Lane(V vector) : v(vector) {}                     // NOLINT: lanes are what vectors are
  HWY_INLINE Lane(N number) : v(hn::Set(Tag<N>(), number)) {}  // NOLINT: numbers mix with lanes

  friend HWY_INLINE Lane operator+(Lane a, Lane b) { return hn::Add(a.v, b.v); }
  friend HWY_INLINE Lane operator-(Lane a, Lane b) { return hn::Sub(a.v, b.v); }
  friend HWY_INLINE Lane operator*(Lane a, Lane b) { return hn::Mul(a.v, b.v); }
  friend HWY_INLINE Lane operator/(Lane a, Lane b) { return hn::Div(a.v, b.v); }  // of floats
  friend HWY_INLINE Bools<N> operator==(Lane a, Lane b) { return {hn::Eq(a.v, b.v)}; }
  friend HWY_INLINE Bools<N> operator!=(Lane a, Lane b) { return {hn::Not(hn::Eq(a.v, b.v))}; }
  friend HWY_INLINE Bools<N> operator<(Lane a, Lane b) { return {hn::Lt(a.v, b.v)}; }
  friend HWY_INLINE Bools<N> operator>(Lane a, Lane b) { return {hn::Gt(a.v, b.v)}; }
  // Not the inverse of the other: NaN is on neither side.
  friend HWY_INLINE Bools<N> operator<=(Lane a, Lane b) {
    if constexpr (std::is_same_v<N, f32>)
      return {hn::Le(a.v, b.v)};
    else
      return {hn::Not(hn::Gt(a.v, b.v))};
  }
  friend HWY_INLINE Bools<N> operator>=(Lane a, Lane b) { return b <= a; }
};
using Ints = Lane<i32>;
using Shorts = Lane<i16>;
using Floats = Lane<f32>;

template <int bits>
HWY_INLINE Ints shifted_right(Ints a) {
  return hn::ShiftRight<bits>(a.v);
}
template <int bits>
HWY_INLINE Shorts shifted_right(Shorts a) {
  return hn::ShiftRight<bits>(a.v);
}
template <int bits>
HWY_INLINE Ints shifted_left(Ints a) {
  return hn::ShiftLeft<bits>(a.v);
}
template <int bits>
HWY_INLINE Shorts shifted_left(Shorts a) {
  return hn::ShiftLeft<bits>(a.v);
}
HWY_INLINE Ints masked(Ints a, i32 bits) { return hn::And(a.v, Ints(bits).v); }
HWY_INLINE Shorts masked(Shorts a, i16 bits) { return hn::And(a.v, Shorts(bits).v); }
HWY_INLINE Floats to_float(Ints a) { return hn::ConvertTo(Tag<f32>(), a.v); }
// Toward zero; the argument fits. Highway's own conversion mends what does not, at some times the price.
HWY_INLINE Ints fitting_int(Floats a) {
#if HWY_TARGET == HWY_AVX3
  return Ints::V{_mm512_cvttps_epi32(a.v.raw)};
#elif HWY_TARGET == HWY_AVX2
  return Ints::V{_mm256_cvttps_epi32(a.v.raw)};
#elif HWY_TARGET == HWY_SSE4 || HWY_TARGET == HWY_SSE2
  return Ints::V{_mm_cvttps_epi32(a.v.raw)};
#else
  return hn::ConvertTo(Tag<i32>(), a.v);
#endif
}

template <class N>
HWY_INLINE Lane<N> pick(Bools<N> condition, std::type_identity_t<Lane<N>> a, std::type_identity_t<Lane<N>> b) {
  return hn::IfThenElse(condition.mask, a.v, b.v);
}
// Toward zero; what does not fit, and NaN, gives INT32_MIN.
HWY_INLINE Ints to_int(Floats a) {
#if HWY_ARCH_X86
  return fitting_int(a);  // which says so by itself
#else
  const Bools<f32> fits = a >= -2147483648.0f && a < 2147483648.0f;
  return pick(Bools<i32>{hn::RebindMask(Tag<i32>(), fits.mask)}, fitting_int(a), std::numeric_limits<i32>::min());
#endif
}
// Calls f where the condition holds in all lanes, else g.
template <class N, class F, class G>
HWY_INLINE auto where_all(Bools<N> condition, F f, G g) {
  return all(condition) ? f() : g();
}
// Calls f where the condition holds in all lanes, g where it holds in none, else both. Each stands here once: what is
// inlined doubles with every other place.
template <class N, class F, class G>
HWY_INLINE auto choose(Bools<N> condition, F f, G g) {
  const bool takes_f = !none(condition), takes_g = !all(condition);
  decltype(f()) a, b;
  if (takes_f) a = f();
  if (!takes_g) return a;
  b = g();
  return takes_f ? pick(condition, a, b) : b;
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif  // ZR_HAS_LANES

#endif
