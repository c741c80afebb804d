// The Gaussian blur's inner loop on lanes, for positions whose taps all lie in the line.
#include "filter/bell_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "filter/lane_bell_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "filter/lane_pixels-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// Sums of a depth for `channels_at_once` channels from channel c on, and what is made of them.
template <class T, bool straight>
struct BellLanes;

template <bool straight>
struct BellLanes<ZR_Pixel8, straight> {
  using Shorts = hn::Vec<hn::Repartition<i16, Tag<i32>>>;
  static constexpr i32 channels_at_once = 2 * lane_count();

  const BellRun<ZR_Pixel8>& run;
  const Ints half;
  const ExactDivision division;

  HWY_INLINE explicit BellLanes(const BellRun<ZR_Pixel8>& r)
      : run(r), half(r.divisor / 2), division(ExactReciprocal::of(r.divisor)) {}

  static HWY_INLINE Shorts bytes_at(const u8* p) {
    const hn::Repartition<i16, Tag<i32>> d;
    return hn::PromoteTo(d, hn::LoadU(hn::Rebind<u8, decltype(d)>(), p));
  }
  // Two taps to a product: the middle goes with the first distance, or alone.
  HWY_INLINE void make(const u8* middle, i64 step, u8* out) const {
    const hn::Repartition<i16, Tag<i32>> d;
    Ints low = 0, high = 0;
    const auto add = [&](Shorts a, Shorts b, i32 weight_a, i32 weight_b) HWY_ATTR {
      const Ints weights = weight_a | weight_b << 16;
      low = low + pair_products(hn::BitCast(Tag<i32>(), hn::InterleaveLower(d, a, b)), weights);
      high = high + pair_products(hn::BitCast(Tag<i32>(), hn::InterleaveUpper(d, a, b)), weights);
    };
    const auto both = [&](i64 tap)
                          HWY_ATTR { return hn::Add(bytes_at(middle + tap * step), bytes_at(middle - tap * step)); };
    const Shorts centre = bytes_at(middle);
    i32 tap = run.reach % 2;
    add(centre, tap != 0 ? both(1) : hn::Zero(d), run.weights[0], tap != 0 ? run.weights[1] : 0);
    for (++tap; tap < run.reach; tap += 2) add(both(tap), both(tap + 1), run.weights[tap], run.weights[tap + 1]);

    if constexpr (straight) {
      low = divided_by_alpha(low, hn::BitCast(Tag<i32>(), hn::InterleaveLower(d, centre, hn::Zero(d))));
      high = divided_by_alpha(high, hn::BitCast(Tag<i32>(), hn::InterleaveUpper(d, centre, hn::Zero(d))));
    } else {
      low = division.quotient(low + half);
      high = division.quotient(high + half);
    }
    const hn::Rebind<u8, decltype(d)> bytes;
    hn::StoreU(hn::DemoteTo(bytes, hn::ReorderDemote2To(d, low.v, high.v)), bytes, out);
  }

 private:
  HWY_INLINE Ints divided_by_alpha(Ints sum, Ints middle) const {
    const Ints alpha =
        run.alpha_is_filtered ? Ints(hn::Broadcast<0>(sum.v)) : Ints(hn::Broadcast<0>(middle.v)) * Ints(run.divisor);
    const Ints colour = byte_quotient(sum * 255 + shifted_right<1>(alpha), alpha);
    return pick(alpha == 0, 0, pick(alpha_lanes<i32>(), division.quotient(sum + half), colour));
  }
};

// Sums in single precision. Vectors of channels side by side keep the processor busy while sums wait for each other.
template <class T, bool straight>
struct FloatBellLanes {
  static constexpr i32 side_by_side = 4;

  const BellRun<T>& run;
  const Floats divisor, half;

  HWY_INLINE explicit FloatBellLanes(const BellRun<T>& r)
      : run(r), divisor(static_cast<f32>(r.divisor)), half(static_cast<f32>(r.divisor) / 2) {}

