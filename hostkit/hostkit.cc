// The ready host: what it sets before birth it takes back after death.
#include <ZR/hostkit.h>
#include <ZR/module.h>
#include <ZR/platform.h>
#include <ZR/slots.h>

#include <atomic>
#include <stdexcept>
#include <utility>

#include "divided_calls_state.h"
#include "slot_trials.h"
#include "threaded_iterate.h"
#include "threaded_iterate_state.h"

namespace zr {
namespace {

int thread_count(int asked) { return asked > 0 ? asked : WorkerPool::machine_threads(); }

}  // namespace

struct Hostkit::State {
  explicit State(HostkitOptions given) : options(std::move(given)), workers(thread_count(options.threads)) {
    WorkerPool* nobody = nullptr;
    if (!G_iterate_workers.compare_exchange_strong(nobody, &workers))
      throw std::runtime_error("a second Hostkit in one process");
    G_scratch_records.store(&scratch);
  }
  ~State() {
    if (alive) ZR_Death();
    if (ZRp_G_OverFuncs[ZR_Slot_iterate_generic] == reinterpret_cast<ZR_SlotFunc>(&threaded_iterate))
      ZRp_G_OverFuncs[ZR_Slot_iterate_generic] = reinterpret_cast<ZR_SlotFunc>(&ZR_IterateGeneric_Static);
    HB_SetNumThreads(0);
    ZR_SetSlotCheck(nullptr, nullptr);
    if (!options.module_folders.empty()) ADDIN_SetModuleFolders(nullptr, 0);
    if (options.message_sink) HB_SetMessageSink(nullptr, nullptr);
    if (options.verification_sink) HB_SetVerificationSink(nullptr, nullptr);
    G_scratch_records.store(nullptr);
    G_iterate_workers.store(nullptr);
  }
  State(const State&) = delete;
  State& operator=(const State&) = delete;

  void set_up_layers() {
    if (options.message_sink)
      HB_SetMessageSink(
          [](void* self, u32 code, i32 severity, const char* text) {
            static_cast<State*>(self)->options.message_sink(code, severity, text != nullptr ? text : "");
          },
          this);
    if (options.verification_sink)
      HB_SetVerificationSink(
          [](void* self, u32 code, i32 line, const char* text) {
            static_cast<State*>(self)->options.verification_sink(code, line, text != nullptr ? text : "");
          },
          this);
    if (!options.module_folders.empty()) {
      std::vector<const char*> folders;
      for (const std::string& folder : options.module_folders) folders.push_back(folder.c_str());
      ADDIN_SetModuleFolders(folders.data(), static_cast<i32>(folders.size()));
    }
    if (options.frame_pool_limit >= 0) RS_SetFramePoolLimit(static_cast<u64>(options.frame_pool_limit));
    HB_SetNumThreads(workers.count());
    ZR_SetSlotCheck(&check_slot, nullptr);
  }
  void begin_life() {
    if (const i32 error = ZR_Birth(); error != ZR_Err_None)
      throw std::runtime_error("ZR_Birth failed with error " + std::to_string(error));
    alive = true;
    if (workers.count() > 1) ZR_SetOverrideFunc(ZR_Slot_iterate_generic, reinterpret_cast<void*>(&threaded_iterate));
  }

  HostkitOptions options;
  WorkerPool workers;
  ScratchRecords scratch;
  bool alive = false;
};

Hostkit::Hostkit(HostkitOptions options) : state_(std::make_unique<State>(std::move(options))) {
  state_->set_up_layers();
  state_->begin_life();
}

Hostkit::~Hostkit() = default;

int Hostkit::threads() const { return state_ != nullptr ? state_->workers.count() : 0; }

i32 Hostkit::End() {
  if (state_ == nullptr) return ZR_Err_None;
  state_->alive = false;
  const i32 result = ZR_Death();
  state_.reset();
  return result;
}

}  // namespace zr
