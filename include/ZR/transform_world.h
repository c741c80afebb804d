/* A layer drawn through a matrix, or through the matrices of a shutter interval. */
#ifndef ZR_TRANSFORM_WORLD_H
#define ZR_TRANSFORM_WORLD_H

#include <ZR/types.h>

#ifdef __cplusplus
extern "C" {
#endif

ZR_API i32 ZR_TransformWorld(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                             const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                             const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                             const GX_LRect* dst_rect, ZR_LayerDef* dst);
ZR_API i32 ZR_TransformWorld_S(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                               const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                               const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                               const GX_LRect* dst_rect, ZR_LayerDef* dst);
/* With the caller's scratch (see ZR_TransferRectPlus): calls with scratch of their own may run together. */
ZR_API i32 ZR_TransformWorldPlus(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                                 const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                                 const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                                 void* scratch[10], const GX_LRect* dst_rect, ZR_LayerDef* dst);

#ifdef __cplusplus
}
#endif

#endif
