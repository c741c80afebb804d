// Chosen channels of a world, packed into a block of rows and taken back.
#include <ZR/depth.h>
#include <ZR/drawing.h>

#include <cstddef>
#include <cstring>
#include <limits>

#include "filter/plane_rows.h"
#include "world/guard.h"

namespace zr {
namespace {

// visit(channel, place among the packed bytes) for each chosen channel.
template <class Visit>
void each_plane(u32 planes, Visit visit) {
  i32 place = 0;
  for (i32 channel = 0; channel < 4; ++channel)
    if ((planes >> channel & 1) != 0) visit(channel, place++);
}

void extract(u32 planes, i32 n, const ZR_Pixel8* row, u8* packed) {
  const std::ptrdiff_t count = plane_count(planes), pixels = n;
  if (count == 4 && n > 0) {
    std::memcpy(packed, row, static_cast<size_t>(n) * sizeof(ZR_Pixel8));
    return;
  }
  const u8* const bytes = reinterpret_cast<const u8*>(row);
  each_plane(planes, [&](i32 channel, i32 place) {
    for (std::ptrdiff_t i = 0; i < pixels; ++i) packed[i * count + place] = bytes[i * 4 + channel];
  });
}

void insert(u32 planes, i32 n, const u8* packed, ZR_Pixel8* row) {
  const std::ptrdiff_t count = plane_count(planes), pixels = n;
  if (count == 4 && n > 0) {
    std::memcpy(row, packed, static_cast<size_t>(n) * sizeof(ZR_Pixel8));
    return;
  }
  u8* const bytes = reinterpret_cast<u8*>(row);
  each_plane(planes, [&](i32 channel, i32 place) {
    for (std::ptrdiff_t i = 0; i < pixels; ++i) bytes[i * 4 + channel] = packed[i * count + place];
  });
}

bool is_usable(u32 planes, const ZR_LayerDef* world) {
  return world != nullptr && world->data != nullptr && planes <= all_planes && world->width >= 0 &&
         world->height >= 0 && ZRp_WorldDepth(world) == Depth<ZR_Pixel8>::bits;
}

i64 packed_row_bytes(i32 width, u32 planes) { return ((i64{width} + 8) * plane_count(planes) + 3) & ~i64{1}; }

}  // namespace

const PlaneRows& single_plane_rows() {
  static constexpr PlaneRows rows = {&extract, &insert};
  return rows;
}

const PlaneRows& plane_rows() {
  const PlaneRows* const lanes = lane_plane_rows();
  return lanes != nullptr ? *lanes : single_plane_rows();
}

}  // namespace zr

extern "C" {

i32 ZR_ExtractPlanes(void*, ZR_LayerDef* world, u32 planes, void*** handle_out, i32* row_bytes_out) {
  return zr::guarded([&]() -> i32 {
    if (handle_out == nullptr || row_bytes_out == nullptr || !zr::is_usable(planes, world))
      return ZR_ReportBadCallbackParam(ZR_Site_Planes);
    const i64 row_bytes = zr::packed_row_bytes(world->width, planes);
    if (row_bytes > std::numeric_limits<i32>::max()) return ZR_ReportBadCallbackParam(ZR_Site_Planes);
    const auto block_bytes = static_cast<size_t>(row_bytes) * static_cast<size_t>(world->height);
    const HB_Handle handle = HB_AllocateHandleClear(
        block_bytes, HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_PlaneBuffer, 0, 0), ZR_ModuleCode | ZR_Site_Planes);
    if (handle == nullptr) return ZR_Err_OutOfMemory;
    const ZR_WorldX<ZR_Pixel8> source(world, false);
    const zr::PlaneRows& rows = zr::plane_rows();
    u8* const block = static_cast<u8*>(*handle);
    for (i32 y = 0; y < source.height; ++y) rows.extract(planes, source.width, source.Row(y), block + y * row_bytes);
    *handle_out = handle;
    *row_bytes_out = static_cast<i32>(row_bytes);
    return ZR_Err_None;
  });
}

i32 ZR_InsertPlanes(void*, const void* data, i32 row_bytes, u32 planes, ZR_LayerDef* world) {
  return zr::guarded([&]() -> i32 {
    if (data == nullptr || !zr::is_usable(planes, world)) return ZR_Err_None;
    const ZR_WorldX<ZR_Pixel8> target(world, false);
    const zr::PlaneRows& rows = zr::plane_rows();
    const u8* const block = static_cast<const u8*>(data);
    for (i32 y = 0; y < target.height; ++y)
      rows.insert(planes, target.width, block + std::ptrdiff_t{y} * row_bytes, target.Row(y));
    return ZR_Err_None;
  });
}

}  // extern "C"
