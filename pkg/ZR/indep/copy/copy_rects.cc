// Rectangles of copies.
#include "copy/copy_rects.h"

#include <algorithm>

namespace zr {
namespace {

// How far `other_extent` pixels reach over `cut` of `extent` pixels.
i32 proportion(i32 cut, i32 other_extent, i32 extent) { return wrap_div(wrap_mul(cut, other_extent), extent); }

// Clips one side of an axis, pulling the other in.
void clip_side(i32 size, i32 extent, i32 other_extent, i32* begin, i32* end, i32* other_begin, i32* other_end) {
  if (*begin < 0) {
    *other_begin = wrap_add(*other_begin, proportion(wrap_sub(0, *begin), other_extent, extent));
    *begin = 0;
  }
  if (*end > size) {
    *other_end = wrap_sub(*other_end, proportion(wrap_sub(*end, size), other_extent, extent));
    *end = size;
  }
}

}  // namespace

bool take_rect(const GX_LRect* rect, i32 width, i32 height, CopySide* out) {
  const GX_LRect all = {0, 0, width, height};
  out->full = rect == nullptr || same_rect(*rect, all);
  out->rect = out->full ? all : *rect;
  if (out->full) return true;
  return rect->left != rect->right && rect->top != rect->bottom && rect->left < width && rect->top < height &&
         rect->right >= 1 && rect->bottom >= 1;
}

CopyAxis clip_axis(const CopyAxis& axis, bool src_full, i32 src_size, bool dst_full, i32 dst_size) {
  CopyAxis out = axis;
  // Both proportions are those of the rectangles as they were given.
  const i32 src_extent = wrap_sub(axis.src_end, axis.src_begin), dst_extent = wrap_sub(axis.dst_end, axis.dst_begin);
  if (!src_full)
    clip_side(src_size, src_extent, dst_extent, &out.src_begin, &out.src_end, &out.dst_begin, &out.dst_end);
  if (!dst_full)
    clip_side(dst_size, dst_extent, src_extent, &out.dst_begin, &out.dst_end, &out.src_begin, &out.src_end);
  return out;
}

AxisWalk::AxisWalk(const CopyAxis& axis, i32 src_size, i32 dst_size)
    : src_extent(wrap_sub(axis.src_end, axis.src_begin)),
      dst_extent(wrap_sub(axis.dst_end, axis.dst_begin)),
      src_begin(axis.src_begin),
      dst_begin(axis.dst_begin) {
  if (src_extent < 1 || dst_extent < 1) return;
  const i64 cells = src_extent, pixels = dst_extent, src_from = src_begin, dst_from = dst_begin;
  // Destination pixels that the source pixels before n show; n is not negative, nor is anything here above 2^62.
  const auto shown_before = [=](i64 n) { return std::min(n, cells) * pixels / cells; };
  const i64 begin = std::max(std::max<i64>(0, -dst_from), shown_before(std::max<i64>(0, -src_from)));
  const i64 end = std::min(std::min(pixels, dst_size - dst_from), shown_before(std::max<i64>(0, src_size - src_from)));
  if (begin >= end) return;
  first = static_cast<i32>(dst_from + begin);
  count = static_cast<i32>(end - begin);
}

void AxisWalk::sources(i32 from, i32 n, i32* out) const {
  const i64 cells = src_extent, pixels = dst_extent;
  const i64 numerator = (i64{first} + from - dst_begin + 1) * cells - 1;
  const i64 whole_step = cells / pixels, error_step = cells % pixels;
  i64 at = src_begin + numerator / pixels, error = numerator % pixels;
  for (i32 k = 0; k < n; ++k) {
    out[k] = static_cast<i32>(at);
    error += error_step;
    const bool carry = error >= pixels;
    error -= carry ? pixels : 0;
    at += whole_step + carry;
  }
}

}  // namespace zr
