// The callback block: 69 routines for a quality and an alpha mode, and the replacing of slots.
#include <ZR/callback_block.h>

#include <array>

#include "host/callback_choice.h"
#include "world/guard.h"

namespace zr {
namespace {

using Block = std::array<Choice, ZR_CallbackEntryCount>;

constexpr Block block_choices() {
  using P = PrivateRoutine;
  Block block = {};
  block[ZR_Entry_module0] = always(ZR_Slot_module0);
  block[ZR_Entry_sample] = sample_choice;
  block[ZR_Entry_area_sample] = area_sample_choice;
  block[ZR_Entry_batch_sampling] = always(P::batch_sampling);
  block[ZR_Entry_module1] = always(ZR_Slot_module1);
  block[ZR_Entry_composite_rect] = composite_rect_choice;
  block[ZR_Entry_blend] = blend_choice;
  block[ZR_Entry_convolve] = always(ZR_Slot_convolve);
  block[ZR_Entry_copy_bits] = copy_bits_choice;
  block[ZR_Entry_fill] = always(P::fill8);
  block[ZR_Entry_gaussian_kernel] = always(P::gaussian_kernel);
  block[ZR_Entry_iterate] = always(ZR_Slot_iterate);
  block[ZR_Entry_premul] = always(P::premul);
  block[ZR_Entry_premul_color] = always(P::premul_color);
  block[ZR_Entry_new_world] = always(P::new_world);
  block[ZR_Entry_dispose_world] = always(P::dispose_world);
  block[ZR_Entry_iterate_origin] = always(ZR_Slot_iterate_origin);
  block[ZR_Entry_iterate_lut] = always(ZR_Slot_iterate_lut);
  block[ZR_Entry_transfer_rect] = always(P::transfer_rect_adapter);
  block[ZR_Entry_transform_world] = always(P::transform_world_adapter);
  block[ZR_Entry_handle_new] = always(P::handle_new);
  block[ZR_Entry_handle_lock] = always(P::handle_lock);
  block[ZR_Entry_handle_unlock] = always(P::handle_unlock);
  block[ZR_Entry_handle_dispose] = always(P::handle_dispose);
  block[ZR_Entry_get_callback_addr] = always(P::get_callback_addr);
  block[ZR_Entry_app_callback] = always(P::app_callback);
  for (int i = ZR_Entry_atan; i <= ZR_Entry_acos; ++i)
    block[static_cast<size_t>(i)] = always(static_cast<P>(static_cast<int>(P::ansi_first) + i - ZR_Entry_atan));
  for (int i = 0; i < colour_function_count; ++i)
    block[static_cast<size_t>(ZR_Entry_rgb_to_hls + i)] = colour_choice(i);
  block[ZR_Entry_platform_query] = always(P::platform_query);
  block[ZR_Entry_handle_size] = always(P::handle_size);
  block[ZR_Entry_iterate_origin_no_clip] = always(ZR_Slot_iterate_origin_no_clip);
  block[ZR_Entry_iterate_generic] = always(ZR_Slot_iterate_generic);
  block[ZR_Entry_handle_resize] = always(P::handle_resize);
  // There are no premultiplied 16-bit samplers of best quality; plug-ins that ask get null.
  block[ZR_Entry_sample16] = draft_or(ZR_Slot_nn_sample16, in_slot(ZR_Slot_bilinear_straight16), no_routine);
  block[ZR_Entry_area_sample16] = draft_or(ZR_Slot_nn_sample16, in_slot(ZR_Slot_area_straight16), no_routine);
  block[ZR_Entry_fill16] = always(P::fill16);
  block[ZR_Entry_premul_color16] = always(P::premul_color16);
  // One set of bodies serves all depths.
  block[ZR_Entry_iterate16] = always(ZR_Slot_iterate);
  block[ZR_Entry_iterate_origin16] = always(ZR_Slot_iterate_origin);
  block[ZR_Entry_iterate_origin_no_clip16] = always(ZR_Slot_iterate_origin_no_clip);
  block[ZR_Entry_get_pixel_data8] = always(P::get_pixel_data8);
  block[ZR_Entry_get_pixel_data16] = always(P::get_pixel_data16);
  return block;
}

constexpr Block G_choices = block_choices();

}  // namespace
}  // namespace zr

extern "C" {

i32 ZR_GetCallbackBlock(i32 quality, i32 flags, void* block[69]) {
  if (block == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_CallbackBlock);
  return zr::guarded([&] {
    zr::fill_private_routines();
    for (size_t i = 0; i < zr::G_choices.size(); ++i) block[i] = zr::routine_at(zr::G_choices[i].of(quality, flags));
    return i32{ZR_Err_None};
  });
}

i32 ZR_SetCallbackBlockQuality(i32 quality, i32 flags, void* block[69]) {
  if (block == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_CallbackBlock);
  for (size_t i = 0; i < zr::G_choices.size(); ++i) {
    const zr::Source source = zr::G_choices[i].of(quality, flags);
    // Where this quality has no routine the one from before stays: entries 59 and 60.
    if (zr::G_choices[i].varies() && source != zr::no_routine) block[i] = zr::routine_at(source);
  }
  return ZR_Err_None;
}

i32 ZR_SetOverrideFunc(i32 slot, void* fn) {
  if (slot < 1 || slot >= ZR_SlotCount) return ZR_Err_Internal;
  ZRp_G_OverFuncs[slot] = reinterpret_cast<ZR_SlotFunc>(fn);
  return ZR_Err_None;
}

}  // extern "C"
