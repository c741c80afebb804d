// Bilinear samples of straight pixels along a row, on lanes.
#include "sample/lane_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "sample/lane_bilinear.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "sample/lane_four-inl.h"
#include "sample/lane_motion-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <int k, class Real, class T>
HWY_INLINE Real in_pairs(const Real (&w)[4], const Raw<T> (&p)[4]) {
  return (w[0] * real_channel_of<Real, k>(p[0]) + w[1] * real_channel_of<Real, k>(p[1])) +
         (w[2] * real_channel_of<Real, k>(p[2]) + w[3] * real_channel_of<Real, k>(p[3]));
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
    if (all(alpha == 0)) return pick(same, p[0], Raw<T>{});
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

// Weights of a phase in whole sixteenths of a pixel: with 8-bit channels all their products and sums are exact in
// single precision, so that whole numbers give the same.
class Sixteenths {
 public:
  static bool suits(u32 fraction_x, u32 fraction_y) { return ((fraction_x | fraction_y) & 0xfff) == 0; }
  HWY_INLINE Sixteenths(u32 fraction_x, u32 fraction_y) {
    const u32 x = fraction_x >> 12, y = fraction_y >> 12;
    const u32 w[4] = {(16 - x) * (16 - y), x * (16 - y), (16 - x) * y, x * y};  // of 256
    for (i32 i = 0; i < 4; ++i) w_[i] = hn::Set(D(), static_cast<u16>(w[i]));
  }
  // False where alphas differ.
  HWY_INLINE bool mix(const Raw<ZR_Pixel8> (&p)[4], Raw<ZR_Pixel8>* out) const {
    const Ints a = p[0].w[0];
    const Ints difference = ((a ^ p[1].w[0]) | (a ^ p[2].w[0])) | (a ^ p[3].w[0]);
    if (!all(masked(difference, 255) == 0)) return false;
    const D d;
    auto even = hn::Set(d, 128), odd = even;
    for (i32 i = 0; i < 4; ++i) {
      const auto v = hn::BitCast(d, p[i].w[0].v);
      even = hn::Add(even, hn::Mul(hn::And(v, hn::Set(d, 255)), w_[i]));
      odd = hn::Add(odd, hn::Mul(hn::ShiftRight<8>(v), w_[i]));
    }
    const auto both = hn::Or(hn::ShiftRight<8>(even), hn::And(odd, hn::Set(d, 0xff00)));
    const Ints mixed = hn::BitCast(Tag<i32>(), both);
    out->w[0] = pick(difference == 0, a, pick(masked(a, 255) == 0, 0, mixed));
    return true;
  }

 private:
  using D = hn::Repartition<u16, Tag<i32>>;
  hn::Vec<D> w_[4];
};

// A span of 8-bit pixels in such a phase.
template <class Sum>
i32 sixteenth_vectors(const SampleRun& run, const ZR_SampPB& params, Sum* sum, ZR_Pixel8* dst) {
  const u32 fraction_x = static_cast<u32>(run.x) & 0xffff, fraction_y = static_cast<u32>(run.y) & 0xffff;
  const LaneWeights<Floats> phase(Ints(run.x & 0xffff), Ints(run.y & 0xffff));
  const Sixteenths whole(fraction_x, fraction_y);
  using Neighbours = Adjacent<ZR_Pixel8>;
  return sample_vectors<ZR_Pixel8, Neighbours>(run, *params.src, sum, dst,
                                               [&](const Neighbours& at, ZR_Pixel8* out) HWY_ATTR {
                                                 Raw<ZR_Pixel8> upper[2], lower[2], mixed;
                                                 at.row(0, 0, upper);
                                                 at.row(0, 1, lower);
                                                 const Raw<ZR_Pixel8> p[4] = {upper[0], upper[1], lower[0], lower[1]};
                                                 if (!whole.mix(p, &mixed))
                                                   mixed = integer_mix<ZR_Pixel8>(p, phase, Ints(0) != Ints(0));
                                                 return put(mixed, out);
                                               });
}

// The pixels of a vector of floats are loaded and stored as they lie in memory, a fourth of them at a time. In between
// lane 4 * b + k holds the pixel b of part k.
HWY_INLINE Ints together_order() {
  const Ints lane = hn::Iota(Tag<i32>(), 0);
  return masked(lane, 3) * Together::pixels + shifted_right<2>(lane);
}
HWY_INLINE Ints put_together(const Raw<ZR_PixelFloat>& p, ZR_PixelFloat* dst) {
  Ints parts[4];
  transpose_blocks(p.w, parts);
  for (i32 k = 0; k < 4; ++k) hn::StoreU(parts[k].v, Tag<i32>(), reinterpret_cast<i32*>(dst + k * Together::pixels));
  return p.w[0];
}

// Neighbours of positions anywhere.
class TogetherAnywhere {
 public:
  HWY_INLINE TogetherAnywhere(const SampleRun& run, const ZR_LayerDef& src) : at_(run, src) {
    const Ints place = together_order();
    x_ = Ints(run.x) + place * run.step_x, y_ = Ints(run.y) + place * run.step_y;
    stride_x_ = wrap_mul(run.step_x, lane_count()), stride_y_ = wrap_mul(run.step_y, lane_count());
  }
  HWY_INLINE void next() {
    at_.next();
    x_ = x_ + Ints(stride_x_), y_ = y_ + Ints(stride_y_);
  }
  HWY_INLINE Ints fraction_x() const { return masked(x_, 65535); }
  HWY_INLINE Ints fraction_y() const { return masked(y_, 65535); }
  HWY_INLINE void row(i32 dy, Raw<ZR_PixelFloat> (&p)[2]) const {
    for (i32 i = 0; i < 2; ++i) {
      Ints parts[4];
      for (i32 k = 0; k < 4; ++k) parts[k] = at_.together(k, i, dy);
      transpose_blocks(parts, p[i].w);
    }
  }

 private:
  Scattered<ZR_PixelFloat> at_;
  Ints x_, y_;
  i32 stride_x_, stride_y_;
};

// The same for positions along a row of the source, not more than a pixel apart: a vector of pixels holds the left
// neighbours, and the one a pixel further the right ones.
class TogetherAlong {
 public:
  static bool suits(const SampleRun& run) { return run.step_y == 0 && run.step_x > 0 && run.step_x <= 0x10000; }
  HWY_INLINE TogetherAlong(const SampleRun& run, const ZR_LayerDef& src)
      : row_(static_cast<const char*>(src.data) + static_cast<std::ptrdiff_t>(run.y >> 16) * src.row_bytes),
        row_bytes_(src.row_bytes),
        width_(src.width),
        step_(run.step_x),
        x_(run.x),
        y_(run.y) {}
  HWY_INLINE void next() { x_ += step_ * lane_count(); }
  HWY_INLINE Ints fraction_x() const { return masked(Ints(x_) + together_order() * step_, 65535); }
  HWY_INLINE Ints fraction_y() const { return y_ & 0xffff; }
  HWY_INLINE void row(i32 dy, Raw<ZR_PixelFloat> (&p)[2]) const {
    const Tag<i32> d;
    const Ints lane = hn::Iota(d, 0), steps = shifted_right<2>(lane) * step_;
    const char* const line = row_ + dy * static_cast<std::ptrdiff_t>(row_bytes_);
    Ints parts[2][4];
    for (i32 k = 0; k < 4; ++k) {
      const i32 start = x_ + k * Together::pixels * step_, first = start >> 16;
      const Ints place = shifted_left<2>(shifted_right<16>(steps + (start & 0xffff))) + masked(lane, 3);
      const auto indices = hn::IndicesFromVec(d, place.v);
      for (i32 i = 0; i < 2; ++i) {
        const char* const at = line + static_cast<std::ptrdiff_t>(first + i) * i32{sizeof(ZR_PixelFloat)};
        parts[i][k] = whole_window(first)
                          ? Ints(hn::TableLookupLanes(hn::LoadU(d, reinterpret_cast<const i32*>(at)), indices))
                          : single_pixels(at, start, first);
      }
    }
    for (i32 i = 0; i < 2; ++i) transpose_blocks(parts[i], p[i].w);
  }

 private:
  HWY_INLINE bool whole_window(i32 first) const { return width_ - first > Together::pixels; }
  HWY_INLINE Ints single_pixels(const char* at, i32 start, i32 first) const {
    i64 offsets[Together::pixels];
    for (i32 i = 0; i < Together::pixels; ++i)
      offsets[i] = i64{((start + i * step_) >> 16) - first} * i64{sizeof(ZR_PixelFloat)};
    return load_pixels(Tag<i32>(), at, offsets);
  }

  const char* row_;
  i32 row_bytes_, width_, step_, x_, y_;
};

template <class Neighbours>
i32 float_vectors(const SampleRun& run, const ZR_SampPB& params, FloatAlphas* sum, ZR_PixelFloat* dst) {
  return sample_vectors<ZR_PixelFloat, Neighbours>(
      run, *params.src, sum, dst, [&](const Neighbours& at, ZR_PixelFloat* out) HWY_ATTR {
        Raw<ZR_PixelFloat> upper[2], lower[2];
        at.row(0, upper);
        at.row(1, lower);
        const Raw<ZR_PixelFloat> p[4] = {upper[0], upper[1], lower[0], lower[1]};
        return put_together(as_raw(mix_in_order(p, LaneWeights<Floats>(at.fraction_x(), at.fraction_y()))), out);
      });
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
    return as_raw(mix_in_order(p, weights));
  else
    return integer_mix<T>(p, weights, takes_first);
}

template <class T, class Neighbours, class Sum>
i32 bilinear_vectors(const SampleRun& run, const ZR_SampPB& params, Sum* sum, T* dst) {
  using Weights = LaneWeights<RealOf<T>>;
  const Weights phase(run.x & 0xffff, run.y & 0xffff);
  return sample_vectors<T, Neighbours>(run, *params.src, sum, dst, [&](const Neighbours& at, T* out) HWY_ATTR {
    const Weights weights = Neighbours::one_phase ? phase : Weights(at.fraction_x(), at.fraction_y());
    return put(mixed_at<T>(at, weights, Neighbours::one_phase ? Ints(0) != Ints(0) : at.whole()), out);
  });
}

// Any steps.
template <class T>
i32 bilinear_row(const SampleRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    if (TogetherAlong::suits(run)) return float_vectors<TogetherAlong>(run, params, sum, dst);
    return float_vectors<TogetherAnywhere>(run, params, sum, dst);
  } else {
    if (Windowed<T, 2>::suits(run)) return bilinear_vectors<T, Windowed<T, 2>>(run, params, sum, dst);
    return bilinear_vectors<T, Scattered<T>>(run, params, sum, dst);
  }
}

