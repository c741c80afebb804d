// Four neighbours of a vector of positions, weighted: what bilinear samples and motion by given weights share.
#if defined(ZR_SAMPLE_LANE_FOUR_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SAMPLE_LANE_FOUR_INL_H
#undef ZR_SAMPLE_LANE_FOUR_INL_H
#else
#define ZR_SAMPLE_LANE_FOUR_INL_H
#endif

#include "sample/lane_samples-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class Real>
struct LaneWeights {
  Real w[4];

  HWY_INLINE LaneWeights(Ints fraction_x, Ints fraction_y) {
    const Real unit(0x1p-16f), fx = to_real<Real>(fraction_x) * unit, fy = to_real<Real>(fraction_y) * unit;
    w[3] = fx * fy;
    w[1] = fx - w[3];
    w[2] = fy - w[3];
    w[0] = Real(1.0f) - w[1] - w[2] - w[3];
  }
  // Of the caller.
  explicit HWY_INLINE LaneWeights(const f64* numbers) {
    using Number = std::conditional_t<std::is_same_v<Real, Floats>, f32, f64>;
    for (i32 i = 0; i < 4; ++i) w[i] = Real(static_cast<Number>(numbers[i]));
  }
};

struct FloatPixels {
  Floats c[4];
};
HWY_INLINE Raw<ZR_PixelFloat> as_raw(const FloatPixels& p) {
  return {{as_ints(p.c[0]), as_ints(p.c[1]), as_ints(p.c[2]), as_ints(p.c[3])}};
}

template <int k, class T>
HWY_INLINE Floats in_order(const Floats (&w)[4], const Raw<T> (&p)[4]) {
  return ((w[0] * real_channel_of<Floats, k>(p[0]) + w[1] * real_channel_of<Floats, k>(p[1])) +
          w[2] * real_channel_of<Floats, k>(p[2])) +
         w[3] * real_channel_of<Floats, k>(p[3]);
}

// From left to right in single precision, alpha limited to 1. On the depth's scale.
template <class T>
HWY_INLINE FloatPixels mix_in_order(const Raw<T> (&p)[4], const LaneWeights<Floats>& weights) {
  Floats alpha[4];
  for (i32 i = 0; i < 4; ++i) alpha[i] = real_channel_of<Floats, 0>(p[i]);
  const Bools<f32> equal = (alpha[0] == alpha[1] && alpha[0] == alpha[2]) && alpha[0] == alpha[3];
  if (all(equal)) return {{alpha[0], in_order<1>(weights.w, p), in_order<2>(weights.w, p), in_order<3>(weights.w, p)}};
  // Lanes of equal alphas are weighted by 1 in its place.
  Floats a[4];
  for (i32 i = 0; i < 4; ++i) a[i] = weights.w[i] * pick(equal, 1.0f, alpha[i]);
  const Floats sum = ((a[0] + a[1]) + a[2]) + a[3];
  const Bools<f32> clear = !equal && sum == 0.0f;
  const Floats limited = pick(equal || sum > 1.0f, 1.0f, sum), inverse = 1.0f / limited;
  const auto colour = [&](Floats c) HWY_ATTR { return pick(clear, 0.0f, inverse * c); };
  return {{pick(clear, 0.0f, pick(equal, alpha[0], limited)), colour(in_order<1>(a, p)), colour(in_order<2>(a, p)),
           colour(in_order<3>(a, p))}};
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
