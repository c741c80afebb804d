// SEQ: a growable list of records of one fixed size. One list belongs to one thread at a time.
#pragma once

#include <ZR/zr.h>

struct SEQ_List;

// The two middle arguments after `record_bytes` are the first and the growing capacity, in records.
i32 SEQ_New(i32 kind, i32 record_bytes, i32 first_capacity, i32 growth, SEQ_List** out);  // 0, 4 or 516
// Copies a record (not one of this list) in before `index`; -1 appends. 0, 4, 516 for a bad index, or 3 while
// the list is locked; the list is unchanged on failure.
i32 SEQ_Insert(SEQ_List* list, i32 index, const void* record);
// Appends `count` records of zero bytes, with no room beyond them. 0, 4, 516 for a negative count, or 3 while the list
// is locked; the list is unchanged on failure.
i32 SEQ_AppendClear(SEQ_List* list, i32 count);
i32 SEQ_GetCount(const SEQ_List* list);
// Address of a record, and a lock on the list: nothing can be inserted until SEQ_Unlock. Null outside.
void* SEQ_GetAddress(SEQ_List* list, i32 index);
void SEQ_Unlock(SEQ_List* list);
void SEQ_Dispose(SEQ_List* list);
