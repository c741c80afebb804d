// Which samplers belong to a depth and a sample quality.
#include "sample/ZR_Samp.h"

#include <ZR/summed_area.h>

#include "sample/sample_functions.h"

namespace zr {
namespace {

constexpr bool is_bicubic(i32 quality) { return (quality & ~1) == 2; }

}  // namespace

template <>
SampleFunctions<ZR_Pixel8> sample_functions<ZR_Pixel8>(i32 quality) {
  if (is_bicubic(quality))
    return {&ZR_SubpixelSpanSampleAllInBicubic8,       &ZR_SubpixelBicubic8,
            &ZR_AreaSample_CPlusPlus<ZR_Pixel8, 2>,    &ZR_SubpixelNoClipBicubic8,
            &ZR_SubpixelSampleTranslateNoClipBicubic8, &ZR_SubpixelSpanSampleBicubic8};
  return {
      slot<ZR_Slot_bilinear_plus8>(),    slot<ZR_Slot_bilinear_straight8>(),          slot<ZR_Slot_area_straight8>(),
      slot<ZR_Slot_bilinear_no_clip8>(), slot<ZR_Slot_bilinear_translate_no_clip8>(), slot<ZR_Slot_bilinear_span8>()};
}

template <>
SampleFunctions<ZR_Pixel16> sample_functions<ZR_Pixel16>(i32 quality) {
  if (is_bicubic(quality))
    return {&ZR_SubpixelSpanSampleAllInBicubic16,       &ZR_SubpixelBicubic16,
            &ZR_AreaSample_CPlusPlus<ZR_Pixel16, 2>,    &ZR_SubpixelNoClipBicubic16,
            &ZR_SubpixelSampleTranslateNoClipBicubic16, &ZR_SubpixelSpanSampleBicubic16};
  return {slot<ZR_Slot_bilinear_plus16>(),
          slot<ZR_Slot_bilinear_straight16>(),
          slot<ZR_Slot_area_straight16>(),
          slot<ZR_Slot_bilinear_no_clip16>(),
          slot<ZR_Slot_bilinear_translate_no_clip16>(),
          slot<ZR_Slot_bilinear_span16>()};
}

template <>
SampleFunctions<ZR_PixelFloat> sample_functions<ZR_PixelFloat>(i32 quality) {
  if (is_bicubic(quality))
    return {&ZR_SubpixelSpanSampleAllInBicubicFloat,       &ZR_SubpixelBicubicFloat,
            &ZR_AreaSample_CPlusPlus<ZR_PixelFloat, 2>,    &ZR_SubpixelNoClipBicubicFloat,
            &ZR_SubpixelSampleTranslateNoClipBicubicFloat, &ZR_SubpixelSpanSampleBicubicFloat};
  return {&ZR_SubpixelSpanSampleAllInBilinearFloat,       &ZR_SubpixelBilinearFloat,
          &ZR_AreaSample_CPlusPlus<ZR_PixelFloat, 1>,     &ZR_SubpixelNoClipBilinearFloat,
          &ZR_SubpixelSampleTranslateNoClipBilinearFloat, &ZR_SubpixelSpanSampleBilinearFloat};
}

namespace {

// The library's own samplers of a depth.
template <class T>
struct Own;
template <>
struct Own<ZR_Pixel8> {
  static constexpr SampleFunc<ZR_Pixel8>*bilinear = &ZR_SubpixelSampleNoClip_Straight,
                   *bicubic = &ZR_SubpixelNoClipBicubic8, *clipping = &ZR_SubpixelSample_Straight;
  static constexpr SamplePlusFunc<ZR_Pixel8>*bilinear_flag = &ZR_SubpixelSamplePlus_Straight,
                   *bicubic_flag = &ZR_SubpixelSpanSampleAllInBicubic8;
  static constexpr SampleTranslateFunc<ZR_Pixel8>*bilinear_translate = &ZR_SubpixelSampleTranslateNoClip_Straight,
                   *bicubic_translate = &ZR_SubpixelSampleTranslateNoClipBicubic8;
};
template <>
struct Own<ZR_Pixel16> {
  static constexpr SampleFunc<ZR_Pixel16>*bilinear = &ZR_SubpixelSampleNoClip_Straight16,
                   *bicubic = &ZR_SubpixelNoClipBicubic16, *clipping = &ZR_SubpixelSample_Straight16;
  static constexpr SamplePlusFunc<ZR_Pixel16>*bilinear_flag = &ZR_SubpixelSamplePlus_Straight16,
                   *bicubic_flag = &ZR_SubpixelSpanSampleAllInBicubic16;
  static constexpr SampleTranslateFunc<ZR_Pixel16>*bilinear_translate = &ZR_SubpixelSampleTranslateNoClip_Straight16,
                   *bicubic_translate = &ZR_SubpixelSampleTranslateNoClipBicubic16;
};
template <>
struct Own<ZR_PixelFloat> {
  static constexpr SampleFunc<ZR_PixelFloat>*bilinear = &ZR_SubpixelNoClipBilinearFloat,
                   *bicubic = &ZR_SubpixelNoClipBicubicFloat, *clipping = &ZR_SubpixelBilinearFloat;
  static constexpr SamplePlusFunc<ZR_PixelFloat>*bilinear_flag = &ZR_SubpixelSpanSampleAllInBilinearFloat,
                   *bicubic_flag = &ZR_SubpixelSpanSampleAllInBicubicFloat;
  static constexpr SampleTranslateFunc<ZR_PixelFloat>*bilinear_translate =
                       &ZR_SubpixelSampleTranslateNoClipBilinearFloat,
                   *bicubic_translate = &ZR_SubpixelSampleTranslateNoClipBicubicFloat;
};

}  // namespace

PixelRange run_within(const SampleRun& run, const GX_LRect& rect) {
  PixelRange range = {0, run.count};
  // The part of an axis between two edges, and how many steps reach the first position that is not below an edge.
  const auto narrow = [&](i64 at, i64 step, i64 low, i64 high) {
    const auto steps_over = [](i64 way, i64 one) { return way <= 0 ? 0 : (way + one - 1) / one; };
    i64 first = 0, end = run.count;
    if (step == 0) {
      if (at < low || at >= high) end = 0;
    } else if (step > 0) {
      first = steps_over(low - at, step), end = std::min(end, steps_over(high - at, step));
    } else {
      first = steps_over(at - (high - 1), -step), end = std::min(end, steps_over(at - (low - 1), -step));
    }
    range.first = static_cast<i32>(std::min<i64>(std::max<i64>(range.first, first), run.count));
    range.end = static_cast<i32>(std::min<i64>(range.end, end));
  };
  narrow(run.x, run.step_x, i64{rect.left} * 65536, i64{rect.right} * 65536);
  narrow(run.y, run.step_y, i64{rect.top} * 65536, i64{rect.bottom} * 65536);
  if (range.first >= range.end) range = {0, 0};
  return range;
}

template <class T>
MotionRows<T> motion_rows(const SampleFunctions<T>& samplers) {
  MotionRows<T> rows;
  const LaneRows<T>* lanes = nullptr;
  SampleTranslateFunc<T>* translate = nullptr;
  if (samplers.no_clipping == Own<T>::bilinear && samplers.inside_flag == Own<T>::bilinear_flag)
    lanes = lane_bilinear_rows<T>(), translate = Own<T>::bilinear_translate, rows.before = 0, rows.behind = 1;
  else if (samplers.no_clipping == Own<T>::bicubic && samplers.inside_flag == Own<T>::bicubic_flag)
    lanes = lane_bicubic_rows<T>(), translate = Own<T>::bicubic_translate, rows.before = rows.behind = 2;
  if (lanes == nullptr) return rows;
  rows.each = lanes->motion;
  const bool own_weights =
      samplers.translate == translate && slot<ZR_Slot_sample_compute_weight>() == &ZR_SubpixelSampleComputeWeight;
  if (own_weights) rows.weighted = lanes->weighted_motion;
  return rows;
}
template MotionRows<ZR_Pixel8> motion_rows(const SampleFunctions<ZR_Pixel8>&);
template MotionRows<ZR_Pixel16> motion_rows(const SampleFunctions<ZR_Pixel16>&);
template MotionRows<ZR_PixelFloat> motion_rows(const SampleFunctions<ZR_PixelFloat>&);

template <class T>
LaneRowFunc<T>* no_clip_row(const SampleFunctions<T>& samplers) {
  const LaneRows<T>* rows = nullptr;
  if (samplers.no_clipping == Own<T>::bilinear) rows = lane_bilinear_rows<T>();
  if (samplers.no_clipping == Own<T>::bicubic) rows = lane_bicubic_rows<T>();
  return rows != nullptr ? rows->no_clip : nullptr;
}
template <class T>
LaneRowFunc<T>* clipping_row(const SampleFunctions<T>& samplers) {
  const LaneRows<T>* const rows = samplers.clipping == Own<T>::clipping ? lane_bilinear_rows<T>() : nullptr;
  return rows != nullptr ? rows->no_clip : nullptr;
}
template <class T>
LaneRowFunc<T>* box_row(const SampleFunctions<T>& samplers) {
  const bool own = samplers.area == &ZR_AreaSample_CPlusPlus<T, 1> || samplers.area == &ZR_AreaSample_CPlusPlus<T, 2>;
  return own ? lane_box_row<T>() : nullptr;
}
LaneSpanFunc<ZR_Pixel8>* bilinear_span_row(const SampleFunctions<ZR_Pixel8>& samplers) {
  if (samplers.span != &ZR_SubpixelSpanSampleTranslateNoClip_Straight) return nullptr;
  const LaneRows<ZR_Pixel8>* const rows = lane_bilinear_rows<ZR_Pixel8>();
  return rows != nullptr ? rows->span : nullptr;
}
template LaneRowFunc<ZR_Pixel8>* box_row(const SampleFunctions<ZR_Pixel8>&);
template LaneRowFunc<ZR_Pixel16>* box_row(const SampleFunctions<ZR_Pixel16>&);
template LaneRowFunc<ZR_PixelFloat>* box_row(const SampleFunctions<ZR_PixelFloat>&);
template LaneRowFunc<ZR_Pixel8>* clipping_row(const SampleFunctions<ZR_Pixel8>&);
template LaneRowFunc<ZR_Pixel16>* clipping_row(const SampleFunctions<ZR_Pixel16>&);
template LaneRowFunc<ZR_PixelFloat>* clipping_row(const SampleFunctions<ZR_PixelFloat>&);
template LaneRowFunc<ZR_Pixel8>* no_clip_row(const SampleFunctions<ZR_Pixel8>&);
template LaneRowFunc<ZR_Pixel16>* no_clip_row(const SampleFunctions<ZR_Pixel16>&);
template LaneRowFunc<ZR_PixelFloat>* no_clip_row(const SampleFunctions<ZR_PixelFloat>&);

namespace {

template <class T>
void function_set(i32 quality, ZR_SampleFunctionSet* out) {
  const SampleFunctions<T> set = sample_functions<T>(quality);
  const auto any = [](auto* sampler) { return reinterpret_cast<ZR_AnySampleFunc>(sampler); };
  *out = {any(set.inside_flag), any(set.clipping),  any(set.area),
          any(set.no_clipping), any(set.translate), any(set.span)};
}

}  // namespace
}  // namespace zr

extern "C" {

void ZR_GetSampleFunctionSet8(i32 quality, ZR_SampleFunctionSet* out) { zr::function_set<ZR_Pixel8>(quality, out); }
void ZR_GetSampleFunctionSet16(i32 quality, ZR_SampleFunctionSet* out) { zr::function_set<ZR_Pixel16>(quality, out); }
void ZR_GetSampleFunctionSetFloat(i32 quality, ZR_SampleFunctionSet* out) {
  zr::function_set<ZR_PixelFloat>(quality, out);
}

i32 ZR_GetSampleQualityPixelSupport(i32 quality) { return zr::is_bicubic(quality) ? 2 : quality == 1 ? 1 : 0; }

}  // extern "C"
