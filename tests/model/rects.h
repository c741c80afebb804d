// Rectangles of worlds: transfer, alpha outside a rectangle, the old 8-bit composite.
#pragma once

#include <functional>
#include <utility>

#include "model/rows.h"

namespace model {

template <class D>
typename D::Pixel& at(const ZR_LayerDef& w, i32 x, i32 y) {
  return reinterpret_cast<typename D::Pixel*>(static_cast<u8*>(w.data) + ptrdiff_t{y} * w.row_bytes)[x];
}
inline GX_LRect bounds(const ZR_LayerDef& w) { return {0, 0, w.width, w.height}; }
inline GX_LRect moved(const GX_LRect& r, i32 dx, i32 dy) {
  return {r.left + dx, r.top + dy, r.right + dx, r.bottom + dy};
}
// By any distance, whatever is then beyond the numbers held to them.
inline GX_LRect moved_far(const GX_LRect& r, i64 dx, i64 dy) {
  const auto held = [](i64 v) { return static_cast<i32>(v < INT32_MIN ? INT32_MIN : v > INT32_MAX ? INT32_MAX : v); };
  return {held(r.left + dx), held(r.top + dy), held(r.right + dx), held(r.bottom + dy)};
}
inline GX_LRect common(const GX_LRect& a, const GX_LRect& b) {
  return {most(a.left, b.left), most(a.top, b.top), least(a.right, b.right), least(a.bottom, b.bottom)};
}
inline bool empty(const GX_LRect& r) { return r.right <= r.left || r.bottom <= r.top; }
inline bool inside(const GX_LRect& r, i32 x, i32 y) { return x >= r.left && x < r.right && y >= r.top && y < r.bottom; }

// What a caller's progress function is told, and when it stops the work.
using Progress = std::function<i32(i32 done, i32 total)>;

template <class D>
void clear_alpha_except(const GX_LRect& rect, const ZR_LayerDef& world) {
  for (i32 y = 0; y < world.height; ++y)
    for (i32 x = 0; x < world.width; ++x)
      if (!inside(rect, x, y)) at<D>(world, x, y).alpha = 0;
}

// Opacity as the rows take it.
template <class D>
typename D::V row_opacity(f32 opacity) {
  if constexpr (is_float<D>)
    return opacity;
  else
    return static_cast<typename D::Channel>(truncate(static_cast<f32>(D::white) * opacity + 0.5f));
}
// The opacity that the two fields of a plain composite record mean.
inline f32 plain_opacity(u8 opacity, u16 opacity16) {
  const f32 coarse = static_cast<f32>(opacity) / 255.0f, fine = static_cast<f32>(opacity16) * 3.0517578e-5f;
  return static_cast<f64>(std::abs(coarse - fine)) >= 0.00392156862745098 ? coarse : fine;
}
inline bool row_in_field(i32 y, i32 field) { return field == 1 ? (y & 1) == 0 : field == 2 ? (y & 1) != 0 : true; }

template <class D>
i32 transfer_rect(const Progress& progress, i32 field, const GX_LRect& rect, const ZR_LayerDef& src,
                  const ZR_CompositeModePlus& mode, const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask,
                  i32 dest_x, i32 dest_y, const ZR_LayerDef& dst) {
  const i64 dx = i64{dest_x} - rect.left, dy = i64{dest_y} - rect.top;
  GX_LRect r = common(rect, bounds(src));
  if (empty(r)) return 0;
  r = common(moved_far(r, dx, dy), bounds(dst));
  if (empty(r)) return 0;
  if (mask != nullptr && (mask->kind & 1) == 0)
    r = common(r, moved(bounds(mask->world), mask->offset_x, mask->offset_y));
  if (empty(r)) return 0;
  if (!known_mode(mode.xfer)) return ZR_Err_UnimplementedMode;
  if (mode.xfer == multiply_alpha || mode.xfer == multiply_alpha_luma) clear_alpha_except<D>(r, dst);

  u32 seed = static_cast<u32>(mode.rand_seed) + static_cast<u32>(r.left), step = static_cast<u32>(r.top) * 12281u;
  for (i32 y = r.top; y < r.bottom; ++y, seed += step, step += 12281u) {
    if (row_in_field(y, field)) {
      Row<D> s, d;
      std::vector<typename D::V> m;
      for (i32 x = r.left; x < r.right; ++x) {
        s.push_back(load<D>(at<D>(src, static_cast<i32>(x - dx), static_cast<i32>(y - dy))));
        d.push_back(load<D>(at<D>(dst, x, y)));
        if (mask == nullptr) continue;
        const i32 mx = x - mask->offset_x, my = y - mask->offset_y;
        const bool covered = inside(bounds(mask->world), mx, my);  // never outside for even kinds but at the sides
        m.push_back(covered ? mask_value<D>(load<D>(at<D>(mask->world, mx, my)), mask->kind) : D::white);
      }
      const RowPlan<D> plan{mode.xfer, static_cast<i32>(seed), row_opacity<D>(mode.opacity), mode.keep_alpha, tables};
      composite_row<D>(plan, s, mask != nullptr ? m.data() : nullptr, d);
      for (i32 x = r.left; x < r.right; ++x) at<D>(dst, x, y) = store(d[static_cast<size_t>(x - r.left)]);
    }
    if ((y & 127) == 0)
      if (const i32 stop = progress(y - r.top, r.bottom - r.top); stop != 0) return stop;
  }
  return 0;
}

// The rectangle lies inside both worlds; its corner lands at (dest_x, dest_y).
inline i32 composite_rect(bool premultiplied, const Progress& progress, const GX_LRect& rect, u8 opacity,
                          const ZR_LayerDef& src, i32 dest_x, i32 dest_y, i32 field, const ZR_LayerDef& dst) {
  if (opacity == 0) return 0;
  const u32 o = opacity;
  for (i32 row = 0; row < rect.bottom - rect.top; ++row) {
    if ((row & 31) == 0)
      if (const i32 stop = progress(row, rect.bottom - rect.top); stop != 0) return stop;
    if (!row_in_field(dest_y + row, field)) continue;
    for (i32 x = 0; x < rect.right - rect.left; ++x) {
      const Px<Eight> s = load<Eight>(at<Eight>(src, rect.left + x, rect.top + row));
      Px<Eight> d = load<Eight>(at<Eight>(dst, dest_x + x, dest_y + row));
      const i32 full = static_cast<i32>(o);
      if (d.a >= 255) continue;
      if (premultiplied) {
        const Px<Eight> scaled{Eight::mul(full, s.a),
                               {Eight::mul(full, s.c[0]), Eight::mul(full, s.c[1]), Eight::mul(full, s.c[2])}};
        const i32 rest = 255 - d.a;
        if (d.a == 0) {
          d = scaled;
        } else {
          for (int c = 0; c < 3; ++c) d.c[c] += Eight::mul(rest, scaled.c[c]);
          d.a += Eight::mul(rest, scaled.a);
        }
      } else if (d.a == 0) {
        d = s, d.a = Eight::mul(full, s.a);
      } else {
        const i64 w = (i64{255} * o - i64{o} * d.a) * s.a, k = i64{d.a} * 65025;
        for (int c = 0; c < 3; ++c) d.c[c] = static_cast<i32>((s.c[c] * w + d.c[c] * k) / (k + w));
        d.a = static_cast<i32>((k + w) / 65025);
      }
      at<Eight>(dst, dest_x + x, dest_y + row) = store(d);
    }
  }
  return 0;
}

}  // namespace model
