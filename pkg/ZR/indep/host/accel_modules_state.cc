// Scan, load, roll back and close acceleration modules; owner of the list of loaded ones.
#include "host/accel_modules_state.h"

#include <DSK/dsk.h>
#include <JRN/jrn.h>
#include <SEQ/seq.h>

#include <algorithm>
#include <cstdlib>
#include <string>

#include "host/ansi_functions.h"
#include "host/slot_review_state.h"
#include "host/suites_state.h"
#include "world/constants_state.h"
#include "world/guard.h"

namespace zr {
namespace {

// What a module may point into until it is unloaded.
struct LoadedModule {
  ZR_ModuleEntry entry;
  void* own_words[2];
  ZR_ModuleBlock block;
};

struct ModuleRecord {
  ADDIN_Routine* routine;
  LoadedModule* module;
};
static_assert(sizeof(ModuleRecord) == 16);

// Written by birth and death only, which run alone.
constinit SEQ_List* G_loaded = nullptr;
constinit const ADDIN_BasicSuite* G_basic_suite = nullptr;

constexpr u32 module_file_type = 0x2e5a4e58;  // '.ZNX'
constexpr u32 module_version = 2;

// All slots as one image, to be put back when a module fails.
class SlotImage {
 public:
  SlotImage() { std::copy(std::begin(ZRp_G_OverFuncs), std::end(ZRp_G_OverFuncs), std::begin(slots)); }
  void put_back() const { std::copy(std::begin(slots), std::end(slots), std::begin(ZRp_G_OverFuncs)); }

  ZR_SlotFunc slots[ZR_SlotCount];
};

// Let go of on every way out, until it is kept.
class HeldRoutine {
 public:
  explicit HeldRoutine(ADDIN_Routine* routine) : routine_(routine) {}
  ~HeldRoutine() {
    if (routine_ == nullptr) return;
    if (prepared_) ADDIN_UnprepRoutine(routine_);
    ADDIN_UnregisterRoutine(routine_);
    HB_FreePtr(module_);
  }
  HeldRoutine(const HeldRoutine&) = delete;
  HeldRoutine& operator=(const HeldRoutine&) = delete;

  i32 prepare() {
    module_ = static_cast<LoadedModule*>(HB_AllocatePtrQuiet(sizeof(LoadedModule)));
    if (module_ == nullptr) return ZR_Err_OutOfMemory;
    *module_ = {};
    const i32 error = ADDIN_PrepRoutine(routine_, &module_->entry);
    prepared_ = error == ZR_Err_None;
    return error;
  }
  LoadedModule& module() { return *module_; }
  i32 keep() {
    const ModuleRecord record{routine_, module_};
    const i32 error = SEQ_Insert(G_loaded, -1, &record);
    if (error == ZR_Err_None) routine_ = nullptr;
    return error;
  }

