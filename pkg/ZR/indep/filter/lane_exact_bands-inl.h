// Bands of a convolution of floats whose sums are exact in single precision, in two parts.
#if defined(ZR_FILTER_LANE_EXACT_BANDS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_FILTER_LANE_EXACT_BANDS_INL_H
#undef ZR_FILTER_LANE_EXACT_BANDS_INL_H
#else
#define ZR_FILTER_LANE_EXACT_BANDS_INL_H
#endif

#include <hwy/cache_control.h>

#include <algorithm>

#include "filter/float_bands.h"
#include "simd/lanes-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// A strip of a band.
struct StripLanes {
  FloatBand& band;
  i64 left = 0;    // its first pixel
  i64 pixels = 0;  // a whole number of blocks

  HWY_INLINE i64 reach() const { return band.kernel.width / 2; }

  // The samples of a source row, with those that taps reach on both sides.
  HWY_INLINE const f32* samples_of(i64 r) const {
    const i64 first = left - reach(), end = left + pixels + reach();
    const i64 inside_first = std::max<i64>(first, 0), inside_end = std::min<i64>(end, band.kernel.src_width);
    const f32* const row = reinterpret_cast<const f32*>(band.kernel.source_row(r));
    if (first == inside_first && end == inside_end) return row + 4 * first;
    std::fill(band.padded, band.padded + 4 * (end - first), 0.0f);
    if (inside_first < inside_end)
      std::copy(row + 4 * inside_first, row + 4 * inside_end, band.padded + 4 * (inside_first - first));
    return band.padded;
  }
};

class ExactLanes {
  using Form = FloatBand::Form;
  using Condition = FloatBand::Exact::Condition;
  using Line = FloatBand::Exact::Line;
  using Numbers = hn::Vec<Tag<f32>>;
  static constexpr i32 lanes = lane_count();
  static constexpr i32 vectors = 4;  // of a block, of each part
  static constexpr i64 rows_ahead = 2;
  static_assert(4 * float_strip_step % (vectors * lanes) == 0);

 public:
  HWY_INLINE explicit ExactLanes(const StripLanes& strip) : strip_(strip), band_(strip.band) {}

  // The strip from a source row to another, if it can be made so.
  HWY_INLINE bool run(i64 first, i64 end) const {
    // Strips resemble the last one: what that allowed is not looked at before, but on the way.
    if (run_as(band_.form, first, end)) return true;
    for (const Form form : {Form::whole, Form::rounded}) {
      if (!find_bound(form, first, end) || !run_as(form, first, end)) continue;
      band_.form = form;
      return true;
    }
    band_.form = Form::doubles;
    return false;
  }

 private:
  const Condition& condition(Form form) const { return form == Form::whole ? band_.exact.whole : band_.exact.rounded; }

  // What samples that are multiples of their bound's quantum leave at 0.
  struct Rests {
    Numbers per_quantum, most, rests;
    HWY_INLINE explicit Rests(f32 quantum)
        : per_quantum(hn::Set(Tag<f32>(), 1 / quantum)), most(hn::Zero(Tag<f32>())), rests(hn::Zero(Tag<f32>())) {}
    HWY_INLINE void look(Numbers v) {
      const auto quanta = hn::Mul(v, per_quantum);
#if HWY_TARGET == HWY_AVX3  // in one instruction each; what is infinite leaves 0, but is the most
      most = Numbers{_mm512_range_ps(most.raw, v.raw, 0b1011)};
      rests = hn::Or(rests, Numbers{_mm512_reduce_ps(quanta.raw, 0)});
#else
      most = hn::Max(most, hn::Abs(v));
      rests = hn::Or(rests, hn::Sub(quanta, hn::Round(quanta)));  // 0, or NaN for what is not finite
#endif
    }
    HWY_INLINE f32 greatest() const { return hn::GetLane(hn::MaxOfLanes(Tag<f32>(), most)); }
    HWY_INLINE bool within(f32 bound) const {
      const Tag<f32> d;
      return hn::AllTrue(d, hn::And(hn::Eq(rests, hn::Zero(d)), hn::Le(most, hn::Set(d, bound))));
    }
  };
  HWY_INLINE Rests rests_of(f32 quantum, i64 first_row, i64 end_row) const {
    const Tag<f32> d;
    const i64 first = std::max<i64>(strip_.left - strip_.reach(), 0);
    const i64 end = std::min<i64>(strip_.left + strip_.pixels + strip_.reach(), band_.kernel.src_width);
    Rests rests(quantum * band_.bound);
    for (i64 r = first_row; r < end_row; ++r) {
      const f32* const row = reinterpret_cast<const f32*>(band_.kernel.source_row(r));
      i64 c = 4 * first;
      for (; c + lanes <= 4 * end; c += lanes) rests.look(hn::LoadU(d, row + c));
      for (; c < 4 * end; c += 4) rests.look(hn::LoadDup128(d, row + c));
    }
    return rests;
  }
  // Whether the strip's samples between two source rows are such multiples; finds their bound.
  bool find_bound(Form form, i64 first_row, i64 end_row) const {
    // A row that fails with its own bound does so with a larger one, too.
    return condition(form).possible && find_bound_of(condition(form).quantum, first_row, first_row + 1) &&
           find_bound_of(condition(form).quantum, first_row, end_row);
  }
  bool find_bound_of(f32 quantum, i64 first_row, i64 end_row) const {
    const Rests rests = rests_of(quantum, first_row, end_row);
    if (rests.within(band_.bound)) return true;
    const f32 greatest = rests.greatest();
    if (!(greatest > 0x1p-30f && greatest < 0x1p30f)) return false;
    const f32 before = band_.bound;
    for (band_.bound = 0x1p-30f; band_.bound < greatest;) band_.bound *= 2;
    return band_.bound != before && rests_of(quantum, first_row, end_row).within(band_.bound);
  }

