// The box blur's inner loop on lanes: whole pixels as they lie in memory, each channel a lane.
#include "filter/box_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "filter/lane_box_rows.cc"
#include <hwy/foreach_target.h>

#include <hwy/cache_control.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "filter/lane_pixels-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class T>
using BoxLane = Lane<BoxSum<T>>;

// What a run divides by, spread over lanes.
template <class T>
struct BoxDivision {
  Floats divisor, half;

  HWY_INLINE explicit BoxDivision(const BoxWeights<T>& w) : divisor(w.divisor), half(w.divisor / 2) {}
  HWY_INLINE Floats weighed(Floats sum, Floats edge, Floats shortfall) const { return sum - edge * shortfall; }
  HWY_INLINE Floats unweighed(Floats sum) const { return sum; }
  HWY_INLINE Floats premultiplied(Floats n) const {
    if constexpr (std::is_same_v<T, ZR_Pixel16>)
      return (n + half) / divisor;
    else
      return n / divisor;
  }
  HWY_INLINE Floats alpha_weight(Floats n) const {
    if constexpr (std::is_same_v<T, ZR_Pixel16>)
      return n * 3.0517578e-5f;
    else
      return n;
  }
  HWY_INLINE Floats straight(Floats n, Floats q) const {
    if constexpr (std::is_same_v<T, ZR_Pixel16>) {
      const Floats v = (n + q * 0.5f) / q;
      return pick(v > 32768.0f, 32768.0f, v);
    } else {
      return n / q;
    }
  }
};

template <>
struct BoxDivision<ZR_Pixel8> {
  Ints half;
  ExactDivision by_weight, by_white;

  HWY_INLINE explicit BoxDivision(const BoxWeights<ZR_Pixel8>& w)
      : half(w.divisor / 2), by_weight(ExactReciprocal::of(w.divisor)), by_white(ExactReciprocal::of(255)) {}
  // Edges are two bytes at most, and the shortfall fits 11 bits.
  HWY_INLINE Ints weighed(Ints sum, Ints edge, Ints shortfall) const {
    return shifted_left<10>(sum) - pair_products(edge, shortfall);
  }
  HWY_INLINE Ints unweighed(Ints sum) const { return shifted_left<10>(sum); }
  HWY_INLINE Ints premultiplied(Ints n) const { return by_weight.quotient(n + half); }
  HWY_INLINE Ints alpha_weight(Ints n) const { return by_white.quotient(n + 127); }
  HWY_INLINE Ints straight(Ints n, Ints q) const { return byte_quotient(n + shifted_right<1>(q), q); }
};

template <class T>
void add(i32 pixels, i64 count, const T* from, i64 step, void* sums) {
  using Number = BoxSum<T>;
  auto* const all = static_cast<Number*>(sums);
  for (i32 c = 0; c < 4 * pixels; c += lane_count()) {
    Lane<Number> sum = hn::LoadU(Tag<Number>(), all + c);
    const T* p = from;
    for (i64 k = 0; k < count; ++k, p += step) sum = sum + channels_at<Number>(p, c);
    hn::StoreU(sum.v, Tag<Number>(), all + c);
  }
}

constexpr i64 rows_ahead = 4;

template <class T, bool straight, bool edged>
HWY_INLINE void run_form(const BoxRun<T>& run) {
  using Number = BoxSum<T>;
  using L = BoxLane<T>;
  const BoxDivision<T> division(run.weights);
  const L shortfall(run.weights.shortfall), zero(Number{0});
  const auto alphas = alpha_lanes<Number>();
  auto* const all = static_cast<Number*>(run.sums);
  const T *leaving = run.leaving, *first = run.first, *entering = run.entering;
  T* out = run.out;
  const i32 channels = 4 * run.pixels;
  // Columns jump from memory page to page, where no processor looks ahead by itself.
  const i64 row_bytes = run.pixels * static_cast<i64>(sizeof(T)), ahead = run.entering_step * rows_ahead;
  for (i64 k = 0; k < run.count; ++k) {
    if (k + rows_ahead < run.count)
      for (i64 b = 0; b < row_bytes; b += 64) hwy::Prefetch(reinterpret_cast<const char*>(entering + ahead) + b);
    for (i32 c = 0; c < channels; c += lane_count()) {
      const L next = channels_at<Number>(entering, c);
      L sum = hn::LoadU(Tag<Number>(), all + c);
      sum = sum - channels_at<Number>(leaving, c) + next;
      hn::StoreU(sum.v, Tag<Number>(), all + c);
      const L n =
          edged ? division.weighed(sum, channels_at<Number>(first, c) + next, shortfall) : division.unweighed(sum);
      L made = division.premultiplied(n);
      if constexpr (straight) {
        const L q = division.alpha_weight(hn::Broadcast<0>(n.v));
        made = pick(q == zero, zero, pick(alphas, made, division.straight(n, q)));
      }
      store_channels(made, out, c);
    }
    leaving += run.leaving_step;
    first += run.first_step;
    entering += run.entering_step;
    out += run.out_step;
  }
}

template <class T, bool straight>
void run_box(const BoxRun<T>& run) {
  if (run.weights.divisor == 0) return single_box_rows<T>().premultiplied(run);
  if (run.weights.shortfall != 0)
    run_form<T, straight, true>(run);
  else
    run_form<T, straight, false>(run);
}

template <class T>
const BoxRows<T>* box_rows() {
  static constexpr BoxRows<T> rows = {&add<T>, &run_box<T, false>, &run_box<T, true>};
  return &rows;
}
ZR_ROWS_OF_DEPTHS(const BoxRows, box_rows)

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_ROWS(const BoxRows, box_rows)
#endif
