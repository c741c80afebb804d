// Pixels in motion on lanes: sums of samples weighted by alpha, their means, and the walk along a row of which every
// pixel has its own line of samples.
#if defined(ZR_SAMPLE_LANE_MOTION_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SAMPLE_LANE_MOTION_INL_H
#undef ZR_SAMPLE_LANE_MOTION_INL_H
#else
#define ZR_SAMPLE_LANE_MOTION_INL_H
#endif

#include "sample/lane_samples-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// Toward zero, for a divisor of at least 1. A double's quotient of such numbers is never rounded up to an integer.
HWY_INLINE Ints quotient(Ints a, Ints b) { return fitting_int(to_double(a) / to_double(b)); }
HWY_INLINE Ints quotient(Ints a, i32 b) { return fitting_int(to_double(a) / Doubles(static_cast<f64>(b))); }

// Alphas and colours times alphas of up to most_lane_samples samples.
template <class T>
struct MotionSums;

template <>
struct MotionSums<ZR_Pixel8> {
  Ints alpha, colour[3];

  HWY_INLINE MotionSums() : alpha(0) {
    for (Ints& c : colour) c = 0;
  }

  HWY_INLINE void add(const Raw<ZR_Pixel8>& p) {
    const hn::Repartition<u16, Tag<i32>> narrow;
    const Ints a = channel_of<0>(p);
    const auto product = [&](Ints c) HWY_ATTR {  // fits 16 bits
      return Ints(hn::BitCast(Tag<i32>(), hn::Mul(hn::BitCast(narrow, a.v), hn::BitCast(narrow, c.v))));
    };
    alpha = alpha + a;
    colour[0] = colour[0] + product(channel_of<1>(p));
    colour[1] = colour[1] + product(channel_of<2>(p));
    colour[2] = colour[2] + product(channel_of<3>(p));
  }
  HWY_INLINE Raw<ZR_Pixel8> mean(i32 samples) const {
    const Bools<i32> clear = alpha == 0, opaque = alpha == samples * 255;
    const Ints divisor = pick(clear, 1, alpha);
    const Floats n(static_cast<f32>(samples));
    const auto one = [&](Ints sum) HWY_ATTR {
      return masked(choose(
                        opaque, [&]() HWY_ATTR { return Primitive<ZR_Pixel8>::fold(fitting_int(to_float(sum) / n)); },
                        [&]() HWY_ATTR { return quotient(sum, divisor); }),
                    255);
    };
    return packed<ZR_Pixel8>(quotient(alpha, samples), one(colour[0]), one(colour[1]), one(colour[2]));
  }
};

template <>
struct MotionSums<ZR_Pixel16> {
  using Words = hn::Rebind<u32, Tag<i32>>;
  using Pairs = hn::RepartitionToWide<Words>;
  // Of the even lanes and of the odd ones; below 2^52.
  struct Wide {
    hn::Vec<Pairs> even, odd;
  };
  Ints alpha;
  Wide colour[3];

  HWY_INLINE MotionSums() : alpha(0) {
    for (Wide& c : colour) c.even = c.odd = hn::Zero(Pairs());
  }

