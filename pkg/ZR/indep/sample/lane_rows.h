// Samplers along a row on lanes: whole vectors of destination pixels at a time, equal to the samplers of one pixel
// bit for bit. All neighbours lie inside the world; nothing is tested.
#pragma once

#include <ZR/sample.h>

#include "sample/motion_line.h"
#include "sample/row_sum.h"
#include "world/slot_table.h"

namespace zr {

// Positions (x + i * step_x, y + i * step_y) in 16.16, none of which wraps.
struct SampleRun {
  i32 count, x, y, step_x, step_y;
};

// Fills dst and adds the alphas to *sum as far as whole vectors go; returns how many pixels that are.
template <class T>
using LaneRowFunc = i32(const SampleRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst);
// The same for steps of one pixel to the right, with the sum of the span samplers.
template <class T>
using LaneSpanFunc = i32(const SampleRun& run, const ZR_SampPB& params, AlphaSum<T>* sum, T* dst);

// A row in motion: every pixel is the mean of samples on the line between its positions in two runs, colour weighted
// by alpha. All samples lie inside, and no line wraps.
struct MotionRun {
  SampleRun first, last;  // of as many pixels: where the shutter opens and where it closes
  i32 samples;            // 2 to most_lane_samples
  // For runs of steps of one pixel to the right: of each sample, its four weights where no sampler looks whether it is
  // inside. Null where each sample goes by its own position.
  const f64 (*weights)[4];
};
inline constexpr i32 most_lane_samples = 32768;  // sums fit their lanes
// Fills dst and adds the alphas to *sum as far as whole vectors go; returns how many pixels that are.
template <class T>
using LaneMotionFunc = i32(const MotionRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst);

template <class T>
struct LaneRows {
  LaneRowFunc<T>* no_clip;  // may be null
  LaneSpanFunc<T>* span;
  LaneMotionFunc<T>* motion;           // may be null
  LaneMotionFunc<T>* weighted_motion;  // with weights; may be null
};
// The fastest that this processor has, or null.
template <class T>
const LaneRows<T>* lane_bilinear_rows();
template <class T>
const LaneRows<T>* lane_bicubic_rows();

// Box means for boxes of more than a pixel both ways that boxes_inside() has let pass.
template <class T>
LaneRowFunc<T>* lane_box_row();

// The same two for premultiplied pixels: bilinear ones whose neighbours lie inside, and such boxes.
struct LanePremul {
  LaneRowFunc<ZR_Pixel8>*bilinear, *boxes;
};
// The fastest that this processor has, or null.
const LanePremul* lane_premul_samples();

// Nearest pixels of a row and of a row in motion, to whose positions half a pixel has been added. May be null; the
// bytes of the world are fewer than 2^31.
template <class T>
struct LaneNearest {
  LaneRowFunc<T>* row;
  LaneMotionFunc<T>* motion;
};
template <class T>
const LaneNearest<T>* lane_nearest_rows();

// Sums over rows of samples of the same pixels, at most most_lane_samples of them, and their means.
template <class T>
struct LaneMotionSums {
  std::size_t (*bytes)(i32 count);  // of the sums; all zero at first
  void (*add)(i32 count, const T* samples, void* sums);
  void (*mean)(i32 count, i32 samples, const void* sums, RowSum<T>* sum, T* dst);
};
template <class T>
const LaneMotionSums<T>* lane_motion_sums();

struct PixelRange {
  i32 first, end;
};
// The pixels of a run whose source pixel lies in a rectangle; none of those wraps.
PixelRange run_within(const SampleRun& run, const GX_LRect& rect);
// The pixels of a run whose boxes, and a pixel or two more, lie inside the world; of a run along a row of the source
// between its left and right edge.
PixelRange boxes_inside(const SampleRun& run, const ZR_SampPB& params);

}  // namespace zr
