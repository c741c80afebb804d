// Pixels of 4 and 8 bytes by their columns, on lanes, and rows written past the caches.
#pragma once

#include <ZR/depth.h>

#include <cstddef>

namespace zr {

struct LaneColumns {
  // Writes the pixels at columns[0..n-1], which never fall, of a row of `width` pixels; source and destination share
  // no memory. Returns how many it has written: whole vectors.
  i32 (*pick4)(i32 n, const i32* columns, i32 width, const char* src, char* dst);
  i32 (*pick8)(i32 n, const i32* columns, i32 width, const char* src, char* dst);
  // Copies bytes that nobody reads soon.
  void (*stream)(std::size_t bytes, const char* src, char* dst);
  // After the last stream(): other threads see all of it in order.
  void (*finish)();
};
// The fastest that this processor has, or null.
const LaneColumns* lane_columns();

}  // namespace zr
