// Convolution of floats in bands: a product of a sample and a weight is made once for all taps that share it.
//
// A band is walked in strips of columns, from source row to source row. The products of a row are rounded to single
// precision, as everywhere, and kept as doubles for the sums of all destination rows that the source row meets. Each
// sum takes its taps in the order of the kernel, as single numbers do, for it meets source rows in that order. Strips
// whose sums need no rounding are made in single precision instead (Exact).
#pragma once

#include "filter/convolve_rows.h"

namespace zr {

inline constexpr i32 largest_banded_side = 63;  // of kernels; of larger ones few taps are alike
inline constexpr i32 float_strip_step = 32;     // strips are whole multiples of so many pixels
inline constexpr i32 float_most_strip = 128;

// Blocks of so many lines of 64 bytes, at addresses that differ in their last 12 bits: equal ones wait for each other.
constexpr i64 spread_lines(i64 lines) { return (lines + 52) / 64 * 64 + 11; }
// Numbers from one plane of a strip's numbers, with those that taps reach, to the next.
inline constexpr i64 float_plane_place = 16 * spread_lines((float_most_strip + largest_banded_side - 1) / 4 + 1);

struct FloatBand {
  // A kernel row: where the products of its taps are, in pixels from the first of its group's. Taps of weight 0 add
  // nothing where all samples are finite: the second list is without them.
  struct Row {
    i32 v;
    const i32 *places, *fewer_places;
    i32 count, fewer;
  };
  // Products that are made together, and the kernel rows made of them.
  struct Group {
    i32 first_product, end_product, first_row, end_row;
  };

  // Sums that are exact in single precision, so that they may be made in any order and form: each of two numbers, the
  // upper one a multiple of `split`. Kernel rows that are alike share their sums, and sums their pairs of samples.
  struct Exact {
    // What samples of up to 1 are multiples of.
    struct Condition {
      bool possible;
      f32 quantum, split;
    };
    // The numbers of a kernel row's terms, counted from its pixel on, and their weights, four for each; null are ones.
    struct Line {
      const i32* places;
      const f32* weights;
      i32 count, first_row, end_row;  // in `order`
    };
    // Whole products: samples are split, then weighted. Rounded products: these are split.
    Condition whole, rounded;
    bool mirrored;   // every kernel row: terms of samples are pairs
    i32 line_count;  // kinds of kernel rows
    const Line *samples, *products;
    const i32* order;    // of kernel rows
    const i32* lines;    // of each kernel row
    bool small;          // 3x3 or 5x5, alike from left and right, from above and below
    f32 *planes, *sums;  // upper and lower parts of a row; of a destination row, and of none
    i64 sums_place;      // numbers from one row to the next
    bool short_quotients;
    f32 reciprocals[2][4];  // upper and lower parts of the divisors'
  };
  enum class Form { whole, rounded, doubles };

  Convolution<ZR_PixelFloat> kernel;
  Exact exact;
  // Of the last strip.
  Form form = Form::doubles;
  f32 bound = 1;  // of its samples, a power of two
  const Group* groups;
  i32 group_count;
  const Row* rows;
  const f32* weights;  // four for each product
  bool has_zeros;
  i32 strip;  // pixels
  // Pixels from one product of a group, or from one row of sums, to the next; of half a strip where there are halves.
  i64 product_place, sums_place;
  f32 divisors[4];
  f64 *products, *sums;
  f32* padded;  // a source row of the strip, with clear pixels outside of the source
  f32* spare;   // a strip of a destination row that is not in the destination, or not all of it

  // Destination rows, all of which meet the source.
  i32 first, end, pixels;
  char* dst;  // of row `first`
  i64 dst_row_bytes;
  bool streams;  // the destination is too large for the caches
};
// How lanes hold a strip: its halves side by side in each vector, where vectors hold two pixels.
struct FloatBandLanes {
  void (*run)(FloatBand& band);
  i32 halves;
};
// The fastest that this processor has; without any, `run` is null.
FloatBandLanes lane_float_band();

// The plan of a call, and the memory it takes. There is none without lanes, and for kernels that are too large.
class FloatBands {
 public:
  // With `kept`, rows can be made apart from the destination.
  FloatBands(const Convolution<ZR_PixelFloat>& c, const ZR_LayerDef& dst, bool kept);
  ~FloatBands();
  FloatBands(const FloatBands&) = delete;
  FloatBands& operator=(const FloatBands&) = delete;
  explicit operator bool() const { return memory_ != nullptr; }
  // Rows first..end-1 of the destination.
  void make_rows(i32 first, i32 end);
  // Row y alone, those before having been made; rows that follow are made with it, and kept.
  void make_next(i32 y);

 private:
  void make(i32 first, i32 end, char* rows);
  i64 row_bytes() const { return i64{dst_.width} * static_cast<i64>(sizeof(ZR_PixelFloat)); }
  char* row(i32 y) const { return static_cast<char*>(dst_.data) + i64{y} * dst_.row_bytes; }

  const ZR_LayerDef& dst_;
  char* memory_ = nullptr;
  void (*run_)(FloatBand&);
  FloatBand band_ = {};
  char* kept_ = nullptr;
  i32 kept_first_ = 0, kept_end_ = 0;
};

}  // namespace zr
