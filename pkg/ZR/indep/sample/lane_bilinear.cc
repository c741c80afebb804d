// Bilinear samples of straight pixels along a row, on lanes.
#include "sample/lane_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "sample/lane_bilinear.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "sample/lane_motion-inl.h"

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

template <int k, class Real, class T>
HWY_INLINE Real in_pairs(const Real (&w)[4], const Raw<T> (&p)[4]) {
  return (w[0] * real_channel_of<Real, k>(p[0]) + w[1] * real_channel_of<Real, k>(p[1])) +
         (w[2] * real_channel_of<Real, k>(p[2]) + w[3] * real_channel_of<Real, k>(p[3]));
}
template <int k, class T>
HWY_INLINE Floats in_order(const Floats (&w)[4], const Raw<T> (&p)[4]) {
  return ((w[0] * real_channel_of<Floats, k>(p[0]) + w[1] * real_channel_of<Floats, k>(p[1])) +
          w[2] * real_channel_of<Floats, k>(p[2])) +
         w[3] * real_channel_of<Floats, k>(p[3]);
}

// Weights are within a rounding of 0..1, so that all results fit their channels. `takes_first`: lanes that copy the
// upper left neighbour whatever it holds.
template <class T, class Real>
HWY_INLINE Raw<T> integer_mix(const Raw<T> (&p)[4], const LaneWeights<Real>& weights, Bools<i32> takes_first) {
  const auto difference = [&](i32 i) HWY_ATTR {
    return ((p[0].w[i] ^ p[1].w[i]) | (p[0].w[i] ^ p[2].w[i])) | (p[0].w[i] ^ p[3].w[i]);
  };
  const Ints first = difference(0);
  Ints any = first;
  for (i32 i = 1; i < Raw<T>::words; ++i) any = any | difference(i);
  const Bools<i32> same = takes_first || any == 0;
  if (all(same)) return p[0];
  const Bools<i32> equal = masked(first, std::numeric_limits<Channel<T>>::max()) == 0;
  const Real half(0.5f);
  const Ints alpha = channel_of<0>(p[0]);
  if (all(equal)) {
    const auto colour = [&](Real c) HWY_ATTR { return fitting_int(c + half); };
    const Raw<T> mixed = packed<T>(alpha, colour(in_pairs<1>(weights.w, p)), colour(in_pairs<2>(weights.w, p)),
                                   colour(in_pairs<3>(weights.w, p)));
    return pick(same, p[0], pick(alpha == 0, Raw<T>{}, mixed));
  }
  // Lanes of equal alphas are weighted by 1 in its place.
  Real a[4];
  for (i32 i = 0; i < 4; ++i) a[i] = weights.w[i] * to_real<Real>(pick(equal, 1, channel_of<0>(p[i])));
  const Real sum = (a[0] + a[1]) + (a[2] + a[3]);
  const Bools<i32> clear = pick(equal, alpha, fitting_int(sum + sum)) == 0;
  const Real inverse = pick_real(equal, Real(1.0f), Real(1.0f) / sum);
  const auto colour = [&](Real c) HWY_ATTR { return fitting_int(inverse * c + half); };
  const Raw<T> mixed = packed<T>(pick(equal, alpha, fitting_int(sum + half)), colour(in_pairs<1>(a, p)),
                                 colour(in_pairs<2>(a, p)), colour(in_pairs<3>(a, p)));
  return pick(same, p[0], pick(clear, Raw<T>{}, mixed));
}

