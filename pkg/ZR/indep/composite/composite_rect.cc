// Rectangles of the 8-bit composite behind.
#include "composite/composite_rect.h"

#include <ZR/errors.h>

#include "world/guard.h"

namespace zr {
namespace {

using D = Depth<ZR_Pixel8>;

i32 composite_rect(const ZR_ProgressInfo* progress, const GX_LRect* rect, u8 opacity, ZR_LayerDef* src, i32 dest_x,
                   i32 dest_y, i32 field, ZR_LayerDef* dst, CompositeBehindRowFunc* row) {
  return guarded([&]() -> i32 {
    if (opacity == 0) return ZR_Err_None;
    if (src == nullptr || dst == nullptr || src->data == nullptr || dst->data == nullptr)
      return ZR_ReportBadCallbackParam(ZR_Site_CompositeRect);
    if (ZRp_WorldDepth(src) != D::bits || ZRp_WorldDepth(dst) != D::bits)
      return failed_verification(ZR_Site_CompositeRect, "ZR_CompositeRect requires 8-bit src and dst worlds");
    if (row == nullptr) return failed_verification(ZR_Site_EmptySlot, "no routine for the rows of ZR_CompositeRect");

    const GX_LRect whole = {0, 0, src->width, src->height};
    const GX_LRect& from = rect != nullptr ? *rect : whole;
    if (from.right <= from.left || from.bottom <= from.top) return ZR_Err_None;
    const ZR_WorldX<ZR_Pixel8> source(src, false), destination(dst, false);
    const i32 width = wrap_sub(from.right, from.left), height = wrap_sub(from.bottom, from.top);
    for (i32 r = 0; r < height; ++r) {
      if ((r & 31) == 0) {
        const i32 stop = poll(progress, r, height);
        if (stop != 0) return stop;
      }
      const i32 y = wrap_add(dest_y, r);
      const bool even = (y & 1) == 0;
      if (field == 0 || even == (field == 1))
        row(width, opacity, source.At(from.left, from.top + r), destination.At(dest_x, y));
    }
    return ZR_Err_None;
  });
}

}  // namespace

i32 composite_rect_straight(const ZR_ProgressInfo* progress, const GX_LRect* rect, u8 opacity, ZR_LayerDef* src,
                            i32 dest_x, i32 dest_y, i32 field, u32 /*flags*/, ZR_LayerDef* dst) {
  return composite_rect(progress, rect, opacity, src, dest_x, dest_y, field, dst,
                        slot<ZR_Slot_composite_behind_row_straight>());
}

i32 composite_rect_premul(const ZR_ProgressInfo* progress, const GX_LRect* rect, u8 opacity, ZR_LayerDef* src,
                          i32 dest_x, i32 dest_y, i32 field, u32 /*flags*/, ZR_LayerDef* dst) {
  return composite_rect(progress, rect, opacity, src, dest_x, dest_y, field, dst,
                        slot<ZR_Slot_composite_behind_row_premul>());
}

}  // namespace zr
