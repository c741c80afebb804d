// The older rectangle composite of 8-bit worlds: the source goes behind what the destination holds.
#pragma once

#include "world/slot_table.h"

namespace zr {

// Default bodies of the draft and best slots, which are one operation for each kind of alpha. Rows go
// through the row slots. Nothing is clipped: the rectangle lies inside both worlds.
CompositeRectFunc composite_rect_straight, composite_rect_premul;

// One row; src and dst may be the same row.
CompositeBehindRowFunc composite_behind_row_straight, composite_behind_row_premul;

}  // namespace zr
