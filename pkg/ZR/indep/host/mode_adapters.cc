// The composite calls for holders of the plain mode record: the extended record is built here, without
// tables for linear light, and the call goes on through the slot.
#include "world/guard.h"
#include "world/slot_table.h"

namespace {

constexpr const ZR_LinearBlendingTables* no_tables = nullptr;

ZR_CompositeModePlus extended(const ZR_CompositeMode& plain) {
  ZR_CompositeModePlus mode(plain);
  mode.tables = no_tables;
  return mode;
}

}  // namespace

extern "C" {

i32 transfer_rect_adapter(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, const GX_LRect* rect,
                          ZR_LayerDef* src, const ZR_CompositeMode* mode, const ZR_MaskWorld* mask, i32 dest_x,
                          i32 dest_y, ZR_LayerDef* dst) {
  if (mode == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_TransferRect);
  const ZR_CompositeModePlus plus = extended(*mode);
  return zr::call_slot<ZR_Slot_transfer_rect>(progress, quality, flags, field, rect, src, &plus, no_tables, mask,
                                              dest_x, dest_y, dst);
}

i32 transform_world_adapter(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                            const ZR_CompositeMode* mode, const ZR_MaskWorld* mask, const GX_Matrix3* matrices,
                            i32 count, bool src2dst, const GX_LRect* dst_rect, ZR_LayerDef* dst) {
  if (mode == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_TransferRect);
  const ZR_CompositeModePlus plus = extended(*mode);
  return zr::call_slot<ZR_Slot_transform_world>(progress, quality, flags, field, src, &plus, no_tables, mask, matrices,
                                                count, src2dst, dst_rect, dst);
}

}  // extern "C"
