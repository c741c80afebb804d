// The engine's lcms context: memory through HB, formatters of worlds, errors to the log.
#include <JRN/jrn.h>

#include <cstdlib>
#include <cstring>
#include <new>
#include <utility>

#include "TON/lcms_engine.h"

namespace zr::prisma {
namespace {

// Whether memory was refused to lcms during the call that runs on this thread.
thread_local constinit bool memory_failed = false;

// One context for all objects of a life; null until something is made.
struct Current {
  std::mutex lock;
  Context* context = nullptr;
};
Current& current() {
  static auto* const instance = new Current;
  return *instance;
}

// A damaged profile may ask for any size; nothing that a good one needs is larger.
constexpr u32 largest_block = 256u << 20;

// Stands before each block: its size, for resizing, and where it came from.
struct alignas(16) Head {
  u32 bytes;
  bool counted;
};

// lcms does not survive every refusal of memory. So what HB refuses comes from the C library, lcms goes on,
// and the call that it works for fails afterwards and throws its result away.
void* allocate(cmsContext, u32 bytes) {
  if (bytes > largest_block) return nullptr;
  const size_t all = sizeof(Head) + bytes;
  void* place = HB_AllocatePtrQuiet(all);
  const bool counted = place != nullptr;
  if (!counted) {
    memory_failed = true;
    place = std::malloc(all);
    if (place == nullptr) return nullptr;
  }
  return new (place) Head{bytes, counted} + 1;
}
void give_back(cmsContext, void* block) {
  if (block == nullptr) return;
  Head* const head = static_cast<Head*>(block) - 1;
  if (head->counted)
    HB_FreePtr(head);
  else
    std::free(head);
}
void* resize(cmsContext id, void* block, u32 bytes) {
  void* const moved = allocate(id, bytes);
  if (moved == nullptr || block == nullptr) return moved;
  const u32 before = (static_cast<Head*>(block) - 1)->bytes;
  std::memcpy(moved, block, before < bytes ? before : bytes);
  give_back(id, block);
  return moved;
}

// lcms's own mutexes are not made of its memory as ours are.
void* create_mutex(cmsContext id) {
  void* const place = allocate(id, sizeof(std::mutex));
  return place != nullptr ? new (place) std::mutex : nullptr;
}
void destroy_mutex(cmsContext id, void* mutex) {
  if (mutex == nullptr) return;
  static_cast<std::mutex*>(mutex)->~mutex();
  give_back(id, mutex);
}
cmsBool lock_mutex(cmsContext, void* mutex) {
  if (mutex == nullptr) return FALSE;
  static_cast<std::mutex*>(mutex)->lock();
  return TRUE;
}
void unlock_mutex(cmsContext, void* mutex) {
  if (mutex != nullptr) static_cast<std::mutex*>(mutex)->unlock();
}

void log_error(cmsContext, cmsUInt32Number, const char* text) { JRN_Log(20, "TON", "lcms", text); }

cmsPluginMutex mutex_plugin = {
    {cmsPluginMagicNumber, 2060, cmsPluginMutexSig, nullptr}, create_mutex, destroy_mutex, lock_mutex, unlock_mutex};
cmsPluginFormatters formatters_plugin = {{cmsPluginMagicNumber, 2060, cmsPluginFormattersSig, &mutex_plugin.base},
                                         world_formatter};
cmsPluginMemHandler memory_plugin = {{cmsPluginMagicNumber, 2060, cmsPluginMemHandlerSig, &formatters_plugin.base},
                                     allocate,
                                     give_back,
                                     resize,
                                     nullptr,
                                     nullptr,
                                     nullptr};

}  // namespace

void forget_memory_failure() { memory_failed = false; }
bool memory_has_failed() { return memory_failed; }

Context::Context() : PRISMA_Object(destroy_object<Context>) {
  raw = cmsCreateContext(&memory_plugin, nullptr);
  if (raw == nullptr || memory_failed) {
    if (raw != nullptr) cmsDeleteContext(raw);
    throw i32{ZR_Err_OutOfMemory};
  }
  cmsSetLogErrorHandlerTHR(raw, log_error);
}
Context::~Context() { cmsDeleteContext(raw); }

ContextRef current_context() {
  Current& shared = current();
  const std::lock_guard hold(shared.lock);
  if (shared.context == nullptr) shared.context = make_object<Context>();
  shared.context->shares.fetch_add(1);
  return ContextRef(shared.context);
}

void let_current_context_go() {
  Current& shared = current();
  const std::lock_guard hold(shared.lock);
  if (Context* const last = std::exchange(shared.context, nullptr)) ContextRef{last};
}

}  // namespace zr::prisma
