// The plan of a convolution of floats: which products there are, and which taps take them.
#include "filter/float_bands.h"

#include <ZR/blur.h>
#include <ZR/errors.h>

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdlib>
#include <cstring>

#include "filter/short_quotient.h"
#include "simd/streamed.h"
#include "world/guard.h"

namespace zr {
namespace {

constexpr i32 most_shared = 12;  // products for all rows, before each kind of row gets its own
constexpr i32 least_strip = 32;
constexpr i64 near_memory = 44 * 1024;  // that processors keep closest, with some to spare
constexpr i32 least_rows = 128;         // of a band
constexpr i32 kept_rows = 32;
constexpr i64 pixel_bytes = 4 * sizeof(f64);

// Pieces of memory; of none it only finds the size.
class Cutter {
 public:
  explicit Cutter(char* memory) : memory_(memory) {}
  template <class N>
  N* take(i64 count) {
    char* const piece = memory_ != nullptr ? memory_ + used_ : nullptr;
    used_ += (count * static_cast<i64>(sizeof(N)) + 63) / 64 * 64;
    return reinterpret_cast<N*>(piece);
  }
  i64 used() const { return used_; }

 private:
  char* memory_;
  i64 used_ = 0;
};

class Plan {
 public:
  Plan(const Convolution<ZR_PixelFloat>& c, i32 halves, char* memory) : c_(c), halves_(halves) {
    const i64 taps = static_cast<i64>(c.width) * c.height;
    Cutter cutter(memory);
    groups_ = cutter.take<FloatBand::Group>(c.height);
    rows_ = cutter.take<FloatBand::Row>(c.height);
    weights_ = cutter.take<f32>(4 * taps);
    places_ = cutter.take<i32>(taps);
    fewer_places_ = cutter.take<i32>(taps);
    kinds_ = cutter.take<FloatBand::Group>(c.height);
    order_ = cutter.take<i32>(c.height);
    sample_lines_ = cutter.take<FloatBand::Exact::Line>(c.height);
    product_lines_ = cutter.take<FloatBand::Exact::Line>(c.height);
    sample_places_ = cutter.take<i32>(c.width);
    product_places_ = cutter.take<i32>(taps);
    term_weights_ = cutter.take<f32>(4 * taps);
    lines_ = cutter.take<i32>(c.height);
    padded_ = cutter.take<f32>(4 * (float_most_strip + c.width));
    spare_ = cutter.take<f32>(4 * float_most_strip);
    const i64 most_made = std::max(c.width, most_shared);
    blocks_ = cutter.take<char>(std::max(block_bytes(float_most_strip, most_made), exact_bytes(most_made)));
    bytes_ = cutter.used();
  }
  i64 bytes() const { return bytes_; }

  void fill(FloatBand* band) {
    find_kinds();
    if (!share_among_all()) share_among_rows();
    find_exact(&band->exact);
    i32 most_made = 1;
    for (i32 g = 0; g < group_count_; ++g)
      most_made = std::max(most_made, groups_[g].end_product - groups_[g].first_product);
    i32 strip = float_most_strip;
    while (strip > least_strip && near_bytes(strip, most_made) > near_memory) strip -= float_strip_step;

    band->kernel = c_;
    band->groups = groups_;
    band->group_count = group_count_;
    band->rows = rows_;
    band->weights = weights_;
    band->strip = strip;
    band->product_place = spread_lines(product_pixels(strip));
    band->sums_place = spread_lines(strip / halves_);
    for (i32 k = 0; k < 4; ++k) band->divisors[k] = static_cast<f32>(c_.divisors[k]);
    band->products = reinterpret_cast<f64*>(blocks_);
    band->sums = band->products + most_made * band->product_place * 4 * halves_;
    band->padded = padded_;
    band->spare = spare_;
    for (i32 g = 0; g < group_count_; ++g)
      for (i32 r = groups_[g].first_row; r < groups_[g].end_row; ++r) find_places(groups_[g], &rows_[r], band);
  }

