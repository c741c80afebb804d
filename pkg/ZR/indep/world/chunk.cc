// Chunks: typed blocks of channels behind a handle.
#include "world/chunk.h"

#include <HB/hb.h>
#include <ZR/errors.h>
#include <ZR/world.h>

#include <limits>

#include "world/guard.h"
#include "world/world_memory.h"

namespace zr {
namespace {

i32 bad_chunk() {
  report_string(ZR_Str_InvalidParameter, ZR_Site_Chunk);
  return ZR_Err_BadParam;
}

}  // namespace

u16 chunk_element_bytes(i32 type) {
  switch (type) {
    case chunk_type("FLT4"):
    case chunk_type("LON4"):
    case chunk_type("FIX4"):
    case chunk_type("UFX4"): return 4;
    case chunk_type("DBL8"): return 8;
    case chunk_type("SHT2"):
    case chunk_type("UST2"): return 2;
    case chunk_type("RBG "): return 3;  // the B does come second
    default: return 1;
  }
}

}  // namespace zr

extern "C" {

i32 ZR_ChunkDataSize(i32 type, u16* size) {
  *size = zr::chunk_element_bytes(type);
  return ZR_Err_None;
}

i32 ZR_NewChunk(i32 width, i32 height, i32 channels, i32 type, ZR_Chunk* out) {
  if (width < 1 || height < 1 || channels < 1 || out == nullptr) return zr::bad_chunk();
  const i64 elements = i64{width} * channels;  // below 2^62, so that a row of up to 8 bytes each needs a check first
  constexpr i64 largest_row = std::numeric_limits<i32>::max();
  if (elements > largest_row / zr::chunk_element_bytes(type)) return zr::bad_chunk();
  out->width = width;
  out->height = height;
  out->channels = channels;
  out->row_bytes = static_cast<i32>(elements * zr::chunk_element_bytes(type));
  out->type = type;
  out->handle = nullptr;
  out->data = nullptr;
  const std::size_t bytes = static_cast<std::size_t>(height) * static_cast<std::size_t>(out->row_bytes);
  const char* const label = HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_ChunkMemory, 0, 0);
  out->handle = HB_AllocateHandleClear(bytes, label, ZR_ModuleCode | ZR_Site_Chunk);
  if (out->handle == nullptr) return ZR_Err_OutOfMemory;
  out->data = *out->handle;
  zr::count_live(ZR_G_LiveChunks, 1);
  return ZR_Err_None;
}

i32 ZR_LockChunk(ZR_Chunk* chunk) {
  if (chunk == nullptr || chunk->handle == nullptr) return zr::bad_chunk();
  chunk->data = *chunk->handle;
  return ZR_Err_None;
}

i32 ZR_UnlockChunk(ZR_Chunk* chunk) {
  if (chunk == nullptr || chunk->data == nullptr) return zr::bad_chunk();
  chunk->data = nullptr;
  return ZR_Err_None;
}

i32 ZR_DisposeChunk(ZR_Chunk* chunk) {
  if (chunk == nullptr) return zr::bad_chunk();
  if (chunk->handle != nullptr) {
    HB_FreeHandle(chunk->handle);
    zr::count_live(ZR_G_LiveChunks, -1);
  }
  *chunk = ZR_Chunk{};
  return ZR_Err_None;
}

}  // extern "C"
