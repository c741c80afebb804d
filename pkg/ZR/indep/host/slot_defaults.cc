// Default contents of the slot table.
#include "host/slot_defaults.h"

#include <ZR/copy_bits.h>
#include <ZR/filter.h>

#include "composite/composite_rect.h"
#include "composite/ground_rows.h"
#include "composite/transfer_rect.h"
#include "copy/transform_rows.h"
#include "iterate/iterate.h"
#include "world/effect_world.h"
#include "world/premul_rows.h"
#include "world/slot_table.h"

namespace zr {
namespace {

// Slots 47 and 48 have no caller in the library; a module that takes them calls something that does nothing.
i32 do_nothing(void*, void*) { return ZR_Err_None; }

// The slots that exist once for each depth: 17 to 19, 35 to 41, 72 to 78, 94 to 112,
// 115 to 117.
template <class T>
void fill_slots_of_depth() {
  using S = DepthSlots<T>;
  set_slot<S::transfer_rows>(&transfer_rows<T>);
  set_slot<S::transform_rows>(&transform_rows<T>);
  set_slot<S::premul>(&premul_row<T>);
  set_slot<S::unmul>(&unmul_row<T>);
  set_slot<S::white_fade>(&white_fade_row<T>);
  set_slot<S::white_unfade>(&white_unfade_row<T>);
  set_slot<S::grey_fade>(&grey_fade_row<T>);
  set_slot<S::grey_unfade>(&grey_unfade_row<T>);
  set_slot<S::union_alpha>(&union_alpha_row<T>);
  set_slot<S::inner>(&ZR_GetInnerBlendingFunc<T, false, false>);
  set_slot<S::inner_mask>(&ZR_GetInnerBlendingFunc<T, true, false>);
  set_slot<S::inner_linear>(&ZR_GetInnerBlendingFunc<T, false, true>);
  set_slot<S::inner_mask_linear>(&ZR_GetInnerBlendingFunc<T, true, true>);
}

}  // namespace

void fill_default_slots() {
  // Draft and best are one operation.
  set_slot<ZR_Slot_composite_rect_draft_straight>(&composite_rect_straight);
  set_slot<ZR_Slot_composite_rect_draft_premul>(&composite_rect_premul);
  set_slot<ZR_Slot_composite_rect_best_straight>(&composite_rect_straight);
  set_slot<ZR_Slot_composite_rect_best_premul>(&composite_rect_premul);
  set_slot<ZR_Slot_transfer_rect_plus>(&transfer_rect_plus_body);
  set_slot<ZR_Slot_composite_behind_row_straight>(&composite_behind_row_straight);
  set_slot<ZR_Slot_composite_behind_row_premul>(&composite_behind_row_premul);
  set_slot<ZR_Slot_transfer_rect>(&ZR_TransferRect_S);
  set_slot<ZR_Slot_copy_bits_draft>(&ZR_CopyBits_Draft_Static);
  set_slot<ZR_Slot_copy_bits_hq_straight>(&ZR_CopyBits_HQ_Straight_Static);
  set_slot<ZR_Slot_copy_bits_hq_premul>(&ZR_CopyBits_HQ_Premul_Static);
  set_slot<ZR_Slot_fast_blur_straight>(&ZR_FastBlur_Straight);
  set_slot<ZR_Slot_fast_blur_premul>(&ZR_FastBlur_Premul);
  set_slot<ZR_Slot_convolve>(&ZR_Convolve);
  set_slot<ZR_Slot_transform_world>(&ZR_TransformWorld_S);
  set_slot<ZR_Slot_iterate>(&iterate_body);
  set_slot<ZR_Slot_iterate_origin>(&iterate_origin_body);
  set_slot<ZR_Slot_iterate_lut>(&iterate_lut_body);
  set_slot<ZR_Slot_open_destination>(&open_destination);
  set_slot<ZR_Slot_close_destination>(&close_destination);
  set_slot<ZR_Slot_module47>(&do_nothing);
  set_slot<ZR_Slot_module48>(&do_nothing);
  set_slot<ZR_Slot_iterate_origin_no_clip>(&iterate_origin_no_clip_body);
  set_slot<ZR_Slot_premul_rect>(&ZR_PremulRect_S);
  set_slot<ZR_Slot_iterate_generic>(&ZR_IterateGeneric_Static);
  fill_sampler_slots();
  fill_mask_slots();
  fill_slots_of_depth<ZR_Pixel8>();
  fill_slots_of_depth<ZR_Pixel16>();
  fill_slots_of_depth<ZR_PixelFloat>();
}

}  // namespace zr
