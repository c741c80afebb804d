// Cubic convolution along a row, on lanes.
#include "sample/lane_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "sample/lane_bicubic.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "sample/lane_four-inl.h"
#include "sample/lane_motion-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

struct LaneCubicWeights {
  Floats w[4];

  explicit HWY_INLINE LaneCubicWeights(Ints fraction) {
    const Doubles f = to_double(fraction) * 0x1p-16, one(1.0);
    const auto near = [&](Doubles t) HWY_ATTR { return narrowed((t * 1.25 - 2.25) * t * t + one); };
    const auto far = [&](Doubles t) HWY_ATTR { return narrowed(((t * -0.75 + 3.75) * t - 6.0) * t + 3.0); };
    w[0] = far(one + f), w[1] = near(f), w[2] = near(one - f), w[3] = far(Doubles(2.0) - f);
  }
};

HWY_INLINE Floats in_order(const Floats (&w)[4], const FloatPixels (&p)[4], i32 k) {
  return ((w[0] * p[0].c[k] + w[1] * p[1].c[k]) + w[2] * p[2].c[k]) + w[3] * p[3].c[k];
}

// Four pixels into one: where their alphas differ colour is weighted by alpha and divided by its sum.
HWY_INLINE FloatPixels convolve(const Floats (&w)[4], const FloatPixels (&p)[4]) {
  const Floats alpha = p[0].c[0];
  const Bools<f32> equal = (alpha == p[1].c[0] && alpha == p[2].c[0]) && alpha == p[3].c[0];
  if (all(equal)) return {{alpha, in_order(w, p, 1), in_order(w, p, 2), in_order(w, p, 3)}};
  // Lanes of equal alphas are weighted by 1 in its place.
  Floats b[4];
  for (i32 i = 0; i < 4; ++i) b[i] = w[i] * pick(equal, 1.0f, p[i].c[0]);
  const Floats sum = ((b[0] + b[1]) + b[2]) + b[3];
  const Bools<f32> clear = !equal && sum == 0.0f;
  const Floats inverse = pick(equal, 1.0f, 1.0f / sum);
  const auto colour = [&](i32 k) HWY_ATTR { return pick(clear, 0.0f, inverse * in_order(b, p, k)); };
  return {{pick(clear, 0.0f, pick(equal, alpha, sum)), colour(1), colour(2), colour(3)}};
}

template <class T>
HWY_INLINE Raw<T> limited(const FloatPixels& p) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    const Floats alpha = p.c[0];
    const Floats held = pick(alpha > 1.0f, 1.0f, pick(alpha < 1e-16f, 0.0f, alpha));
    return {{as_ints(held), as_ints(p.c[1]), as_ints(p.c[2]), as_ints(p.c[3])}};
  } else {
    // An alpha that counts as none is none on the channel's scale too, so that one rule serves all channels.
    constexpr f32 white = static_cast<f32>(Depth<T>::white);
    const auto channel = [](Floats c) HWY_ATTR {
      const Floats scaled = c * (1.0f / white) * white;
      const Floats rounded = pick(scaled > 0.0f, scaled, 0.0f) + 0.5f;
      return fitting_int(pick(rounded < white, rounded, white));
    };
    return packed<T>(channel(p.c[0]), channel(p.c[1]), channel(p.c[2]), channel(p.c[3]));
  }
}

template <class T, class Neighbours>
HWY_INLINE Raw<T> convolved_at(const Neighbours& at, const LaneCubicWeights& across, const LaneCubicWeights& down) {
  FloatPixels rows[4];
  for (i32 j = 0; j < 4; ++j) {
    Raw<T> raw[4];
    at.row(-1, j - 1, raw);
    FloatPixels p[4];
    for (i32 i = 0; i < 4; ++i)
      p[i] = {{real_channel_of<Floats, 0>(raw[i]), real_channel_of<Floats, 1>(raw[i]),
               real_channel_of<Floats, 2>(raw[i]), real_channel_of<Floats, 3>(raw[i])}};
    rows[j] = convolve(across.w, p);
  }
  return limited<T>(convolve(down.w, rows));
}

