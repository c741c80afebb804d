// What the list of modes and the row pipeline agree upon.
#pragma once

#include <ZR/composite.h>

#include <array>

namespace zr {

// How a mode treats alpha: what its entry must bring.
enum class ModeKind {
  copy,          // pixel
  over,          // pixel
  row_only,      // a row function of its own
  black_ground,  // full, partial
  white_ground,  // full, partial
  grey_ground,   // full, partial
  weighted,      // full
  colour,        // wanted (or none), recoloured
  alpha_only,    // alpha
  special,       // pixel
};

// What a row of the mode runs besides the main function, and whether the pipeline guards its alpha.
enum class RowClass { plain, self_contained, black_ground, white_ground, grey_ground, colour };

constexpr RowClass usual_row_class(ModeKind kind) {
  switch (kind) {
    case ModeKind::black_ground: return RowClass::black_ground;
    case ModeKind::white_ground: return RowClass::white_ground;
    case ModeKind::grey_ground: return RowClass::grey_ground;
    case ModeKind::weighted: return RowClass::self_contained;
    case ModeKind::colour: return RowClass::colour;
    default: return RowClass::plain;
  }
}

inline constexpr i32 first_mode = -3, mode_rows = 44, pixel_slots = 44;

// The row functions of a depth; index mode - first_mode, null at -1.
template <class T>
using InnerRows = std::array<ZR_InnerBlendingFunc<T>, mode_rows>;
// In stored values: of single numbers, and the fastest that this processor has.
template <class T, bool masked>
const InnerRows<T>& single_rows();
template <class T, bool masked>
const InnerRows<T>& inner_rows();
// Of modes on a ground, all passes of the default row routines in one: for a mask or none, and for rows that have no
// pixel in common. Null for other modes, and where this processor has no lanes.
template <class T>
ZR_InnerBlendingFunc<T> whole_ground_row(i32 index);

}  // namespace zr
