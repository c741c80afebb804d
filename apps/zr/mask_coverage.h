// How much of each pixel a shape covers.
#pragma once

#include "mask_shapes.h"

namespace zr::tool {

// Pixels around a shape, at most as far out as any number of i32 pixels.
GX_LRect bounds_of(const MaskShape& shape);

// Draws the shape into a buffer of 8 or 16 bits whose left top pixel lies at `corner`. Values are the covered share of
// a pixel, rounded; rectangles exactly, other shapes from kLinesPerRow lines in each row, exact along each.
inline constexpr i32 kLinesPerRow = 32;
void draw_shape(const MaskShape& shape, const GX_LPoint& corner, ZR_UnoBuffer& buffer);

}  // namespace zr::tool
