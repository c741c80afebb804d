// Blocks, handles and tracked objects, all from one counted allocator.
#include <HB/hb.h>
#include <ZR/errors.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace {

// Stands before every block; its size keeps the block aligned to 16.
struct alignas(16) BlockHead {
  std::size_t bytes;
};
static_assert(sizeof(BlockHead) == 16 && alignof(std::max_align_t) >= 16);

// What a handle points to: the master pointer first, so that one dereference gives the block.
struct Master {
  void* block;
  std::size_t bytes;
};

// Above this a request is an overflow of somebody's arithmetic, not a need.
constexpr std::size_t largest_request = std::size_t{1} << 39;

BlockHead* head_of(void* block) { return static_cast<BlockHead*>(block) - 1; }
Master* master_of(HB_Handle handle) { return reinterpret_cast<Master*>(handle); }

void report_out_of_memory(std::size_t bytes, const char* label, u32 code) {
  char text[256];
  std::snprintf(text, sizeof text, "Out of memory: %s (%zu bytes).", label != nullptr ? label : "unnamed block", bytes);
  HBp_ReportErrString(code, ZR_ReportSeverity, text);
}

HB_Handle new_handle(std::size_t bytes) {
  auto* const master = static_cast<Master*>(HB_AllocatePtrQuiet(sizeof(Master)));
  if (master == nullptr) return nullptr;
  *master = {HB_AllocatePtrQuiet(bytes), bytes};
  if (master->block == nullptr) {
    HB_FreePtr(master);
    return nullptr;
  }
  return &master->block;
}

}  // namespace

void* HB_AllocatePtrQuiet(std::size_t bytes) {
  if (!HB_AllocationMayProceed() || bytes > largest_request) return nullptr;
  auto* const head = static_cast<BlockHead*>(std::malloc(sizeof(BlockHead) + bytes));
  if (head == nullptr) return nullptr;
  head->bytes = bytes;
  HB_CountAllocated(bytes);
  return head + 1;
}

void* HB_AllocatePtr(std::size_t bytes, const char* label, u32 code) {
  void* const block = HB_AllocatePtrQuiet(bytes);
  if (block == nullptr) report_out_of_memory(bytes, label, code);
  return block;
}

void HB_FreePtr(void* block) {
  if (block == nullptr) return;
  HB_CountFreed(head_of(block)->bytes);
  std::free(head_of(block));
}

HB_Handle HB_AllocateHandleQuiet(std::size_t bytes) { return new_handle(bytes); }

HB_Handle HB_AllocateHandleClear(std::size_t bytes, const char* label, u32 code) {
  const HB_Handle handle = new_handle(bytes);
  if (handle == nullptr)
    report_out_of_memory(bytes, label, code);
  else
    std::memset(*handle, 0, bytes);
  return handle;
}

i32 HB_ResizeHandle(HB_Handle handle, std::size_t bytes, const char* label, u32 code) {
  if (handle == nullptr) return ZR_Err_Internal;
  Master* const master = master_of(handle);
  void* const moved = HB_AllocatePtr(bytes, label, code);
  if (moved == nullptr) return ZR_Err_OutOfMemory;
  std::memcpy(moved, master->block, bytes < master->bytes ? bytes : master->bytes);
  HB_FreePtr(master->block);
  *master = {moved, bytes};
  return ZR_Err_None;
}

void HB_FreeHandle(HB_Handle handle) {
  if (handle == nullptr) return;
  HB_FreePtr(master_of(handle)->block);
  HB_FreePtr(master_of(handle));
}

std::size_t HB_GetHandleSize(HB_Handle handle) { return handle != nullptr ? master_of(handle)->bytes : 0; }

void* HB_MemTrackedObject::operator new(size_t bytes) noexcept { return HB_AllocatePtrQuiet(bytes); }
void HB_MemTrackedObject::operator delete(void* block) noexcept { HB_FreePtr(block); }
