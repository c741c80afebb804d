// Plug-in files and their routines.
#include <ADDIN/addin_files.h>
#include <HB/hb.h>
#include <ZR/errors.h>

#include <cstring>
#include <dlfcn.h>

struct ADDIN_Manifest {
  const ZR_ModuleRoutine* routine;
};
struct ADDIN_Routine {
  ADDIN_File* file;
  const ZR_ModuleRoutine* routine;
  bool prepared;
};

namespace {

// Null when memory is short, which has been reported then.
template <class Record>
Record* new_record(const char* label) {
  return static_cast<Record*>(HB_AllocatePtr(sizeof(Record), label, ZR_ModuleCode | ZR_Site_Plain));
}

const ZR_ModuleRoutine* routine_at(const ADDIN_File* file, i32 index) {
  const bool inside = file != nullptr && index >= 0 && static_cast<u32>(index) < file->descriptor->routine_count;
  return inside ? &file->descriptor->routines[index] : nullptr;
}

std::string last_loader_error() {
  const char* const text = dlerror();
  return text != nullptr ? text : "the loader gave no reason";
}

// Empty: the descriptor may be used.
std::string fault_of(const ZR_ModuleDescriptor* descriptor) {
  if (descriptor == nullptr) return "it exports no " ZR_ModuleDescriptorSymbol;
  if (descriptor->version != ZR_ModuleDescriptorVersion)
    return "its descriptor has version " + std::to_string(descriptor->version) + " and not " +
           std::to_string(ZR_ModuleDescriptorVersion);
  if (descriptor->routine_count > 0 && descriptor->routines == nullptr) return "its descriptor lists no routines";
  return {};
}

}  // namespace

ADDIN_File* ADDINp_OpenFile(const char* path, std::string* reason) {
  void* const library = dlopen(path, RTLD_LOCAL | RTLD_NOW);
  if (library == nullptr) {
    *reason = last_loader_error();
    return nullptr;
  }
  const auto* const descriptor = static_cast<const ZR_ModuleDescriptor*>(dlsym(library, ZR_ModuleDescriptorSymbol));
  *reason = fault_of(descriptor);
  ADDIN_File* file = nullptr;
  if (reason->empty()) {
    file = new_record<ADDIN_File>("plug-in file");
    if (file == nullptr) *reason = "memory is short";
  }
  if (file == nullptr)
    dlclose(library);
  else
    *file = {library, descriptor, 1};
  return file;
}

void ADDINp_LeaveFile(ADDIN_File* file) {
  if (--file->users != 0) return;
  dlclose(file->library);
  HB_FreePtr(file);
}

bool ADDINp_HasRoutineOfKind(const ADDIN_File* file, u32 kind) {
  for (u32 i = 0; i < file->descriptor->routine_count; ++i)
    if (file->descriptor->routines[i].kind == kind) return true;
  return false;
}

i32 ADDIN_GetRoutineCount(ADDIN_File* file, i32* count) {
  if (file == nullptr || count == nullptr) return ZR_Err_BadParam;
  *count = static_cast<i32>(file->descriptor->routine_count);
  return ZR_Err_None;
}

i32 ADDIN_GetRoutineInfo(ADDIN_File* file, i32 index, ADDIN_RoutineInfo* info) {
  const ZR_ModuleRoutine* const routine = routine_at(file, index);
  if (routine == nullptr || info == nullptr) return ZR_Err_BadParam;
  *info = {routine->name != nullptr ? routine->name : "", routine->kind, routine->flags};
  return ZR_Err_None;
}

i32 ADDIN_GetManifest(ADDIN_File* file, i32 index, ADDIN_Manifest** out) {
  if (out == nullptr) return ZR_Err_BadParam;
  *out = nullptr;
  const ZR_ModuleRoutine* const routine = routine_at(file, index);
  if (routine == nullptr) return ZR_Err_BadParam;
  auto* const manifest = new_record<ADDIN_Manifest>("plug-in manifest");
  if (manifest == nullptr) return ZR_Err_OutOfMemory;
  *manifest = {routine};
  *out = manifest;
  return ZR_Err_None;
}

i32 ADDIN_GetManifestProp(ADDIN_Manifest* manifest, u32 key, void* out, u32 size) {
  if (manifest == nullptr || out == nullptr) return ZR_Err_BadParam;
  const ZR_ModuleRoutine& routine = *manifest->routine;
  for (u32 i = 0; routine.properties != nullptr && i < routine.property_count; ++i) {
    const ZR_ModuleProperty& property = routine.properties[i];
    if (property.key != key) continue;
    if (property.size != size || property.data == nullptr) return ZR_Err_BadParam;
    std::memcpy(out, property.data, size);
    return ZR_Err_None;
  }
  return ZR_Err_BadParam;
}

void ADDIN_DisposeManifest(ADDIN_Manifest* manifest) { HB_FreePtr(manifest); }

i32 ADDIN_RegisterRoutine(ADDIN_File* file, i32 index, ADDIN_Routine** out) {
  if (out == nullptr) return ZR_Err_BadParam;
  *out = nullptr;
  const ZR_ModuleRoutine* const routine = routine_at(file, index);
  if (routine == nullptr) return ZR_Err_BadParam;
  auto* const registered = new_record<ADDIN_Routine>("plug-in routine");
  if (registered == nullptr) return ZR_Err_OutOfMemory;
  *registered = {file, routine, false};
  ++file->users;
  *out = registered;
  return ZR_Err_None;
}

i32 ADDIN_UnregisterRoutine(ADDIN_Routine* routine) {
  if (routine == nullptr) return ZR_Err_BadParam;
  if (routine->prepared) return ZR_Err_Internal;  // its code may still be running
  ADDINp_LeaveFile(routine->file);
  HB_FreePtr(routine);
  return ZR_Err_None;
}

i32 ADDIN_PrepRoutine(ADDIN_Routine* routine, ZR_ModuleEntry* entry) {
  if (entry == nullptr) return ZR_Err_BadParam;
  *entry = nullptr;
  if (routine == nullptr || routine->routine->entry == nullptr) return ZR_Err_BadParam;
  routine->prepared = true;
  *entry = routine->routine->entry;
  return ZR_Err_None;
}

i32 ADDIN_UnprepRoutine(ADDIN_Routine* routine) {
  if (routine == nullptr || !routine->prepared) return ZR_Err_BadParam;
  routine->prepared = false;
  return ZR_Err_None;
}
