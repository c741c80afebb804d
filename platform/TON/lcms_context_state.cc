// The engine's lcms context: memory through HB, formatters of worlds, errors to the log.
#include <JRN/jrn.h>

#include <cstring>
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

// The size stands before each block, for resizing.
struct alignas(16) Head {
  u32 bytes;
};

void* allocate(cmsContext, u32 bytes) {
  if (bytes > largest_block) return nullptr;
  auto* const head = static_cast<Head*>(HB_AllocatePtrQuiet(sizeof(Head) + bytes));
  if (head == nullptr) {
    memory_failed = true;
    return nullptr;
  }
  head->bytes = bytes;
  return head + 1;
}
void give_back(cmsContext, void* block) {
  if (block != nullptr) HB_FreePtr(static_cast<Head*>(block) - 1);
}
void* resize(cmsContext id, void* block, u32 bytes) {
  void* const moved = allocate(id, bytes);
  if (moved == nullptr || block == nullptr) return moved;
  const u32 before = (static_cast<Head*>(block) - 1)->bytes;
  std::memcpy(moved, block, before < bytes ? before : bytes);
  give_back(id, block);
  return moved;
}

void log_error(cmsContext, cmsUInt32Number, const char* text) { JRN_Log(20, "TON", "lcms", text); }

cmsPluginFormatters formatters_plugin = {{cmsPluginMagicNumber, 2060, cmsPluginFormattersSig, nullptr},
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
  if (raw == nullptr) throw i32{ZR_Err_OutOfMemory};
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
