// Rows in bands through the iterate slot: a host that has threads runs bands side by side.
#pragma once

#include <ZR/zr.h>

#include <algorithm>

#include "world/guard.h"

namespace zr {

// Bytes of one band: enough to make a call through the slot cheap beside the work on them. Rows that only store or
// move need more.
constexpr i64 band_of_work = 1 << 16, band_of_stores = 1 << 18;

// Rows of a band for rows of that many bytes, and at most `rows` (1 or more).
inline i32 rows_in_band(i32 rows, i64 row_bytes, i64 band_bytes) {
  return static_cast<i32>(std::clamp<i64>(band_bytes / std::max<i64>(row_bytes, 1), 1, rows));
}

// Calls body(top, bottom), which gives 0 or an error, for bands of rows 0 to rows - 1 through the generic iterator;
// a non-zero answer is returned, and bands not yet begun stay undone.
template <class Body>
i32 for_bands(i32 rows, i64 row_bytes, i64 band_bytes, const Body& body,
              decltype(&ZR_IterateGeneric) iterate = &ZR_IterateGeneric) {
  if (rows < 1) return 0;
  struct Job {
    const Body* body;
    i32 rows, band_rows;
  };
  Job job = {&body, rows, rows_in_band(rows, row_bytes, band_bytes)};
  return iterate((rows - 1) / job.band_rows + 1, &job, [](void* refcon, i32, i32 band, i32) -> i32 {
    const Job& work = *static_cast<const Job*>(refcon);
    const i32 top = band * work.band_rows;
    return (*work.body)(top, top + std::min(work.band_rows, work.rows - top));
  });
}

// Calls body(y), which cannot fail, for rows 0 to rows - 1. The band with row 0 asks progress->abort before it starts.
template <class Body>
i32 for_rows(const ZR_ProgressInfo* progress, i32 rows, i64 row_bytes, const Body& body,
             decltype(&ZR_IterateGeneric) iterate = &ZR_IterateGeneric) {
  const auto band = [&](i32 top, i32 bottom) -> i32 {
    if (top == 0 && progress != nullptr && progress->abort != nullptr)
      if (const i32 stop = progress->abort(progress->refcon); stop != 0) return stop;
    for (i32 y = top; y < bottom; ++y) body(y);
    return ZR_Err_None;
  };
  return for_bands(rows, row_bytes, band_of_work, band, iterate);
}

// Calls body(top, bottom), which cannot fail, for bands of rows `top` to `bottom` - 1 of stores or moves; throws what
// the iterator answers. A single band is no matter for the iterator.
template <class Body>
void each_band(i32 top, i32 bottom, i64 columns, i64 pixel_bytes, const Body& body) {
  if (bottom <= top) return;
  const i64 row_bytes = columns * pixel_bytes;
  if (rows_in_band(bottom - top, row_bytes, band_of_stores) == bottom - top) return body(top, bottom);
  const i32 error = for_bands(bottom - top, row_bytes, band_of_stores, [&](i32 first, i32 last) -> i32 {
    body(top + first, top + last);
    return 0;
  });
  if (error != 0) fail(error);
}
// The same row by row.
template <class Body>
void each_row(i32 top, i32 bottom, i64 columns, i64 pixel_bytes, const Body& body) {
  each_band(top, bottom, columns, pixel_bytes, [&](i32 first, i32 last) {
    for (i32 y = first; y < last; ++y) body(y);
  });
}

}  // namespace zr