  // A 16-bit number times a weight is exact, so that it may be fused with the sum.
  static HWY_INLINE Floats more(Floats sum, Floats weight, Floats v) {
    if constexpr (std::is_same_v<T, ZR_Pixel16>)
      return hn::MulAdd(weight.v, v.v, sum.v);
    else
      return sum + weight * v;
  }
  template <i32 vectors>
  HWY_INLINE void make(const T* middle, i64 step, i32 c, T* out) const {
    Floats sum[vectors], centre[vectors];
    const Floats first = static_cast<f32>(run.weights[0]);
    for (i32 v = 0; v < vectors; ++v) {
      centre[v] = channels_at<f32>(middle, c + v * lane_count());
      sum[v] = first * centre[v];
    }
    const T *ahead = middle, *behind = middle;
    for (i32 tap = 1; tap <= run.reach; ++tap) {
      ahead += step;
      behind -= step;
      const Floats weight = static_cast<f32>(run.weights[tap]);
      for (i32 v = 0; v < vectors; ++v) sum[v] = more(sum[v], weight, channels_at<f32>(ahead, c + v * lane_count()));
      for (i32 v = 0; v < vectors; ++v) sum[v] = more(sum[v], weight, channels_at<f32>(behind, c + v * lane_count()));
    }
    for (i32 v = 0; v < vectors; ++v) store_channels(made(sum[v], centre[v]), out, c + v * lane_count());
  }

 private:
  HWY_INLINE Floats made(Floats sum, Floats middle) const {
    constexpr bool words = std::is_same_v<T, ZR_Pixel16>;
    const Floats level = words ? (sum + half) / divisor : sum / divisor;
    if constexpr (!straight) return level;
    const Floats alpha =
        run.alpha_is_filtered ? Floats(hn::Broadcast<0>(sum.v)) : Floats(hn::Broadcast<0>(middle.v)) * divisor;
    Floats colour = sum / alpha;
    if constexpr (words) {
      const Floats v = (sum * 32768.0f + Floats(hn::Trunc((alpha * 0.5f).v))) / alpha;
      colour = pick(v > 32768.0f, 32768.0f, v);
    }
    return pick(alpha == 0.0f, 0.0f, pick(alpha_lanes<f32>(), level, colour));
  }
};

template <class T, bool straight>
HWY_INLINE void make_channels(const BellRun<T>& run, const T* middle, i64 channels, T* out) {
  if constexpr (std::is_same_v<T, ZR_Pixel8>) {
    const BellLanes<T, straight> lanes(run);
    for (i64 c = 0; c < channels; c += lanes.channels_at_once)
      lanes.make(reinterpret_cast<const u8*>(middle) + c, 4 * run.step, reinterpret_cast<u8*>(out) + c);
  } else {
    const FloatBellLanes<T, straight> lanes(run);
    constexpr i32 many = lanes.side_by_side * lane_count();
    i64 c = 0;
    for (; c + many <= channels; c += many)
      lanes.template make<lanes.side_by_side>(middle + c / 4, run.step, 0, out + c / 4);
    for (; c < channels; c += lane_count()) lanes.template make<1>(middle + c / 4, run.step, 0, out + c / 4);
  }
}

template <class T, bool straight>
void run_bell(const BellRun<T>& run) {
  // Sums times white fit 32 bits up to here.
  constexpr i32 greatest_divisor = 32900;
  if (!run.is_whole() || (straight && std::is_same_v<T, ZR_Pixel8> && run.divisor > greatest_divisor)) {
    const BellRows<T>& single = single_bell_rows<T>();
    return straight ? single.straight(run) : single.premultiplied(run);
  }
  // Positions that follow each other in memory are one long row, of single pixels maybe with a rest.
  if (run.step == run.pixels && run.out_step == run.pixels) {
    constexpr i64 pixels_at_once = lane_count() / 4;
    const i64 pixels = run.pixels * run.count, rest = run.pixels == 1 ? pixels % pixels_at_once : 0;
    make_channels<T, straight>(run, run.middle, 4 * (pixels - rest), run.out);
    if (rest == 0) return;
    BellRun<T> last = run;
    last.middle += pixels - rest, last.out += pixels - rest, last.count = rest;
    return straight ? single_bell_rows<T>().straight(last) : single_bell_rows<T>().premultiplied(last);
  }
  for (i64 k = 0; k < run.count; ++k)
    make_channels<T, straight>(run, run.middle + k * run.step, 4 * run.pixels, run.out + k * run.out_step);
}

template <class T>
const BellRows<T>* bell_rows() {
  static constexpr BellRows<T> rows = {&run_bell<T, false>, &run_bell<T, true>};
  return &rows;
}
ZR_ROWS_OF_DEPTHS(const BellRows, bell_rows)

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_ROWS(const BellRows, bell_rows)
#endif
