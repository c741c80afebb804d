// What the divided calls ask of worlds and slots before they cut, and the records of a band's rows.
#pragma once

#include <ZR/errors.h>
#include <ZR/slots.h>
#include <ZR/world.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <new>

#include "bands.h"

namespace zr {

template <class Routine>
bool holds(ZR_SlotIndex slot, Routine* routine) {
  return ZRp_G_OverFuncs[slot] == reinterpret_cast<ZR_SlotFunc>(routine);
}

// Bytes of a pixel; 0 for a record that says nothing known.
inline i32 pixel_bytes(const ZR_LayerDef& world) {
  if (world.owner != nullptr) return world.owner->PixelSize();
  const u32 format = world.flags >> 24;
  return format <= 2 ? 4 << format : 0;
}

// Depth, size and pixels are in order; other worlds are the library's to report.
inline bool in_order(const ZR_LayerDef& world) {
  return pixel_bytes(world) != 0 && world.data != nullptr && world.width > 0 && world.height > 0;
}

inline bool share_memory(const ZR_LayerDef& a, const ZR_LayerDef& b) {
  struct Range {
    std::intptr_t first, end;
  };
  const auto range = [](const ZR_LayerDef& world) {
    const auto data = reinterpret_cast<std::intptr_t>(world.data);
    const std::intptr_t last_row = data + std::intptr_t{world.height - 1} * world.row_bytes;
    return Range{std::min(data, last_row), std::max(data, last_row) + std::intptr_t{world.width} * pixel_bytes(world)};
  };
  const Range x = range(a), y = range(b);
  return x.first < y.end && y.first < x.end;
}

// No byte belongs to two rows.
inline bool owns_rows(const ZR_LayerDef& world) {
  return std::abs(i64{world.row_bytes}) >= i64{world.width} * pixel_bytes(world);
}

// A record of some rows alone. The first of them is row 0 there.
inline ZR_LayerDef only_rows(const ZR_LayerDef& world, Rows band) {
  ZR_LayerDef rows = world;
  rows.data = static_cast<char*>(world.data) + std::ptrdiff_t{band.first} * world.row_bytes;
  rows.height = band.end - band.first;
  rows.extent = {0, 0, rows.width, rows.height};
  return rows;
}

// call.run(), with codes in place of exceptions.
template <class Call>
i32 run_divided(const Call& call) noexcept {
  try {
    return call.run();
  } catch (const i32 code) {
    return code;
  } catch (const std::bad_alloc&) {
    return ZR_Err_OutOfMemory;
  } catch (...) {
    return ZR_Err_Internal;
  }
}

}  // namespace zr
