// Samplers along a row on lanes: whole vectors of destination pixels at a time, equal to the samplers of one pixel
// bit for bit. All neighbours lie inside the world; nothing is tested.
#pragma once

#include <ZR/sample.h>

#include "world/slot_table.h"

namespace zr {

// Positions (x + i * step_x, y + i * step_y) in 16.16, none of which wraps.
struct SampleRun {
  i32 count, x, y, step_x, step_y;
};

// Wide enough for any row: 0 means wholly transparent, count times white wholly opaque.
template <class T>
using RowSum = std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, f64, u64>;

// Fills dst and adds the alphas to *sum as far as whole vectors go; returns how many pixels that are.
template <class T>
using LaneRowFunc = i32(const SampleRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst);
// The same for steps of one pixel to the right, with the sum of the span samplers.
template <class T>
using LaneSpanFunc = i32(const SampleRun& run, const ZR_SampPB& params, AlphaSum<T>* sum, T* dst);

template <class T>
struct LaneRows {
  LaneRowFunc<T>* no_clip;  // may be null
  LaneSpanFunc<T>* span;
};
// The fastest that this processor has, or null.
template <class T>
const LaneRows<T>* lane_bilinear_rows();
template <class T>
const LaneRows<T>* lane_bicubic_rows();

// Box means of steps along a row of the source (step_y is 0), for boxes of more than a pixel both ways that
// boxes_inside() has let pass.
template <class T>
LaneRowFunc<T>* lane_box_row();

struct PixelRange {
  i32 first, end;
};
// The pixels of a run along a row whose boxes, and a pixel more, lie between the world's left and right edge.
PixelRange boxes_inside(const SampleRun& run, const ZR_SampPB& params);

}  // namespace zr
