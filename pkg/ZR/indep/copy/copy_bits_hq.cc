// The copies of high quality: every destination pixel is a sample of the source.
#include <ZR/errors.h>
#include <ZR/sample.h>
#include <ZR/world.h>

#include <algorithm>

#include "copy/copy_bits.h"
#include "copy/copy_rects.h"
#include "copy/copy_scaled.h"
#include "sample/lane_copies.h"
#include "sample/sample_functions.h"
#include "simd/streamed.h"
#include "world/guard.h"
#include "world/slot_table.h"

namespace zr {
namespace {

constexpr i32 one_pixel = 0x10000;

// One axis of the walk through the source, 16.16, and the destination pixels that it serves. Wraps in 32 bits.
struct SampledAxis {
  i32 step = 0, radius = 0, start = 0;
  i32 first = 0, end = 0;

  // False when the destination's extent is 0 as a 16-bit number, which is what the step is divided by.
  bool prepare(i32 src_begin, i32 src_end, i32 dst_begin, i32 dst_end, i32 dst_size) {
    const auto fixed = [](i32 v) { return wrap_mul(v, one_pixel); };
    const i32 extent = static_cast<i16>(wrap_sub(dst_end, dst_begin));
    if (extent == 0) return false;
    step = wrap_div(wrap_sub(fixed(src_end), fixed(src_begin)), extent);
    radius = step >> 1;
    first = std::max(dst_begin, 0);
    end = std::min(dst_end, dst_size);
    // The middle of the first pixel's footprint; what is cut off on the left is walked over.
    start = wrap_add(wrap_add(fixed(src_begin), radius - one_pixel / 2), wrap_mul(wrap_sub(first, dst_begin), step));
    return true;
  }
  i32 count() const { return std::max(wrap_sub(end, first), 0); }
};

// What runs in place of a sampler along a part of a row, if anything does.
template <class T>
struct InnerRow {
  LaneRowFunc<T>* row = nullptr;
  LaneCopyFunc<T>* copy = nullptr;  // takes many rows, of worlds that share no memory
  bool boxes = false;               // it averages boxes; else it is bilinear

  // The pixels of a row for which it may: all that they read lies inside.
  PixelRange range(const SampleRun& run, const ZR_SampPB& params) const {
    if (row == nullptr) return {0, 0};
    if (boxes) return boxes_inside(run, params);
    const ZR_LayerDef& src = *params.src;
    if (src.data == nullptr || run.step_x < 1 || run.y < 0 || (run.y >> 16) + 1 >= src.height) return {0, 0};
    const i64 step = run.step_x, end = (std::min(src.width, 32768) - i64{1}) * 65536;
    const auto first_at = [&](i64 x) {
      return x <= run.x ? 0 : std::min<i64>((x - run.x + step - 1) / step, run.count);
    };
    return {static_cast<i32>(first_at(0)), static_cast<i32>(first_at(end))};
  }
};

struct SampledCopy {
  SampledAxis x, y;

  bool prepare(const CopySide& from, const CopySide& to, const ZR_LayerDef& dst) {
    return x.prepare(from.rect.left, from.rect.right, to.rect.left, to.rect.right, dst.width) &&
           y.prepare(from.rect.top, from.rect.bottom, to.rect.top, to.rect.bottom, dst.height);
  }
  bool shrinks() const { return x.step > one_pixel || y.step > one_pixel; }

