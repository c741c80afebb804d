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
#include "world/guard.h"

namespace zr {
namespace {

constexpr i32 most_shared = 12;  // products for all rows, before each kind of row gets its own
constexpr i32 least_strip = 32, most_strip = 128;
constexpr i64 near_memory = 44 * 1024;  // that processors keep closest, with some to spare
constexpr i32 least_rows = 16;          // of a band
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
    term_weights_ = cutter.take<f32>(4 * taps);
    padded_ = cutter.take<f32>(4 * (most_strip + c.width));
    const i64 most_made = std::max(c.width, most_shared);
    blocks_ = cutter.take<char>(std::max(block_bytes(most_strip, most_made), exact_bytes()));
    bytes_ = cutter.used();
  }
  i64 bytes() const { return bytes_; }

  void fill(FloatBand* band) {
    find_kinds();
    find_exact(&band->exact);
    if (!share_among_all()) share_among_rows();
    i32 most_made = 1;
    for (i32 g = 0; g < group_count_; ++g)
      most_made = std::max(most_made, groups_[g].end_product - groups_[g].first_product);
    i32 strip = most_strip;
    while (strip > least_strip && near_bytes(strip, most_made) > near_memory) strip -= float_strip_step;

    band->kernel = c_;
    band->groups = groups_;
    band->group_count = group_count_;
    band->rows = rows_;
    band->weights = weights_;
    band->strip = strip;
    band->product_place = spread(product_pixels(strip));
    band->sums_place = spread(strip / halves_);
    for (i32 k = 0; k < 4; ++k) band->divisors[k] = static_cast<f32>(c_.divisors[k]);
    band->products = reinterpret_cast<f64*>(blocks_);
    band->sums = band->products + most_made * band->product_place * 4 * halves_;
    band->padded = padded_;
    for (i32 g = 0; g < group_count_; ++g)
      for (i32 r = groups_[g].first_row; r < groups_[g].end_row; ++r) find_places(groups_[g], &rows_[r], band);
  }

 private:
  // Blocks whose addresses have the same last 12 bits would wait for each other.
  static constexpr i64 spread(i64 places) { return (places + 52) / 64 * 64 + 11; }
  i64 product_pixels(i32 strip) const { return strip / halves_ + c_.width - 1; }
  i64 near_bytes(i32 strip, i64 products) const {
    return pixel_bytes * halves_ * (products * product_pixels(strip) + i64{c_.height} * strip / halves_);
  }
  i64 block_bytes(i32 strip, i64 products) const {
    return pixel_bytes * halves_ * (products * spread(product_pixels(strip)) + c_.height * spread(strip / halves_));
  }
  i64 exact_samples() const { return (c_.width + 1) * exact_samples_place(); }
  i64 exact_samples_place() const { return 16 * spread((most_strip + c_.width - 1) / 4 + 1); }
  static i64 exact_sums_place() { return 16 * spread(8 * most_strip / 16); }
  i64 exact_bytes() const { return (exact_samples() + c_.height * exact_sums_place()) * static_cast<i64>(sizeof(f32)); }
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
  void find_exact(FloatBand::Exact* exact) const {
    u64 greatest = 1, sum = 1;
    for (i32 k = 0; k < 4; ++k) {
      sum = std::max(sum, c_.tap_sums[k]);
      for (i64 i = 0; i < i64{c_.width} * c_.height; ++i)
        greatest = std::max(greatest, static_cast<u64>(std::abs(i64{c_.kernels[k][i]})));
    }
    // Samples are up to 2^bits quanta, so that products fit the 24 bits of single precision. The lower halves, of up to
    // 2^lower quanta, and the upper halves, of up to 2^(bits - lower - 1) times that, are summed in 24 bits too.
    const i32 product_bits = static_cast<i32>(std::bit_width(greatest - 1));
    const i32 sum_bits = static_cast<i32>(std::bit_width(sum - 1));
    const i32 bits = std::min({24 - product_bits, 47 - 2 * sum_bits, 22}), lower = 24 - sum_bits;
    exact->possible = bits >= 8;
    exact->quantum = std::ldexp(1.0f, -bits);
    exact->split = std::ldexp(1.0f, std::min(lower + 1 - bits, 0));
    exact->short_quotients = true;
    for (i32 k = 0; k < 4; ++k) {
      const f32 divisor = static_cast<f32>(c_.divisors[k]);
      const ShortQuotient by = ShortQuotient::of(divisor);
      exact->short_quotients = exact->short_quotients && ShortQuotient::serves(divisor);
      exact->reciprocals[0][k] = by.upper;
      exact->reciprocals[1][k] = by.lower;
    }
    exact->mirrored = is_mirrored();
    exact->terms = exact->mirrored ? c_.width / 2 + 1 : c_.width;
    exact->weights = term_weights_;
    exact->kinds = kinds_;
    exact->kind_count = kind_count_;
    exact->order = order_;
    exact->samples = reinterpret_cast<f32*>(blocks_);
    exact->samples_place = exact_samples_place();
    exact->sums = exact->samples + exact_samples();
    exact->sums_place = exact_sums_place();
    for (i32 k = 0; k < kind_count_; ++k)
      for (i32 t = 0; t < exact->terms; ++t)
        for (i32 c = 0; c < 4; ++c)
          term_weights_[4 * (k * exact->terms + t) + c] =
              static_cast<f32>(c_.kernels[c][i64{order_[kinds_[k].first_row]} * c_.width + t]);
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
  f32 *weights_, *term_weights_, *padded_;
  i32 *places_, *fewer_places_, *order_;
  char* blocks_;
  i64 bytes_;
  i32 product_count_ = 0, group_count_ = 0, kind_count_ = 0;
};

}  // namespace

FloatBands::FloatBands(const Convolution<ZR_PixelFloat>& c) {
  const FloatBandLanes lanes = lane_float_band();
  run_ = lanes.run;
  if (run_ == nullptr || c.width > largest_banded_side || c.height > largest_banded_side) return;
  const u64 bytes = static_cast<u64>(Plan(c, lanes.halves, nullptr).bytes());
  memory_ = static_cast<char*>(HB_AllocatePtr(bytes + 64, HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_BlurMemory, 0, 0),
                                              ZR_ModuleCode | ZR_Site_Convolve));
  if (memory_ == nullptr) fail(ZR_Err_OutOfMemory);
  Plan(c, lanes.halves, memory_ + (64 - reinterpret_cast<std::uintptr_t>(memory_) % 64) % 64).fill(&band_);
}
FloatBands::~FloatBands() { HB_FreePtr(memory_); }

void FloatBands::make(i32 first, i32 end, i32 pixels, char* dst, i64 dst_row_bytes) {
  // Rows further down meet no source.
  const i64 below = i64{band_.kernel.src_height} + band_.kernel.height / 2;
  const i32 met = band_.kernel.src_height > 0 ? static_cast<i32>(std::clamp<i64>(below, first, end)) : first;
  band_.pixels = pixels;
  band_.dst_row_bytes = dst_row_bytes;
  // Few enough that what they read twice stays near.
  const i32 rows_of_band = std::max(least_rows, 4 * band_.kernel.height);
  for (i32 y = first; y < met && pixels > 0; y = band_.end) {
    band_.first = y;
    band_.end = std::min(y + rows_of_band, met);
    band_.dst = dst + (y - first) * dst_row_bytes;
    run_(band_);
  }
  for (i32 y = met; y < end; ++y)
    convolve_pixels(band_.kernel, y, 0, pixels, reinterpret_cast<ZR_PixelFloat*>(dst + (y - first) * dst_row_bytes));
}

}  // namespace zr