  HWY_INLINE bool run_as(Form form, i64 first, i64 end) const {
    if (form == Form::doubles) return false;
    begin_rows();
    i64 r = first;
    while (r < end && meet(form, r)) ++r;
    if (r == end) end_rows();
    return r == end;
  }

  // By kernel rows, the sums of the destination rows that a source row meets, in turn the upper and the lower part of
  // each vector. Rows outside of the band have sums too, for nothing.
  struct Targets {
    f32* sums[largest_banded_side];
    f32* out;  // of the last kernel row's
    bool streams;
  };
  HWY_INLINE f32* sums_of(i64 y) const { return band_.exact.sums + y % band_.kernel.height * band_.exact.sums_place; }
  HWY_INLINE f32* out_of(i64 y) const {
    return strip_.left + strip_.pixels <= band_.pixels ? inside_of(y) : band_.spare;
  }
  HWY_INLINE f32* inside_of(i64 y) const {
    return reinterpret_cast<f32*>(band_.dst + (y - band_.first) * band_.dst_row_bytes) + 4 * strip_.left;
  }
  HWY_INLINE Targets targets_of(i64 r) const {
    Targets targets;
    const i32 height = band_.kernel.height;
    i64 y = r + height / 2;
    for (i32 v = 0; v < height; ++v, --y) {
      const bool inside = y >= band_.first && y < band_.end;
      targets.sums[v] = inside ? sums_of(y) : band_.exact.sums + height * band_.exact.sums_place;
      targets.out = inside ? out_of(y) : band_.spare;
    }
    targets.streams = band_.streams && targets.out != band_.spare &&
                      reinterpret_cast<std::uintptr_t>(targets.out) % (sizeof(f32) * lanes) == 0;
    return targets;
  }
  // Of a destination row that went to the spare one, the pixels that there are.
  HWY_INLINE void take_spare(i64 y) const {
    if (y >= band_.first && y < band_.end && out_of(y) == band_.spare)
      std::copy(band_.spare, band_.spare + 4 * (band_.pixels - strip_.left), inside_of(y));
  }
  // Rows whose first kernel rows lie above the source.
  HWY_INLINE void begin_rows() const {
    for (i64 y = band_.first; y < std::min<i64>(band_.end, band_.kernel.height / 2); ++y)
      std::fill_n(sums_of(y), 8 * strip_.pixels, 0.0f);
  }
  // Rows whose last kernel rows lie below it.
  HWY_INLINE void end_rows() const {
    const Tag<f32> d;
    const i64 below = i64{band_.kernel.src_height} - band_.kernel.height / 2;
    for (i64 y = std::max<i64>(band_.first, below); y < band_.end; ++y) {
      const f32* const sums = sums_of(y);
      f32* const out = out_of(y);
      for (i64 c = 0; c < 4 * strip_.pixels; c += lanes)
        hn::StoreU(divided(hn::Add(hn::Load(d, sums + 2 * c), hn::Load(d, sums + 2 * c + lanes))), d, out + c);
      take_spare(y);
    }
  }

