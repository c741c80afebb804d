// Exports of replaceable routines: each jumps through its slot.
#include <ZR/copy_bits.h>

#include "world/slot_table.h"

using zr::call_slot;

extern "C" {

i32 ZR_Iterate(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src, const GX_LRect* area,
               void* refcon, ZR_PixelFunc fn, ZR_LayerDef* dst) {
  return call_slot<ZR_Slot_iterate>(in_data, progress_base, progress_final, src, area, refcon, fn, dst);
}

i32 ZR_IterateOrigin(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src, const GX_LRect* area,
                     const GX_LPoint* origin, void* refcon, ZR_PixelFunc fn, ZR_LayerDef* dst) {
  return call_slot<ZR_Slot_iterate_origin>(in_data, progress_base, progress_final, src, area, origin, refcon, fn, dst);
}

i32 ZR_IterateLUT(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src, const GX_LRect* area,
                  const u8* a_lut, const u8* r_lut, const u8* g_lut, const u8* b_lut, ZR_LayerDef* dst) {
  return call_slot<ZR_Slot_iterate_lut>(in_data, progress_base, progress_final, src, area, a_lut, r_lut, g_lut, b_lut,
                                        dst);
}

i32 ZR_IterateGeneric(i32 iterations, void* refcon, ZR_GenericFunc fn) {
  return call_slot<ZR_Slot_iterate_generic>(iterations, refcon, fn);
}

i32 ZR_OpenDestination(void* first, void* record) { return call_slot<ZR_Slot_open_destination>(first, record); }

i32 ZR_CloseDestination(void* first, void* record) { return call_slot<ZR_Slot_close_destination>(first, record); }

i32 ZR_TransferRect(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, const GX_LRect* rect,
                    ZR_LayerDef* src, const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                    const ZR_MaskWorld* mask, i32 dest_x, i32 dest_y, ZR_LayerDef* dst) {
  return call_slot<ZR_Slot_transfer_rect>(progress, quality, flags, field, rect, src, mode, tables, mask, dest_x,
                                          dest_y, dst);
}

i32 ZR_TransferRectPlus(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, const GX_LRect* rect,
                        ZR_LayerDef* src, const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                        const ZR_MaskWorld* mask, void* scratch[10], i32 dest_x, i32 dest_y, ZR_LayerDef* dst) {
  return call_slot<ZR_Slot_transfer_rect_plus>(progress, quality, flags, field, rect, src, mode, tables, mask, scratch,
                                               dest_x, dest_y, dst);
}

i32 ZR_CompositeRectDraft_Straight(const ZR_ProgressInfo* progress, const GX_LRect* rect, u8 opacity, ZR_LayerDef* src,
                                   i32 dest_x, i32 dest_y, i32 field, u32 flags, ZR_LayerDef* dst) {
  return call_slot<ZR_Slot_composite_rect_draft_straight>(progress, rect, opacity, src, dest_x, dest_y, field, flags,
                                                          dst);
}

i32 ZR_CompositeRectDraft_Premul(const ZR_ProgressInfo* progress, const GX_LRect* rect, u8 opacity, ZR_LayerDef* src,
                                 i32 dest_x, i32 dest_y, i32 field, u32 flags, ZR_LayerDef* dst) {
  return call_slot<ZR_Slot_composite_rect_draft_premul>(progress, rect, opacity, src, dest_x, dest_y, field, flags,
                                                        dst);
}

i32 ZR_CompositeRectBest_Straight(const ZR_ProgressInfo* progress, const GX_LRect* rect, u8 opacity, ZR_LayerDef* src,
                                  i32 dest_x, i32 dest_y, i32 field, u32 flags, ZR_LayerDef* dst) {
  return call_slot<ZR_Slot_composite_rect_best_straight>(progress, rect, opacity, src, dest_x, dest_y, field, flags,
                                                         dst);
}

i32 ZR_CompositeRectBest_Premul(const ZR_ProgressInfo* progress, const GX_LRect* rect, u8 opacity, ZR_LayerDef* src,
                                i32 dest_x, i32 dest_y, i32 field, u32 flags, ZR_LayerDef* dst) {
  return call_slot<ZR_Slot_composite_rect_best_premul>(progress, rect, opacity, src, dest_x, dest_y, field, flags, dst);
}

i32 ZR_PremulRect(const ZR_ProgressInfo* progress, i32 forward, const GX_LRect* rect, ZR_LayerDef* dst) {
  return call_slot<ZR_Slot_premul_rect>(progress, forward, rect, dst);
}

i32 ZR_CopyBits_Draft(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect,
                      const GX_LRect* dst_rect) {
  return call_slot<ZR_Slot_copy_bits_draft>(progress, src, dst, src_rect, dst_rect);
}

i32 ZR_CopyBits_HQ_Straight(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                            const GX_LRect* src_rect, const GX_LRect* dst_rect) {
  return call_slot<ZR_Slot_copy_bits_hq_straight>(progress, src, dst, src_rect, dst_rect);
}

i32 ZR_CopyBits_HQ_Premul(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect,
                          const GX_LRect* dst_rect) {
  return call_slot<ZR_Slot_copy_bits_hq_premul>(progress, src, dst, src_rect, dst_rect);
}

i32 ZR_AreaSample_Straight(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel8* dst) {
  return call_slot<ZR_Slot_area_straight8>(progress, x, y, params, dst);
}

i32 ZR_AreaSample_Straight16(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel16* dst) {
  return call_slot<ZR_Slot_area_straight16>(progress, x, y, params, dst);
}

}  // extern "C"
