// The pixel iterators: one walk for all three, told once for all depths.
#include "iterate/iterate.h"

#include <ZR/errors.h>
#include <ZR/world.h>

#include <algorithm>

#include "iterate/iterate_area.h"
#include "world/guard.h"

namespace zr {
namespace {

// The three differ in how a source cuts the walk.
enum class Clip { to_source, to_placed_source, to_area };

struct Call {
  ZR_LayerDef* src;
  const GX_LRect* area;
  GX_LPoint origin;
  void* refcon;
  ZR_PixelFunc fn;
  ZR_LayerDef* dst;
};

// Rows and columns are counted as 16-bit values.
constexpr i64 low_word(i64 v) { return v & 0xffff; }

// n pixels of one row; `in` moves by in_step pixels.
template <class T>
i32 walk_span(const Call& call, i64 x, i64 y, i64 n, const T* in, i64 in_step, T* out) {
  for (i64 i = 0; i < n; ++i, in += in_step, ++out) {
    const i32 result = call.fn(call.refcon, static_cast<i32>(low_word(x + i)), static_cast<i32>(y), in, out);
    if (result != 0) return result;
  }
  return 0;
}

// One row of a placed source: transparent black on both sides of it.
template <class T>
i32 walk_row(const Call& call, const ZR_WorldX<T>& src, i64 left, i64 y, i64 n, T* out) {
  const T outside = {};
  const i64 right = left + n, sy = y - call.origin.y;
  const bool row_inside = sy >= 0 && sy < src.height;
  const i64 in_left = row_inside ? std::clamp<i64>(call.origin.x, left, right) : right;
  const i64 in_right = row_inside ? std::clamp<i64>(i64{call.origin.x} + src.width, in_left, right) : right;
  if (const i32 result = walk_span<T>(call, left, y, in_left - left, &outside, 0, out); result != 0) return result;
  if (in_right > in_left) {
    const T* const in = src.At(static_cast<i32>(in_left - call.origin.x), static_cast<i32>(sy));
    const i32 result = walk_span<T>(call, in_left, y, in_right - in_left, in, 1, out + (in_left - left));
    if (result != 0) return result;
  }
  return walk_span<T>(call, in_right, y, right - in_right, &outside, 0, out + (in_right - left));
}

// A walk by origin without a source is kept as plug-ins know it: x goes up by 2 for each pixel of `out`, so
// half of the columns are visited, and the next row starts where this one stopped plus the row's end: ever
// further to the left. Rows of a world that runs upwards in memory, or whose rows overlap, would leave it in
// that way; their pixels outside the world are passed over.
template <class T>
class SkewedWalk {
 public:
  SkewedWalk(const ZR_WorldX<T>& dst, const WalkArea& walk, i64 columns)
      : walk_(walk), columns_(columns), row_bytes_(dst.row_bytes) {
    const i64 last_row = i64{dst.row_bytes} * (i64{dst.height} - 1);
    base_ = static_cast<char*>(dst.data);
    lowest_ = std::min<i64>(last_row, 0);
    end_ = std::max<i64>(last_row, 0) + i64{dst.width} * pixel_bytes;
    at_ = walk.top * row_bytes_ + walk.left * pixel_bytes;
  }
  i32 row(const Call& call, i64 y) {
    for (i64 x = 0; x < columns_; x += 2, at_ += pixel_bytes) {
      if (at_ < lowest_ || at_ + pixel_bytes > end_) continue;
      const i32 result =
          call.fn(call.refcon, static_cast<i32>(low_word(walk_.left + x)), static_cast<i32>(y), nullptr, base_ + at_);
      if (result != 0) return result;
    }
    at_ += row_bytes_ - columns_ * pixel_bytes;
    return 0;
  }