  HWY_INLINE void add(const Raw<ZR_Pixel16>& p) {
    const Words d;
    const auto a = hn::BitCast(d, channel_of<0>(p).v);
    const Pairs pairs;
    const auto odd = [&](auto v) HWY_ATTR { return hn::BitCast(d, hn::ShiftRight<32>(hn::BitCast(pairs, v))); };
    const auto odd_a = odd(a);
    const auto one = [&](Wide& sum, Ints channel) HWY_ATTR {
      const auto c = hn::BitCast(d, channel.v);
      sum.even = hn::Add(sum.even, hn::MulEven(a, c));
      sum.odd = hn::Add(sum.odd, hn::MulEven(odd_a, odd(c)));
    };
    alpha = hn::Add(alpha.v, hn::BitCast(Tag<i32>(), a));
    one(colour[0], channel_of<1>(p));
    one(colour[1], channel_of<2>(p));
    one(colour[2], channel_of<3>(p));
  }
  HWY_INLINE Raw<ZR_Pixel16> mean(i32 samples) const {
    const Words d;
    const Pairs pairs;
    const Bools<i32> opaque = alpha == samples * 32768;
    const auto divisor = hn::BitCast(pairs, pick(alpha == 0, 1, alpha).v);
    const auto even = as_double(hn::And(divisor, hn::Set(pairs, 0xffffffffu)));
    const auto odd = as_double(hn::ShiftRight<32>(divisor));
    const auto one = [&](const Wide& sum) HWY_ATTR {
      const Ints c = choose(
          opaque,
          [&]() HWY_ATTR {
            const auto part = [&](auto v) HWY_ATTR {
              const HalfFloats half;
              const Tag<f64> wide;
              // A quotient of two floats, rounded to double and then to float, is the one rounded to float.
              const auto single = hn::PromoteTo(wide, hn::DemoteTo(half, as_double(v)));
              const auto n = hn::Set(wide, static_cast<f64>(static_cast<f32>(samples)));
              const auto product = hn::PromoteTo(wide, hn::DemoteTo(half, hn::Div(single, n)));
              return hn::ShiftRight<15>(hn::Add(whole(product), hn::Set(pairs, 16383)));
            };
            return joined(part(sum.even), part(sum.odd));
          },
          [&]() HWY_ATTR {
            return joined(whole(hn::Div(as_double(sum.even), even)), whole(hn::Div(as_double(sum.odd), odd)));
          });
      return masked(c, 65535);
    };
    return packed<ZR_Pixel16>(quotient(alpha, samples), one(colour[0]), one(colour[1]), one(colour[2]));
  }

 private:
  // Whole numbers below 2^52 lie that much above 2^52 when they are its fraction.
  static HWY_INLINE hn::Vec<Tag<f64>> as_double(hn::Vec<Pairs> v) {
    const Tag<f64> d;
    const auto base = hn::Set(d, 0x1p52);
    return hn::Sub(hn::BitCast(d, hn::Or(v, hn::BitCast(Pairs(), base))), base);
  }
  static HWY_INLINE hn::Vec<Pairs> whole(hn::Vec<Tag<f64>> v) {
    const auto base = hn::Set(Tag<f64>(), 0x1p52);
    return hn::Xor(hn::BitCast(Pairs(), hn::Add(hn::Trunc(v), base)), hn::BitCast(Pairs(), base));
  }
  static HWY_INLINE Ints joined(hn::Vec<Pairs> even, hn::Vec<Pairs> odd) {
    return hn::BitCast(Tag<i32>(), hn::Or(even, hn::ShiftLeft<32>(odd)));
  }
};

template <>
struct MotionSums<ZR_PixelFloat> {
  Floats alpha, colour[3];

  HWY_INLINE MotionSums() : alpha(0.0f) {
    for (Floats& c : colour) c = 0.0f;
  }

  HWY_INLINE void add(const Raw<ZR_PixelFloat>& p) {
    const Floats a = as_floats(p.w[0]);
    alpha = alpha + a;
    for (i32 k = 0; k < 3; ++k) colour[k] = colour[k] + a * as_floats(p.w[k + 1]);
  }
  HWY_INLINE Raw<ZR_PixelFloat> mean(i32 samples) const {
    const Floats n(static_cast<f32>(samples));
    const Bools<f32> clear = alpha == 0.0f;
    const Floats divisor = pick(alpha == n, n, alpha);
    const auto one = [&](Floats sum, Floats by) HWY_ATTR { return as_ints(pick(clear, 0.0f, sum / by)); };
    return {{one(alpha, n), one(colour[0], divisor), one(colour[1], divisor), one(colour[2], divisor)}};
  }
};

