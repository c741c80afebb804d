// From a matrix to the numbers that row loops walk with: where the image falls, box radii, start positions and
// steps. Positions are 16.16 with pixel centres on integers; matrices see pixel centres on halves.
#pragma once

#include <GX/gx.h>
#include <ZR/depth.h>

namespace zr {

// 16.16, halves away from zero; what does not fit, and NaN, gives INT32_MIN.
constexpr i32 fixed_from(f64 v) { return truncate_i32(65536.0 * v + (v < 0 ? -0.5 : 0.5)); }
// Into what 16.16 holds with room for a neighbour: -32767..32766. NaN gives -32767.
constexpr f64 clamp_position(f64 v) { return v > 32766.0 ? 32766.0 : v > -32767.0 ? v : -32767.0; }

// One matrix in both directions.
struct Placement {
  GX_Matrix3 forward;  // source to destination
  GX_Matrix3 inverse;
};
// False when the matrix is singular or not finite; *out is then not to be read.
bool make_placement(const GX_Matrix3& matrix, bool src2dst, Placement* out);

// The pixels of `area` (in the destination, not empty) that a source of this size can reach, with a pixel of
// room on each side; (0, 0, 0, 0) when there are none.
GX_LRect reached_rect(const Placement& placement, const GX_LRect& area, i32 src_width, i32 src_height);

// What a placement does to the size of a source pixel.
struct PlacedScale {
  i32 x_radius, y_radius;  // 16.16: half of what a destination pixel covers in the source, at most 127
  i32 area;                // 16.16: 4 * x_radius * y_radius; INT32_MIN where that does not fit
  i32 shift_x, shift_y;    // 16.16: where the source's origin goes
  bool degenerate;         // a side is shorter than half of 1/65536 pixel: nothing can be drawn
};
PlacedScale placed_scale(const GX_Matrix3& forward);

// Source positions under the destination's pixels, 16.16. Starts are clamped; advancing wraps in 32 bits.
struct SourceWalk {
  i32 x, y;            // under the first pixel of the current row
  i32 step_x, step_y;  // from one pixel to the next
  i32 row_x, row_y;    // from one row to the next

  void next_row() {
    x = wrap_add(x, row_x);
    y = wrap_add(y, row_y);
  }
  // No pixel of a row of `count` wraps, nor does it when half a pixel is added: the row is then a straight
  // line, and what lies between two inside pixels is inside.
  bool straight(i32 count) const {
    constexpr i64 low = -32768 * i64{65536}, high = 32767 * i64{65536};
    const i64 last_x = x + (count - i64{1}) * step_x, last_y = y + (count - i64{1}) * step_y;
    return x <= high && y <= high && last_x >= low && last_x <= high && last_y >= low && last_y <= high;
  }
};
SourceWalk source_walk(const GX_Matrix3& inverse, i32 left, i32 top);

// The column or row of the nearest pixel; halves go right and down.
constexpr i32 nearest_index(i32 position) { return wrap_add(position, 32768) >> 16; }

// Of a straight row, the pixels [first, end) whose nearest source pixel lies inside a world of this size.
// Walks the outside ends only.
struct InsideRun {
  i32 first, end;
};
inline InsideRun nearest_run(const SourceWalk& walk, i32 count, i32 src_width, i32 src_height) {
  const auto inside = [=](i32 i) {
    const i32 x = nearest_index(wrap_add(walk.x, wrap_mul(i, walk.step_x)));
    const i32 y = nearest_index(wrap_add(walk.y, wrap_mul(i, walk.step_y)));
    return x >= 0 && x < src_width && y >= 0 && y < src_height;
  };
  InsideRun run = {0, count};
  while (run.first < run.end && !inside(run.first)) ++run.first;
  while (run.end > run.first && !inside(run.end - 1)) --run.end;
  return run;
}

}  // namespace zr
