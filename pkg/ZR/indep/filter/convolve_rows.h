// Rows of a convolution.
#pragma once

#include <ZR/depth.h>

#include <type_traits>

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

// Taps as lanes take them, at distances in bytes from the window's middle; weights in the order of the channels.
struct alignas(16) TapPair {
  i16 weights[8];  // of both taps for alpha, then red, ...
  i64 first, second;
};
struct alignas(16) FloatTap {
  f32 weights[4];
  i64 place;
};
template <class T>
using LaneTap = std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, FloatTap, TapPair>;

// Pixels side by side whose windows have the same taps, all in the source. Of whole numbers all sums fit 32 bits, and
// divisors are positive, as weights have taken their sign.
template <class T>
struct LaneConvolution {
  const LaneTap<T>* taps;
  i64 count;
  i32 bias[4];      // 16 bits: 32768 times the weights' sum; samples are taken 32768 lower, to fit signed numbers
  i32 divisors[4];  // whole numbers
  f32 float_divisors[4];
  bool wraps;
  const T* src;  // of the first pixel's window the middle
  i32 pixels;
  T* dst;
};
// Does all pixels, or none where they are too few; returns how many.
template <class T>
using LaneConvolveFunc = i32(const LaneConvolution<T>& work);
// The fastest that this processor has, or null.
template <class T>
LaneConvolveFunc<T>* lane_convolve_row();

}  // namespace zr
