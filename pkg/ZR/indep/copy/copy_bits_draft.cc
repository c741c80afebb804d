// The draft copy: nearest neighbour between worlds of any depths.
#include <ZR/errors.h>
#include <ZR/world.h>

#include <algorithm>
#include <type_traits>

#include "copy/copy_bits.h"
#include "copy/copy_pixels.h"
#include "copy/copy_scaled.h"

namespace zr {
namespace {

constexpr OverflowTexts overflow_texts = {ZR_Site_CopyBitsDraft, "ZRp_CopyBitsUniversal x overflow detected",
                                          "ZRp_CopyBitsUniversal y overflow detected"};

// One rectangle at one place of both worlds, clipped to both; its left and top are not negative.
template <class To, class From>
void copy_in_place(ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect& rect) {
  const i32 right = std::min({rect.right, src->width, dst->width});
  const i32 bottom = std::min({rect.bottom, src->height, dst->height});
  if (right <= rect.left || bottom <= rect.top) return;
  const ZR_WorldX<From> from(src, false);
  ZR_WorldX<To> to(dst, false);
  if constexpr (std::is_same_v<To, From>) {
    to.CopyRect(&from, rect, rect.left, rect.top);
  } else {
    for (i32 y = rect.top; y < bottom; ++y) copy_row(right - rect.left, from.At(rect.left, y), to.At(rect.left, y));
  }
}

template <class To, class From>
i32 copy_bits(ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect, const GX_LRect* dst_rect) {
  CopySide from, to;
  if (!take_rect(src_rect, src->width, src->height, &from) || !take_rect(dst_rect, dst->width, dst->height, &to))
    return ZR_Err_None;
  if (same_rect(from.rect, to.rect) && from.rect.left >= 0 && from.rect.top >= 0) {
    copy_in_place<To, From>(src, dst, from.rect);
    return ZR_Err_None;
  }
  const LaneColumns* const lanes = lane_columns();
  const auto emit = [&](i32 n, const i32* columns, const char* src_row, char* dst_pixels, bool apart) {
    i32 done = 0;
    if constexpr (std::is_same_v<To, From> && sizeof(To) <= 8) {
      if (lanes != nullptr && apart)
        done = (sizeof(To) == 4 ? lanes->pick4 : lanes->pick8)(n, columns, src->width, src_row, dst_pixels);
    }
    const From* const in = reinterpret_cast<const From*>(src_row);
    To* const out = reinterpret_cast<To*>(dst_pixels);
    for (i32 k = done; k < n; ++k) out[k] = copy_pixel<To>(in[columns[k]]);
  };
  return copy_scaled({*src, sizeof(From)}, from, {*dst, sizeof(To)}, to, overflow_texts, emit);
}

}  // namespace

i32 copy_bits_any_depths(ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect, const GX_LRect* dst_rect) {
  return on_depth(ZRp_WorldDepth(src), unknown_depth_text, [&]<class From>() {
    return on_depth(ZRp_WorldDepth(dst), unknown_depth_text,
                    [&]<class To>() { return copy_bits<To, From>(src, dst, src_rect, dst_rect); });
  });
}

}  // namespace zr

i32 ZR_CopyBits_Draft_Static(const ZR_ProgressInfo* /*progress*/, ZR_LayerDef* src, ZR_LayerDef* dst,
                             const GX_LRect* src_rect, const GX_LRect* dst_rect) {
  return zr::guarded([&]() -> i32 {
    if (src == nullptr || dst == nullptr || src->data == nullptr || dst->data == nullptr)
      return ZR_ReportBadCallbackParam(ZR_Site_CopyBitsDraft);
    return zr::copy_bits_any_depths(src, dst, src_rect, dst_rect);
  });
}
