// One settings object and its pool for the process: made on the first call, freed by death.
#include "colour/emergency_settings_state.h"

#include <HB/hb.h>
#include <ZR/colour_settings.h>

#include <mutex>
#include <new>

#include "world/guard.h"

namespace zr {
namespace {

struct Emergency {
  TON_PRISMA_ProfilePool pool;
  ZR_ColorSettings settings{&pool};
};

// Two threads may call first.
constinit std::mutex lock;
constinit Emergency* current = nullptr;

void destroy(Emergency* emergency) {
  emergency->~Emergency();
  HB_FreePtr(emergency);
}

Emergency* make() {
  void* const place = HB_AllocatePtr(sizeof(Emergency), "colour settings", ZR_ModuleCode | ZR_Site_ColourSettings);
  if (place == nullptr) fail(ZR_Err_OutOfMemory);
  Emergency* made = nullptr;
  try {
    made = new (place) Emergency;
    made->settings.SetProfile(TON_PRISMA_GetDefaultProfile());
    made->settings.SetLinearize(true);
  } catch (...) {
    if (made != nullptr)
      destroy(made);
    else
      HB_FreePtr(place);
    throw;
  }
  return made;
}

}  // namespace

i32 free_emergency_settings() {
  const std::lock_guard hold(lock);
  if (current != nullptr) destroy(current);
  current = nullptr;
  return ZR_Err_None;
}

}  // namespace zr

ZR_ColorSettings* ZR_GetEmergencyColorSettings() {
  const std::lock_guard hold(zr::lock);
  if (zr::current == nullptr) zr::current = zr::make();
  return &zr::current->settings;
}
