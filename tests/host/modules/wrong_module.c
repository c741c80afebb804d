/* Modules for the check of rewritten slots. As WRONG_MODULE says: 1 rewrites three slots, the first wrongly; 2 empties
 * a slot; 3 rewrites two slots rightly; 4 has a routine without an entry. */
#include <ZR/module.h>

static ZR_ModuleRow8 premultiply_before, unmultiply_before;
static ZR_ModuleRow16 unmultiply16_before;

/* Right but for a red that is one too large at half alpha. */
static i32 off_by_one(i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  const i32 result = premultiply_before(n, src, dst);
  for (i32 i = 0; i < n; ++i)
    if (dst[i].alpha == 128 && dst[i].red < 255) ++dst[i].red;
  return result;
}
static i32 the_same(i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst) { return unmultiply_before(n, src, dst); }
static i32 the_same16(i32 n, const ZR_Pixel16* src, ZR_Pixel16* dst) { return unmultiply16_before(n, src, dst); }

static i32 entry(i32 command, void** out, const ZR_ModuleBlock* block, void** out2) {
  (void)out, (void)out2;
  if (command != ZR_ModuleCommand_Load) return ZR_Err_None;
  ZR_SlotFunc* const slots = block->slots;
  premultiply_before = (ZR_ModuleRow8)slots[ZR_Slot_premul_row8];
  unmultiply_before = (ZR_ModuleRow8)slots[ZR_Slot_unmul_row8];
  unmultiply16_before = (ZR_ModuleRow16)slots[ZR_Slot_unmul_row16];
  if (WRONG_MODULE == 1) slots[ZR_Slot_premul_row8] = (ZR_SlotFunc)off_by_one;
  if (WRONG_MODULE == 2) {
    slots[ZR_Slot_premul_row8] = NULL;
    return ZR_Err_None;
  }
  slots[ZR_Slot_unmul_row8] = (ZR_SlotFunc)the_same;
  slots[ZR_Slot_unmul_row16] = (ZR_SlotFunc)the_same16;
  return ZR_Err_None;
}

static const u32 version = 2;
static const ZR_ModuleProperty manifest[] = {{ZR_ModuleProp_Version, sizeof version, &version}};
static const ZR_ModuleRoutine routines[] = {
    {"rows", ZR_ModuleKind, ZR_ModuleFlag_Acceleration, 1, manifest, WRONG_MODULE == 4 ? NULL : entry}};

#ifndef WRONG_DESCRIPTOR_VERSION
#define WRONG_DESCRIPTOR_VERSION ZR_ModuleDescriptorVersion
#endif
#ifndef WRONG_DESCRIPTOR_NAME
#define WRONG_DESCRIPTOR_NAME ZR_Module
#endif
ZR_API extern const ZR_ModuleDescriptor WRONG_DESCRIPTOR_NAME;
const ZR_ModuleDescriptor WRONG_DESCRIPTOR_NAME = {WRONG_DESCRIPTOR_VERSION, 1, routines};
