// The scaled copy by nearest neighbour over planes of pixels of any size: clipping, overflow, and the rows.
#pragma once

#include <ZR/errors.h>
#include <ZR/types.h>

#include <algorithm>
#include <cstring>

#include "copy/copy_rects.h"
#include "copy/lane_columns.h"
#include "simd/streamed.h"
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

// Copies `rows` of the destination. emit(n, source columns, source row, destination pixels, apart) writes n pixels; the
// source row is that of column 0. Unless source and destination are apart it writes one pixel after the other.
template <class EmitRow>
i32 copy_scaled(const CopyPlane& src, const CopySide& from, const CopyPlane& dst, const CopySide& to,
                const CopyRows& rows, const OverflowTexts& texts, EmitRow&& emit) {
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

  const i32 first = static_cast<i32>(std::clamp<i64>(i64{rows.first} - y.first, 0, y.count));
  const i32 end = static_cast<i32>(std::clamp<i64>(i64{rows.end} - y.first, first, y.count));

  // The columns' sources are worked out once for all rows, in blocks that fit a table. Where the planes may share
  // memory the rows have to be finished one by one, and a row may have changed between its copies.
  constexpr i32 block = 1024;
  i32 columns[block], row;
  const auto out = [&](i32 k, i32 column) { return dst.at(i64{x.first} + column, i64{y.first} + k); };
  if (src.may_overlap(dst)) {
    for (i32 k = first; k < end; ++k) {
      y.sources(k, 1, &row);
      for (i32 column = 0; column < x.count; column += block) {
        const i32 n = std::min(block, x.count - column);
        x.sources(column, n, columns);
        emit(n, columns, src.at(0, row), out(k, column), false);
      }
    }
    return ZR_Err_None;
  }
  // Rows that are shown several times are made once, beside the destination where that is large, in parts or not.
  const LaneColumns* const lanes = lane_columns();
  const bool large = i64{x.count} * y.count * dst.pixel_bytes >= streamed_bytes;
  alignas(64) char kept[block * 16];
  const bool streams = lanes != nullptr && large && dst.pixel_bytes <= 16 && y.dst_extent > y.src_extent;
  for (i32 column = 0; column < x.count; column += block) {
    const i32 n = std::min(block, x.count - column);
    const std::size_t bytes = static_cast<std::size_t>(n) * static_cast<std::size_t>(dst.pixel_bytes);
    x.sources(column, n, columns);
    i32 row_above = -1;
    for (i32 k = first; k < end; ++k, row_above = row) {
      y.sources(k, 1, &row);
      char* const pixels = out(k, column);
      if (streams) {
        if (row != row_above) emit(n, columns, src.at(0, row), kept, true);
        lanes->stream(bytes, kept, pixels);
      } else if (row == row_above) {
        std::memcpy(pixels, pixels - dst.row_bytes, bytes);
      } else {
        emit(n, columns, src.at(0, row), pixels, true);
      }
    }
  }
  if (streams) lanes->finish();
  return ZR_Err_None;
}

}  // namespace zr
