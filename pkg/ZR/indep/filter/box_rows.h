// The inner loop of the box blur: running sums along a strip of lines (line_job.h).
//
// For each position: a pixel leaves the window, one enters it, and the window's first and last pixels, the edge, are
// weighed down where the radius is not whole. Pixels outside of the line are rows of zeros. Sums of 8 bits are i32,
// of 16 bits and floats single precision, subtracted from before they are added to.
#pragma once

#include <ZR/depth.h>

#include <type_traits>

namespace zr {

template <class T>
struct BoxWeights;
// Of 8 bits in 1/1024 pixel. A divisor of 0 gives clear pixels.
template <>
struct BoxWeights<ZR_Pixel8> {
  i32 shortfall;  // of the edge
  i32 divisor;
};
template <class T>
struct FloatBoxWeights {
  f32 shortfall, divisor;
};
template <>
struct BoxWeights<ZR_Pixel16> : FloatBoxWeights<ZR_Pixel16> {};
template <>
struct BoxWeights<ZR_PixelFloat> : FloatBoxWeights<ZR_PixelFloat> {};

template <class T>
using BoxSum = std::conditional_t<std::is_same_v<T, ZR_Pixel8>, i32, f32>;

// `pixels` (whole groups) side by side at each of `count` positions; steps are in pixels. `first` is the window's
// first pixel after the step. Output does not overlap input.
template <class T>
struct BoxRun {
  i32 pixels;
  i64 count;
  const T *leaving, *first, *entering;
  i64 leaving_step, first_step, entering_step;
  bool leaves, enters;  // false where only zeros do
  T* out;
  i64 out_step;
  void* sums;  // four for each pixel: BoxSum<T>, or f64 for the alpha of floats
  BoxWeights<T> weights;
};

template <class T>
struct BoxRows {
  // Adds `count` positions to the sums.
  void (*add)(i32 pixels, i64 count, const T* from, i64 step, void* sums);
  void (*premultiplied)(const BoxRun<T>& run);
  void (*straight)(const BoxRun<T>& run);
};

// By single numbers: what every other variant equals bit for bit.
template <class T>
const BoxRows<T>& single_box_rows();
// Alpha alone, of floats: its sums are double precision. Other channels of the output are 0.
const BoxRows<ZR_PixelFloat>& box_rows_of_float_alpha();
// On lanes, or null.
template <class T>
const BoxRows<T>* lane_box_rows();

}  // namespace zr
