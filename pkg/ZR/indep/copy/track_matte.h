// Mask rows as the blending code wants them: one cell per output pixel, of which the alpha counts, with
// inversion and luminance already in it and the cells beside the mask filled in.
#pragma once

#include <ZR/depth.h>
#include <ZR/zr.h>

namespace zr {

// Which value a cell takes; the low two bits of ZR_MaskWorld.kind.
enum : u32 { mask_inverted = 1, mask_luma = 2, mask_kinds = 3 };

// Writes the alpha of `count` cells of `out`. The source row has row_length pixels, of which the first
// falls on cell `offset` (negative: left of the first cell); cells beside it are white for inverted kinds,
// else 0. src is not read where no cell falls on it.
template <class T>
void prepare_mask_row(u32 count, const T* src, i64 offset, i64 row_length, u32 kind, T* out);

// The mask of `count` (>= 0) destination pixels from (x, y) on: for kind 0 a pointer into the mask world,
// which the caller has clipped to, else `scratch` of count cells, filled. A row above or below the mask, or
// of a mask without pixels, is white throughout. The mask has depth T.
template <class T>
const T* mask_row(const ZR_MaskWorld& mask, i32 x, i32 y, i32 count, T* scratch);

}  // namespace zr