 private:
  i64 product_pixels(i32 strip) const { return strip / halves_ + c_.width - 1; }
  i64 near_bytes(i32 strip, i64 products) const {
    return pixel_bytes * halves_ * (products * product_pixels(strip) + i64{c_.height} * strip / halves_);
  }
  i64 block_bytes(i32 strip, i64 products) const {
    return pixel_bytes * halves_ *
           (products * spread_lines(product_pixels(strip)) + c_.height * spread_lines(strip / halves_));
  }
  static i64 exact_sums_place() { return 16 * spread_lines(8 * float_most_strip / 16); }
  i64 planes_end(i64 products) const { return 2 * std::max<i64>(products, c_.width / 2 + 1) * float_plane_place; }
  i64 exact_bytes(i64 products) const {
    return (planes_end(products) + (c_.height + 1) * exact_sums_place()) * static_cast<i64>(sizeof(f32));
  }
  // The number of a tap's product, which may be a new one, from those of its group on.
  i32 product_of(i32 v, i32 u, i32 group_begin) {
    f32 w[4];
    for (i32 k = 0; k < 4; ++k) w[k] = static_cast<f32>(c_.kernels[k][i64{v} * c_.width + u]);
    i32 p = group_begin;
    while (p < product_count_ && std::memcmp(weights_ + 4 * p, w, sizeof w) != 0) ++p;
    if (p == product_count_) std::memcpy(weights_ + 4 * product_count_++, w, sizeof w);
    return p;
  }
  void number_row(i32 v, i32 group_begin) {
    for (i32 u = 0; u < c_.width; ++u) places_[i64{v} * c_.width + u] = product_of(v, u, group_begin);
  }
  // One group, where it stays small.
  bool share_among_all() {
    for (i32 v = 0; v < c_.height; ++v) {
      number_row(v, 0);
      rows_[v].v = v;
      if (product_count_ > most_shared) return false;
    }
    groups_[0] = {0, product_count_, 0, c_.height};
    group_count_ = 1;
    return true;
  }
  bool same_rows(i32 a, i32 b) const {
    for (const i32* const kernel : c_.kernels)
      if (!std::equal(kernel + i64{a} * c_.width, kernel + (i64{a} + 1) * c_.width, kernel + i64{b} * c_.width))
        return false;
    return true;
  }
  void find_kinds() {
    i32 placed = 0;
    for (i32 v = 0; v < c_.height; ++v) {
      if (std::find(order_, order_ + placed, v) != order_ + placed) continue;
      FloatBand::Group& kind = kinds_[kind_count_++];
      kind = {0, 0, placed, placed};
      for (i32 other = v; other < c_.height; ++other)
        if (same_rows(v, other)) order_[placed++] = other;
      kind.end_row = placed;
    }
  }
  void share_among_rows() {
    product_count_ = 0;
    group_count_ = kind_count_;
    for (i32 k = 0; k < kind_count_; ++k) {
      FloatBand::Group& group = groups_[k];
      group = kinds_[k];
      group.first_product = product_count_;
      for (i32 i = group.first_row; i < group.end_row; ++i) {
        rows_[i].v = order_[i];
        number_row(order_[i], group.first_product);
      }
      group.end_product = product_count_;
    }
  }
  bool is_mirrored() const {
    for (const i32* const kernel : c_.kernels)
      for (i32 v = 0; v < c_.height; ++v)
        for (i32 u = 0; u < c_.width / 2; ++u)
          if (kernel[i64{v} * c_.width + u] != kernel[i64{v} * c_.width + c_.width - 1 - u]) return false;
    return true;
  }
  // Products of samples of up to 2^bits quanta fit the 24 bits of single precision. The lower parts, of up to 2^lower
  // quanta, and the upper parts, of up to 2^(bits - lower - 1) times that, are summed in 24 bits too.
  static FloatBand::Exact::Condition whole_products(u64 greatest_tap, u64 tap_sum) {
    const i32 product_bits = static_cast<i32>(std::bit_width(greatest_tap - 1));
    const i32 sum_bits = static_cast<i32>(std::bit_width(tap_sum - 1));
    const i32 bits = std::min({24 - product_bits, 47 - 2 * sum_bits, 22}), lower = 24 - sum_bits;
    return {bits >= 8, std::ldexp(1.0f, -bits), std::ldexp(1.0f, std::min(lower + 1 - bits, 0))};
  }
  // Products, each rounded to a multiple of the quantum, and their sums in a kernel row are up to 2^22 times the split,
  // so that they can be rounded to it, and all upper parts' sums up to 2^24 times. Lower parts are up to half of it,
  // and their sums up to 2^24 quanta.
  static FloatBand::Exact::Condition rounded_products(u64 row_sum, u64 tap_sum, i64 taps) {
    constexpr i32 most_bits = 24;  // of weights
    const i32 tap_bits = static_cast<i32>(std::bit_width(static_cast<u64>(taps) - 1));
    i32 split = -most_bits;
    while (std::ldexp(static_cast<f64>(row_sum), -split) > 0x1p22 ||
           std::ldexp(static_cast<f64>(tap_sum), -split) + static_cast<f64>(taps) > 0x1p24)
      ++split;
    const i32 quantum = split + tap_bits - 25;
    return {tap_sum < 1u << most_bits && quantum <= -most_bits, std::ldexp(1.0f, quantum), std::ldexp(1.0f, split)};
  }
  void find_exact(FloatBand::Exact* exact) const {
    u64 greatest = 1, row_sum = 1, sum = 1;
    for (i32 k = 0; k < 4; ++k) {
      sum = std::max(sum, c_.tap_sums[k]);
      for (i32 v = 0; v < c_.height; ++v) {
        u64 of_row = 0;
        for (i64 i = i64{v} * c_.width; i < (i64{v} + 1) * c_.width; ++i) {
          const u64 tap = static_cast<u64>(std::abs(i64{c_.kernels[k][i]}));
          greatest = std::max(greatest, tap);
          of_row += tap;
        }
        row_sum = std::max(row_sum, of_row);
      }
    }
    exact->whole = whole_products(greatest, sum);
    exact->rounded = rounded_products(row_sum, sum, i64{c_.width} * c_.height);
    exact->short_quotients = true;
    for (i32 k = 0; k < 4; ++k) {
      const f32 divisor = static_cast<f32>(c_.divisors[k]);
      const ShortQuotient by = ShortQuotient::of(divisor);
      exact->short_quotients = exact->short_quotients && ShortQuotient::serves(divisor);
      exact->reciprocals[0][k] = by.upper;
      exact->reciprocals[1][k] = by.lower;
    }
    exact->mirrored = is_mirrored();
    exact->line_count = kind_count_;
    exact->order = order_;
    for (i32 k = 0; k < kind_count_; ++k)
      for (i32 i = kinds_[k].first_row; i < kinds_[k].end_row; ++i) lines_[order_[i]] = k;
    exact->lines = lines_;
    exact->small = exact->mirrored && c_.width == c_.height && (c_.width == 3 || c_.width == 5);
    for (i32 v = 0; v < c_.height; ++v) exact->small = exact->small && lines_[v] == lines_[c_.height - 1 - v];
    find_sample_lines(exact->mirrored);
    find_product_lines();
    exact->samples = sample_lines_;
    exact->products = product_lines_;
    exact->planes = reinterpret_cast<f32*>(blocks_);
    const i64 products = std::max(c_.width, most_shared);
    exact->sums = exact->planes + planes_end(products);
    exact->sums_place = exact_sums_place();
  }
  // Terms of samples are those of one plane, or of pairs: a plane for each, after that of the samples themselves.
  void find_sample_lines(bool mirrored) const {
    const i32 pairs = mirrored ? c_.width / 2 : 0, terms = c_.width - pairs;
    for (i32 t = 0; t < terms; ++t)
      sample_places_[t] = t < pairs ? static_cast<i32>((2 * t + 2) * float_plane_place) : 4 * t;
    for (i32 k = 0; k < kind_count_; ++k) {
      f32* const weights = term_weights_ + 4 * i64{k} * c_.width;
      const i64 first_tap = i64{order_[kinds_[k].first_row]} * c_.width;
      for (i32 t = 0; t < terms; ++t)
        for (i32 c = 0; c < 4; ++c) weights[4 * t + c] = static_cast<f32>(c_.kernels[c][first_tap + t]);
      sample_lines_[k] = {sample_places_, weights, terms, kinds_[k].first_row, kinds_[k].end_row};
    }
  }
  // Terms of products, one plane for each product of a group, but those of weight 0.
  void find_product_lines() const {
    for (i32 k = 0; k < kind_count_; ++k) {
      const i32 first_product = groups_[group_count_ == kind_count_ ? k : 0].first_product;
      const i64 first_tap = i64{order_[kinds_[k].first_row]} * c_.width;
      i32* const places = product_places_ + first_tap;
      i32 count = 0;
      for (i32 u = 0; u < c_.width; ++u) {
        const i32 product = places_[first_tap + u];
        const f32* const w = weights_ + 4 * i64{product};
        if (w[0] != 0 || w[1] != 0 || w[2] != 0 || w[3] != 0)
          places[count++] = static_cast<i32>(2 * (product - first_product) * float_plane_place + 4 * u);
      }
      product_lines_[k] = {places, nullptr, count, kinds_[k].first_row, kinds_[k].end_row};
    }
  }
  void find_places(const FloatBand::Group& group, FloatBand::Row* row, FloatBand* band) const {
    const i64 first_tap = i64{row->v} * c_.width;
    i32* const places = places_ + first_tap;
    i32* const fewer_places = fewer_places_ + first_tap;
    row->places = places;
    row->fewer_places = fewer_places;
    row->count = c_.width;
    row->fewer = 0;
    for (i32 u = 0; u < c_.width; ++u) {
      const f32* const w = weights_ + 4 * places[u];
      places[u] = static_cast<i32>((places[u] - group.first_product) * band->product_place + u);
      if (w[0] != 0 || w[1] != 0 || w[2] != 0 || w[3] != 0) fewer_places[row->fewer++] = places[u];
    }
    if (row->fewer < row->count) band->has_zeros = true;
  }

