// Look-up of a routine by selector number.
#include <ZR/callback_block.h>

#include <algorithm>
#include <iterator>

#include "host/callback_choice.h"
#include "world/guard.h"

namespace zr {
namespace {

using P = PrivateRoutine;

struct Selector {
  i32 number;
  Choice choice;
};

constexpr Selector selectors[] = {
    {ZR_Selector_box_blur_deep_uno_scan, always(ZR_Slot_box_blur_deep_uno_scan)},
    {ZR_Selector_bilinear_no_clip8, always(ZR_Slot_bilinear_no_clip8)},
    {ZR_Selector_bilinear_plus8, always(ZR_Slot_bilinear_plus8)},
    {ZR_Selector_bilinear_translate_no_clip8, always(ZR_Slot_bilinear_translate_no_clip8)},
    {ZR_Selector_sample_compute_weight, always(ZR_Slot_sample_compute_weight)},
    {ZR_Selector_box_blur_uno_scan, always(ZR_Slot_box_blur_uno_scan)},
    {ZR_Selector_gaussian_value, always(P::gaussian_value)},
    {ZR_Selector_insert_planes, always(P::insert_planes)},
    {ZR_Selector_extract_planes, always(P::extract_planes)},
    {ZR_Selector_fast_blur, by_alpha(in_slot(ZR_Slot_fast_blur_straight), in_slot(ZR_Slot_fast_blur_premul))},
    {ZR_Selector_paint_spot, always(P::paint_spot)},
    {ZR_Selector_module0, always(ZR_Slot_module0)},
    {ZR_Selector_sample, sample_choice},
    {ZR_Selector_area_sample, area_sample_choice},
    {ZR_Selector_batch_sampling, always(P::batch_sampling)},
    {ZR_Selector_module1, always(ZR_Slot_module1)},
    {ZR_Selector_composite_rect, composite_rect_choice},
    {ZR_Selector_blend, blend_choice},
    {ZR_Selector_convolve, always(ZR_Slot_convolve)},
    {ZR_Selector_copy_bits, copy_bits_choice},
    {ZR_Selector_fill, always(P::fill8)},
    {ZR_Selector_gaussian_kernel, always(P::gaussian_kernel)},
    {ZR_Selector_iterate, always(ZR_Slot_iterate)},
    {ZR_Selector_premul, always(P::premul)},
    {ZR_Selector_premul_color, always(P::premul_color)},
    {ZR_Selector_rgb_to_hls, colour_choice(0)},
    {ZR_Selector_hls_to_rgb, colour_choice(1)},
    {ZR_Selector_rgb_to_yiq, colour_choice(2)},
    {ZR_Selector_yiq_to_rgb, colour_choice(3)},
    {ZR_Selector_luminance, colour_choice(4)},
    {ZR_Selector_hue, colour_choice(5)},
    {ZR_Selector_lightness, colour_choice(6)},
    {ZR_Selector_saturation, colour_choice(7)},
    {ZR_Selector_new_world, always(P::new_world)},
    {ZR_Selector_dispose_world, always(P::dispose_world)},
    {ZR_Selector_iterate_origin, always(ZR_Slot_iterate_origin)},
    {ZR_Selector_iterate_lut, always(ZR_Slot_iterate_lut)},
    {ZR_Selector_transfer_rect, always(P::transfer_rect_adapter)},
    {ZR_Selector_transform_world, always(P::transform_world_adapter)},
    {ZR_Selector_iterate_origin_no_clip, always(ZR_Slot_iterate_origin_no_clip)},
    {ZR_Selector_iterate_generic, always(ZR_Slot_iterate_generic)},
    // The alpha mode is not asked here; the block does ask it.
    {ZR_Selector_sample16,
     draft_or(ZR_Slot_nn_sample16, in_slot(ZR_Slot_bilinear_straight16), in_slot(ZR_Slot_bilinear_straight16))},
    {ZR_Selector_area_sample16,
     draft_or(ZR_Slot_nn_sample16, in_slot(ZR_Slot_area_straight16), in_slot(ZR_Slot_area_straight16))},
    {ZR_Selector_fill16, always(P::fill16)},
    {ZR_Selector_premul_color16, always(P::premul_color16)},
    {ZR_Selector_iterate16, always(ZR_Slot_iterate)},
    {ZR_Selector_iterate_origin16, always(ZR_Slot_iterate_origin)},
    {ZR_Selector_iterate_origin_no_clip16, always(ZR_Slot_iterate_origin_no_clip)},
};

}  // namespace
}  // namespace zr

extern "C" i32 ZR_GetCallbackAddr(void*, i32 quality, i32 flags, i32 selector, void** out) {
  if (out == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_GetCallbackAddr);
  const auto* const found = std::find_if(std::begin(zr::selectors), std::end(zr::selectors),
                                         [selector](const zr::Selector& one) { return one.number == selector; });
  if (found == std::end(zr::selectors)) {
    *out = nullptr;
    zr::report_string(ZR_Str_InvalidSelector, ZR_Site_GetCallbackAddr);
    return ZR_Err_BadSelector;
  }
  *out = zr::routine_at(found->choice.of(quality, flags));
  return ZR_Err_None;
}