// Steps of one pixel.
template <class T>
i32 bilinear_span_row(const SampleRun& run, const ZR_SampPB& params, AlphaSum<T>* sum, T* dst) {
  if constexpr (std::is_same_v<T, ZR_Pixel8>)
    if (Sixteenths::suits(static_cast<u32>(run.x) & 0xffff, static_cast<u32>(run.y) & 0xffff))
      return sixteenth_vectors(run, params, sum, dst);
  return bilinear_vectors<T, Adjacent<T>>(run, params, sum, dst);
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

template <class T>
i32 bilinear_weighted_motion(const MotionRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  using Weights = LaneWeights<RealOf<T>>;
  const SampleLine line(run.first.x, run.first.y, run.last.x, run.last.y, run.samples);
  const InnerSamples inner = copies_whole<T> ? inner_samples(line) : InnerSamples{1, run.samples - 1};
  return weighted_vectors<T>(
      run, line, inner.end, *params.src, sum,
      dst, [&](const Adjacent<T>& at, i32 k) HWY_ATTR __attribute__((always_inline)) {
        const bool walked = k >= inner.first && k < inner.end;
        const Weights weights = walked ? Weights(run.weights[k]) : Weights(at.fraction_x(), at.fraction_y());
        return mixed_at<T>(at, weights, at.whole());
      });
}

template <class T>
const LaneRows<T>* bilinear_rows() {
  static constexpr LaneRows<T> rows = [] {
    LaneRows<T> r = {nullptr, &bilinear_span_row<T>, nullptr, &bilinear_weighted_motion<T>};
    if constexpr (gains_from_lanes<T>) {
      r.no_clip = &bilinear_row<T>;
      r.motion = &bilinear_motion<T>;
    }
    return r;
  }();
  return &rows;
}
ZR_ROWS_OF_DEPTHS(const LaneRows, bilinear_rows)

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_ROWS(const LaneRows, bilinear_rows)
#endif