HWY_INLINE Raw<ZR_PixelFloat> float_mix(const Raw<ZR_PixelFloat> (&p)[4], const LaneWeights<Floats>& weights) {
  Floats alpha[4];
  for (i32 i = 0; i < 4; ++i) alpha[i] = as_floats(p[i].w[0]);
  const Bools<f32> equal = (alpha[0] == alpha[1] && alpha[0] == alpha[2]) && alpha[0] == alpha[3];
  if (all(equal))
    return {{p[0].w[0], as_ints(in_order<1>(weights.w, p)), as_ints(in_order<2>(weights.w, p)),
             as_ints(in_order<3>(weights.w, p))}};
  Floats a[4];
  for (i32 i = 0; i < 4; ++i) a[i] = weights.w[i] * pick(equal, 1.0f, alpha[i]);
  const Floats sum = ((a[0] + a[1]) + a[2]) + a[3];
  const Bools<f32> clear = !equal && sum == 0.0f;
  const Floats limited = pick(equal || sum > 1.0f, 1.0f, sum), inverse = 1.0f / limited;
  const auto colour = [&](Floats c) HWY_ATTR { return as_ints(pick(clear, 0.0f, inverse * c)); };
  return {{as_ints(pick(clear, 0.0f, pick(equal, alpha[0], limited))), colour(in_order<1>(a, p)),
           colour(in_order<2>(a, p)), colour(in_order<3>(a, p))}};
}

// Where all alphas agree, pixels stay as they lie in memory: channels are pulled apart for the others only.
template <int k>
HWY_INLINE void put_blocks(const Ints (&v)[4][4], const LaneWeights<Floats>& weights, Bools<f32> first,
                           ZR_PixelFloat* out) {
  const auto weighted = [&](i32 i) HWY_ATTR { return Floats(hn::Broadcast<k>(weights.w[i].v)) * as_floats(v[i][k]); };
  const Floats sum = ((weighted(0) + weighted(1)) + weighted(2)) + weighted(3);
  store_blocks(Tag<f32>(), pick(first, as_floats(v[0][k]), sum).v, out + k);
}
HWY_INLINE Ints put_scattered_floats(const Scattered<ZR_PixelFloat>& at, const LaneWeights<Floats>& weights,
                                     ZR_PixelFloat* out) {
  Ints v[4][4];
  for (i32 i = 0; i < 4; ++i) at.blocks(i & 1, i >> 1, v[i]);
  const Ints place = hn::Iota(Tag<i32>(), 0);
  const Bools<f32> first = {hn::RebindMask(Tag<f32>(), (masked(place, 3) == 0).mask)};
  Bools<f32> equal = Floats(0.0f) == Floats(0.0f), one = equal;
  for (i32 k = 0; k < 4; ++k) {
    const Floats p = as_floats(v[0][k]);
    equal = equal && p == as_floats(v[1][k]) && p == as_floats(v[2][k]) && p == as_floats(v[3][k]);
    one = one && p == 1.0f;
  }
  if (all(equal || !first)) {
    put_blocks<0>(v, weights, first, out);
    put_blocks<1>(v, weights, first, out);
    put_blocks<2>(v, weights, first, out);
    put_blocks<3>(v, weights, first, out);
    return as_ints(pick(one || !first, 1.0f, 0.0f));  // enough to tell whether all are 1
  }
  Raw<ZR_PixelFloat> p[4];
  for (i32 i = 0; i < 4; ++i) transpose_blocks(v[i], p[i].w);
  return put(float_mix(p, weights), out);
}

template <class T>
using RealOf = std::conditional_t<std::is_same_v<T, ZR_Pixel16>, Doubles, Floats>;

template <class T, class Neighbours>
HWY_INLINE Raw<T> mixed_at(const Neighbours& at, const LaneWeights<RealOf<T>>& weights, Bools<i32> takes_first) {
  Raw<T> upper[2], lower[2];
  at.row(0, 0, upper);
  at.row(0, 1, lower);
  const Raw<T> p[4] = {upper[0], upper[1], lower[0], lower[1]};
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return float_mix(p, weights);
  else
    return integer_mix<T>(p, weights, takes_first);
}

