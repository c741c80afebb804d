// Masks and the alpha of worlds.
#pragma once

#include <ZR/depth.h>
#include <ZR/mask_buffer.h>

struct ZR_World;

// Multiplies the alpha of `area` of a world by a mask of 8 or 16 bits whose pixel (0, 0) lies at (x, y) of the world;
// alpha outside of the mask becomes 0, colour stays.
//
// Ranges     area: pixels of the world, null for all of it, cut to it. clip: pixels of the mask, beyond which it counts
//            as 0; may be null.
// Rounding   the mask is brought to the world's depth, and the product is the depth's.
// Nothing    where mask, clip and area do not meet, colour too becomes 0 in the area.
// Threads    bands of rows go through ZR_IterateGeneric. Calls on disjoint areas of one world may run together.
// Failure    throws an i32: ZR_Err_Internal (damaged mask, unknown depths), or what progress->abort answered before
//            row 0; the world is untouched then.
ZR_API void ZR_MergeMaskAlpha(const ZR_ProgressInfo* progress, i32 x, i32 y, const GX_LRect* clip,
                              const ZR_UnoBuffer* mask, const GX_LRect* area, ZR_World* world);

// Pulls the alpha of n pixels toward `target` by mul(mask, opacity); colours stay. T and C are the pixel and the
// channel type of one depth. Cannot fail.
template <class T, class C>
ZR_API void ZR_BlendSingleChannel(i32 n, C opacity, C target, const C* mask, T* pixels);
