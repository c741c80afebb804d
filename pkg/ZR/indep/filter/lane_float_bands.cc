// Bands of a convolution of floats on lanes.
#include "filter/float_bands.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "filter/lane_float_bands.cc"
#include <hwy/foreach_target.h>

#include <algorithm>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// Vectors of double precision hold two pixels, one, or half of one. Where there are two, they come from both halves of
// the strip: the neighbours of a pixel are then whole vectors, at aligned places.
struct BandLanes {
  using Wide = Tag<f64>;
  using Half = hn::Rebind<f32, Wide>;
  using Sums = hn::Vec<Wide>;
  static constexpr i32 lanes = static_cast<i32>(HWY_LANES(f64));
  static constexpr i32 halves = lanes == 8 ? 2 : 1;        // of the strip
  static constexpr i32 parts = lanes == 2 ? 2 : 1;         // of a pixel
  static constexpr i32 vectors = 8;                        // at once
  static constexpr i32 pixels_of_block = vectors / parts;  // of each half
  static constexpr i32 place_numbers = lanes * parts;      // of a pixel, or one of each half
  static_assert(float_strip_step % (halves * pixels_of_block) == 0 && lanes * parts == 4 * halves);

  FloatBand& band;
  i64 left = 0;  // the strip's first pixel
  i64 part = 0;  // pixels of the strip, or of half of it

  HWY_INLINE i64 reach() const { return band.kernel.width / 2; }

  // The strip's samples of a source row, with those that its taps reach on both sides.
  HWY_INLINE const f32* samples_of(i64 r) const {
    const i64 first = left - reach(), end = left + part * halves + reach();
    const i64 inside_first = std::max<i64>(first, 0), inside_end = std::min<i64>(end, band.kernel.src_width);
    const f32* const row = reinterpret_cast<const f32*>(band.kernel.source_row(r));
    if (first == inside_first && end == inside_end) return row + 4 * first;
    std::fill(band.padded, band.padded + 4 * (end - first), 0.0f);
    if (inside_first < inside_end)
      std::copy(row + 4 * inside_first, row + 4 * inside_end, band.padded + 4 * (inside_first - first));
    return band.padded;
  }
  HWY_INLINE bool all_finite(const f32* samples) const {
    const hn::FixedTag<f32, 4> d;
    auto rests = hn::Zero(d);
    for (i64 i = 0; i < 4 * (part * halves + 2 * reach()); i += 4) {
      const auto v = hn::LoadU(d, samples + i);
      rests = hn::Or(rests, hn::Sub(v, v));  // 0, or NaN for what is not finite
    }
    return hn::AllTrue(d, hn::Eq(rests, hn::Zero(d)));
  }
  HWY_INLINE hn::Vec<Half> samples_at(const f32* p) const {
    if constexpr (halves == 2) {
      const hn::Half<Half> pixel;
      return hn::Combine(Half(), hn::LoadU(pixel, p + 4 * part), hn::LoadU(pixel, p));
    } else {
      return hn::LoadU(Half(), p);
    }
  }
  static HWY_INLINE hn::Vec<Half> four_at(const f32* four, i32 k) {
    return parts == 2 ? hn::LoadU(Half(), four + lanes * k) : hn::LoadDup128(Half(), four);
  }
  // Products of some places of a row, from the first on.
  template <i32 products>
  HWY_INLINE void make_products(const f32* samples, const f32* weights, i64 first, i64 end, f64* out) const {
    hn::Vec<Half> w[products * parts];
    for (i32 p = 0; p < products; ++p)
      for (i32 k = 0; k < parts; ++k) w[p * parts + k] = four_at(weights + 4 * p, k);
    const i64 from_product_to_product = band.product_place * place_numbers;
    samples += 4 * first;
    out += place_numbers * first;
    for (i64 x = first; x < end; ++x, samples += 4, out += place_numbers)
      for (i32 k = 0; k < parts; ++k) {
        const auto v = samples_at(samples + k * lanes);
        for (i32 p = 0; p < products; ++p)
          hn::Store(hn::PromoteTo(Wide(), hn::Mul(v, w[p * parts + k])), Wide(),
                    out + p * from_product_to_product + k * lanes);
      }
  }
  HWY_INLINE void make_group(const FloatBand::Group& group, const f32* samples, i64 first, i64 end) const {
    f64* out = band.products;
    const i64 next = band.product_place * place_numbers;
    i32 p = group.first_product;
    for (; p + 3 <= group.end_product; p += 3, out += 3 * next)
      make_products<3>(samples, band.weights + 4 * p, first, end, out);
    for (; p < group.end_product; ++p, out += next) make_products<1>(samples, band.weights + 4 * p, first, end, out);
  }

