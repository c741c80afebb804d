// Bands of a convolution of floats on lanes.
#include "filter/float_bands.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "filter/lane_float_bands.cc"
#include <hwy/foreach_target.h>

#include <hwy/cache_control.h>

#include <algorithm>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "filter/lane_exact_bands-inl.h"

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

  StripLanes strip;
  FloatBand& band = strip.band;
  i64 part = 0;  // pixels of the strip, or of half of it

  HWY_INLINE i64 reach() const { return strip.reach(); }

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
  template <class D>
  static HWY_INLINE void write(hn::Vec<D> v, D d, bool streams, f32* to) {
    if constexpr (hn::MaxLanes(D()) >= 4)
      if (streams) return hn::Stream(v, d, to);
    hn::StoreU(v, d, to);
  }
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
    const bool streams = band.streams && !cut && reinterpret_cast<std::uintptr_t>(to) % 16 == 0;
    for (i32 i = 0; i < vectors; ++i, to += lanes / halves) {
      const auto made = hn::Div(hn::DemoteTo(Half(), sum[i]), divisors[i % parts]);
      if constexpr (halves == 2) {
        const hn::Half<Half> pixel;
        write(hn::LowerHalf(pixel, made), pixel, streams, to);
        write(hn::UpperHalf(pixel, made), pixel, streams, to + half_step);
      } else {
        write(made, Half(), streams, to);
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
    const f32* const samples = strip.samples_of(r);
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
        way.out = reinterpret_cast<f32*>(band.dst + (y - band.first) * band.dst_row_bytes) + 4 * strip.left;
        way.pixels = band.pixels - strip.left;
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

  HWY_INLINE void run() {
    const i64 half = band.kernel.height / 2;
    const i64 first = std::max<i64>(band.first - half, 0), end = std::min<i64>(band.end + half, band.kernel.src_height);
    for (; strip.left < band.pixels; strip.left += band.strip) {
      const i64 wide = std::min<i64>(band.strip, band.pixels - strip.left);
      part = (wide + halves * pixels_of_block - 1) / (halves * pixels_of_block) * pixels_of_block;
      strip.pixels = part * halves;
      if (ExactLanes{strip}.run(first, end)) continue;
      for (i64 r = first; r < end; ++r) meet(r);
    }
    if (band.streams) hwy::FlushStream();
  }
};

void run_band(FloatBand& band) { BandLanes{{band}}.run(); }
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