  // Carries source row r to all destination rows of the band that it meets; false, with the strip to be made anew,
  // where its samples do not meet the condition.
  HWY_INLINE bool meet(Form form, i64 r) const {
    const f32 *const samples = strip_.samples_of(r), *const fetched = fetched_after(r);
    const Targets targets = targets_of(r);
    const bool whole = form == Form::whole;
    bool made = false;
    if (!band_.exact.small)
      made = whole ? add_all_whole(samples, fetched, targets) : add_all_rounded(samples, fetched, targets);
    else if (band_.kernel.width == 3)
      made = whole ? add_whole<3>(samples, fetched, targets) : add_rounded<3>(samples, fetched, targets);
    else
      made = whole ? add_whole<5>(samples, fetched, targets) : add_rounded<5>(samples, fetched, targets);
    if (made) take_spare(r - band_.kernel.height / 2);
    return made;
  }
  // Kernels of any size, by planes.
  HWY_INLINE bool add_all_whole(const f32* samples, const f32* fetched, const Targets& targets) const {
    if (!split_samples(samples, fetched)) return false;
    if (band_.exact.mirrored) add_pairs();
    add_lines<true>(band_.exact.samples, 0, band_.exact.line_count, targets);
    return true;
  }
  HWY_INLINE bool add_all_rounded(const f32* samples, const f32* fetched, const Targets& targets) const {
    const i32 lines = band_.exact.line_count;
    for (i32 g = 0; g < band_.group_count; ++g) {
      if (!split_group(samples, fetched, band_.groups[g])) return false;
      const bool of_one_kind = band_.group_count == lines;
      add_lines<false>(band_.exact.products, of_one_kind ? g : 0, of_one_kind ? g + 1 : lines, targets);
    }
    return true;
  }

  // What the next source row has for the strip: rows are too far apart for processors to see them coming.
  HWY_INLINE const f32* fetched_after(i64 r) const {
    const i64 row = std::min<i64>(r + rows_ahead, band_.kernel.src_height - 1);
    return reinterpret_cast<const f32*>(band_.kernel.source_row(row)) +
           4 * std::max<i64>(strip_.left - strip_.reach(), 0);
  }
  // Calls each(c) for the samples of a row of the strip with those that taps reach, a vector at a time; the last may
  // overlap the one before.
  template <class Each>
  HWY_INLINE void for_samples(Each&& each) const {
    const i64 count = 4 * (strip_.pixels + 2 * strip_.reach());
    i64 c = 0;
    for (; c + lanes <= count; c += lanes) each(c);
    if (c < count) each(count - lanes);
  }
  // Both parts of a number.
  static HWY_INLINE void split(Numbers v, Numbers magic, f32* upper, f32* lower) {
    const Tag<f32> d;
    const auto high = hn::Sub(hn::Add(v, magic), magic);
    hn::StoreU(high, d, upper);
    hn::StoreU(hn::Sub(v, high), d, lower);
  }
  HWY_INLINE Numbers magic_of(const Condition& condition) const {
    return hn::Set(Tag<f32>(), 0x1.8p23f * condition.split * band_.bound);
  }
  HWY_INLINE bool split_samples(const f32* samples, const f32* fetched) const {
    const Condition& whole = band_.exact.whole;
    const auto magic = magic_of(whole);
    Rests rests(whole.quantum * band_.bound);
    f32 *const upper = band_.exact.planes, *const lower = upper + float_plane_place;
    for_samples([&](i64 c) HWY_ATTR {
      hwy::Prefetch(fetched + c);
      const auto v = hn::LoadU(Tag<f32>(), samples + c);
      rests.look(v);
      split(v, magic, upper + c, lower + c);
    });
    return rests.within(band_.bound);
  }
  HWY_INLINE void add_pairs() const {
    const Tag<f32> d;
    constexpr i64 place = float_plane_place;
    const i64 opposite = 8 * strip_.reach();
    for (i64 t = 0; t < strip_.reach(); ++t)
      for (i64 part = 0; part < 2; ++part) {
        const f32* const from = band_.exact.planes + part * place;
        f32* const to = band_.exact.planes + (2 * t + 2 + part) * place;
        for (i64 c = 0; c < 4 * strip_.pixels; c += lanes)
          hn::Store(hn::Add(hn::LoadU(d, from + c + 4 * t), hn::LoadU(d, from + c + opposite - 4 * t)), d, to + c);
      }
  }
  HWY_INLINE bool split_group(const f32* samples, const f32* fetched, const FloatBand::Group& group) const {
    i32 p = group.first_product;
    f32* planes = band_.exact.planes;
    constexpr i64 place = 2 * float_plane_place;
    const i32 most = group.end_product - p;
    bool fit = most % 3 == 1   ? split_products<1, true>(samples, fetched, p, planes)
               : most % 3 == 2 ? split_products<2, true>(samples, fetched, p, planes)
                               : split_products<3, true>(samples, fetched, p, planes);
    for (i32 done = (most - 1) % 3 + 1; fit && done < most; done += 3)
      fit = split_products<3, false>(samples, fetched, p + done, planes + done * place);
    return fit;
  }
  template <i32 products, bool looks>
  HWY_INLINE bool split_products(const f32* samples, const f32* fetched, i32 product, f32* planes) const {
    const Tag<f32> d;
    const Condition& rounded = band_.exact.rounded;
    const auto magic = magic_of(rounded);
    Numbers w[products];
    for (i32 p = 0; p < products; ++p) w[p] = hn::LoadDup128(d, band_.weights + 4 * (product + p));
    Rests rests(rounded.quantum * band_.bound);
    for_samples([&](i64 c) HWY_ATTR {
      const auto v = hn::LoadU(d, samples + c);
      if constexpr (looks) hwy::Prefetch(fetched + c), rests.look(v);
      for (i32 p = 0; p < products; ++p)
        split(hn::Mul(v, w[p]), magic, planes + 2 * p * float_plane_place + c,
              planes + (2 * p + 1) * float_plane_place + c);
    });
    return !looks || rests.within(band_.bound);
  }

