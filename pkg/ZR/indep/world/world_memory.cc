// The memory behind worlds that own their pixels.
#include "world/world_memory.h"

#include <HB/hb.h>
#include <RS/rs.h>
#include <SHM/shm.h>
#include <ZR/errors.h>

#include <algorithm>
#include <atomic>
#include <cstring>
#include <string>

#include "world/guard.h"

namespace zr {
namespace {

constexpr i32 max_side = 30000;
constexpr u8 gutter_byte = 0x55;

// A text of its own, beside the library's table: it has a key instead of a number.
constexpr const char* size_error_strings[] = {
    "$$$/ZN/ZR/ZR_WorldX/Constructor/InvalidSizeError=invalid image buffer size (^L1x^L2)."};
constexpr HB_StringTable size_error_table = {"ZR", 1, size_error_strings};

// Raster frames are made without the host's window.
class WindowMode {
 public:
  WindowMode() { SHM_BeginGdiMinimalisticWindowCreationMode(); }
  ~WindowMode() { SHM_EndGdiMinimalisticWindowCreationMode(); }
  WindowMode(const WindowMode&) = delete;
  WindowMode& operator=(const WindowMode&) = delete;
};

u8* gutter_start(u64 allocation, const FrameShape& shape) {
  return static_cast<u8*>(frame_pixels(allocation)) + shape.pixels_end();
}

}  // namespace

void check_world_size(i32 width, i32 height) {
  if (width > 0 && width <= max_side && height > 0 && height <= max_side) return;
  char text[256];
  const i32 error = HB_SubString(text, sizeof text, HB_ZLookupLStrCache(&size_error_table, 0, 0, 0),
                                 std::to_string(width).c_str(), std::to_string(height).c_str());
  if (error != 0) fail(error);
  HBp_ReportErrString(ZR_ModuleCode | ZR_Site_WorldSize, ZR_ReportSeverity, text);
  fail(ZR_Err_BadParam);
}

u64 allocate_frame(const FrameShape& shape) {
  void* const frame = RS_AllocateFrameQuiet(shape.bytes());
  if (frame == nullptr) {
    RS_ReportWorldAllocationFailure(ZR_Err_OutOfMemory, shape.row_bytes, shape.width, shape.height,
                                    shape.pixel_bytes * 8);
    fail(ZR_Err_OutOfMemory);
  }
  const u64 allocation = reinterpret_cast<u64>(frame);
  std::memset(gutter_start(allocation, shape), gutter_byte, shape.gutter());
  return allocation;
}

void free_frame(u64 allocation, const FrameShape& shape) {
  RS_FreeFrame(reinterpret_cast<void*>(allocation), shape.bytes());
}

void* frame_pixels(u64 allocation) {
  return reinterpret_cast<void*>((allocation & 8) != 0 ? allocation + 8 : allocation);
}

bool gutter_overwritten(u64 allocation, const FrameShape& shape) {
  const u8* const start = gutter_start(allocation, shape);
  return std::any_of(start, start + shape.gutter(), [](u8 byte) { return byte != gutter_byte; });
}

RS_World** make_raster_frame(i32 width, i32 height, i32 bits_per_pixel) {
  constexpr i32 frame_format = 8;
  const WindowMode mode;
  const GX_Rect bounds = {0, 0, static_cast<i16>(height), static_cast<i16>(width)};
  RS_World** raster = nullptr;
  if (const i32 error = RS_NewWorld(&bounds, frame_format, bits_per_pixel, &raster); error != 0) fail(error);
  if (const i32 error = RS_LoadLockPixels(raster); error != 0) {
    RS_DisposeWorld(raster);
    fail(error);
  }
  return raster;
}

void* raster_pixels(RS_World** raster) {
  return (*raster)->base != nullptr ? (*raster)->base : RSp_GetPixBaseAddr(raster);
}

void count_live(i32& counter, i32 change) { std::atomic_ref(counter).fetch_add(change, std::memory_order_relaxed); }

}  // namespace zr
