/* Copies of a rectangle of one world into a rectangle of another, scaled, and converted to its depth.
 * Null rectangles mean the whole world. Null worlds or pixels: ZR_Err_Internal, reported. An empty rectangle,
 * or one outside of its world, copies nothing and is no error. */
#ifndef ZR_COPY_BITS_H
#define ZR_COPY_BITS_H

#include <ZR/types.h>

#ifdef __cplusplus
extern "C" {
#endif

/* Nearest neighbour by integer error accumulation, all nine depth pairs. An inverted destination rectangle that
 * touches its world fails with ZR_Err_Internal. `progress` is not read. */
ZR_API i32 ZR_CopyBits_Draft(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                             const GX_LRect* src_rect, const GX_LRect* dst_rect);
ZR_API i32 ZR_CopyBits_Draft_Static(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                                    const GX_LRect* src_rect, const GX_LRect* dst_rect);
/* Of ZR_CopyBits_Draft_Static the destination rows first_row..end_row-1, with the bytes that the whole copy gives
 * them. Where the worlds share no memory, calls for different rows may run together. */
ZR_API i32 ZR_CopyBits_DraftRows(ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect, const GX_LRect* dst_rect,
                                 i32 first_row, i32 end_row);
/* Bilinear where neither axis shrinks, else the mean of each pixel's footprint. Sizes that differ need one depth.
 * Only the abort function is asked, after rows 0, 64, 128, ... An inverted destination copies nothing. */
ZR_API i32 ZR_CopyBits_HQ_Straight(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                                   const GX_LRect* src_rect, const GX_LRect* dst_rect);
ZR_API i32 ZR_CopyBits_HQ_Straight_Static(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                                          const GX_LRect* src_rect, const GX_LRect* dst_rect);
/* The same on premultiplied 8-bit worlds. */
ZR_API i32 ZR_CopyBits_HQ_Premul(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                                 const GX_LRect* src_rect, const GX_LRect* dst_rect);
ZR_API i32 ZR_CopyBits_HQ_Premul_Static(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                                        const GX_LRect* src_rect, const GX_LRect* dst_rect);
/* The same on raster frames. ZR_WorldCopy, and only it, repairs a channel order that differs. */
ZR_API i32 ZR_WorldCopy(void* unused, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                        const GX_LRect* dst_rect);
ZR_API i32 ZR_WorldCopy_Static(void* unused, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                               const GX_LRect* dst_rect);
ZR_API i32 ZR_WorldCopy_HQ(void* unused, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                           const GX_LRect* dst_rect);
ZR_API i32 ZR_WorldCopy_HQ_Straight(void* unused, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                                    const GX_LRect* dst_rect);
ZR_API i32 ZR_WorldCopy_HQ_Static(void* unused, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                                  const GX_LRect* dst_rect);
ZR_API i32 ZR_WorldCopy_HQ_Straight_Static(void* unused, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                                           const GX_LRect* dst_rect);
ZR_API i32 ZR_WorldCopy_HQ_Premul(void* unused, RS_World** src, RS_World** dst, const GX_LRect* src_rect,
                                  const GX_LRect* dst_rect);
/* The draft copy on chunks, whose elements have one size in bytes. */
ZR_API i32 ZR_ChannelCopy(const ZR_ProgressInfo* progress, ZR_Chunk* src, ZR_Chunk* dst, const GX_LRect* src_rect,
                          const GX_LRect* dst_rect);
/* Nearest neighbour through a matrix, inside `clip` (null: all). Where nothing of the image falls there, `clip` is
 * cleared; else the whole rest of the world is. Polls after rows 0, 64, 128, ... of the image. */
ZR_API i32 ZR_CopyBits3_LO_Straight(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const GX_Matrix3* matrix,
                                    bool src2dst, const GX_LRect* clip, ZR_LayerDef* dst);

#ifdef __cplusplus
}
#endif

#endif
