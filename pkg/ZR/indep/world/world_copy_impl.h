// Bodies of ZR_WorldX<T>: copies between worlds of one or of two depths. Included by world.cc alone.
#pragma once

#include <ZR/world.h>

#include <algorithm>
#include <cstring>
#include <type_traits>
#include <utility>

#include "world/depth_rows.h"
#include "world/dither_state.h"
#include "world/guard.h"
#include "world/row_bands.h"

namespace zr {

// The destination rectangle of a copy, clipped to both worlds, and how far the source lies from it. 64 bits,
// so that no rectangle and no position overflows.
struct CopyArea {
  i64 left, top, right, bottom;
  i64 x_off, y_off;  // source pixel = destination pixel - offset

  CopyArea(const ZR_LayerDef& src, const GX_LRect& rect, i32 dst_x, i32 dst_y, const ZR_LayerDef& dst)
      : x_off(i64{dst_x} - rect.left), y_off(i64{dst_y} - rect.top) {
    left = std::max<i64>(std::max<i64>(rect.left, 0) + x_off, 0);
    right = std::min<i64>(std::min<i64>(rect.right, src.width) + x_off, dst.width);
    top = std::max<i64>(std::max<i64>(rect.top, 0) + y_off, 0);
    bottom = std::min<i64>(std::min<i64>(rect.bottom, src.height) + y_off, dst.height);
  }
  bool empty() const { return right <= left || bottom <= top; }
  i32 columns() const { return static_cast<i32>(right - left); }
  i32 rows() const { return static_cast<i32>(bottom - top); }
};

// Row `row` of the area (0 is its top) in the destination and in the source.
template <class T>
T* dst_row(const ZR_LayerDef& dst, const CopyArea& area, i32 row) {
  return reinterpret_cast<T*>(static_cast<char*>(dst.data) + (area.top + row) * dst.row_bytes) + area.left;
}
template <class T>
const T* src_row(const ZR_LayerDef& src, const CopyArea& area, i32 row) {
  return reinterpret_cast<const T*>(static_cast<const char*>(src.data) +
                                    (area.top - area.y_off + row) * src.row_bytes) +
         (area.left - area.x_off);
}

// Moves rows of one depth, top row first, each as by memmove.
template <class T>
void move_rows(const ZR_LayerDef& src, const ZR_LayerDef& dst, const CopyArea& area, i32 first, i32 count) {
  const std::size_t bytes = static_cast<std::size_t>(area.columns()) * sizeof(T);
  const T* const from = src_row<T>(src, area, first);
  T* const to = dst_row<T>(dst, area, first);
  // Packed rows are one move, unless that would keep rows that this order overwrites before it reads them.
  const u64 ahead = reinterpret_cast<u64>(to) - reinterpret_cast<u64>(from);  // huge when `to` lies below
  const std::size_t total = bytes * static_cast<std::size_t>(count);
  const bool packed = static_cast<i64>(bytes) == src.row_bytes && static_cast<i64>(bytes) == dst.row_bytes;
  if (packed && (ahead == 0 || ahead >= total)) {
    std::memmove(to, from, total);
    return;
  }
  for (i32 row = first; row < first + count; ++row)
    std::memmove(dst_row<T>(dst, area, row), src_row<T>(src, area, row), bytes);
}

// Whether no byte is in rows of both sides.
template <class T>
bool rows_are_apart(const ZR_LayerDef& src, const ZR_LayerDef& dst, const CopyArea& area, i32 first, i32 count) {
  const auto range = [&](const T* top, i64 row_bytes) {
    const auto begin = reinterpret_cast<std::intptr_t>(top), last = begin + (count - 1) * row_bytes;
    return std::pair(std::min(begin, last), std::max(begin, last) + area.columns() * std::intptr_t{sizeof(T)});
  };
  const auto from = range(src_row<T>(src, area, first), src.row_bytes);
  const auto to = range(dst_row<T>(dst, area, first), dst.row_bytes);
  return from.second <= to.first || to.second <= from.first;
}
// Moves rows of one depth: in bands, or in their order where that matters.
template <class T>
void move_rows_divided(const ZR_LayerDef& src, const ZR_LayerDef& dst, const CopyArea& area, i32 first, i32 count) {
  const auto move = [&](i32 top, i32 bottom) { move_rows<T>(src, dst, area, top, bottom - top); };
  if (rows_are_apart<T>(src, dst, area, first, count))
    each_band(first, first + count, area.columns(), 2 * sizeof(T), move);
  else
    move(first, first + count);
}

// From here on, both worlds together, a conversion gains by storing past the caches even where its result is read
// right after. Measured with caches of 2 MB a core.
constexpr i64 past_caches = i64{32} << 20;

template <class To, class From>
void copy_rows(const ZR_LayerDef& src, const ZR_LayerDef& dst, const CopyArea& area, bool dither, i32 first,
               i32 count) {
  if constexpr (std::is_same_v<To, From>) {
    move_rows_divided<To>(src, dst, area, first, count);
  } else {
    constexpr i64 bytes = sizeof(To) + sizeof(From);
    const auto from = [&](i32 y) { return src_row<From>(src, area, first + y); };
    const auto to = [&](i32 y) { return dst_row<To>(dst, area, first + y); };
    if constexpr (std::is_same_v<To, ZR_Pixel8>)
      if (dither) {  // goes on from row to row
        const i64 row_words = 4 * i64{area.columns()};
        each_band(0, count, area.columns(), bytes, [&](i32 top, i32 bottom) {
          DitherRow words(top * row_words);
          for (i32 y = top; y < bottom; ++y) convert_row(area.columns(), from(y), to(y), &words);
        });
        return skip_dither_words(count * row_words);
      }
    if (area.columns() * bytes * area.rows() < past_caches)
      each_row(0, count, area.columns(), bytes, [&](i32 y) { convert_row(area.columns(), from(y), to(y), false); });
    else
      each_band(0, count, area.columns(), bytes, [&](i32 top, i32 bottom) {
        for (i32 y = top; y < bottom; ++y) stream_row(area.columns(), from(y), to(y));
        finish_streamed_rows();
      });
  }
}

// Calls body.template operator()<From>() for the depth of the source.
template <class Body>
void on_source_depth(const ZR_World* src, Body&& body) {
  const auto run = [&]<class From> {
    body.template operator()<From>();
    return static_cast<i32>(ZR_Err_None);
  };
  const i32 error = on_depth(src->GetBitDepth(), "Unknown bit depth in ZR_World::CopyRectPossiblyDifferentBitdepths",
                             run, ZR_Site_CopyRectDepth);
  if (error != 0) fail(error);
}

}  // namespace zr

