// Rows of a convolution.
#pragma once

#include <ZR/depth.h>

namespace zr {

// Kernels and worlds of one call. Kernels are width x height taps around (width / 2, height / 2).
template <class T>
struct Convolution {
  i32 width, height;
  const i32* kernels[4];  // alpha, red, green, blue
  i64 divisors[4];        // never 0
  u64 tap_sums[4];        // of the taps' absolute values
  bool wraps;             // 8 bits: results are 16-bit numbers before they are kept to 0..255
  const char* src;
  i64 src_row_bytes;
  i32 src_width, src_height;

  const T* source_row(i64 y) const { return reinterpret_cast<const T*>(src + y * src_row_bytes); }
};

// The kernel rows that meet the source at destination row y: first..end-1, none if they are equal.
struct KernelRows {
  i32 first, end;
};
template <class T>
KernelRows kernel_rows_at(const Convolution<T>& c, i32 y) {
  const i64 top = i64{y} - c.height / 2;
  const i64 first = top < 0 ? -top : 0, end = c.src_height - top < c.height ? c.src_height - top : c.height;
  return first < end ? KernelRows{static_cast<i32>(first), static_cast<i32>(end)} : KernelRows{0, 0};
}

// Pixels first..end-1 of destination row y, by single numbers.
template <class T>
void convolve_pixels(const Convolution<T>& c, i32 y, i32 first, i32 end, T* dst_row);

// On lanes: some or all pixels of row y whose windows lie between the left and right border of the source. Returns
// those done; the caller does the others. Made for a call, with scratch of its own.
template <class T>
struct PixelSpan {
  i32 first, end;
};

}  // namespace zr
