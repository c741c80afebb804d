// Premultiplying and unmultiplying: rows handed to the generic iterator.
#include "composite/premultiply.h"

#include <ZR/errors.h>

#include <algorithm>
#include <type_traits>

#include "composite/matte_rows.h"
#include "world/guard.h"
#include "world/row_bands.h"
#include "world/slot_table.h"

namespace zr {
namespace {

// `rect` (null: everything) cut to width x height; false when nothing is left.
bool clip(const GX_LRect* rect, i32 width, i32 height, GX_LRect* out) {
  *out = {0, 0, width, height};
  if (rect != nullptr)
    *out = {std::max(rect->left, 0), std::max(rect->top, 0), std::min(rect->right, width),
            std::min(rect->bottom, height)};
  return out->right > out->left && out->bottom > out->top;
}

template <class T>
RowFunc<T>* plain_row(bool forward) {
  return forward ? slot<DepthSlots<T>::premul>() : slot<DepthSlots<T>::unmul>();
}

i32 empty_row_slot() { return failed_verification(ZR_Site_EmptySlot, "no routine for the rows of ZR_Premul"); }

// ------------------------------------------------------------------------------ worlds

template <class T>
bool is_black(const T& colour) {
  return colour.red == 0 && colour.green == 0 && colour.blue == 0;
}

// One world under one or two records.
bool same_world(const ZR_LayerDef* a, const ZR_LayerDef* b) {
  return a == b || (a->data == b->data && a->row_bytes == b->row_bytes);
}

template <class T>
i32 premul_colour_rows(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const T& matte, bool forward,
                       const GX_LRect* rect, ZR_LayerDef* dst) {
  GX_LRect area;
  if (!clip(rect, std::min(src->width, dst->width), std::min(src->height, dst->height), &area)) return ZR_Err_None;
  if (src->data == nullptr || dst->data == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_Premul);
  const ZR_WorldX<T> from(src, false), to(dst, false);
  const i32 width = area.right - area.left, rows = area.bottom - area.top;
  const i64 row_bytes = static_cast<i64>(width) * static_cast<i64>(sizeof(T));
  const auto source = [&](i32 y) { return from.At(area.left, area.top + y); };
  const auto target = [&](i32 y) { return to.At(area.left, area.top + y); };
  if (forward)
    return for_rows(progress, rows, row_bytes, [&](i32 y) { matte_row<T, true>(width, matte, source(y), target(y)); });
  // Taking black away is the plain division, which makes colours under alpha 0 white.
  if (is_black(matte)) {
    RowFunc<T>* const row = plain_row<T>(false);
    if (row == nullptr) return empty_row_slot();
    return for_rows(progress, rows, row_bytes, [&](i32 y) { row(width, source(y), target(y)); });
  }
  return for_rows(progress, rows, row_bytes, [&](i32 y) { matte_row<T, false>(width, matte, source(y), target(y)); });
}

template <class Colour>
i32 premul_colour(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const Colour* colour, i32 forward,
                  const GX_LRect* rect, ZR_LayerDef* dst) {
  return guarded([&]() -> i32 {
    if (src == nullptr || colour == nullptr || dst == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_Premul);
    const i32 depth = ZRp_WorldDepth(dst);
    if (ZRp_WorldDepth(src) != depth)
      return failed_verification(ZR_Site_Premul, "ZR_PremulColor requires src and dst worlds to be same depth");
    return on_depth(depth, unknown_depth_text, [&]<class T>() -> i32 {
      const T matte = convert_colour<T>(*colour);
      if (same_world(src, dst) && is_black(matte)) return ZR_PremulRect(progress, forward, rect, dst);
      return premul_colour_rows<T>(progress, src, matte, forward != 0, rect, dst);
    });
  });
}

}  // namespace

i32 premul_color_rect16(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const ZR_Pixel16* colour, i32 forward,
                        const GX_LRect* rect, ZR_LayerDef* dst) {
  return premul_colour(progress, src, colour, forward, rect, dst);
}

}  // namespace zr

i32 ZR_PremulRect_S(const ZR_ProgressInfo* progress, i32 forward, const GX_LRect* rect, ZR_LayerDef* dst) {
  return zr::guarded([&]() -> i32 {
    if (dst == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_Premul);
    return zr::on_depth(ZRp_WorldDepth(dst), zr::unknown_depth_text, [&]<class T>() -> i32 {
      GX_LRect area;
      if (!zr::clip(rect, dst->width, dst->height, &area)) return ZR_Err_None;
      if (dst->data == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_Premul);
      zr::RowFunc<T>* const row = zr::plain_row<T>(forward != 0);
      if (row == nullptr) return zr::empty_row_slot();
      const ZR_WorldX<T> world(dst, false);
      const i32 width = area.right - area.left;
      return zr::for_rows(progress, area.bottom - area.top, static_cast<i64>(width) * static_cast<i64>(sizeof(T)),
                          [&](i32 y) { row(width, nullptr, world.At(area.left, area.top + y)); });
    });
  });
}

i32 ZR_Premul(const ZR_ProgressInfo* progress, i32 forward, ZR_LayerDef* dst) {
  return ZR_PremulRect(progress, forward, nullptr, dst);
}

i32 ZR_PremulColor(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const ZR_Pixel8* colour, i32 forward,
                   ZR_LayerDef* dst) {
  return zr::premul_colour(progress, src, colour, forward, nullptr, dst);
}

i32 ZR_PremulColor16(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const ZR_Pixel16* colour, i32 forward,
                     ZR_LayerDef* dst) {
  return zr::premul_colour(progress, src, colour, forward, nullptr, dst);
}

i32 ZR_PremulColorFloat(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const ZR_PixelFloat* colour, i32 forward,
                        ZR_LayerDef* dst) {
  return zr::premul_colour(progress, src, colour, forward, nullptr, dst);
}

i32 ZR_PremulColorRect(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const ZR_Pixel8* colour, i32 forward,
                       const GX_LRect* rect, ZR_LayerDef* dst) {
  return zr::premul_colour(progress, src, colour, forward, rect, dst);
}

i32 ZR_PremulColorRectFloat(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const ZR_PixelFloat* colour, i32 forward,
                            const GX_LRect* rect, ZR_LayerDef* dst) {
  return zr::premul_colour(progress, src, colour, forward, rect, dst);
}
