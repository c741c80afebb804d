// Parts of scaled copies on lanes: rows that share their source's rows are worked out together.
#pragma once

#include <cstddef>

#include "sample/lane_rows.h"

namespace zr {

// Destination pixel (i, j) of a part shows the source at (x + i * step_x, y + j * step_y), 16.16, none of which wraps.
// The destination shares no memory with the source.
template <class T>
struct CopyPart {
  i32 columns, rows, x, y, step_x, step_y;
  T* dst;
  std::ptrdiff_t dst_row_bytes;
  bool past_caches;  // the whole copy does not stay there

  T* row(i32 j) const { return reinterpret_cast<T*>(reinterpret_cast<char*>(dst) + j * dst_row_bytes); }
  SampleRun run(i32 first, i32 count, i32 j) const { return {count, x + first * step_x, y + j * step_y, step_x, 0}; }
};

// Fills the part as the sampler of one pixel would; false, and anything written, where it does not suit.
template <class T>
using LaneCopyFunc = bool(const CopyPart<T>& part, const ZR_SampPB& params);

// The fastest that this processor has, or null. Bilinear, of parts whose neighbours lie inside and in the first 32768
// columns and rows.
template <class T>
LaneCopyFunc<T>* lane_bilinear_copier();
// Means of boxes that boxes_inside() has let pass.
template <class T>
LaneCopyFunc<T>* lane_box_copier();

}  // namespace zr
