// Default bodies of the pixel iterators, as they stand in slots 42, 43, 51 and 44. All run serially on the
// calling thread, rows top to bottom, pixels left to right.
//
// The caller's function gets x in its low 16 bits; a non-zero result stops the walk and is returned. With
// progress_final non-zero the host is told (base + 1 + row, final) behind every row: 517 stops the walk, any
// other answer becomes the result if it is the last.
#pragma once

#include <ZR/zr.h>

namespace zr {

// Without area the whole of dst; a source cuts the walk to its own size. Without source in is out.
i32 iterate_body(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src, const GX_LRect* area,
                 void* refcon, ZR_PixelFunc fn, ZR_LayerDef* dst);
// Pixel (0, 0) of src lies at `origin` of dst (which may be null without a source); the walk is cut to the
// source there.
i32 iterate_origin_body(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src,
                        const GX_LRect* area, const GX_LPoint* origin, void* refcon, ZR_PixelFunc fn, ZR_LayerDef* dst);
// The same over all of the area; outside the source in points to one transparent black pixel.
i32 iterate_origin_no_clip_body(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src,
                                const GX_LRect* area, const GX_LPoint* origin, void* refcon, ZR_PixelFunc fn,
                                ZR_LayerDef* dst);
// 8-bit pixels through four tables of 256 bytes; a null table changes nothing.
i32 iterate_lut_body(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src, const GX_LRect* area,
                     const u8* a_lut, const u8* r_lut, const u8* g_lut, const u8* b_lut, ZR_LayerDef* dst);

}  // namespace zr
