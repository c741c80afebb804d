// The inner loop of the Gaussian blur: weighted sums around each position of a strip of lines (line_job.h).
//
// The middle comes first, then the taps of each distance, the one ahead before the one behind. Sums of 8 bits are
// i32, of 16 bits and floats single precision.
#pragma once

#include <ZR/depth.h>

namespace zr {

// Distances first..end-1, of which taps exist on one side of a position.
struct TapRange {
  i32 first = 1, end = 1;
};

// `pixels` (whole groups, or of floats one) side by side at each of `count` positions, which all have the same taps.
template <class T>
struct BellRun {
  i32 pixels;
  i64 count;
  const T* middle;  // of the first position; pixels of the taps lie `step` apart
  i64 step;
  bool has_middle;
  TapRange ahead, behind;
  i32 reach;               // the kernel's; both ranges are all of it where the whole kernel lies in the line
  const i32* weights;      // reach + 1 of them, each 0..255, and a 0 behind them
  i32 divisor;             // 0 gives clear pixels
  bool alpha_is_filtered;  // else straight output divides by the middle's alpha
  T* out;
  i64 out_step;

  bool is_whole() const {
    return has_middle && ahead.first == 1 && ahead.end > reach && behind.first == 1 && behind.end > reach;
  }
};

template <class T>
struct BellRows {
  void (*premultiplied)(const BellRun<T>& run);
  void (*straight)(const BellRun<T>& run);
};

// By single numbers: what every other variant equals bit for bit.
template <class T>
const BellRows<T>& single_bell_rows();
// On lanes, or null. Runs that are not whole, and divisors beyond their numbers, go to the single ones.
template <class T>
const BellRows<T>* lane_bell_rows();

}  // namespace zr