  const Convolution<ZR_PixelFloat>& c_;
  i32 halves_;
  FloatBand::Group* groups_;
  FloatBand::Row* rows_;
  FloatBand::Group* kinds_;
  FloatBand::Exact::Line *sample_lines_, *product_lines_;
  f32 *weights_, *term_weights_, *padded_, *spare_;
  i32 *places_, *fewer_places_, *order_, *sample_places_, *product_places_, *lines_;
  char* blocks_;
  i64 bytes_;
  i32 product_count_ = 0, group_count_ = 0, kind_count_ = 0;
};

}  // namespace

FloatBands::FloatBands(const Convolution<ZR_PixelFloat>& c, const ZR_LayerDef& dst, bool kept) : dst_(dst) {
  const FloatBandLanes lanes = lane_float_band();
  run_ = lanes.run;
  if (run_ == nullptr || c.width > largest_banded_side || c.height > largest_banded_side) return;
  constexpr u64 line = 64;
  const u64 plan_bytes = (static_cast<u64>(Plan(c, lanes.halves, nullptr).bytes()) + line - 1) / line * line;
  const u64 kept_bytes = kept && dst.width > 0 ? kept_rows * static_cast<u64>(row_bytes()) : 0;
  memory_ = static_cast<char*>(HB_AllocatePtr(plan_bytes + kept_bytes + line,
                                              HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_BlurMemory, 0, 0),
                                              ZR_ModuleCode | ZR_Site_Convolve));
  if (memory_ == nullptr) fail(ZR_Err_OutOfMemory);
  char* const first = memory_ + (line - reinterpret_cast<std::uintptr_t>(memory_) % line) % line;
  Plan(c, lanes.halves, first).fill(&band_);
  kept_ = first + plan_bytes;
  band_.pixels = dst.width;
}
FloatBands::~FloatBands() { HB_FreePtr(memory_); }

