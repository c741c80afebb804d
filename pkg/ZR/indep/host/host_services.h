// Small services of the callback surface that are functions of their own: handles, the query for platform
// data, and what answers in the place of batch sampling. Types and failures: <ZR/callback_block.h>.
#pragma once

#include <ZR/zr.h>

namespace zr {

void** host_handle_new(i32 size);
void* host_handle_lock(void** handle);
void host_handle_unlock(void** handle);
void host_handle_dispose(void** handle);
u64 host_handle_size(void** handle);
i32 host_handle_resize(void** handle, i32 size);

i32 platform_query(void* ref, i32 kind, void** out);

// Answers callers of any signature: reads no argument.
i32 batch_sampling_ended();

}  // namespace zr