  // A kernel row on its way to the sums of a destination row.
  struct Way {
    const i32* places;
    i32 count;
    bool begins, ends;
    f64* sums;
    f32* out;
    i64 pixels;  // of the strip, that the destination has
  };
  // Adds its taps to a block of them, at place x.
  template <bool begins, bool ends>
  HWY_INLINE void add_block(const Way& way, i64 x) const {
    const Wide d;
    f64* const sums = way.sums + x * place_numbers;
    const f64* const products = band.products + x * place_numbers;
    Sums sum[vectors];
    for (i32 i = 0; i < vectors; ++i) sum[i] = begins ? hn::Zero(d) : hn::Load(d, sums + i * lanes);
    for (i32 t = 0; t < way.count; ++t) {
      const f64* const from = products + way.places[t] * place_numbers;
      for (i32 i = 0; i < vectors; ++i) sum[i] = hn::Add(sum[i], hn::Load(d, from + i * lanes));
    }
    if constexpr (!ends) {
      for (i32 i = 0; i < vectors; ++i) hn::Store(sum[i], d, sums + i * lanes);
      return;
    }
    hn::Vec<Half> divisors[parts];
    for (i32 k = 0; k < parts; ++k) divisors[k] = four_at(band.divisors, k);
    f32 rest[vectors * lanes];
    const bool cut = way.pixels < x + pixels_of_block + (halves - 1) * part;
    f32* to = cut ? rest : way.out + 4 * x;
    const i64 half_step = 4 * (cut ? pixels_of_block : part);
    for (i32 i = 0; i < vectors; ++i, to += lanes / halves) {
      const auto made = hn::Div(hn::DemoteTo(Half(), sum[i]), divisors[i % parts]);
      if constexpr (halves == 2) {
        const hn::Half<Half> pixel;
        hn::StoreU(hn::LowerHalf(pixel, made), pixel, to);
        hn::StoreU(hn::UpperHalf(pixel, made), pixel, to + half_step);
      } else {
        hn::StoreU(made, Half(), to);
      }
    }
    for (i32 h = 0; cut && h < halves; ++h) {
      const i64 first = x + h * part, count_inside = std::clamp<i64>(way.pixels - first, 0, pixels_of_block);
      std::copy(rest + h * half_step, rest + h * half_step + 4 * count_inside, way.out + 4 * first);
    }
  }
  HWY_INLINE void add(const Way& way, i64 x) const {
    if (way.begins && way.ends)
      add_block<true, true>(way, x);
    else if (way.begins)
      add_block<true, false>(way, x);
    else if (way.ends)
      add_block<false, true>(way, x);
    else
      add_block<false, false>(way, x);
  }
  // Carries source row r to all destination rows of the band that it meets.
  HWY_INLINE void meet(i64 r) {
    const f32* const samples = samples_of(r);
    const bool finite = !band.has_zeros || all_finite(samples);
    for (i32 g = 0; g < band.group_count; ++g) {
      const FloatBand::Group& group = band.groups[g];
      Way ways[largest_banded_side];
      i32 count = 0;
      for (i32 i = group.first_row; i < group.end_row; ++i) {
        const FloatBand::Row& row = band.rows[i];
        const i64 y = r - row.v + band.kernel.height / 2;
        if (y < band.first || y >= band.end) continue;
        const KernelRows met = kernel_rows_at(band.kernel, static_cast<i32>(y));
        Way& way = ways[count++];
        way.places = finite ? row.fewer_places : row.places;
        way.count = finite ? row.fewer : row.count;
        way.begins = row.v == met.first;
        way.ends = row.v == met.end - 1;
        way.sums = band.sums + y % band.kernel.height * band.sums_place * place_numbers;
        way.out = reinterpret_cast<f32*>(band.dst + (y - band.first) * band.dst_row_bytes) + 4 * left;
        way.pixels = band.pixels - left;
      }
      if (count == 0) continue;
      // Close to each other, so that processors do some of both at once.
      i64 made = 0;
      for (i64 x = 0; x < part; x += pixels_of_block) {
        const i64 end = x + pixels_of_block + 2 * reach();
        make_group(group, samples, made, end);
        made = end;
        for (i32 i = 0; i < count; ++i) add(ways[i], x);
      }
    }
  }

