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
// gives null. Blocks are aligned to 16 and not zeroed unless said; one of 0 bytes is a block too. Sizes
// beyond 512 GiB fail as if memory were short. Any thread; a handle belongs to one thread at a time.
void* HB_AllocatePtr(std::size_t bytes, const char* label, u32 code);
void* HB_AllocatePtrQuiet(std::size_t bytes);                                      // no message
void HB_FreePtr(void* block);                                                      // null is nothing
HB_Handle HB_AllocateHandleClear(std::size_t bytes, const char* label, u32 code);  // zeroed
HB_Handle HB_AllocateHandleQuiet(std::size_t bytes);
i32 HB_ResizeHandle(HB_Handle handle, std::size_t bytes, const char* label,
                    u32 code);                   // contents kept; 0, 4, 3 for null
void HB_FreeHandle(HB_Handle handle);            // null is nothing
std::size_t HB_GetHandleSize(HB_Handle handle);  // bytes as asked for; 0 for null

// For the allocators of other layers (frames): counts an attempt; false when it is the one ordered to fail.
bool HB_AllocationMayProceed();
void HB_CountAllocated(std::size_t bytes);
void HB_CountFreed(std::size_t bytes);

// Text of entry `index` with its key and '=' cut off and #{rsquo} resolved; null outside the table.
// Table and strings must live as long as the process, and so does the pointer. Any thread.
const char* HB_ZLookupLStrCache(const HB_StringTable* table, i32 index, i32, i32);

// Replaces ^L1 .. ^L4 in `format` by the arguments (a null one by nothing; arguments are not searched for
// further marks), into `out` of `limit` bytes with its ending zero, which must not overlap the inputs.
// 0, or ZR_Err_BadParam when the result does not fit (out then holds the empty string).
i32 HB_SubString(char* out, std::size_t limit, const char* format, const char* first, const char* second = nullptr,
                 const char* third = nullptr, const char* fourth = nullptr);

// Reports what() under code 0x250000 and gives the error: std::bad_alloc is out of memory, all else internal.
i32 HB_TranslateAndReportException(const std::exception& error) noexcept;

// Reads the processor into the record behind HB_G_CPU_DataP, capped by the "cpu" preference; ZR_Birth
// calls it, alone. Before that all words are zero.
void HB_PrepareCpuData();

// The four bytes of a word in the opposite order.
constexpr u32 HB_LongSwap(u32 word) { return word << 24 | (word & 0xff00u) << 8 | (word >> 8 & 0xff00u) | word >> 24; }