template <class T>
void ZR_WorldX<T>::CopyRect(const ZR_World* src, const GX_LRect& rect, i32 dst_x, i32 dst_y) {
  if (src->GetBitDepth() != GetBitDepth())
    zr::fail(zr::failed_verification(ZR_Site_CopyRect, "Src and dest bitdepths are different in ZR_World::CopyRect"));
  const zr::CopyArea area(*src, rect, dst_x, dst_y, *this);
  if (!area.empty()) zr::move_rows_divided<T>(*src, *this, area, 0, area.rows());
}

template <class T>
void ZR_WorldX<T>::CopyRectPossiblyDifferentBitdepth(const ZR_World* src, const GX_LRect& rect, bool dither, i32 dst_x,
                                                     i32 dst_y, ZR_ProgressInfo* progress) {
  zr::on_source_depth(src, [&]<class From> {
    const zr::CopyArea area(*src, rect, dst_x, dst_y, *this);
    if (area.empty()) return;
    constexpr i32 poll_rows = 64;  // polled behind rows 63, 127, ...
    const i32 total = area.rows();
    const i32 band = progress != nullptr ? poll_rows : total;
    for (i32 row = 0; row < total; row += band) {
      const i32 count = std::min(band, total - row);
      zr::copy_rows<T, From>(*src, *this, area, dither, row, count);
      if (count < poll_rows) continue;
      if (const i32 stop = zr::poll(progress, row + count - 1, total); stop != 0) zr::fail(stop);
    }
  });
}

template <class T>
void ZR_WorldX<T>::CopyRectPossiblyDifferentBitdepthWithField(const ZR_World* src, const GX_LRect& rect, i32 field) {
  zr::on_source_depth(src, [&]<class From> {
    const zr::CopyArea area(*src, rect, 0, 0, *this);
    if (area.empty()) return;
    if (field != 1 && field != 2) return zr::copy_rows<T, From>(*src, *this, area, true, 0, area.rows());
    const i64 parity = field - 1;  // field 1 has the even destination rows
    for (i32 row = (area.top & 1) == parity ? 0 : 1; row < area.rows(); row += 2)
      zr::copy_rows<T, From>(*src, *this, area, true, row, 1);
  });
}
