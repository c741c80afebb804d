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

// Rows of one rectangle at one place of both worlds, clipped to both; its left and top are not negative.
template <class To, class From>
void copy_in_place(ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect& rect, const CopyRows& rows) {
  const i32 right = std::min({rect.right, src->width, dst->width});
  const i32 top = std::max(rect.top, rows.first);
  const i32 bottom = std::min({rect.bottom, src->height, dst->height, rows.end});
  if (right <= rect.left || bottom <= top) return;
  const ZR_WorldX<From> from(src, false);
  ZR_WorldX<To> to(dst, false);
  if constexpr (std::is_same_v<To, From>) {
    to.CopyRect(&from, {rect.left, top, right, bottom}, rect.left, top);
  } else {
    for (i32 y = top; y < bottom; ++y) copy_row(right - rect.left, from.At(rect.left, y), to.At(rect.left, y));
  }
}

// The pixels at columns[0..n-1] of a row of `width` pixels; nothing shares memory.
template <class T>
void pick_pixels(const LaneColumns* lanes, i32 n, const i32* columns, i32 width, const T* src, T* dst) {
  i32 done = 0;
  if constexpr (sizeof(T) <= 8)
    if (lanes != nullptr)
      done = (sizeof(T) == 4 ? lanes->pick4 : lanes->pick8)(n, columns, width, reinterpret_cast<const char*>(src),
                                                            reinterpret_cast<char*>(dst));
  for (i32 k = done; k < n; ++k) dst[k] = src[columns[k]];
}

// The same at another depth: the smaller pixels are picked, unless that means to convert more of them. Columns never
// fall.
template <class To, class From>
void convert_pixels(const LaneColumns* lanes, i32 n, const i32* columns, i32 width, const From* src, To* dst) {
  constexpr i32 batch = 256;
  for (; n > 0; n -= batch, columns += batch, dst += batch) {
    const i32 count = std::min(n, batch), first = columns[0], span = columns[count - 1] - first + 1;
    if (sizeof(To) < sizeof(From) && span <= count) {
      To converted[batch];
      i32 places[batch];
      for (i32 k = 0; k < count; ++k) places[k] = columns[k] - first;
      copy_row(span, src + first, converted);
      pick_pixels(lanes, count, places, span, converted, dst);
    } else {
      From picked[batch];
      pick_pixels(lanes, count, columns, width, src, picked);
      copy_row(count, picked, dst);
    }
  }
}

template <class To, class From>
i32 copy_bits(ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect, const GX_LRect* dst_rect,
              const CopyRows& rows) {
  CopySide from, to;
  if (!take_rect(src_rect, src->width, src->height, &from) || !take_rect(dst_rect, dst->width, dst->height, &to))
    return ZR_Err_None;
  if (same_rect(from.rect, to.rect) && from.rect.left >= 0 && from.rect.top >= 0) {
    copy_in_place<To, From>(src, dst, from.rect, rows);
    return ZR_Err_None;
  }
  const LaneColumns* const lanes = lane_columns();
  const auto emit = [&](i32 n, const i32* columns, const char* src_row, char* dst_pixels, bool apart) {
    const From* const in = reinterpret_cast<const From*>(src_row);
    To* const out = reinterpret_cast<To*>(dst_pixels);
    if (!apart)
      for (i32 k = 0; k < n; ++k) out[k] = copy_pixel<To>(in[columns[k]]);
    else if constexpr (std::is_same_v<To, From>)
      pick_pixels(lanes, n, columns, src->width, in, out);
    else
      convert_pixels(lanes, n, columns, src->width, in, out);
  };
  return copy_scaled({*src, sizeof(From)}, from, {*dst, sizeof(To)}, to, rows, overflow_texts, emit);
}

i32 copy_draft(ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect, const GX_LRect* dst_rect,
               const CopyRows& rows) {
  return guarded([&]() -> i32 {
    if (src == nullptr || dst == nullptr || src->data == nullptr || dst->data == nullptr)
      return ZR_ReportBadCallbackParam(ZR_Site_CopyBitsDraft);
    return copy_bits_any_depths(src, dst, src_rect, dst_rect, rows);
  });
}

}  // namespace

i32 copy_bits_any_depths(ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect, const GX_LRect* dst_rect,
                         const CopyRows& rows) {
  return on_depth(ZRp_WorldDepth(src), unknown_depth_text, [&]<class From>() {
    return on_depth(ZRp_WorldDepth(dst), unknown_depth_text,
                    [&]<class To>() { return copy_bits<To, From>(src, dst, src_rect, dst_rect, rows); });
  });
}

}  // namespace zr

i32 ZR_CopyBits_Draft_Static(const ZR_ProgressInfo* /*progress*/, ZR_LayerDef* src, ZR_LayerDef* dst,
                             const GX_LRect* src_rect, const GX_LRect* dst_rect) {
  return zr::copy_draft(src, dst, src_rect, dst_rect, {});
}

i32 ZR_CopyBits_DraftRows(ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect, const GX_LRect* dst_rect,
                          i32 first_row, i32 end_row) {
  return zr::copy_draft(src, dst, src_rect, dst_rect, {first_row, end_row});
}
