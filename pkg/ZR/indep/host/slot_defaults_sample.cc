// Default contents of the sampling slots.
#include <ZR/summed_area.h>

#include "host/slot_defaults.h"
#include "world/slot_table.h"

namespace zr {

void fill_sampler_slots() {
  set_slot<ZR_Slot_nn_sample8>(&ZR_NNSample);
  set_slot<ZR_Slot_nn_sample16>(&ZR_NNSample16);
  set_slot<ZR_Slot_bilinear_straight8>(&ZR_SubpixelSample_Straight);
  set_slot<ZR_Slot_bilinear_straight16>(&ZR_SubpixelSample_Straight16);
  set_slot<ZR_Slot_bilinear_premul8>(&ZR_SubpixelSample_Premul);
  set_slot<ZR_Slot_area_straight8>(&ZR_AreaSample_CPlusPlus<ZR_Pixel8, 1>);
  set_slot<ZR_Slot_area_straight16>(&ZR_AreaSample_CPlusPlus<ZR_Pixel16, 1>);
  set_slot<ZR_Slot_area_premul8>(&ZR_AreaSample_Premul);
  set_slot<ZR_Slot_sample_compute_weight>(&ZR_SubpixelSampleComputeWeight);
  set_slot<ZR_Slot_bilinear_translate_no_clip8>(&ZR_SubpixelSampleTranslateNoClip_Straight);
  set_slot<ZR_Slot_bilinear_translate_no_clip16>(&ZR_SubpixelSampleTranslateNoClip_Straight16);
  set_slot<ZR_Slot_bilinear_plus8>(&ZR_SubpixelSamplePlus_Straight);
  set_slot<ZR_Slot_bilinear_plus16>(&ZR_SubpixelSamplePlus_Straight16);
  set_slot<ZR_Slot_bilinear_no_clip8>(&ZR_SubpixelSampleNoClip_Straight);
  set_slot<ZR_Slot_bilinear_no_clip16>(&ZR_SubpixelSampleNoClip_Straight16);
  set_slot<ZR_Slot_bilinear_no_clip8_x4>(&ZR_SubpixelSampleNoClip_Straight_4);
  set_slot<ZR_Slot_bilinear_translate_no_clip8_x4>(&ZR_SubpixelSampleTranslateNoClip_Straight_4);
  set_slot<ZR_Slot_bilinear_span8>(&ZR_SubpixelSpanSampleTranslateNoClip_Straight);
  set_slot<ZR_Slot_bilinear_span16>(&ZR_SubpixelSpanSampleTranslateNoClip_Straight16);
}

}  // namespace zr
