// Convolution of floats in bands: a product of a sample and a weight is made once for all taps that share it.
//
// A band is walked in strips of columns, from source row to source row. The products of a row are rounded to single
// precision, as everywhere, and kept as doubles for the sums of all destination rows that the source row meets. Each
// sum takes its taps in the order of the kernel, as single numbers do, for it meets source rows in that order.
#pragma once

#include "filter/convolve_rows.h"

namespace zr {

inline constexpr i32 largest_banded_side = 63;  // of kernels; of larger ones few taps are alike
inline constexpr i32 float_strip_step = 32;     // strips are whole multiples of so many pixels

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

  // Where a strip's samples are whole multiples of a quantum, few bits above it, all products and sums are exact: they
  // may be made in any order and form. Samples are then split into two numbers of single precision, the upper a
  // multiple of `split`; sums of both halves are exact too. Kernel rows that are alike share their sums.
  struct Exact {
    bool possible;
    bool mirrored;       // every kernel row: taps go in pairs
    i32 terms;           // pairs, or taps
    f32 quantum, split;  // of samples up to 1
    bool short_quotients;
    f32 reciprocals[2][4];  // upper and lower parts of the divisors'
    const f32* weights;     // of each kind of kernel row, four for each term
    const Group* kinds;     // their places in `order`
    i32 kind_count;
    const i32* order;               // of kernel rows
    f32 *samples, *sums;            // upper and lower halves of a row and of its pairs; of a destination row
    i64 samples_place, sums_place;  // numbers from one to the next
  };

  Convolution<ZR_PixelFloat> kernel;
  Exact exact;
  f32 bound = 1;         // of the last strip's samples, a power of two
  bool doubtful = true;  // whether the next strip's sums are exact
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

  // Destination rows, all of which meet the source.
  i32 first, end, pixels;
  char* dst;  // of row `first`
  i64 dst_row_bytes;
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
  explicit FloatBands(const Convolution<ZR_PixelFloat>& c);
  ~FloatBands();
  FloatBands(const FloatBands&) = delete;
  FloatBands& operator=(const FloatBands&) = delete;
  explicit operator bool() const { return memory_ != nullptr; }
  // Rows first..end-1 of a destination.
  void make(i32 first, i32 end, i32 pixels, char* dst, i64 dst_row_bytes);

 private:
  char* memory_ = nullptr;
  void (*run_)(FloatBand&);
  FloatBand band_ = {};
};

}  // namespace zr