  // Both counts start at the first pixel of the axis and stay inside the destination.
  template <class T>
  i32 run(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst, SampleFunc<T>* sample,
          const InnerRow<T>& inner, i32 columns, i32 rows) const {
    if (sample == nullptr) return ZR_Err_Internal;  // a slot that a module emptied
    ZR_SampPB params = {};
    params.x_radius = x.radius;
    params.y_radius = y.radius;
    params.area = truncate_i32(x.step / 65536.0 * y.step);
    params.src = src;
    const ZR_WorldX<T> out(dst, false);
    const bool large = i64{columns} * rows * static_cast<i64>(sizeof(T)) >= streamed_bytes;
    bool copies = inner.copy != nullptr;
    i32 copied = 0;  // rows below here have their inner pixels
    i32 at_y = y.start;
    for (i32 row = 0; row < rows; ++row) {
      T* const pixels = out.At(x.first, y.first + row);
      const auto each = [&](i32 first, i32 end) {
        i32 at_x = wrap_add(x.start, wrap_mul(first, x.step));
        for (i32 k = first; k < end; ++k, at_x = wrap_add(at_x, x.step))
          sample(nullptr, at_x, at_y, &params, pixels + k);
      };
      const auto inner_at = [&](i32 y_at) { return inner.range({columns, x.start, y_at, x.step, 0}, params); };
      const PixelRange range = inner_at(at_y);
      i32 done = 0;
      if (range.first < range.end) {
        each(0, range.first);
        const i32 from = wrap_add(x.start, wrap_mul(range.first, x.step));
        if (copies && row >= copied) {
          // As far as the next poll and as the same columns go.
          const i32 last = std::min((row + 63) & ~63, rows - 1);
          CopyPart<T> part = {range.end - range.first, 1,    from, at_y, x.step, y.step, pixels + range.first,
                              dst->row_bytes,          large};
          for (i32 next = wrap_add(at_y, y.step); row + part.rows <= last; ++part.rows, next = wrap_add(next, y.step)) {
            const PixelRange other = inner_at(next);
            if (other.first != range.first || other.end != range.end) break;
          }
          copies = inner.copy(part, params);
          if (copies) copied = row + part.rows;
        }
        RowSum<T> alphas{};
        done = row < copied ? range.end
                            : range.first + inner.row({range.end - range.first, from, at_y, x.step, 0}, params, &alphas,
                                                      pixels + range.first);
      }
      each(done, columns);
      if ((row & 63) == 0 && progress != nullptr && progress->abort != nullptr) {
        if (const i32 stop = progress->abort(progress->refcon); stop != 0) return stop;
      }
      at_y = wrap_add(at_y, y.step);
    }
    return ZR_Err_None;
  }
};

GX_LRect rect_or_all(const GX_LRect* rect, const ZR_LayerDef& world) {
  return rect != nullptr ? *rect : GX_LRect{0, 0, world.width, world.height};
}

bool lacks_pixels(const ZR_LayerDef& src, const ZR_LayerDef& dst) { return src.data == nullptr || dst.data == nullptr; }

i32 copy_straight(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect,
                  const GX_LRect* dst_rect) {
  if (src == nullptr || dst == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_CopyBitsStraight);
  const GX_LRect in = rect_or_all(src_rect, *src), out = rect_or_all(dst_rect, *dst);
  if (wrap_sub(in.right, in.left) == wrap_sub(out.right, out.left) &&
      wrap_sub(in.bottom, in.top) == wrap_sub(out.bottom, out.top)) {  // nothing to scale
    if (lacks_pixels(*src, *dst)) return ZR_ReportBadCallbackParam(ZR_Site_CopyBitsStraight);
    return copy_bits_any_depths(src, dst, src_rect, dst_rect);
  }
  const i32 depth = ZRp_WorldDepth(src);
  if (ZRp_WorldDepth(dst) != depth)
    return failed_verification(ZR_Site_CopyBitsStraight,
                               "ZR_CopyBits_HQ_Straight_Static requires src and dst worlds to have same bit depth");
  return on_depth(depth, unknown_depth_text, [&]<class T>() -> i32 {
    if (lacks_pixels(*src, *dst)) return ZR_ReportBadCallbackParam(ZR_Site_CopyBitsStraight);
    CopySide from, to;
    SampledCopy copy;
    if (!take_rect(src_rect, src->width, src->height, &from) || !take_rect(dst_rect, dst->width, dst->height, &to) ||
        !copy.prepare(from, to, *dst))
      return ZR_Err_None;
    // What the slots hold now, and the library's own for float.
    const SampleFunctions<T> samplers = sample_functions<T>(1);
    const bool boxes = copy.shrinks();
    InnerRow<T> inner = {boxes ? box_row(samplers) : clipping_row(samplers), nullptr, boxes};
    if (inner.row != nullptr && !CopyPlane(*src, sizeof(T)).may_overlap(CopyPlane(*dst, sizeof(T))))
      inner.copy = boxes ? lane_box_copier<T>() : lane_bilinear_copier<T>();
    return copy.run<T>(progress, src, dst, boxes ? samplers.area : samplers.clipping, inner, copy.x.count(),
                       copy.y.count());
  });
}

i32 copy_premul(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect,
                const GX_LRect* dst_rect) {
  if (src == nullptr || dst == nullptr || lacks_pixels(*src, *dst))
    return ZR_ReportBadCallbackParam(ZR_Site_CopyBitsPremul);
  CopySide from, to;
  if (!take_rect(src_rect, src->width, src->height, &from) || !take_rect(dst_rect, dst->width, dst->height, &to))
    return ZR_Err_None;
  if (from.full && to.full && same_rect(from.rect, to.rect)) {
    const ZR_WorldX<ZR_Pixel8> in(src, false);
    ZR_WorldX<ZR_Pixel8>(dst, false).CopyRect(&in, from.rect, 0, 0);
    return ZR_Err_None;
  }
  SampledCopy copy;
  if (!copy.prepare(from, to, *dst)) return ZR_Err_None;
  const bool boxes = copy.shrinks();
  SampleFunc<ZR_Pixel8>*const point = slot<ZR_Slot_bilinear_premul8>(), *const area = slot<ZR_Slot_area_premul8>();
  InnerRow<ZR_Pixel8> inner;
  inner.boxes = boxes;
  const LanePremul* const lanes = lane_premul_samples();
  const bool own = point == &ZR_SubpixelSample_Premul && (!boxes || area == &ZR_AreaSample_Premul);
  // A copy within one world reads what it has written, pixel by pixel.
  const bool apart = !CopyPlane(*src, sizeof(ZR_Pixel8)).may_overlap(CopyPlane(*dst, sizeof(ZR_Pixel8)));
  if (own && apart && lanes != nullptr) inner.row = boxes ? lanes->boxes : lanes->bilinear;
  // Rows and columns are counted in 16 bits: 32768 of them count as none.
  return copy.run<ZR_Pixel8>(progress, src, dst, boxes ? area : point, inner, static_cast<i16>(copy.x.count()),
                             static_cast<i16>(copy.y.count()));
}

}  // namespace
}  // namespace zr

extern "C" {

i32 ZR_CopyBits_HQ_Straight_Static(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                                   const GX_LRect* src_rect, const GX_LRect* dst_rect) {
  return zr::guarded([&] { return zr::copy_straight(progress, src, dst, src_rect, dst_rect); });
}

i32 ZR_CopyBits_HQ_Premul_Static(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                                 const GX_LRect* src_rect, const GX_LRect* dst_rect) {
  return zr::guarded([&] { return zr::copy_premul(progress, src, dst, src_rect, dst_rect); });
}

}  // extern "C"
