// Handles, the platform query, and the end of batch sampling.
#include "host/host_services.h"

#include <SHM/shm.h>

#include "world/guard.h"

namespace zr {

void** host_handle_new(i32 size) { return size < 0 ? nullptr : HB_AllocateHandleQuiet(static_cast<std::size_t>(size)); }

void* host_handle_lock(void** handle) { return handle != nullptr ? *handle : nullptr; }

void host_handle_unlock(void**) {}

void host_handle_dispose(void** handle) {
  if (handle != nullptr) HB_FreeHandle(handle);
}

u64 host_handle_size(void** handle) { return handle != nullptr ? HB_GetHandleSize(handle) : 0; }

i32 host_handle_resize(void** handle, i32 size) {
  if (handle == nullptr || size < 0) return ZR_ReportBadCallbackParam(ZR_Site_PlatformQuery);
  HB_StartQuietErrorsOnCurrentThread();
  const i32 resized = HB_ResizeHandle(handle, static_cast<std::size_t>(size), "effect handle data",
                                      ZR_ModuleCode | ZR_Site_PlatformQuery);
  const i32 ended = HB_EndQuietErrorsOnCurrentThread();
  return resized != ZR_Err_None ? resized : ended;
}

i32 platform_query(void*, i32 kind, void** out) {
  if (kind == 0 && out != nullptr) *out = SHM_GetMainWindow();
  ZR_ReportBadCallbackParam(ZR_Site_PlatformQuery);
  return ZR_Err_BadParam;  // also where an answer was stored: kept, plug-ins know it so
}

i32 batch_sampling_ended() {
  return failed_verification(ZR_Site_BatchSampling,
                             "Batch Sampling has been deprecated; please update your plug-in calling code");
}

}  // namespace zr