  // Adds the terms of lines to the sums of their targets.
  template <bool weighted>
  HWY_INLINE void add_lines(const Line* lines, i32 first, i32 end, const Targets& targets) const {
    for (i64 c = 0; c < 4 * strip_.pixels; c += vectors * lanes)
      for (i32 k = first; k < end; ++k) {
        Numbers upper[vectors], lower[vectors];
        add_terms<weighted>(lines[k], c, upper, lower);
        for (i32 i = lines[k].first_row; i < lines[k].end_row; ++i) {
          const i32 v = band_.exact.order[i];
          for (i32 j = 0; j < vectors; ++j) carry(targets, v, band_.kernel.height, c + j * lanes, upper[j], lower[j]);
        }
      }
  }
  template <bool weighted>
  HWY_INLINE void add_terms(const Line& line, i64 c, Numbers* upper, Numbers* lower) const {
    const Tag<f32> d;
    const f32* const planes = band_.exact.planes + c;
    for (i32 i = 0; i < vectors; ++i) upper[i] = lower[i] = hn::Zero(d);
    for (i32 t = 0; t < line.count; ++t) {
      const f32* const from = planes + line.places[t];
      if constexpr (weighted) {
        const auto weight = hn::LoadDup128(d, line.weights + 4 * t);
        for (i32 i = 0; i < vectors; ++i) {
          upper[i] = hn::MulAdd(weight, hn::LoadU(d, from + i * lanes), upper[i]);
          lower[i] = hn::MulAdd(weight, hn::LoadU(d, from + float_plane_place + i * lanes), lower[i]);
        }
      } else {
        for (i32 i = 0; i < vectors; ++i) {
          upper[i] = hn::Add(hn::LoadU(d, from + i * lanes), upper[i]);
          lower[i] = hn::Add(hn::LoadU(d, from + float_plane_place + i * lanes), lower[i]);
        }
      }
    }
  }
  // Terms of kernel row v to their target. They come from 0 on, for -0 alone is 0 as a sum.
  HWY_INLINE void carry(const Targets& targets, i32 v, i32 height, i64 c, Numbers upper, Numbers lower) const {
    const Tag<f32> d;
    f32* const sums = targets.sums[v] + 2 * c;
    if (v > 0) {
      upper = hn::Add(upper, hn::Load(d, sums));
      lower = hn::Add(lower, hn::Load(d, sums + lanes));
    }
    if (v == height - 1) {
      const auto result = divided(hn::Add(upper, lower));
      targets.streams ? hn::Stream(result, d, targets.out + c) : hn::StoreU(result, d, targets.out + c);
    } else {
      hn::Store(upper, d, sums);
      hn::Store(lower, d, sums + lanes);
    }
  }