// Of each lane, the first sample that is counted from the last one.
template <bool copies_whole>
HWY_INLINE Ints late_samples(Ints x0, Ints y0, Ints x1, Ints y1, Ints dx, Ints dy, i32 samples) {
  if constexpr (copies_whole) {
    const Bools<i32> unusual = masked(x1 | y1, 65535) == 0 || masked((x0 | y0) | (dx | dy), 65535) == 0;
    if (!none(unusual)) {
      constexpr i32 lanes = lane_count();
      alignas(64) i32 at[4][lanes];
      const Tag<i32> d;
      hn::Store(x0.v, d, at[0]), hn::Store(y0.v, d, at[1]), hn::Store(x1.v, d, at[2]), hn::Store(y1.v, d, at[3]);
      for (i32 i = 0; i < lanes; ++i) at[0][i] = inner_samples({at[0][i], at[1][i], at[2][i], at[3][i], samples}).end;
      return hn::Load(d, at[0]);
    }
  }
  return samples - 1;
}

// The whole vectors of a run: sample(x, y) gives the pixels at a vector of positions.
template <class T, bool copies_whole, class Sample>
HWY_INLINE i32 motion_vectors(const MotionRun& run, RowSum<T>* sum, T* dst, Sample sample) {
  constexpr i32 lanes = lane_count();
  const Ints place = hn::Iota(Tag<i32>(), 0);
  const auto start = [&](i32 at, i32 step) HWY_ATTR { return Ints(at) + place * step; };
  const auto stride = [](i32 step) HWY_ATTR { return Ints(wrap_mul(step, lanes)); };
  const SampleRun &opens = run.first, &closes = run.last;
  Ints x0 = start(opens.x, opens.step_x), y0 = start(opens.y, opens.step_y);
  Ints x1 = start(closes.x, closes.step_x), y1 = start(closes.y, closes.step_y);
  AlphaSums<T, RowSum<T>> alphas(sum);
  i32 i = 0;
  for (; opens.count - i >= lanes; i += lanes) {
    const Ints dx = quotient(x1 - x0, run.samples - 1), dy = quotient(y1 - y0, run.samples - 1);
    const Ints late = late_samples<copies_whole>(x0, y0, x1, y1, dx, dy, run.samples);
    const Ints rest_x = x1 - x0 - dx * (run.samples - 1), rest_y = y1 - y0 - dy * (run.samples - 1);
    Ints x = x0, y = y0;
    MotionSums<T> sums;
    for (i32 k = 0; k < run.samples; ++k, x = x + dx, y = y + dy) {
      const Bools<i32> from_last = Ints(k) >= late;
      sums.add(sample(x + pick(from_last, rest_x, 0), y + pick(from_last, rest_y, 0)));
    }
    alphas.add(put(sums.mean(run.samples), dst + i), dst + i);
    x0 = x0 + stride(opens.step_x), y0 = y0 + stride(opens.step_y);
    x1 = x1 + stride(closes.step_x), y1 = y1 + stride(closes.step_y);
  }
  alphas.flush();
  return i;
}

// The same for runs with weights: every sample has one phase for all pixels, and its neighbours lie side by side.
// sample(neighbours, k) gives the pixels of sample k; it has to be inlined, lest neighbours go by way of memory. From
// `late` on samples are counted from the last one.
template <class T, class Sample>
HWY_INLINE i32 weighted_vectors(const MotionRun& run, const SampleLine& line, i32 late, const ZR_LayerDef& src,
                                RowSum<T>* sum, T* dst, Sample sample) {
  constexpr i32 lanes = lane_count();
  const i32 n = run.samples;
  AlphaSums<T, RowSum<T>> alphas(sum);
  i32 i = 0;
  for (; run.first.count - i >= lanes; i += lanes) {
    MotionSums<T> sums;
    for (i32 k = 0; k < n; ++k) {
      const GX_LPoint p = k < late ? line.from_first(k) : line.from_last(n - 1 - k);
      sums.add(sample(Adjacent<T>({lanes, p.x + i * 0x10000, p.y, 0x10000, 0}, src), k));
    }
    alphas.add(put(sums.mean(n), dst + i), dst + i);
  }
  alphas.flush();
  return i;
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
