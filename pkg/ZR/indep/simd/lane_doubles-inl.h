// Double precision on lanes.
#if defined(ZR_SIMD_LANE_DOUBLES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SIMD_LANE_DOUBLES_INL_H
#undef ZR_SIMD_LANE_DOUBLES_INL_H
#else
#define ZR_SIMD_LANE_DOUBLES_INL_H
#endif

#include "simd/lanes-inl.h"

#if ZR_HAS_LANES
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// As many doubles as there are lanes, in two vectors.
struct Doubles {
  using V = hn::Vec<Tag<f64>>;
  V low, high;

  Doubles() = default;
  HWY_INLINE Doubles(V l, V h) : low(l), high(h) {}
  HWY_INLINE Doubles(f64 number) : low(hn::Set(Tag<f64>(), number)), high(low) {}  // NOLINT: numbers mix with lanes
  friend HWY_INLINE Doubles operator+(Doubles a, Doubles b) { return {hn::Add(a.low, b.low), hn::Add(a.high, b.high)}; }
  friend HWY_INLINE Doubles operator-(Doubles a, Doubles b) { return {hn::Sub(a.low, b.low), hn::Sub(a.high, b.high)}; }
  friend HWY_INLINE Doubles operator*(Doubles a, Doubles b) { return {hn::Mul(a.low, b.low), hn::Mul(a.high, b.high)}; }
  friend HWY_INLINE Doubles operator/(Doubles a, Doubles b) { return {hn::Div(a.low, b.low), hn::Div(a.high, b.high)}; }
};
using HalfInts = hn::Rebind<i32, Tag<f64>>;
using HalfFloats = hn::Rebind<f32, Tag<f64>>;

HWY_INLINE Doubles to_double(Ints v) {
  const Tag<f64> d;
  const HalfInts half;
  return {hn::PromoteTo(d, hn::LowerHalf(half, v.v)), hn::PromoteTo(d, hn::UpperHalf(half, v.v))};
}
HWY_INLINE Doubles to_double(Floats v) {
  const Tag<f64> d;
  const HalfFloats half;
  return {hn::PromoteTo(d, hn::LowerHalf(half, v.v)), hn::PromoteTo(d, hn::UpperHalf(half, v.v))};
}
HWY_INLINE Floats narrowed(Doubles v) {
  const HalfFloats half;
  return hn::Combine(Tag<f32>(), hn::DemoteTo(half, v.high), hn::DemoteTo(half, v.low));
}
// Toward zero; the argument fits.
HWY_INLINE Ints fitting_int(Doubles v) {
  const HalfInts half;
  return hn::Combine(Tag<i32>(), hn::DemoteTo(half, v.high), hn::DemoteTo(half, v.low));
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif  // ZR_HAS_LANES

#endif