 private:
  ADDIN_Routine* routine_;
  LoadedModule* module_ = nullptr;
  bool prepared_ = false;
};

void report_from_module(u16 call_site, const char* text) {
  HBp_ReportErrString(ZR_ModuleCode | call_site, ZR_ReportSeverity, text);
}

void fill_block(ZR_ModuleBlock& block) {
  block.report = &report_from_module;
  fill_ansi_functions(block.ansi);
  block.calloc = &std::calloc;
  block.free = &std::free;
  block.malloc = &std::malloc;
  block.realloc = &std::realloc;
  block.exit = &std::exit;
  block.multiply_table = ZRp_G_fcm_table;
  block.divide_table = ZRp_G_fcd_table;
  block.version_major = 2;
  block.version_minor = 1;
  block.slots = ZRp_G_OverFuncs;
}

// The routine is made for this form of the block.
bool has_our_version(ADDIN_File* file, i32 index, const char* name) {
  ADDIN_Manifest* manifest = nullptr;
  if (const i32 error = ADDIN_GetManifest(file, index, &manifest); error != ZR_Err_None) fail(error);
  u32 version = 0;
  const bool known = ADDIN_GetManifestProp(manifest, ZR_ModuleProp_Version, &version, sizeof version) == ZR_Err_None;
  ADDIN_DisposeManifest(manifest);
  if (known && version == module_version) return true;
  const std::string what =
      known ? "is made for version " + std::to_string(version) : std::string("does not name its version");
  JRN_Log(30, "ZR", "Modules",
          (std::string("skipped: ") + (name != nullptr ? name : "a routine") + " " + what).c_str());
  return false;
}

i32 load_routine(ADDIN_File* file, i32 index) {
  ADDIN_RoutineInfo info{};
  if (const i32 error = ADDIN_GetRoutineInfo(file, index, &info); error != ZR_Err_None) return error;
  if (info.kind != ZR_ModuleKind || (info.flags & ZR_ModuleFlag_Acceleration) == 0) return ZR_Err_None;
  if (!has_our_version(file, index, info.name)) return ZR_Err_None;

  ADDIN_Routine* routine = nullptr;
  if (const i32 error = ADDIN_RegisterRoutine(file, index, &routine); error != ZR_Err_None) return error;
  HeldRoutine held(routine);
  const SlotImage before;
  const size_t reviewed = slot_review_count();
  if (const i32 error = held.prepare(); error != ZR_Err_None) return error;
  LoadedModule& module = held.module();
  fill_block(module.block);
  i32 result = guarded(
      [&] { return module.entry(ZR_ModuleCommand_Load, &module.own_words[0], &module.block, &module.own_words[1]); });
  if (result == ZR_Err_None) result = guarded([&] { return review_slots(info.name, before.slots), ZR_Err_None; });
  if (result == ZR_Err_None) result = held.keep();
  if (result != ZR_Err_None) {
    before.put_back();
    forget_slot_review_from(reviewed);
  }
  return result;
}

i32 scan_file(ADDIN_File* file) {
  return guarded([&] {
    i32 count = 0;
    i32 result = ADDIN_GetRoutineCount(file, &count);
    for (i32 index = count - 1; index >= 0 && result == ZR_Err_None; --index) result = load_routine(file, index);
    return result;
  });
}

i32 scan_done() {
  if (const i32 error = register_suites(); error != ZR_Err_None) return error;
  return ADDIN_GetTWBasicSuite(&G_basic_suite);
}

}  // namespace

i32 install_module_scan() {
  if (const i32 error = SEQ_New(2, sizeof(ModuleRecord), 1, 1, &G_loaded); error != ZR_Err_None) return error;
  if (const i32 error = DSK_AddExtensionMap(".ZNX", module_file_type, -1); error != ZR_Err_None) return error;
  const u32 types[2] = {ZR_ModuleKind, module_file_type};
  return ADDIN_InstallScan(0, 2, types, scan_file, scan_done, 0);
}

i32 run_module_scan() {
  const i32 result = ADDIN_RunScans();
  for (const ADDIN_ScanEntry& entry : ADDIN_GetScanReport())
    if (entry.faulty) report_string(ZR_Str_ModuleProblem, ZR_Site_Module);
  return result;
}

i32 unload_modules() {
  G_basic_suite = nullptr;
  forget_slot_review();
  if (G_loaded == nullptr) return ZR_Err_None;
  i32 result = ZR_Err_None;
  const i32 count = SEQ_GetCount(G_loaded);
  const auto* const records = static_cast<const ModuleRecord*>(SEQ_GetAddress(G_loaded, 0));
  for (i32 i = 0; i < count; ++i) {
    const ModuleRecord& record = records[i];
    const auto first = [&](i32 error) { result = result == ZR_Err_None ? error : result; };
    if (result == ZR_Err_None)
      first(guarded([&] { return record.module->entry(ZR_ModuleCommand_Unload, nullptr, nullptr, nullptr); }));
    first(ADDIN_UnprepRoutine(record.routine));
    first(ADDIN_UnregisterRoutine(record.routine));
    HB_FreePtr(record.module);
  }
  SEQ_Unlock(G_loaded);
  SEQ_Dispose(G_loaded);
  G_loaded = nullptr;
  return result;
}

i32 loaded_module_count() { return G_loaded != nullptr ? SEQ_GetCount(G_loaded) : 0; }

const ADDIN_BasicSuite* basic_suite() { return G_basic_suite; }

}  // namespace zr
