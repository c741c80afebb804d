// Raster worlds: a record and its pixels behind a handle.
#include <HB/hb.h>
#include <RS/rs.h>
#include <ZR/errors.h>

#include <atomic>
#include <cstdio>
#include <cstring>
#include <limits>

namespace {

constexpr i32 row_alignment = 64;

std::size_t pixel_bytes(const RS_World& world) {
  return static_cast<std::size_t>(world.row_bytes) * static_cast<std::size_t>(world.height);
}

}  // namespace

void RS_ReportWorldAllocationFailure(i32 code, i32 row_bytes, i32 width, i32 height, i32 bits_per_pixel) {
  char text[256];
  std::snprintf(text, sizeof text,
                "An image buffer of %d x %d pixels, %d bits per pixel, %d bytes per row, could not be allocated "
                "(error %d).",
                width, height, bits_per_pixel, row_bytes, code);
  HBp_ReportErrString(ZR_ModuleCode | ZR_Site_Plain, ZR_ReportSeverity, text);
}

extern "C" i32 RS_NewWorld(const GX_Rect* bounds, i32, i32 bits_per_pixel, RS_World*** out) {
  if (out == nullptr) return ZR_Err_BadParam;
  *out = nullptr;
  if (bounds == nullptr || (bits_per_pixel != 32 && bits_per_pixel != 64 && bits_per_pixel != 128))
    return ZR_Err_BadParam;
  constexpr i32 largest = std::numeric_limits<i16>::max();
  const i32 width = bounds->right - bounds->left, height = bounds->bottom - bounds->top;
  if (width <= 0 || height <= 0 || width > largest || height > largest) return ZR_Err_BadParam;

  RS_World made{};
  made.width = static_cast<i16>(width);
  made.height = static_cast<i16>(height);
  made.bits_per_pixel = static_cast<i16>(bits_per_pixel);
  made.row_bytes = (width * (bits_per_pixel / 8) + row_alignment - 1) / row_alignment * row_alignment;
  const HB_Handle handle = HB_AllocateHandleQuiet(sizeof(RS_World));
  if (handle != nullptr) made.base = RS_AllocateFrameQuiet(pixel_bytes(made));
  if (made.base == nullptr) {
    HB_FreeHandle(handle);
    RS_ReportWorldAllocationFailure(ZR_Err_OutOfMemory, made.row_bytes, width, height, bits_per_pixel);
    return ZR_Err_OutOfMemory;
  }
  std::memset(made.base, 0, pixel_bytes(made));
  std::memcpy(*handle, &made, sizeof made);
  *out = reinterpret_cast<RS_World**>(handle);
  return ZR_Err_None;
}

extern "C" void RS_DisposeWorld(RS_World** raster) {
  if (raster == nullptr) return;
  RS_FreeFrame((*raster)->base, pixel_bytes(**raster));
  HB_FreeHandle(reinterpret_cast<HB_Handle>(raster));
}

extern "C" i32 RS_LoadLockPixels(RS_World** raster) {
  if (raster == nullptr || *raster == nullptr) return ZR_Err_BadParam;
  if ((*raster)->base == nullptr) return ZR_Err_OutOfMemory;
  std::atomic_ref((*raster)->lock_count).fetch_add(1);
  return ZR_Err_None;
}

extern "C" void RS_UnlockPixels(RS_World** raster) {
  if (raster == nullptr || *raster == nullptr) return;
  std::atomic_ref count((*raster)->lock_count);
  u32 locks = count.load();
  while (locks != 0 && !count.compare_exchange_weak(locks, locks - 1)) {}
}

void* RSp_GetPixBaseAddr(RS_World** raster) {
  return raster != nullptr && *raster != nullptr ? (*raster)->base : nullptr;
}

i32 RS_GetChannelOrder(RS_World** raster) { return (*raster)->channel_order; }
