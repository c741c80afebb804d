// The box blur's inner loop on lanes: whole pixels as they lie in memory, each channel a lane.
#include "filter/box_rows.h"
#include "filter/short_quotient.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "filter/lane_box_rows.cc"
#include <hwy/foreach_target.h>

#include <hwy/cache_control.h>

#include <cstdlib>

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
  Floats divisor, half, reciprocal, rest_of_reciprocal;

  HWY_INLINE explicit BoxDivision(const BoxWeights<T>& w) : divisor(w.divisor), half(w.divisor / 2) {
    const ShortQuotient by = ShortQuotient::of(w.divisor);
    reciprocal = by.upper;
    rest_of_reciprocal = by.lower;
  }
  HWY_INLINE Floats weighed(Floats sum, Floats edge, Floats shortfall) const { return sum - edge * shortfall; }
  HWY_INLINE Floats unweighed(Floats sum) const { return sum; }
  HWY_INLINE Floats premultiplied(Floats n) const {
    if constexpr (std::is_same_v<T, ZR_Pixel16>)
      return (n + half) / divisor;
    else
      return n / divisor;
  }
  // Of sums of 16-bit channels, which are whole numbers.
  HWY_INLINE Floats short_quotient(Floats n) const {
    const Floats sum = n + half;
    return hn::MulAdd(sum.v, reciprocal.v, (sum * rest_of_reciprocal).v);
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

HWY_INLINE void store_low_bits(Ints v, ZR_Pixel16* pixels, i32 c) {
  const hn::Rebind<u16, Tag<i32>> d;
  hn::StoreU(hn::TruncateTo(d, hn::BitCast(hn::Rebind<u32, Tag<i32>>(), v.v)), d, reinterpret_cast<u16*>(pixels) + c);
}

constexpr i64 rows_ahead = 4, floats_ahead = 2, page_bytes = 4096;

// Some vectors at once, so that rows far apart are come back to less often.
template <class T, i32 vectors>
HWY_INLINE i32 add_blocks(i32 c, i32 channels, i64 count, const T* from, i64 step, BoxSum<T>* all) {
  using Number = BoxSum<T>;
  const i32 block = vectors * lane_count();
  for (; c + block <= channels; c += block) {
    Lane<Number> sums[vectors];
    for (i32 i = 0; i < vectors; ++i) sums[i] = hn::LoadU(Tag<Number>(), all + c + i * lane_count());
    const T* p = from;
    const i64 ahead_until = std::abs(step) * static_cast<i64>(sizeof(T)) > page_bytes ? count - rows_ahead : 0;
    for (i64 k = 0; k < count; ++k, p += step) {
      if (k < ahead_until)
        for (i32 b = 0; b < block; b += 64 / static_cast<i32>(sizeof(Channel<T>)))
          hwy::Prefetch(reinterpret_cast<const Channel<T>*>(p + rows_ahead * step) + c + b);
      for (i32 i = 0; i < vectors; ++i) sums[i] = sums[i] + channels_at<Number>(p, c + i * lane_count());
    }
    for (i32 i = 0; i < vectors; ++i) hn::StoreU(sums[i].v, Tag<Number>(), all + c + i * lane_count());
  }
  return c;
}
template <class T>
void add(i32 pixels, i64 count, const T* from, i64 step, void* sums) {
  auto* const all = static_cast<BoxSum<T>*>(sums);
  const i32 done = add_blocks<T, 8>(0, 4 * pixels, count, from, step, all);
  add_blocks<T, 1>(add_blocks<T, 2>(done, 4 * pixels, count, from, step, all), 4 * pixels, count, from, step, all);
}

// Columns jump from memory page to page, where no processor looks ahead by itself; strips that lie together need none.
// Of floats, what is written is more than waits for its place in passing.
template <class T>
struct LookAhead {
  i64 block_bytes, in_until, out_until, in, out;

  HWY_INLINE LookAhead(const BoxRun<T>& run, i32 block_channels)
      : block_bytes(block_channels * static_cast<i64>(sizeof(T) / 4)),
        in_until(run.entering_step != run.pixels ? run.count - rows_ahead : 0),
        out_until(sizeof(T) == 16 && run.out_step != run.pixels ? run.count - floats_ahead : 0),
        in(run.entering_step * rows_ahead),
        out(run.out_step * floats_ahead) {}
  HWY_INLINE void operator()(i64 k, const void* entering, void* made) const {
    if (k < in_until)
      for (i64 b = 0; b < block_bytes; b += 64)
        hwy::Prefetch(static_cast<const char*>(entering) + in * static_cast<i64>(sizeof(T)) + b);
    if (k < out_until)
      for (i64 b = 0; b < block_bytes; b += 64)
        __builtin_prefetch(static_cast<char*>(made) + out * static_cast<i64>(sizeof(T)) + b, 1);
  }
};

// How the means of a run are found.
enum class Means { plain, edged, short_quotients };

// 16-bit sums of few pixels are whole numbers, and exact. Means of those below 2^23 by an odd number are n / divisor to
// the nearest: no n lies closer to the middle between two of them than 1 / (2 * divisor), which is more than what n
// times the rounded reciprocal is off. Added to 2^23 the product is rounded once, and ends up in the low bits. So many
// pixels never get there, and some more do not while no channel is above white by far.
constexpr i32 most_rounded = 127, most_rounded_if_small = 255;
HWY_INLINE bool has_rounded_means(const BoxWeights<ZR_Pixel16>& w) {
  return w.divisor <= most_rounded_if_small && static_cast<i32>(w.divisor) % 2 == 1;
}

// What changes a sum: near the ends of a line, where only zeros leave or enter, they need not be looked at.
enum class Change { both, entering, leaving };
template <class Number, Change change, class T>
HWY_INLINE Lane<Number> changed(Lane<Number> sum, const T* leaving, Lane<Number> next, i32 i) {
  if constexpr (change != Change::entering) sum = sum - channels_at<Number>(leaving, i);
  if constexpr (change != Change::leaving) sum = sum + next;
  return sum;
}
template <class Number, Change change, class T>
HWY_INLINE Lane<Number> entering_at(const T* entering, i32 i) {
  if constexpr (change == Change::leaving) return Lane<Number>(Number{0});
  return channels_at<Number>(entering, i);
}

// Some vectors of channels, from channel c on; false where a sum grows too large.
template <Change change, i32 vectors>
HWY_INLINE bool run_rounded(const BoxRun<ZR_Pixel16>& run, i32 c) {
  auto* const all = static_cast<f32*>(run.sums) + c;
  const LookAhead<ZR_Pixel16> look_ahead(run, vectors * lane_count());
  const Floats reciprocal(1 / run.weights.divisor), ground(0x1p23f);
  const ZR_Pixel16 *leaving = run.leaving + c / 4, *entering = run.entering + c / 4;
  ZR_Pixel16* out = run.out + c / 4;
  Ints sums[vectors], greatest = 0;
  for (i32 v = 0; v < vectors; ++v) sums[v] = fitting_int(hn::LoadU(Tag<f32>(), all + v * lane_count()));
  for (i64 k = 0; k < run.count; ++k) {
    look_ahead(k, entering, out);
    for (i32 v = 0; v < vectors; ++v) {
      const i32 i = v * lane_count();
      sums[v] = changed<i32, change>(sums[v], leaving, entering_at<i32, change>(entering, i), i);
      greatest = hn::Max(greatest.v, sums[v].v);
      const Floats made = hn::MulAdd(to_float(sums[v]).v, reciprocal.v, ground.v);
      store_low_bits(hn::BitCast(Tag<i32>(), made.v), out, i);
    }
    leaving += run.leaving_step;
    entering += run.entering_step;
    out += run.out_step;
  }
  if (run.weights.divisor > most_rounded && !none(greatest >= (1 << 23) - most_rounded_if_small)) return false;
  for (i32 v = 0; v < vectors; ++v) hn::StoreU(to_float(sums[v]).v, Tag<f32>(), all + v * lane_count());
  return true;
}

// Some vectors of channels, from channel c on: their sums stay in registers.
template <class T, bool straight, Means means, Change change, i32 vectors>
HWY_INLINE void run_block(const BoxRun<T>& run, i32 c) {
  using Number = BoxSum<T>;
  using L = BoxLane<T>;
  if constexpr (means == Means::short_quotients)
    if (has_rounded_means(run.weights) && run_rounded<change, vectors>(run, c)) return;
  const BoxDivision<T> division(run.weights);
  const L shortfall(run.weights.shortfall), zero(Number{0});
  const auto alphas = alpha_lanes<Number>();
  auto* const all = static_cast<Number*>(run.sums) + c;
  const LookAhead<T> look_ahead(run, vectors * lane_count());
  const i32 pixel = c / 4;
  const T *leaving = run.leaving + pixel, *first = run.first + pixel, *entering = run.entering + pixel;
  T* out = run.out + pixel;
  L sums[vectors];
  for (i32 v = 0; v < vectors; ++v) sums[v] = hn::LoadU(Tag<Number>(), all + v * lane_count());
  for (i64 k = 0; k < run.count; ++k) {
    look_ahead(k, entering, out);
    for (i32 v = 0; v < vectors; ++v) {
      const i32 i = v * lane_count();
      const L next = entering_at<Number, change>(entering, i);
      const L sum = sums[v] = changed<Number, change>(sums[v], leaving, next, i);
      if constexpr (means == Means::short_quotients) {
        store_low_bits(fitting_int(division.short_quotient(sum)), out, i);
        continue;
      }
      const L n = means == Means::edged ? division.weighed(sum, channels_at<Number>(first, i) + next, shortfall)
                                        : division.unweighed(sum);
      L made = division.premultiplied(n);
      if constexpr (straight) {
        const L q = division.alpha_weight(hn::Broadcast<0>(n.v));
        made = pick(q == zero, zero, pick(alphas, made, division.straight(n, q)));
      }
      store_channels(made, out, i);
    }
    leaving += run.leaving_step;
    first += run.first_step;
    entering += run.entering_step;
    out += run.out_step;
  }
  for (i32 v = 0; v < vectors; ++v) hn::StoreU(sums[v].v, Tag<Number>(), all + v * lane_count());
}

template <class T, bool straight, Means means, Change change, i32 vectors>
HWY_INLINE i32 run_blocks(const BoxRun<T>& run, i32 c) {
  for (; c + vectors * lane_count() <= 4 * run.pixels; c += vectors * lane_count())
    run_block<T, straight, means, change, vectors>(run, c);
  return c;
}
template <class T, bool straight, Means means, Change change>
void run_changes(const BoxRun<T>& run) {
  const i32 wide = run_blocks<T, straight, means, change, 8>(run, 0);
  run_blocks<T, straight, means, change, 2>(run, run_blocks<T, straight, means, change, 4>(run, wide));
}
template <class T, bool straight, Means means>
void run_form(const BoxRun<T>& run) {
  if constexpr (!straight && means != Means::edged) {
    if (!run.leaves) return run_changes<T, straight, means, Change::entering>(run);
    if (!run.enters) return run_changes<T, straight, means, Change::leaving>(run);
  }
  run_changes<T, straight, means, Change::both>(run);
}

template <class T, bool straight>
void run_box(const BoxRun<T>& run) {
  if (run.weights.divisor == 0) return single_box_rows<T>().premultiplied(run);
  if (run.weights.shortfall != 0) return run_form<T, straight, Means::edged>(run);
  if constexpr (HWY_NATIVE_FMA && std::is_same_v<T, ZR_Pixel16> && !straight)
    if (ShortQuotient::serves(run.weights.divisor)) return run_form<T, straight, Means::short_quotients>(run);
  run_form<T, straight, Means::plain>(run);
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
