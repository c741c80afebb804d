/* A layer drawn through a matrix, or through the matrices of a shutter interval.
 *
 * quality   0 draft (nearest pixels), 1 bilinear, 2 and 3 bicubic; where the layer shrinks, all but draft
 *           take the mean of the box that a destination pixel covers. flags are not read.
 * field     1 draws even rows, 2 odd rows, anything else all.
 * matrices  `count` of them (at least 1), first to last of the time that the shutter is open, mapping source to
 *           destination if src2dst, else back. Pixel centres lie on halves. Positions in the source are kept
 *           within -32767..32766, and along a row they run in even steps. Ends that differ draw motion: of two
 *           matrices the mean of 17 samples between them (draft: 9), of more the mean of one through each, or,
 *           in draft and where they lie on a straight line, of as many between the ends.
 * tables    linear light for the blend, or null. mode->tables is not read.
 * mask      over the destination and of its depth, or null.
 * dst_rect  the pixels of dst that may be drawn. src and dst have one depth; they should not share pixels.
 * Polls     with one matrix every 32nd row of what is drawn (draft: 64th), with more every 8th, under a field
 *           half as often; the answer of a poll that is not 0 is the result, and what is drawn stays.
 * Failure   3 for null arguments, worlds without pixels and depths that differ; 4; 5 for an unknown mode. A
 *           matrix that cannot be inverted at either end, or that reaches no pixel, draws nothing and gives 0.
 */
#ifndef ZR_TRANSFORM_WORLD_H
#define ZR_TRANSFORM_WORLD_H

#include <ZR/types.h>

#ifdef __cplusplus
extern "C" {
#endif

/* Jumps through its slot; a replacement is handed the pixels that the layer reaches instead of dst_rect. */
ZR_API i32 ZR_TransformWorld(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                             const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                             const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                             const GX_LRect* dst_rect, ZR_LayerDef* dst);
/* The default body. Uses the shared scratch: not for two threads at once. */
ZR_API i32 ZR_TransformWorld_S(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                               const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                               const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                               const GX_LRect* dst_rect, ZR_LayerDef* dst);
/* With the caller's scratch (see ZR_TransferRectPlus): calls with scratch of their own may run together. */
ZR_API i32 ZR_TransformWorldPlus(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                                 const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                                 const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                                 void* scratch[10], const GX_LRect* dst_rect, ZR_LayerDef* dst);

/* What a transform is going to be, before a pixel is touched. */
typedef enum ZR_TransformKind {
  ZR_Transform_Nothing = 0, /* leaves dst as it is */
  ZR_Transform_Move = 1,    /* ZR_TransferRect of `bounds` moved by (-shift_x, -shift_y), to its top left corner */
  ZR_Transform_Rows = 2,    /* rows that ZR_TransformWorldRows draws in parts */
  ZR_Transform_Whole = 3 /* one call draws it: the image has collapsed, or the depth's row slot holds a replacement */
} ZR_TransformKind;
typedef struct ZR_TransformExtent {
  i32 kind;
  GX_LRect bounds; /* pixels of dst that are blended; (0, 0, 0, 0) for ZR_Transform_Nothing */
  i32 shift_x, shift_y;
} ZR_TransformExtent;
/* Arguments as for ZR_TransformWorld, mask may be null. Any thread. Returns 0, or what the transform itself returns
 * for missing records and an unknown depth. */
ZR_API i32 ZR_GetTransformExtent(i32 quality, const ZR_LayerDef* src, const ZR_MaskWorld* mask,
                                 const GX_Matrix3* matrices, i32 count, bool src2dst, const GX_LRect* dst_rect,
                                 const ZR_LayerDef* dst, ZR_TransformExtent* extent);
/* Of a transform of kind ZR_Transform_Rows the destination rows first_row..end_row-1, with the bytes that the whole
 * one gives them; other kinds draw nothing. dst_rect is the whole one's. Alpha outside the bounds is left to the
 * caller: XferMultiplyAlpha and XferMultiplyAlphaLuma want ZR_ClearAlphaExceptRect of the bounds once. Polls on the
 * rows of the whole one, with its counts. Calls for different rows, with scratch of their own, may run together. */
ZR_API i32 ZR_TransformWorldRows(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                                 const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                                 const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                                 void* scratch[10], const GX_LRect* dst_rect, i32 first_row, i32 end_row,
                                 ZR_LayerDef* dst);

#ifdef __cplusplus
}
#endif

#endif