  // Small kernels, without loops over terms. terms(c, k, upper, lower): those of kernel row k and of its like.
  template <i32 side, class Terms>
  HWY_INLINE void add_small(const Targets& targets, Terms&& terms) const {
    for (i64 c = 0; c < 4 * strip_.pixels; c += lanes) {
      Numbers upper[side / 2 + 1], lower[side / 2 + 1];
      terms(c, upper, lower);
      for (i32 v = 0; v < side; ++v) {
        const i32 k = std::min(v, side - 1 - v);
        carry(targets, v, side, c, upper[k], lower[k]);
      }
    }
  }
  // From the samples themselves, which are looked at once each. terms(weights of kinds of kernel rows, what splits,
  // a column's samples, those in the middle, upper, lower).
  template <i32 side, class Terms>
  HWY_INLINE bool add_samples(const Condition& condition, const f32* samples, const f32* fetched,
                              const Targets& targets, Terms&& terms) const {
    constexpr i32 half = side / 2, kinds = half + 1;
    const Tag<f32> d;
    const auto magic = magic_of(condition);
    Numbers w[kinds][kinds];
    for (i32 k = 0; k < kinds; ++k)
      for (i32 t = 0; t < kinds; ++t)
        w[k][t] = hn::LoadDup128(d, band_.exact.samples[band_.exact.lines[k]].weights + 4 * t);
    Rests rests(condition.quantum * band_.bound);
    for (i32 i = 0; i < half; ++i) {
      rests.look(hn::LoadDup128(d, samples + 4 * i));
      rests.look(hn::LoadDup128(d, samples + 4 * (half + strip_.pixels + i)));
    }
    add_small<side>(targets, [&](i64 c, Numbers* upper, Numbers* lower) HWY_ATTR {
      hwy::Prefetch(fetched + c);
      const auto sample = [&](i32 t) HWY_ATTR { return hn::LoadU(d, samples + c + 4 * t); };
      const auto middle = sample(half);
      rests.look(middle);
      terms(w, magic, sample, middle, upper, lower);
    });
    return rests.within(band_.bound);
  }
  // Whole products. Pairs of samples are whole numbers of quanta too, of one bit more: they are split as such.
  template <i32 side>
  HWY_INLINE bool add_whole(const f32* samples, const f32* fetched, const Targets& targets) const {
    constexpr i32 half = side / 2, kinds = half + 1;
    const auto terms = [](const auto& w, Numbers magic, const auto& sample, Numbers middle, Numbers* upper,
                          Numbers* lower) HWY_ATTR {
      for (i32 k = 0; k < kinds; ++k) upper[k] = lower[k] = hn::Zero(Tag<f32>());
      for (i32 t = 0; t < kinds; ++t) {
        const auto v = t < half ? hn::Add(sample(t), sample(side - 1 - t)) : middle;
        const auto high = hn::Sub(hn::Add(v, magic), magic), low = hn::Sub(v, high);
        for (i32 k = 0; k < kinds; ++k) {
          upper[k] = hn::MulAdd(w[k][t], high, upper[k]);
          lower[k] = hn::MulAdd(w[k][t], low, lower[k]);
        }
      }
    };
    return add_samples<side>(band_.exact.whole, samples, fetched, targets, terms);
  }
  // Rounded products: of few terms they are cheaper made for each term than kept. Upper parts are what a product moves
  // the sum by, which is a multiple of `split` all the time.
  template <i32 side>
  HWY_INLINE bool add_rounded(const f32* samples, const f32* fetched, const Targets& targets) const {
    constexpr i32 half = side / 2;
    const auto terms = [](const auto& w, Numbers magic, const auto& sample, Numbers middle, Numbers* upper,
                          Numbers* lower) HWY_ATTR {
      for (i32 k = 0; k <= half; ++k) {
        upper[k] = magic;
        for (i32 t = 0; t < side; ++t) {
          const auto product = hn::Mul(t == half ? middle : sample(t), w[k][std::min(t, side - 1 - t)]);
          const auto sum = hn::Add(upper[k], product), rest = hn::Sub(product, hn::Sub(sum, upper[k]));
          lower[k] = t == 0 ? rest : hn::Add(lower[k], rest);
          upper[k] = sum;
        }
        upper[k] = hn::Sub(upper[k], magic);
      }
    };
    return add_samples<side>(band_.exact.rounded, samples, fetched, targets, terms);
  }
  HWY_INLINE Numbers divided(Numbers sum) const {
    const Tag<f32> d;
    const auto reciprocal = [&](i32 part) HWY_ATTR { return hn::LoadDup128(d, band_.exact.reciprocals[part]); };
    if (HWY_NATIVE_FMA && band_.exact.short_quotients)
      return hn::MulAdd(sum, reciprocal(0), hn::Mul(sum, reciprocal(1)));
    return hn::Div(sum, hn::LoadDup128(d, band_.divisors));
  }

  const StripLanes& strip_;
  FloatBand& band_;
};

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
