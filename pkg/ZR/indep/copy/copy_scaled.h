// The scaled copy by nearest neighbour over planes of pixels of any size: clipping, overflow, and the rows.
#pragma once

#include <ZR/errors.h>
#include <ZR/types.h>

#include <cstring>

#include "copy/copy_rects.h"
#include "world/guard.h"

namespace zr {

// Pixels in memory, whoever holds them.
struct CopyPlane {
  char* data;
  i32 row_bytes, width, height, pixel_bytes;

  CopyPlane(const ZR_LayerDef& layer, std::size_t pixel_size)
      : CopyPlane(layer.data, layer.row_bytes, layer.width, layer.height, static_cast<i32>(pixel_size)) {}
  CopyPlane(void* data_, i32 row_bytes_, i32 width_, i32 height_, i32 pixel_bytes_)
      : data(static_cast<char*>(data_)),
        row_bytes(row_bytes_),
        width(width_),
        height(height_),
        pixel_bytes(pixel_bytes_) {}

  char* at(i64 x, i64 y) const { return data + y * row_bytes + x * pixel_bytes; }
  // Whether a byte of this plane may be a byte of the other.
  bool may_overlap(const CopyPlane& other) const { return lowest() < other.highest() && other.lowest() < highest(); }

 private:
  u64 lowest() const { return reinterpret_cast<u64>(row_bytes < 0 ? at(0, i64{height} - 1) : data); }
  u64 highest() const { return reinterpret_cast<u64>(row_bytes < 0 ? at(width, 0) : at(width, i64{height} - 1)); }
};

// What a copy says of an inverted destination.
struct OverflowTexts {
  ZR_CallSite site;
  const char *x, *y;
};

// emit(walk, source row, destination row) writes walk.count pixels from the given destination pixel on; the source
// row is that of the source's column 0.
template <class EmitRow>
i32 copy_scaled(const CopyPlane& src, const CopySide& from, const CopyPlane& dst, const CopySide& to,
                const OverflowTexts& texts, EmitRow&& emit) {
  const AxisWalk x(clip_axis({from.rect.left, from.rect.right, to.rect.left, to.rect.right}, from.full, src.width,
                             to.full, dst.width),
                   src.width, dst.width);
  const AxisWalk y(clip_axis({from.rect.top, from.rect.bottom, to.rect.top, to.rect.bottom}, from.full, src.height,
                             to.full, dst.height),
                   src.height, dst.height);
  // An inverted extent makes its error term negative sooner or later; before that nothing is written.
  if (y.src_extent < 1) return ZR_Err_None;
  if (y.dst_extent < 0) return failed_verification(texts.site, texts.y);
  if (y.dst_extent > 0 && x.src_extent > 0 && x.dst_extent < 0) return failed_verification(texts.site, texts.x);
  if (x.count == 0) return ZR_Err_None;

  const bool repeats_move = !src.may_overlap(dst);  // else the source row may have changed between its copies
  const std::size_t bytes = static_cast<std::size_t>(x.count) * static_cast<std::size_t>(dst.pixel_bytes);
  std::ptrdiff_t row_above = -1;
  y.each([&](i32 k, std::ptrdiff_t src_row) {
    char* const out = dst.at(x.first, i64{y.first} + k);
    if (repeats_move && src_row == row_above)
      std::memmove(out, dst.at(x.first, i64{y.first} + k - 1), bytes);
    else
      emit(x, src.at(0, src_row), out);
    row_above = src_row;
  });
  return ZR_Err_None;
}

}  // namespace zr
