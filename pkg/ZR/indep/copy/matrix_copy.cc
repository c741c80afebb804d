// The copy through a matrix: nearest neighbour, nothing composited, what the image does not cover is cleared.
#include <ZR/copy_bits.h>
#include <ZR/errors.h>
#include <ZR/world.h>

#include <algorithm>

#include "copy/copy_pixels.h"
#include "copy/matrix_steps.h"
#include "world/guard.h"
#include "world/pixel_rows.h"

namespace zr {
namespace {

// Row by row: a world's own clearing of full rows reaches further down than the rectangle.
template <class T>
void clear_rect(const ZR_WorldX<T>& world, const GX_LRect& rect) {
  for (i32 y = rect.top; y < rect.bottom; ++y) clear_row(world.At(rect.left, y), rect.right - rect.left);
}

// Copies the part of a row that lies inside the source. Pixels are at walk.x + k * step_x for k from run.first on.
template <class To, class From>
void copy_run(const ZR_WorldX<From>& src, const SourceWalk& walk, InsideRun run, To* out) {
  i32 x = wrap_add(walk.x, wrap_mul(run.first, walk.step_x)), y = wrap_add(walk.y, wrap_mul(run.first, walk.step_y));
  if (walk.step_x == 0x10000 && walk.step_y == 0) {
    const From* const in = src.At(nearest_index(x), nearest_index(y));
    if constexpr (std::is_same_v<To, From>)
      std::memmove(out + run.first, in, static_cast<std::size_t>(run.end - run.first) * sizeof(To));
    else
      copy_row(run.end - run.first, in, out + run.first);
    return;
  }
  const auto take = [&](i32 k) {
    out[k] = copy_pixel<To>(*src.At(nearest_index(x), nearest_index(y)));
    x = wrap_add(x, walk.step_x);
    y = wrap_add(y, walk.step_y);
  };
  i32 k = run.first;
  for (; run.end - k >= 8; k += 8)
    for (i32 i = 0; i < 8; ++i) take(k + i);
  for (; k < run.end; ++k) take(k);
}

// A row whose positions wrap somewhere comes back into the source, so every pixel is looked at.
template <class To, class From>
void copy_wrapping_row(const ZR_WorldX<From>& src, const SourceWalk& walk, i32 columns, To* out) {
  i32 x = walk.x, y = walk.y;
  for (i32 k = 0; k < columns; ++k) {
    const i32 column = nearest_index(x), row = nearest_index(y);
    const bool inside = column >= 0 && column < src.width && row >= 0 && row < src.height;
    out[k] = inside ? copy_pixel<To>(*src.At(column, row)) : To{};
    x = wrap_add(x, walk.step_x);
    y = wrap_add(y, walk.step_y);
  }
}

template <class To, class From>
i32 copy_through_matrix(const ZR_ProgressInfo* progress, ZR_LayerDef* src_layer, const GX_Matrix3& matrix, bool src2dst,
                        const GX_LRect* clip, ZR_LayerDef* dst_layer) {
  const ZR_WorldX<From> src(src_layer, false);
  ZR_WorldX<To> dst(dst_layer, false);
  GX_LRect area = {0, 0, dst.width, dst.height};
  if (!GX_SectLRect(&area, clip != nullptr ? clip : &area, &area)) return ZR_Err_None;
  Placement placement;
  GX_LRect bounds = {};
  if (make_placement(matrix, src2dst, &placement)) bounds = reached_rect(placement, area, src.width, src.height);
  if (GX_EmptyLRect(&bounds) || placed_scale(placement.forward).degenerate) {
    clear_rect(dst, area);
    return ZR_Err_None;
  }
  dst.ClearExceptRect(bounds);
  const i32 columns = bounds.right - bounds.left, rows = bounds.bottom - bounds.top;
  SourceWalk walk = source_walk(placement.inverse, bounds.left, bounds.top);
  for (i32 row = 0; row < rows; ++row) {
    To* const out = dst.At(bounds.left, bounds.top + row);
    if (walk.straight(columns)) {
      const InsideRun run = nearest_run(walk, columns, src.width, src.height);
      clear_row(out, run.first);
      if (run.first < run.end) copy_run(src, walk, run, out);
      clear_row(out + run.end, columns - run.end);
    } else {
      copy_wrapping_row(src, walk, columns, out);
    }
    walk.next_row();
    if ((row & 63) == 0) {
      if (const i32 stop = poll(progress, row, rows); stop != 0) return stop;
    }
  }
  return ZR_Err_None;
}

}  // namespace
}  // namespace zr

i32 ZR_CopyBits3_LO_Straight(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const GX_Matrix3* matrix, bool src2dst,
                             const GX_LRect* clip, ZR_LayerDef* dst) {
  return zr::guarded([&]() -> i32 {
    if (src == nullptr || matrix == nullptr || dst == nullptr || src->data == nullptr || dst->data == nullptr)
      return ZR_ReportBadCallbackParam(ZR_Site_MatrixCopy);
    return zr::on_depth(ZRp_WorldDepth(src), zr::unknown_depth_text, [&]<class From>() {
      return zr::on_depth(ZRp_WorldDepth(dst), zr::unknown_depth_text, [&]<class To>() {
        return zr::copy_through_matrix<To, From>(progress, src, *matrix, src2dst, clip, dst);
      });
    });
  });
}
