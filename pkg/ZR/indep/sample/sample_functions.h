// The six samplers of a depth and quality, with their types.
#pragma once

#include <algorithm>

#include "sample/lane_rows.h"
#include "world/slot_table.h"

namespace zr {

template <class T>
struct SampleFunctions {
  SamplePlusFunc<T>* inside_flag;
  SampleFunc<T>* clipping;
  SampleFunc<T>* area;
  SampleFunc<T>* no_clipping;
  SampleTranslateFunc<T>* translate;
  SampleSpanFunc<T>* span;
};

// What ZR_GetSampleFunctionSet... gives: fetched once before the loops. Cannot fail.
template <class T>
SampleFunctions<T> sample_functions(i32 quality);
template <>
SampleFunctions<ZR_Pixel8> sample_functions<ZR_Pixel8>(i32 quality);
template <>
SampleFunctions<ZR_Pixel16> sample_functions<ZR_Pixel16>(i32 quality);
template <>
SampleFunctions<ZR_PixelFloat> sample_functions<ZR_PixelFloat>(i32 quality);

// What samples vectors of pixels just as the set's sampler without clipping does, or null: where that sampler is not
// the library's own, and where the processor has no lanes. Fetched as the set is.
template <class T>
LaneRowFunc<T>* no_clip_row(const SampleFunctions<T>& samplers);
// The same for its bilinear sampler with clipping, where all four neighbours lie inside.
template <class T>
LaneRowFunc<T>* clipping_row(const SampleFunctions<T>& samplers);
// The same for its area sampler and the pixels of boxes_inside().
template <class T>
LaneRowFunc<T>* box_row(const SampleFunctions<T>& samplers);
// The same for its bilinear span sampler.
LaneSpanFunc<ZR_Pixel8>* bilinear_span_row(const SampleFunctions<ZR_Pixel8>& samplers);

// What takes whole vectors of pixels in motion: nothing where a sampler of the set is not the library's own.
template <class T>
struct MotionRows {
  LaneMotionFunc<T>*each = nullptr, *weighted = nullptr;  // either may be null
  i32 before = 0, behind = 0;  // pixels that have to lie between a sample's and the world's edge on either side

  // Pixels whose position lies in here.
  GX_LRect inside(const ZR_LayerDef& src) const {
    return {before, before, std::min(src.width, 32768) - behind, std::min(src.height, 32768) - behind};
  }
};
template <class T>
MotionRows<T> motion_rows(const SampleFunctions<T>& samplers);

// The box mean with bilinear (1) or bicubic (2) point samples where the box is thin.
template <class T, i32 quality>
i32 area_sample(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, T* dst);

}  // namespace zr
