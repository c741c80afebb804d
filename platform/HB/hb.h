// HB: labelled memory, handles, messages, the string table, processor and thread counts, exceptions.
// The part that hosts see stands in <ZR/platform.h>.
#pragma once

#include <ZR/platform.h>

#include <cstddef>
#include <exception>

// A message table: strings of the form key=default text.
struct HB_StringTable {
  const char* module;
  i32 count;
  const char* const* strings;  // entries may be null
};

using HB_Handle = void**;  // one dereference gives the block, which may move when it is resized

// Memory. `label` names the block in the out-of-memory message, reported under `code` on failure, which
// gives null. Blocks are aligned to 16. Any thread.
void* HB_AllocatePtr(std::size_t bytes, const char* label, u32 code);
void* HB_AllocatePtrQuiet(std::size_t bytes);                                      // no message
void HB_FreePtr(void* block);                                                      // null is nothing
HB_Handle HB_AllocateHandleClear(std::size_t bytes, const char* label, u32 code);  // zeroed
HB_Handle HB_AllocateHandleQuiet(std::size_t bytes);
i32 HB_ResizeHandle(HB_Handle handle, std::size_t bytes, const char* label, u32 code);  // 0 or 4; contents kept
void HB_FreeHandle(HB_Handle handle);
std::size_t HB_GetHandleSize(HB_Handle handle);  // bytes as asked for

// For the allocators of other layers (frames): asks the failure injection and counts an attempt.
bool HB_AllocationMayProceed();
void HB_CountAllocated(std::size_t bytes);
void HB_CountFreed(std::size_t bytes);

// Text of entry `index` with its key and '=' cut off and #{rsquo} resolved; null outside the table.
// The pointer stays valid for the life of the process. Any thread.
const char* HB_ZLookupLStrCache(const HB_StringTable* table, i32 index, i32, i32);

// Replaces ^L1 .. ^L4 in `format` by the arguments, into `out` of `limit` bytes with its ending zero.
// 0, or ZR_Err_BadParam when the result does not fit (out then holds the empty string).
i32 HB_SubString(char* out, std::size_t limit, const char* format, const char* first, const char* second = nullptr,
                 const char* third = nullptr, const char* fourth = nullptr);

// Reports what() and gives its code: std::bad_alloc is out of memory, all else internal.
i32 HB_TranslateAndReportException(const std::exception& error) noexcept;

// Reads the processor into the record behind HB_G_CPU_DataP, capped by the "cpu" preference; ZR_Birth
// calls it. Before that all words are zero.
void HB_PrepareCpuData();
