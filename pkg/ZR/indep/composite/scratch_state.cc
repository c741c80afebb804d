// The shared scratch and its growth, and scratch sets that callers make for themselves.
#include "composite/scratch_state.h"

#include <HB/hb.h>
#include <ZR/composite.h>
#include <ZR/errors.h>

#include <algorithm>
#include <cstddef>
#include <limits>

#include "world/guard.h"

namespace {

constexpr i32 row_count = 3, block_count = 7;

// Bytes for each pixel of the alpha row, the mask row and the sample row.
constexpr i64 row_pixel_bytes[row_count] = {4, 16, 16};

struct FixedBlock {
  std::size_t bytes;
  const char* label;
};
constexpr FixedBlock fixed_blocks[block_count] = {
    {2048, "motion blur scratch data1"},  {2048, "motion blur scratch data2"}, {2048, "motion blur scratch data3"},
    {4096, "motion blur scratch data4"},  {4096, "motion blur scratch data5"}, {18432, "motion blur scratch data6"},
    {26624, "motion blur scratch data7"},
};

// The set that every caller without a record of its own shares.
struct SharedScratch {
  void* rows[row_count];
  void* blocks[block_count];
  i32 capacity;  // bytes of the mask and sample rows; 0 makes the next call allocate
};
constinit SharedScratch shared{};

void dispose(void** blocks, i32 count) {
  for (i32 i = 0; i < count; ++i) {
    HB_FreePtr(blocks[i]);
    blocks[i] = nullptr;
  }
}

// Stops at the first block that cannot be had; those made so far stand in `out`, the others are null.
i32 allocate_blocks(void** out) {
  std::fill_n(out, block_count, nullptr);
  for (i32 i = 0; i < block_count; ++i) {
    out[i] = HB_AllocatePtr(fixed_blocks[i].bytes, fixed_blocks[i].label, ZR_ModuleCode | ZR_Site_Plain);
    if (out[i] == nullptr) return ZR_Err_OutOfMemory;
  }
  return ZR_Err_None;
}

// All three rows of the new width, or none.
bool allocate_rows(i32 width, void** out) {
  const char* const label = HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_BlendingScratch, 0, 0);
  for (i32 i = 0; i < row_count; ++i) {
    const i64 bytes = std::max<i64>(width * row_pixel_bytes[i], 1);
    out[i] = HB_AllocatePtr(static_cast<std::size_t>(bytes), label, ZR_ModuleCode | ZR_Site_Scratch);
    if (out[i] == nullptr) {
      dispose(out, i);
      return false;
    }
  }
  return true;
}

}  // namespace

void zr::free_scratch() {
  dispose(shared.rows, row_count);
  dispose(shared.blocks, block_count);
  shared.capacity = 0;
}

// The fixed blocks tell, which no call replaces while another one runs.
bool zr::is_shared_scratch(void* const record[10]) {
  return record[row_count] != nullptr && record[row_count] == shared.blocks[0];
}

i32 ZR_AllocateMotionBlurScratch(void* out[7]) {
  if (out == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_MotionBlurScratch);
  return zr::guarded([&] { return allocate_blocks(out); });
}

void ZR_DisposeMotionBlurScratch(void* scratch[7]) {
  if (scratch != nullptr) dispose(scratch, block_count);
}

i32 ZRp_ReallocScratch(i32 width, i32 channel_bytes, bool force, void* record[10]) {
  return zr::guarded([&]() -> i32 {
    if (channel_bytes != 1 && channel_bytes != 2 && channel_bytes != 4)
      return zr::failed_verification(ZR_Site_ScratchDepth, "Unexpected bitdepth in ZRp_ReallocScratch()");
    // The last but one block stands for all seven; a set that could not be completed is given back, so that
    // the next call tries again.
    if (shared.blocks[5] == nullptr && allocate_blocks(shared.blocks) != ZR_Err_None) {
      dispose(shared.blocks, block_count);
      zr::fail(ZR_Err_OutOfMemory);
    }
    const i64 wanted = static_cast<i64>(width) * row_pixel_bytes[1];
    if (wanted > shared.capacity || force) {
      // What the capacity cannot count cannot be had either.
      const bool countable = wanted >= 0 && wanted <= std::numeric_limits<i32>::max();
      void* rows[row_count] = {};
      if (!countable || !allocate_rows(width, rows)) {
        shared.capacity = 0;
        zr::fail(ZR_Err_OutOfMemory);
      }
      dispose(shared.rows, row_count);
      std::copy_n(rows, row_count, shared.rows);
      shared.capacity = static_cast<i32>(wanted);
    }
    if (record != nullptr) {
      std::copy_n(shared.rows, row_count, record);
      std::copy_n(shared.blocks, block_count, record + row_count);
    }
    return ZR_Err_None;
  });
}