void FloatBands::make_rows(i32 first, i32 end) {
  band_.dst_row_bytes = dst_.row_bytes;
  band_.streams = row_bytes() * dst_.height >= streamed_bytes;
  make(first, end, row(first));
}
void FloatBands::make_next(i32 y) {
  if (dst_.width <= 0) return;
  if (y >= kept_end_) {
    kept_first_ = y;
    kept_end_ = std::min(y + kept_rows, dst_.height);
    band_.dst_row_bytes = row_bytes();
    make(kept_first_, kept_end_, kept_);
  }
  std::memcpy(row(y), kept_ + (y - kept_first_) * row_bytes(), static_cast<std::size_t>(row_bytes()));
}

// Rows first..end-1, to memory whose rows lie as band_ says.
void FloatBands::make(i32 first, i32 end, char* rows) {
  // Rows further down meet no source.
  const i64 below = i64{band_.kernel.src_height} + band_.kernel.height / 2;
  const i32 met = band_.kernel.src_height > 0 ? static_cast<i32>(std::clamp<i64>(below, first, end)) : first;
  const auto at = [&](i32 y) { return rows + (y - first) * band_.dst_row_bytes; };
  // Few enough that what they read twice stays near.
  const i32 rows_of_band = std::max(least_rows, 4 * band_.kernel.height);
  for (i32 y = first; y < met && dst_.width > 0; y = band_.end) {
    band_.first = y;
    band_.end = std::min(y + rows_of_band, met);
    band_.dst = at(y);
    run_(band_);
  }
  for (i32 y = met; y < end; ++y)
    convolve_pixels(band_.kernel, y, 0, dst_.width, reinterpret_cast<ZR_PixelFloat*>(at(y)));
}

}  // namespace zr
