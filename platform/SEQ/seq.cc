// Growable lists of records, in counted memory.
#include <HB/hb.h>
#include <SEQ/seq.h>
#include <ZR/errors.h>

#include <algorithm>
#include <cstring>
#include <limits>

struct SEQ_List {
  u8* records;  // null while nothing is reserved
  std::size_t record_bytes;
  i32 kind, count, capacity, growth, locks;
};

namespace {

constexpr char label[] = "list of records";

// Room for `capacity` records, those there are kept.
i32 reserve(SEQ_List* list, i32 capacity) {
  auto* const records = static_cast<u8*>(
      HB_AllocatePtr(static_cast<std::size_t>(capacity) * list->record_bytes, label, ZR_ModuleCode | ZR_Site_Plain));
  if (records == nullptr) return ZR_Err_OutOfMemory;
  if (list->count > 0) std::memcpy(records, list->records, static_cast<std::size_t>(list->count) * list->record_bytes);
  HB_FreePtr(list->records);
  list->records = records;
  list->capacity = capacity;
  return ZR_Err_None;
}

}  // namespace

i32 SEQ_New(i32 kind, i32 record_bytes, i32 first_capacity, i32 growth, SEQ_List** out) {
  if (out == nullptr) return ZR_Err_BadParam;
  *out = nullptr;
  if (record_bytes <= 0 || first_capacity < 0) return ZR_Err_BadParam;
  auto* const list = static_cast<SEQ_List*>(HB_AllocatePtr(sizeof(SEQ_List), label, ZR_ModuleCode | ZR_Site_Plain));
  if (list == nullptr) return ZR_Err_OutOfMemory;
  *list = {nullptr, static_cast<std::size_t>(record_bytes), kind, 0, 0, std::max(growth, 1), 0};
  if (first_capacity > 0 && reserve(list, first_capacity) != 0) {
    HB_FreePtr(list);
    return ZR_Err_OutOfMemory;
  }
  *out = list;
  return ZR_Err_None;
}

i32 SEQ_Insert(SEQ_List* list, i32 index, const void* record) {
  if (list == nullptr || record == nullptr || index < -1 || index > list->count) return ZR_Err_BadParam;
  if (list->locks > 0) return ZR_Err_Internal;  // an address given out would go stale
  if (list->count == std::numeric_limits<i32>::max()) return ZR_Err_OutOfMemory;
  if (list->count == list->capacity) {
    // At least half again, so that appending many records costs linear time whatever the growth.
    const i64 wanted = i64{list->capacity} + std::max(list->growth, list->capacity / 2);
    const i32 capacity = static_cast<i32>(std::min<i64>(wanted, std::numeric_limits<i32>::max()));
    if (const i32 error = reserve(list, capacity); error != 0) return error;
  }
  const auto place = static_cast<std::size_t>(index == -1 ? list->count : index);
  u8* const at = list->records + place * list->record_bytes;
  std::memmove(at + list->record_bytes, at, (static_cast<std::size_t>(list->count) - place) * list->record_bytes);
  std::memcpy(at, record, list->record_bytes);
  ++list->count;
  return ZR_Err_None;
}

i32 SEQ_AppendClear(SEQ_List* list, i32 count) {
  if (list == nullptr || count < 0) return ZR_Err_BadParam;
  if (list->locks > 0) return ZR_Err_Internal;
  if (count > std::numeric_limits<i32>::max() - list->count) return ZR_Err_OutOfMemory;
  const i32 wanted = list->count + count;
  if (wanted > list->capacity) {
    if (const i32 error = reserve(list, wanted); error != 0) return error;
  }
  const auto first = static_cast<std::size_t>(list->count) * list->record_bytes;
  if (count > 0) std::memset(list->records + first, 0, static_cast<std::size_t>(count) * list->record_bytes);
  list->count = wanted;
  return ZR_Err_None;
}

i32 SEQ_GetCount(const SEQ_List* list) { return list != nullptr ? list->count : 0; }

void* SEQ_GetAddress(SEQ_List* list, i32 index) {
  if (list == nullptr || index < 0 || index >= list->count) return nullptr;
  ++list->locks;
  return list->records + static_cast<std::size_t>(index) * list->record_bytes;
}

void SEQ_Unlock(SEQ_List* list) {
  if (list != nullptr && list->locks > 0) --list->locks;
}

void SEQ_Dispose(SEQ_List* list) {
  if (list == nullptr) return;
  HB_FreePtr(list->records);
  HB_FreePtr(list);
}
