// What a transform knows before it touches a pixel: the ends of the shutter, the destination pixels that the
// layer can reach, and whether its motion is a straight line.
#pragma once

#include <ZR/transform_world.h>

#include "copy/matrix_steps.h"

namespace zr {

// The matrices of a shutter interval, in time order, all of one direction.
struct MatrixList {
  const GX_Matrix3* matrices;
  i32 count;  // at least 1
  bool src2dst;
};

struct Shutter {
  Placement first, last;  // `last` only where there is motion
  bool moves;             // the ends differ
};
// False where an end of the shutter is singular: nothing can be drawn.
bool make_shutter(const MatrixList& list, Shutter* out);

// `rect` within the destination and, for even mask kinds, within the mask; mask may be null.
GX_LRect drawable_area(const GX_LRect& rect, const ZR_LayerDef& dst, const ZR_MaskWorld* mask);
// What of `area` any of the matrices reaches; a singular one reaches nothing. (0, 0, 0, 0) when empty.
GX_LRect reached_bounds(const MatrixList& list, const GX_LRect& area, i32 src_width, i32 src_height);

// Kind, bounds and shift of a drawing by the library's own rows: ZR_Transform_Whole is a collapsed image.
ZR_TransformExtent transform_extent(i32 quality, const MatrixList& list, const ZR_LayerDef& src,
                                    const ZR_MaskWorld* mask, const GX_LRect& rect, const ZR_LayerDef& dst);

// Between the ends the layer turns, or its origin does not keep its pace: the ends alone do not tell the way.
// For more than two matrices.
bool is_complex_motion(const MatrixList& list, const Shutter& shutter);

}  // namespace zr