template <class T, class Neighbours, class Sum>
i32 bicubic_vectors(const SampleRun& run, const ZR_SampPB& params, Sum* sum, T* dst) {
  const LaneCubicWeights phase_across(Ints(run.x & 0xffff)), phase_down(Ints(run.y & 0xffff));
  return sample_vectors<T, Neighbours>(run, *params.src, sum, dst, [&](const Neighbours& at, T* out) HWY_ATTR {
    if constexpr (Neighbours::one_phase)
      return put(convolved_at<T>(at, phase_across, phase_down), out);
    else
      return put(convolved_at<T>(at, LaneCubicWeights(at.fraction_x()), LaneCubicWeights(at.fraction_y())), out);
  });
}

template <class T>
i32 bicubic_motion(const MotionRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  Scattered<T> at(*params.src);
  return motion_vectors<T, false>(run, sum, dst, [&](Ints x, Ints y) HWY_ATTR {
    at.move_to(x, y);
    return convolved_at<T>(at, LaneCubicWeights(at.fraction_x()), LaneCubicWeights(at.fraction_y()));
  });
}

// By the given weights, cut to the channels' low bits.
template <class T, class Neighbours>
HWY_INLINE Raw<T> four_neighbours_at(const Neighbours& at, const LaneWeights<Floats>& weights) {
  Raw<T> upper[2], lower[2];
  at.row(0, 0, upper);
  at.row(0, 1, lower);
  const FloatPixels mixed = mix_in_order<T>({upper[0], upper[1], lower[0], lower[1]}, weights);
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    return as_raw(mixed);
  } else {
    const auto channel = [](Floats c) HWY_ATTR {
      const Floats rounded = c + 0.5f;  // what needs more than 31 bits counts as 2^31, whose low bits are 0
      return masked(fitting_int(pick(rounded < 0x1p31f, rounded, 0.0f)), std::numeric_limits<Channel<T>>::max());
    };
    return packed<T>(channel(mixed.c[0]), channel(mixed.c[1]), channel(mixed.c[2]), channel(mixed.c[3]));
  }
}

// The first and the last sample are convolved, those between them are of four neighbours.
template <class T>
i32 bicubic_weighted_motion(const MotionRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  const LaneCubicWeights across[2] = {LaneCubicWeights(Ints(run.first.x & 0xffff)),
                                      LaneCubicWeights(Ints(run.last.x & 0xffff))};
  const LaneCubicWeights down[2] = {LaneCubicWeights(Ints(run.first.y & 0xffff)),
                                    LaneCubicWeights(Ints(run.last.y & 0xffff))};
  const SampleLine line(run.first.x, run.first.y, run.last.x, run.last.y, run.samples);
  const i32 last = run.samples - 1;
  return weighted_vectors<T>(
      run, line, last, *params.src, sum,
      dst, [&](const Adjacent<T>& at, i32 k) HWY_ATTR __attribute__((always_inline)) {
        if (k == 0 || k == last) return convolved_at<T>(at, across[k != 0], down[k != 0]);
        return four_neighbours_at<T>(at, LaneWeights<Floats>(run.weights[k]));
      });
}

template <class T>
const LaneRows<T>* bicubic_rows() {
  static constexpr LaneRows<T> rows = [] {
    LaneRows<T> r = {nullptr, &bicubic_vectors<T, Adjacent<T>, AlphaSum<T>>, nullptr, &bicubic_weighted_motion<T>};
    if constexpr (gains_from_lanes<T>) {
      r.no_clip = &bicubic_vectors<T, Scattered<T>, RowSum<T>>;
      r.motion = &bicubic_motion<T>;
    }
    return r;
  }();
  return &rows;
}
ZR_ROWS_OF_DEPTHS(const LaneRows, bicubic_rows)

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_ROWS(const LaneRows, bicubic_rows)
#endif
