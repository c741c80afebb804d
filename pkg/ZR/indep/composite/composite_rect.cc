// Rows and rectangles of the 8-bit composite behind.
#include "composite/composite_rect.h"

#include <ZR/errors.h>

#include "world/guard.h"

namespace zr {
namespace {

using D = Depth<ZR_Pixel8>;

u8 multiply(i32 a, i32 b) { return static_cast<u8>(D::mul(a, b)); }

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

void composite_behind_row_straight(i32 n, u8 opacity, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  // Weights are in 1/65025 of a pixel; their sum times a channel stays below 2^32.
  constexpr u32 full = static_cast<u32>(D::white * D::white);
  const u32 o = opacity;
  for (i32 i = 0; i < n; ++i) {
    const ZR_Pixel8 s = src[i], d = dst[i];
    if (d.alpha == D::white) continue;
    if (d.alpha == 0) {
      dst[i] = {multiply(opacity, s.alpha), s.red, s.green, s.blue};
      continue;
    }
    const u32 w = (static_cast<u32>(D::white) * o - o * d.alpha) * s.alpha;
    const u32 k = d.alpha * full;
    const auto mix = [&](u32 source, u32 below) { return static_cast<u8>((source * w + below * k) / (k + w)); };
    dst[i] = {static_cast<u8>((k + w) / full), mix(s.red, d.red), mix(s.green, d.green), mix(s.blue, d.blue)};
  }
}

void composite_behind_row_premul(i32 n, u8 opacity, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  for (i32 i = 0; i < n; ++i) {
    const ZR_Pixel8 s = src[i], d = dst[i];
    const i32 room = D::inv(d.alpha);
    // Under a clear pixel the source replaces whatever colour stood. Colours above their alpha may wrap.
    const i32 kept = d.alpha == 0 ? 0 : 1;
    const auto add = [&](i32 below, i32 source) {
      return static_cast<u8>(below * kept + multiply(room, multiply(opacity, source)));
    };
    dst[i] = {add(d.alpha, s.alpha), add(d.red, s.red), add(d.green, s.green), add(d.blue, s.blue)};
  }
}

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