  // ------------------------------------------------------------------------------ exact sums
  using Single = Tag<f32>;
  using Numbers = hn::Vec<Single>;
  static constexpr i32 singles = lane_count(), single_vectors = lanes == 8 ? 8 : 4;
  static constexpr i32 block_pixels = singles * single_vectors / 4;
  static_assert(float_strip_step % block_pixels == 0);

  // What samples that are multiples of their bound's quantum leave at 0.
  struct Rests {
    Numbers magic, most, rests;
    HWY_INLINE explicit Rests(f32 quantum)
        : magic(hn::Set(Single(), 0x1.8p23f * quantum)), most(hn::Zero(Single())), rests(hn::Zero(Single())) {}
    HWY_INLINE void look(Numbers v) {
      most = hn::Max(most, hn::Abs(v));
      rests = hn::Or(rests, hn::Sub(hn::Sub(hn::Add(v, magic), magic), v));
    }
    HWY_INLINE f32 greatest() const { return hn::GetLane(hn::MaxOfLanes(Single(), most)); }
    HWY_INLINE bool within(f32 bound) const {
      const Single d;
      return hn::AllTrue(d, hn::And(hn::Eq(rests, hn::Zero(d)), hn::Le(most, hn::Set(d, bound))));
    }
  };
  HWY_INLINE Rests rests_of(i64 first_row, i64 end_row) const {
    const Single d;
    const i64 first = std::max<i64>(left - reach(), 0);
    const i64 end = std::min<i64>(left + part * halves + reach(), band.kernel.src_width);
    Rests rests(band.exact.quantum * band.bound);
    for (i64 r = first_row; r < end_row; ++r) {
      const f32* const row = reinterpret_cast<const f32*>(band.kernel.source_row(r));
      i64 c = 4 * first;
      for (; c + singles <= 4 * end; c += singles) rests.look(hn::LoadU(d, row + c));
      for (; c < 4 * end; c += 4) rests.look(hn::LoadDup128(d, row + c));
    }
    return rests;
  }
  // Whether the strip's samples between two source rows are such multiples; finds their bound.
  bool find_bound(i64 first_row, i64 end_row) {
    // A row that fails with its own bound does so with a larger one, too.
    return find_bound_of(first_row, first_row + 1) && find_bound_of(first_row, end_row);
  }
  bool find_bound_of(i64 first_row, i64 end_row) {
    const Rests rests = rests_of(first_row, end_row);
    if (rests.within(band.bound)) return true;
    const f32 greatest = rests.greatest();
    if (!(greatest > 0x1p-30f && greatest < 0x1p30f)) return false;
    const f32 before = band.bound;
    for (band.bound = 0x1p-30f; band.bound < greatest;) band.bound *= 2;
    return band.bound != before && rests_of(first_row, end_row).within(band.bound);
  }
  // The strip from a source row to another, if it can be made so.
  HWY_INLINE bool run_exactly(i64 first, i64 end) {
    if (!band.exact.possible) return false;
    // Strips resemble the last one: what that allowed is not looked at before, but on the way.
    for (i32 turn = 0; turn < 2; ++turn) {
      if (band.doubtful && !find_bound(first, end)) return false;
      i64 r = first;
      while (r < end && meet_exactly(r)) ++r;
      band.doubtful = r < end;
      if (!band.doubtful) return true;
    }
    return false;
  }

