// The exports that draw a layer through matrices.
#include <ZR/composite.h>
#include <ZR/errors.h>

#include <algorithm>

#include "copy/transform_bounds.h"
#include "copy/transform_rows.h"
#include "world/guard.h"

namespace zr {
namespace {

i32 transform_world(const ZR_ProgressInfo* progress, i32 quality, i32 field, ZR_LayerDef* src,
                    const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask,
                    const GX_Matrix3* matrices, i32 count, bool src2dst, void* const* own_scratch,
                    const GX_LRect* dst_rect, const RowBand* band, ZR_LayerDef* dst) {
  return guarded([&]() -> i32 {
    if (src == nullptr || mode == nullptr || matrices == nullptr || count < 1 || dst_rect == nullptr || dst == nullptr)
      return ZR_ReportBadCallbackParam(ZR_Site_TransformWorld);
    const i32 depth = ZRp_WorldDepth(dst);
    return on_depth(depth, unknown_depth_text, [&]<class T>() -> i32 {
      void* shared[10];
      if (own_scratch == nullptr) {
        const i32 error =
            ZRp_ReallocScratch(std::max(dst->width, 0), static_cast<i32>(sizeof(Channel<T>)), false, shared);
        if (error != 0) return error;
      }
      if (ZRp_WorldDepth(src) != depth)
        return failed_verification(ZR_Site_TransformWorld,
                                   "ZR_TransformWorld requires src and dst worlds to have same bit depth");
      const ZR_BlendingMode<T> typed_mode(*mode);
      const ZR_WorldX<T> from(src, false);
      ZR_WorldX<T> to(dst, false);
      void* const* const scratch = own_scratch != nullptr ? own_scratch : shared;
      if (band != nullptr)
        return transform_band<T>(progress, quality, field, &from, &typed_mode, tables, mask, matrices, count, src2dst,
                                 scratch, dst_rect, *band, &to);
      return call_slot<DepthSlots<T>::transform_rows>(progress, quality, field, &from, &typed_mode, tables, mask,
                                                      matrices, count, src2dst, scratch, dst_rect, &to);
    });
  });
}

}  // namespace
}  // namespace zr

i32 ZR_TransformWorld_S(const ZR_ProgressInfo* progress, i32 quality, u32 /*flags*/, i32 field, ZR_LayerDef* src,
                        const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                        const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                        const GX_LRect* dst_rect, ZR_LayerDef* dst) {
  return zr::transform_world(progress, quality, field, src, mode, tables, mask, matrices, count, src2dst, nullptr,
                             dst_rect, nullptr, dst);
}

i32 ZR_TransformWorldPlus(const ZR_ProgressInfo* progress, i32 quality, u32 /*flags*/, i32 field, ZR_LayerDef* src,
                          const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                          const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                          void* scratch[10], const GX_LRect* dst_rect, ZR_LayerDef* dst) {
  if (scratch == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_TransformWorld);
  return zr::transform_world(progress, quality, field, src, mode, tables, mask, matrices, count, src2dst, scratch,
                             dst_rect, nullptr, dst);
}

i32 ZR_TransformWorldRows(const ZR_ProgressInfo* progress, i32 quality, u32 /*flags*/, i32 field, ZR_LayerDef* src,
                          const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                          const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                          void* scratch[10], const GX_LRect* dst_rect, i32 first_row, i32 end_row, ZR_LayerDef* dst) {
  if (scratch == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_TransformWorld);
  const zr::RowBand band = {first_row, end_row};
  return zr::transform_world(progress, quality, field, src, mode, tables, mask, matrices, count, src2dst, scratch,
                             dst_rect, &band, dst);
}

i32 ZR_GetTransformExtent(i32 quality, const ZR_LayerDef* src, const ZR_MaskWorld* mask, const GX_Matrix3* matrices,
                          i32 count, bool src2dst, const GX_LRect* dst_rect, const ZR_LayerDef* dst,
                          ZR_TransformExtent* extent) {
  return zr::guarded([&]() -> i32 {
    if (src == nullptr || matrices == nullptr || count < 1 || dst_rect == nullptr || dst == nullptr ||
        extent == nullptr)
      return ZR_ReportBadCallbackParam(ZR_Site_TransformWorld);
    return zr::on_depth(ZRp_WorldDepth(dst), zr::unknown_depth_text, [&]<class T>() -> i32 {
      *extent = zr::transform_extent(quality, {matrices, count, src2dst}, *src, mask, *dst_rect, *dst);
      if (zr::slot<zr::DepthSlots<T>::transform_rows>() != &zr::transform_rows<T>) extent->kind = ZR_Transform_Whole;
      return ZR_Err_None;
    });
  });
}

// Jumps through the slot. A replacement is handed the pixels that the layer reaches instead of the caller's
// rectangle, so that it need not work them out; a singular matrix leaves the caller's.
i32 ZR_TransformWorld(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                      const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask,
                      const GX_Matrix3* matrices, i32 count, bool src2dst, const GX_LRect* dst_rect, ZR_LayerDef* dst) {
  const GX_LRect* rect = dst_rect;
  GX_LRect bounds;
  const bool replaced = zr::slot<ZR_Slot_transform_world>() != &ZR_TransformWorld_S;
  if (replaced && src != nullptr && matrices != nullptr && count > 0 && dst_rect != nullptr && dst != nullptr) {
    const zr::MatrixList list = {matrices, count, src2dst};
    zr::Shutter shutter;
    if (zr::make_shutter(list, &shutter)) {
      bounds = zr::reached_bounds(list, zr::drawable_area(*dst_rect, *dst, mask), src->width, src->height);
      rect = &bounds;
    }
  }
  return zr::call_slot<ZR_Slot_transform_world>(progress, quality, flags, field, src, mode, tables, mask, matrices,
                                                count, src2dst, rect, dst);
}