template <class T, class Neighbours, class Sum>
i32 bilinear_vectors(const SampleRun& run, const ZR_SampPB& params, Sum* sum, T* dst) {
  using Weights = LaneWeights<RealOf<T>>;
  const Weights phase(run.x & 0xffff, run.y & 0xffff);
  return sample_vectors<T, Neighbours>(run, *params.src, sum, dst, [&](const Neighbours& at, T* out) HWY_ATTR {
    const Weights weights = Neighbours::one_phase ? phase : Weights(at.fraction_x(), at.fraction_y());
    if constexpr (std::is_same_v<Neighbours, Scattered<ZR_PixelFloat>>)
      return put_scattered_floats(at, weights, out);
    else
      return put(mixed_at<T>(at, weights, Neighbours::one_phase ? Ints(0) != Ints(0) : at.whole()), out);
  });
}

// Any steps.
template <class T>
i32 bilinear_row(const SampleRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  if constexpr (!std::is_same_v<T, ZR_PixelFloat>)
    if (Windowed<T, 2>::suits(run)) return bilinear_vectors<T, Windowed<T, 2>>(run, params, sum, dst);
  return bilinear_vectors<T, Scattered<T>>(run, params, sum, dst);
}

// Integer depths say of whole positions that they are not inside, and copy them.
template <class T>
inline constexpr bool copies_whole = !std::is_same_v<T, ZR_PixelFloat>;

template <class T>
i32 bilinear_motion(const MotionRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  Scattered<T> at(*params.src);
  return motion_vectors<T, copies_whole<T>>(run, sum, dst, [&](Ints x, Ints y) HWY_ATTR {
    at.move_to(x, y);
    return mixed_at<T>(at, LaneWeights<RealOf<T>>(at.fraction_x(), at.fraction_y()), at.whole());
  });
}

// Every sample has one phase for all pixels, and its neighbours lie side by side.
template <class T>
i32 bilinear_weighted_motion(const MotionRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  constexpr i32 lanes = lane_count();
  const i32 n = run.samples;
  const SampleLine line(run.first.x, run.first.y, run.last.x, run.last.y, n);
  const InnerSamples inner = copies_whole<T> ? inner_samples(line) : InnerSamples{1, n - 1};
  AlphaSums<T, RowSum<T>> alphas(sum);
  i32 i = 0;
  for (; run.first.count - i >= lanes; i += lanes) {
    MotionSums<T> sums;
    for (i32 k = 0; k < n; ++k) {
      const GX_LPoint p = k < inner.end ? line.from_first(k) : line.from_last(n - 1 - k);
      const Adjacent<T> at({lanes, p.x + i * 0x10000, p.y, 0x10000, 0}, *params.src);
      using Weights = LaneWeights<RealOf<T>>;
      const bool walked = k >= inner.first && k < inner.end;
      const Weights weights = walked ? Weights(run.weights[k]) : Weights(at.fraction_x(), at.fraction_y());
      sums.add(mixed_at<T>(at, weights, at.whole()));
    }
    alphas.add(put(sums.mean(n), dst + i), dst + i);
  }
  alphas.flush();
  return i;
}

template <class T>
const LaneRows<T>* bilinear_rows() {
  static constexpr LaneRows<T> rows = [] {
    LaneRows<T> r = {nullptr, &bilinear_vectors<T, Adjacent<T>, AlphaSum<T>>, nullptr, &bilinear_weighted_motion<T>};
    if constexpr (gains_from_lanes<T>) {
      r.no_clip = &bilinear_row<T>;
      r.motion = &bilinear_motion<T>;
    }
    return r;
  }();
  return &rows;
}
template const LaneRows<ZR_Pixel8>* bilinear_rows<ZR_Pixel8>();
template const LaneRows<ZR_Pixel16>* bilinear_rows<ZR_Pixel16>();
template const LaneRows<ZR_PixelFloat>* bilinear_rows<ZR_PixelFloat>();

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class T>
const LaneRows<T>* lane_bilinear_rows() {
  ZR_RETURN_BEST(bilinear_rows<T>());
  return nullptr;
}
template const LaneRows<ZR_Pixel8>* lane_bilinear_rows<ZR_Pixel8>();
template const LaneRows<ZR_Pixel16>* lane_bilinear_rows<ZR_Pixel16>();
template const LaneRows<ZR_PixelFloat>* lane_bilinear_rows<ZR_PixelFloat>();

}  // namespace zr
#endif
