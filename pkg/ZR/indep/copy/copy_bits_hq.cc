// The copies of high quality: every destination pixel is a sample of the source.
#include <ZR/errors.h>
#include <ZR/sample.h>
#include <ZR/world.h>

#include <algorithm>

#include "copy/copy_bits.h"
#include "copy/copy_rects.h"
#include "sample/sample_functions.h"
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

struct SampledCopy {
  SampledAxis x, y;

  bool prepare(const CopySide& from, const CopySide& to, const ZR_LayerDef& dst) {
    return x.prepare(from.rect.left, from.rect.right, to.rect.left, to.rect.right, dst.width) &&
           y.prepare(from.rect.top, from.rect.bottom, to.rect.top, to.rect.bottom, dst.height);
  }
  bool shrinks() const { return x.step > one_pixel || y.step > one_pixel; }

  // Both counts start at the first pixel of the axis and stay inside the destination.
  template <class T>
  i32 run(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst, SampleFunc<T>* sample, i32 columns,
          i32 rows) const {
    if (sample == nullptr) return ZR_Err_Internal;  // a slot that a module emptied
    ZR_SampPB params = {};
    params.x_radius = x.radius;
    params.y_radius = y.radius;
    params.area = truncate_i32(x.step / 65536.0 * y.step);
    params.src = src;
    const ZR_WorldX<T> out(dst, false);
    i32 at_y = y.start;
    for (i32 row = 0; row < rows; ++row) {
      T* const pixels = out.At(x.first, y.first + row);
      i32 at_x = x.start;
      for (i32 k = 0; k < columns; ++k) {
        sample(nullptr, at_x, at_y, &params, pixels + k);
        at_x = wrap_add(at_x, x.step);
      }
      if ((row & 63) == 0 && progress != nullptr && progress->abort != nullptr) {
        if (const i32 stop = progress->abort(progress->refcon); stop != 0) return stop;
      }
      at_y = wrap_add(at_y, y.step);
    }
    return ZR_Err_None;
  }
};

// The straight samplers of a depth: what the slots hold now, and the library's own for float.
template <class T>
SampleFunc<T>* straight_sampler(bool area) {
  if constexpr (std::is_same_v<T, ZR_Pixel8>)
    return area ? slot<ZR_Slot_area_straight8>() : slot<ZR_Slot_bilinear_straight8>();
  else if constexpr (std::is_same_v<T, ZR_Pixel16>)
    return area ? slot<ZR_Slot_area_straight16>() : slot<ZR_Slot_bilinear_straight16>();
  else
    return area ? &area_sample<ZR_PixelFloat, 1> : &ZR_SubpixelBilinearFloat;
}

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
    return copy.run<T>(progress, src, dst, straight_sampler<T>(copy.shrinks()), copy.x.count(), copy.y.count());
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
  SampleFunc<ZR_Pixel8>* const sample =
      copy.shrinks() ? slot<ZR_Slot_area_premul8>() : slot<ZR_Slot_bilinear_premul8>();
  // Rows and columns are counted in 16 bits: 32768 of them count as none.
  return copy.run<ZR_Pixel8>(progress, src, dst, sample, static_cast<i16>(copy.x.count()),
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
