// Bounds, radii, starts and steps from a matrix.
#include "copy/matrix_steps.h"

#include <algorithm>
#include <cmath>

namespace zr {
namespace {

// The bounding box of a transformed rectangle in whole pixels, one pixel larger on each side.
GX_LRect transformed_rect(const GX_Matrix3& matrix, const GX_LRect& rect) {
  GX_FloatRect box = {static_cast<f64>(rect.left), static_cast<f64>(rect.top), static_cast<f64>(rect.right),
                      static_cast<f64>(rect.bottom)};
  GX_TransformFloatRect(&matrix, &box, &box);
  GX_LRect out = {GX_RoundDouble(clamp_position(box.left)), GX_RoundDouble(clamp_position(box.top)),
                  GX_RoundDouble(clamp_position(box.right)), GX_RoundDouble(clamp_position(box.bottom))};
  GX_InsetLRect(&out, -1, -1);
  return out;
}

}  // namespace

bool make_placement(const GX_Matrix3& matrix, bool src2dst, Placement* out) {
  GX_Matrix3& given = src2dst ? out->forward : out->inverse;
  GX_Matrix3& derived = src2dst ? out->inverse : out->forward;
  given = matrix;
  return GX_InverseMatrixQuiet(&matrix, &derived) == 0;
}

GX_LRect reached_rect(const Placement& placement, const GX_LRect& area, i32 src_width, i32 src_height) {
  GX_LRect none = {0, 0, 0, 0};
  if (src_width < 0 || src_height < 0) return none;
  GX_LRect seen = transformed_rect(placement.inverse, area);
  GX_LRect source = {0, 0, src_width, src_height};
  GX_InsetLRect(&source, -1, -1);
  if (!GX_SectLRect(&seen, &source, &seen)) return none;
  GX_LRect reached = transformed_rect(placement.forward, seen);
  GX_SectLRect(&reached, &area, &reached);
  return reached;
}

PlacedScale placed_scale(const GX_Matrix3& forward) {
  const auto& m = forward.m;
  const auto length = [&](i32 column) {
    return std::sqrt(m[0][column] * m[0][column] + m[1][column] * m[1][column] + m[2][column] * m[2][column]);
  };
  const f64 sx = length(0), sy = length(1);
  constexpr f64 widest = 127.0;  // keeps a box within the range of positions
  const f64 x_radius = std::min(0.5 / sx, widest), y_radius = std::min(0.5 / sy, widest);
  return {.x_radius = fixed_from(x_radius),
          .y_radius = fixed_from(y_radius),
          .area = fixed_from(4.0 * (x_radius * y_radius)),
          .shift_x = fixed_from(m[0][2]),
          .shift_y = fixed_from(m[1][2]),
          .degenerate = truncate_i32(65536.0 * sx + 0.5) == 0 || truncate_i32(65536.0 * sy + 0.5) == 0};
}

SourceWalk source_walk(const GX_Matrix3& inverse, i32 left, i32 top) {
  GX_FloatPoint centre = {left + 0.5, top + 0.5};
  GX_TransformFloatPoints(&inverse, &centre, 1);
  constexpr f64 along_row[3] = {1, 0, 0}, down[3] = {0, 1, 0};
  f64 step[3], row[3];
  GX_TransformVector3(&inverse, along_row, step);
  GX_TransformVector3(&inverse, down, row);
  return {fixed_from(clamp_position(centre.x - 0.5)),
          fixed_from(clamp_position(centre.y - 0.5)),
          fixed_from(step[0]),
          fixed_from(step[1]),
          fixed_from(row[0]),
          fixed_from(row[1])};
}

}  // namespace zr