  struct Target {
    f32 *upper, *lower;  // sums
    f32* out;
    i32 kind;
    bool begins, ends;
  };
  // The destination rows that source row r meets, by kinds of kernel rows; their count.
  HWY_INLINE i32 find_targets(i64 r, Target* targets) const {
    i32 count = 0;
    for (i32 k = 0; k < band.exact.kind_count; ++k)
      for (i32 i = band.exact.kinds[k].first_row; i < band.exact.kinds[k].end_row; ++i) {
        const i32 v = band.exact.order[i];
        const i64 y = r - v + band.kernel.height / 2;
        if (y < band.first || y >= band.end) continue;
        const KernelRows met = kernel_rows_at(band.kernel, static_cast<i32>(y));
        f32* const sums = band.exact.sums + y % band.kernel.height * band.exact.sums_place;
        f32* const out = reinterpret_cast<f32*>(band.dst + (y - band.first) * band.dst_row_bytes) + 4 * left;
        targets[count++] = {sums, sums + 4 * band.strip, out, k, v == met.first, v == met.end - 1};
      }
    return count;
  }
  HWY_INLINE void carry_block(const Target& to, i64 c, const Numbers* upper, const Numbers* lower) const {
    const Single d;
    Numbers sums[2 * single_vectors];
    for (i32 i = 0; i < single_vectors; ++i) {
      // From 0 on, for -0 alone is 0 as a sum.
      const i64 at = c + i * singles;
      sums[i] = hn::Add(to.begins ? hn::Zero(d) : hn::Load(d, to.upper + at), upper[i]);
      sums[single_vectors + i] = hn::Add(to.begins ? hn::Zero(d) : hn::Load(d, to.lower + at), lower[i]);
    }
    if (!to.ends) {
      for (i32 i = 0; i < single_vectors; ++i) {
        hn::Store(sums[i], d, to.upper + c + i * singles);
        hn::Store(sums[single_vectors + i], d, to.lower + c + i * singles);
      }
      return;
    }
    const i64 inside = 4 * (band.pixels - left) - c;
    f32 rest[singles * single_vectors];
    f32* const out = inside < singles * single_vectors ? rest : to.out + c;
    for (i32 i = 0; i < single_vectors; ++i) sums[i] = hn::Add(sums[i], sums[single_vectors + i]);
    if (HWY_NATIVE_FMA && band.exact.short_quotients) {
      const auto by = hn::LoadDup128(d, band.exact.reciprocals[0]),
                 rest_by = hn::LoadDup128(d, band.exact.reciprocals[1]);
      for (i32 i = 0; i < single_vectors; ++i)
        hn::StoreU(hn::MulAdd(sums[i], by, hn::Mul(sums[i], rest_by)), d, out + i * singles);
    } else {
      const auto divisor = hn::LoadDup128(d, band.divisors);
      for (i32 i = 0; i < single_vectors; ++i) hn::StoreU(hn::Div(sums[i], divisor), d, out + i * singles);
    }
    if (out == rest) std::copy(rest, rest + std::max<i64>(inside, 0), to.out + c);
  }
  // Like meet(), where sums are exact; false, with the rest to be made otherwise, where they turn out not to be.
  HWY_INLINE bool meet_exactly(i64 r) const {
    const Single d;
    const FloatBand::Exact& exact = band.exact;
    const i64 count = 4 * (part * halves + 2 * reach()), place = exact.samples_place;
    f32* const upper = exact.samples;
    f32* const lower = upper + place;
    f32* const pairs = lower + place;
    {
      const f32* const samples = samples_of(r);
      const auto magic = hn::Set(d, 0x1.8p23f * exact.split * band.bound);
      Rests rests(exact.quantum * band.bound);
      const auto split = [&](i64 c) HWY_ATTR {
        const auto v = hn::LoadU(d, samples + c);
        rests.look(v);
        const auto high = hn::Sub(hn::Add(v, magic), magic);
        hn::StoreU(high, d, upper + c);
        hn::StoreU(hn::Sub(v, high), d, lower + c);
      };
      i64 c = 0;
      for (; c + singles <= count; c += singles) split(c);
      if (c < count) split(count - singles);
      if (!rests.within(band.bound)) return false;
    }
    const i64 all = 4 * part * halves, opposite = 8 * reach(), pair_terms = exact.mirrored ? reach() : 0;
    Target targets[largest_banded_side];
    const i32 target_count = find_targets(r, targets);
    for (i64 c = 0; c < all; c += singles * single_vectors) {
      for (i64 t = 0; t < pair_terms; ++t)
        for (const f32* const half : {upper, lower}) {
          f32* const to = pairs + (2 * t + (half == lower)) * place + c;
          for (i32 i = 0; i < single_vectors * singles; i += singles)
            hn::StoreU(hn::Add(hn::LoadU(d, half + c + i + 4 * t), hn::LoadU(d, half + c + i + opposite - 4 * t)), d,
                       to + i);
        }
      for (i32 i = 0; i < target_count;) {
        const i32 kind = targets[i].kind;
        const f32* w = exact.weights + 4 * kind * exact.terms;
        Numbers high[single_vectors], low[single_vectors];
        for (i32 j = 0; j < single_vectors; ++j) high[j] = low[j] = hn::Zero(d);
        const auto add_term = [&](const f32* from_upper, const f32* from_lower) HWY_ATTR {
          const auto weight = hn::LoadDup128(d, w);
          for (i32 j = 0; j < single_vectors; ++j) {
            high[j] = hn::MulAdd(weight, hn::LoadU(d, from_upper + j * singles), high[j]);
            low[j] = hn::MulAdd(weight, hn::LoadU(d, from_lower + j * singles), low[j]);
          }
          w += 4;
        };
        for (i64 t = 0; t < pair_terms; ++t) add_term(pairs + 2 * t * place + c, pairs + (2 * t + 1) * place + c);
        for (i64 t = pair_terms; t < exact.terms; ++t) add_term(upper + 4 * t + c, lower + 4 * t + c);
        for (; i < target_count && targets[i].kind == kind; ++i) carry_block(targets[i], c, high, low);
      }
    }
    return true;
  }

  HWY_INLINE void run() {
    const i64 half = band.kernel.height / 2;
    const i64 first = std::max<i64>(band.first - half, 0), end = std::min<i64>(band.end + half, band.kernel.src_height);
    for (; left < band.pixels; left += band.strip) {
      const i64 wide = std::min<i64>(band.strip, band.pixels - left);
      part = (wide + halves * pixels_of_block - 1) / (halves * pixels_of_block) * pixels_of_block;
      if (run_exactly(first, end)) continue;
      for (i64 r = first; r < end; ++r) meet(r);
    }
  }
};

void run_band(FloatBand& band) { BandLanes{band}.run(); }
FloatBandLanes float_band() { return {&run_band, BandLanes::halves}; }

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

FloatBandLanes lane_float_band() {
  ZR_RETURN_BEST(float_band());
  return {nullptr, 1};
}

}  // namespace zr
#endif