 private:
  static constexpr i64 pixel_bytes = sizeof(T);
  WalkArea walk_;
  i64 columns_, row_bytes_;
  char* base_;
  i64 lowest_, end_, at_;  // bytes from the first pixel of the world
};

template <class T>
i32 walk(Clip clip, const Call& call, RowProgress& progress) {
  const ZR_WorldX<T> dst(call.dst, true);
  ZR_LayerDef nothing = {};
  const ZR_WorldX<T> src(call.src != nullptr ? call.src : &nothing, true);
  const i64 src_right = i64{src.width} + call.origin.x, src_bottom = i64{src.height} + call.origin.y;

  if (call.area != nullptr) {
    if (lies_off(*call.area, dst)) return ZR_Err_None;
    if (call.src != nullptr && clip != Clip::to_area && lies_behind(*call.area, src_right, src_bottom))
      return ZR_Err_None;
  }
  WalkArea area = area_of(call.area, dst);
  if (call.src != nullptr && clip != Clip::to_area) area.cut(call.origin.x, call.origin.y, src_right, src_bottom);
  const i64 columns = low_word(area.columns());
  if (clip != Clip::to_source && (columns == 0 || area.rows() == 0)) return ZR_Err_None;

  const bool in_place = call.src == nullptr && clip == Clip::to_source;
  SkewedWalk<T> skewed(dst, area, columns);
  for (i64 y = area.top; y < area.bottom; ++y) {
    i32 result;
    if (call.src == nullptr && !in_place) {
      result = skewed.row(call, y);
    } else {
      T* const out = dst.At(static_cast<i32>(area.left), static_cast<i32>(y));
      result = in_place ? walk_span<T>(call, area.left, y, columns, out, 1, out)
                        : walk_row<T>(call, src, area.left, y, columns, out);
    }
    if (result != 0) return result;
    if (progress.row_done(y - area.top)) break;
  }
  return progress.result();
}

i32 iterate(Clip clip, ZR_CallSite site, RowProgress progress, const Call& call) {
  return guarded([&] {
    const bool bad_src = call.src != nullptr && call.src->data == nullptr;
    if (bad_src || call.dst == nullptr || call.dst->data == nullptr || call.fn == nullptr)
      return ZR_ReportBadCallbackParam(static_cast<i32>(site));
    const i32 depth = ZRp_WorldDepth(call.src != nullptr ? call.src : call.dst);
    if (call.src != nullptr && depth != ZRp_WorldDepth(call.dst))
      return failed_verification(ZR_Site_IterateDepth, "ZR_Iterate requires source and dst worlds to be same depth");
    return on_depth(depth, unknown_depth_text, [&]<class T> { return walk<T>(clip, call, progress); });
  });
}

i32 iterate_placed(Clip clip, RowProgress progress, ZR_LayerDef* src, const GX_LRect* area, const GX_LPoint* origin,
                   void* refcon, ZR_PixelFunc fn, ZR_LayerDef* dst) {
  if (origin == nullptr && src != nullptr) return ZR_ReportBadCallbackParam(ZR_Site_IterateOrigin);
  const GX_LPoint placed = origin != nullptr && src != nullptr ? *origin : GX_LPoint{};
  return iterate(clip, ZR_Site_IterateOrigin, progress, {src, area, placed, refcon, fn, dst});
}

}  // namespace

i32 iterate_body(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src, const GX_LRect* area,
                 void* refcon, ZR_PixelFunc fn, ZR_LayerDef* dst) {
  return iterate(Clip::to_source, ZR_Site_Iterate, {in_data, progress_base, progress_final},
                 {src, area, {}, refcon, fn, dst});
}

i32 iterate_origin_body(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src,
                        const GX_LRect* area, const GX_LPoint* origin, void* refcon, ZR_PixelFunc fn,
                        ZR_LayerDef* dst) {
  return iterate_placed(Clip::to_placed_source, {in_data, progress_base, progress_final}, src, area, origin, refcon, fn,
                        dst);
}

i32 iterate_origin_no_clip_body(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src,
                                const GX_LRect* area, const GX_LPoint* origin, void* refcon, ZR_PixelFunc fn,
                                ZR_LayerDef* dst) {
  return iterate_placed(Clip::to_area, {in_data, progress_base, progress_final}, src, area, origin, refcon, fn, dst);
}

}  // namespace zr
