// Default contents of the slots of mask buffers.
#include "host/slot_defaults.h"
#include "mask/convert_rows.h"
#include "mask/mask_rows.h"
#include "world/slot_table.h"

namespace zr {

void fill_mask_slots() {
  set_slot<ZR_Slot_box_blur_uno_scan>(&ZR_BoxBlurUnoScan);
  set_slot<ZR_Slot_box_blur_deep_uno_scan>(&ZR_BoxBlurDeepUnoScan);
  set_slot<ZR_Slot_uno_row55>(&ZR_GBlurUnoScan);
  set_slot<ZR_Slot_uno_row93>(&ZR_GBlurDeepUnoScan);
  set_slot<ZR_Slot_uno_row56>(&mask_mode_row<u8>);
  set_slot<ZR_Slot_uno_row62>(&mixed_mode_row<u16, u8>);
  set_slot<ZR_Slot_uno_row81>(&mask_mode_row<u16>);
  set_slot<ZR_Slot_uno_row82>(&mixed_mode_row<u8, u16>);
  set_slot<ZR_Slot_uno_row85>(&mask_invert_row<u8>);
  set_slot<ZR_Slot_uno_row88>(&mask_invert_row<u16>);
  set_slot<ZR_Slot_uno_row89>(&mask_fade_row<u8>);
  set_slot<ZR_Slot_uno_row113>(&mask_fade_row<u16>);
  set_slot<ZR_Slot_uno_row114>(&divide_mask_row<u8>);
}

}  // namespace zr
