// Bounds and motion of a list of matrices.
#include "copy/transform_bounds.h"

#include <algorithm>
#include <cmath>

#include "copy/track_matte.h"

namespace zr {
namespace {

constexpr f64 same_matrix = 1e-12;
constexpr f64 uneven_step = 0.9, uneven_half = 1.5;  // pixels

// The image of one step along a row, as a direction in the source.
void direction_of(const GX_Matrix3& inverse, f64 out[3]) {
  constexpr f64 along_row[3] = {1, 0, 0};
  GX_TransformVector3(&inverse, along_row, out);
  const f64 length = std::sqrt(out[0] * out[0] + out[1] * out[1] + out[2] * out[2]);
  for (i32 i = 0; i < 3; ++i) out[i] /= length;
}

bool turns(const Shutter& shutter) {
  f64 a[3], b[3];
  direction_of(shutter.first.inverse, a);
  direction_of(shutter.last.inverse, b);
  for (i32 i = 0; i < 3; ++i) {
    const f64 tolerance = std::max(1e-12 * std::max(std::fabs(a[i]), std::fabs(b[i])), 1.000088900582341e-12);
    if (std::fabs(a[i] - b[i]) > tolerance) return true;
  }
  return false;
}

f64 distance(const GX_FloatPoint& a, const GX_FloatPoint& b) { return std::hypot(b.x - a.x, b.y - a.y); }

}  // namespace

bool make_shutter(const MatrixList& list, Shutter* out) {
  if (!make_placement(list.matrices[0], list.src2dst, &out->first)) return false;
  const GX_Matrix3& last = list.matrices[list.count - 1];
  out->moves = list.count > 1 && !GX_EqualMatrixWithinEpsilon(&list.matrices[0], &last, same_matrix);
  return !out->moves || make_placement(last, list.src2dst, &out->last);
}

GX_LRect drawable_area(const GX_LRect& rect, const ZR_LayerDef& dst, const ZR_MaskWorld* mask) {
  const GX_LRect world = {0, 0, dst.width, dst.height};
  GX_LRect area;
  if (!GX_SectLRect(&rect, &world, &area) || mask == nullptr || (mask->kind & mask_inverted) != 0) return area;
  const auto far_edge = [](i32 offset, i32 size, i32 limit) {
    return static_cast<i32>(std::min<i64>(i64{offset} + size, limit));
  };
  const GX_LRect matte = {mask->offset_x, mask->offset_y,
                          far_edge(mask->offset_x, std::max(mask->world.width, 0), area.right),
                          far_edge(mask->offset_y, std::max(mask->world.height, 0), area.bottom)};
  GX_SectLRect(&area, &matte, &area);
  return area;
}

GX_LRect reached_bounds(const MatrixList& list, const GX_LRect& area, i32 src_width, i32 src_height) {
  GX_LRect bounds = {0, 0, 0, 0};
  if (GX_EmptyLRect(&area)) return bounds;
  for (i32 i = 0; i < list.count; ++i) {
    Placement placement;
    if (!make_placement(list.matrices[i], list.src2dst, &placement)) continue;
    const GX_LRect reached = reached_rect(placement, area, src_width, src_height);
    GX_UnionLRect(&bounds, &reached, &bounds);
  }
  return bounds;
}

ZR_TransformExtent transform_extent(i32 quality, const MatrixList& list, const ZR_LayerDef& src,
                                    const ZR_MaskWorld* mask, const GX_LRect& rect, const ZR_LayerDef& dst) {
  ZR_TransformExtent extent{};
  Shutter shutter;
  if (!make_shutter(list, &shutter)) return extent;
  extent.bounds = reached_bounds(list, drawable_area(rect, dst, mask), src.width, src.height);
  if (GX_EmptyLRect(&extent.bounds)) {
    extent.bounds = {0, 0, 0, 0};
    return extent;
  }
  const PlacedScale scale = placed_scale(shutter.first.forward);
  extent.shift_x = nearest_index(scale.shift_x);
  extent.shift_y = nearest_index(scale.shift_y);
  const bool by_pixels = quality == 0 || ((scale.shift_x | scale.shift_y) & 0xffff) == 0;
  const bool moved =
      !shutter.moves && by_pixels && GX_GetMatrixType(&shutter.first.forward) <= GX_MatrixType_Translation;
  extent.kind = scale.degenerate ? ZR_Transform_Whole : moved ? ZR_Transform_Move : ZR_Transform_Rows;
  return extent;
}

bool is_complex_motion(const MatrixList& list, const Shutter& shutter) {
  if (turns(shutter)) return true;
  GX_FloatPoint start{}, first_move{}, before{}, middle{};
  const i32 half = (list.count - (list.count % 2 == 0)) / 2;
  for (i32 i = 0; i < list.count; ++i) {
    Placement placement;
    // A gap in the list is a gap in the motion.
    if (!make_placement(list.matrices[i], list.src2dst, &placement)) return true;
    constexpr GX_FloatPoint origin = {0, 0};
    GX_FloatPoint here;
    GX_Matrix3_TransformPointAndDivide(&placement.forward, &origin, &here);
    const GX_FloatPoint move = {here.x - before.x, here.y - before.y};
    if (i == 0) start = here;
    if (i == 1) first_move = move;
    if (i > 1 && (std::fabs(move.x - first_move.x) >= uneven_step || std::fabs(move.y - first_move.y) >= uneven_step))
      return true;
    if (i == half) middle = here;
    before = here;
  }
  return std::fabs(distance(start, middle) - distance(middle, before)) >= uneven_half;
}

}  // namespace zr
