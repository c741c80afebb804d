// Scratch records and their lending.
#include "scratch_records.h"

#include <ZR/errors.h>

#include <algorithm>
#include <cstddef>
#include <new>

namespace zr {
namespace {

constexpr std::align_val_t row_alignment{64};
constexpr i32 rows = 3;
constexpr std::size_t row_pixel_bytes[rows] = {4, 16, 16};

}  // namespace

ScratchRecord::~ScratchRecord() {
  for (i32 i = 0; i < rows; ++i) ::operator delete(pointers_[i], row_alignment);
  ZR_DisposeMotionBlurScratch(pointers_ + rows);
}

bool ScratchRecord::reach(i32 width) {
  void** const blocks = pointers_ + rows;
  if (blocks[0] == nullptr && ZR_AllocateMotionBlurScratch(blocks) != ZR_Err_None) {
    ZR_DisposeMotionBlurScratch(blocks);
    return false;
  }
  if (width <= width_) return true;
  void* grown[rows] = {};
  bool complete = true;
  for (i32 i = 0; i < rows; ++i) {
    grown[i] = ::operator new(static_cast<std::size_t>(width) * row_pixel_bytes[i], row_alignment, std::nothrow);
    complete = complete && grown[i] != nullptr;
  }
  if (complete) {
    std::swap_ranges(grown, grown + rows, pointers_);
    width_ = width;
  }
  for (void* const row : grown) ::operator delete(row, row_alignment);
  return complete;
}

ScratchLease::ScratchLease(ScratchRecords& records, i32 workers, i32 width) : records_(records) {
  by_worker_.reserve(static_cast<std::size_t>(workers));
  {
    const std::lock_guard hold(records_.lock_);
    for (i32 i = 0; i < workers && !records_.resting_.empty(); ++i)
      taken_.splice(taken_.end(), records_.resting_, records_.resting_.begin());
  }
  try {
    taken_.resize(static_cast<std::size_t>(workers));
    for (ScratchRecord& record : taken_) {
      if (!record.reach(width)) throw static_cast<i32>(ZR_Err_OutOfMemory);
      by_worker_.push_back(record.pointers());
    }
  } catch (...) {
    give_back();
    throw;
  }
}

ScratchLease::~ScratchLease() { give_back(); }

void ScratchLease::give_back() noexcept {
  const std::lock_guard hold(records_.lock_);
  records_.resting_.splice(records_.resting_.begin(), taken_);
}

}  // namespace zr
