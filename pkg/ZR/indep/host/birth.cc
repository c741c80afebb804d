// Birth and death of the library: two ordered lists of named steps.
//
// Death is not birth in reverse: tables go first, then the modules in the order of their loading.
#include <DSK/dsk.h>
#include <GX/gx.h>
#include <JRN/jrn.h>
#include <OPT/opt.h>
#include <TON/ton.h>
#include <ZR/composite.h>

#include <algorithm>
#include <iterator>
#include <string>

#include "colour/emergency_settings_state.h"
#include "composite/scratch_state.h"
#include "composite/soft_light_state.h"
#include "host/accel_modules_state.h"
#include "host/life_state.h"
#include "host/slot_defaults.h"
#include "mask/scan_weights_state.h"
#include "world/constants_state.h"
#include "world/dither_state.h"
#include "world/guard.h"

namespace zr {
namespace {

struct Step {
  const char* name;
  i32 (*run)();
};

void empty_slots() { std::fill(std::begin(ZRp_G_OverFuncs), std::end(ZRp_G_OverFuncs), nullptr); }

i32 read_preferences() {
  OPT_Reload();
  HB_PrepareCpuData();
  return ZR_Err_None;
}

i32 log_birth() {
  JRN_Log(10, "ZR", "Birth", "ZR Birth");
  return ZR_Err_None;
}

i32 prepare_vector_constants() {
  if (HB_G_CPU_DataP[2] != 0) set_vector_constants();
  return ZR_Err_None;
}

i32 clear_shared_words() {
  empty_slots();
  ZR_G_LiveWorlds = 0;
  ZR_G_LiveChunks = 0;
  return ZR_Err_None;
}

i32 prepare_float_ramp() {
  fill_float_ramp();
  return ZR_Err_None;
}

i32 take_multiply_tables() {
  const i32 error = GX_PrepareFCMD(1, 0, 0, &ZRp_G_fcm_table, &ZRp_G_fcd_table);
  G_life.has_multiply_tables = error == ZR_Err_None;
  if (error == ZR_Err_None) prepare_dither();
  return error;
}

i32 give_multiply_tables_back() {
  if (!G_life.has_multiply_tables) return ZR_Err_None;
  G_life.has_multiply_tables = false;
  return GX_UnprepareFCMD();
}

i32 prepare_soft_light() {
  build_soft_light_tables();
  return ZR_Err_None;
}

i32 prepare_scratch() {
  void* record[10];
  return ZRp_ReallocScratch(1024, 1, false, record);
}

i32 give_scratch_back() {
  free_scratch();
  return ZR_Err_None;
}

i32 fill_slots_with_defaults() {
  fill_default_slots();
  return ZR_Err_None;
}

i32 log_death() {
  JRN_Log(10, "ZR", "Death", "ZR Death");
  return ZR_Err_None;
}

// The answer of a birth without a colour engine: everything else works.
constexpr i32 no_colour_engine = 1;

i32 bind_colour_engine() {
  TON_AddressProc proc = nullptr;
  if (const i32 error = TON_GetQILAddressProc(&proc)) return error;
  return TON_PRISMA_Bind(proc) ? i32{ZR_Err_None} : no_colour_engine;
}

i32 free_colour_settings() { return free_emergency_settings(); }

i32 free_mask_taps() {
  free_bell_taps();
  return ZR_Err_None;
}

i32 let_colour_engine_go() {
  TON_PRISMA_Unbind();
  return ZR_Err_None;
}

i32 clear_registries() {
  ADDIN_ClearTWSuites();
  DSK_ClearExtensionMap();
  return ZR_Err_None;
}

// In this order; the first failure ends the birth. Modules come last, so that they rewrite a filled
// table and a refused one takes back its own changes only.
constexpr Step birth_steps[] = {
    {"preferences", read_preferences},
    {"log", log_birth},
    {"vector constants", prepare_vector_constants},
    {"shared words", clear_shared_words},
    {"float ramp", prepare_float_ramp},
    {"multiply tables", take_multiply_tables},
    {"soft light tables", prepare_soft_light},
    {"scratch", prepare_scratch},
    {"module scan set-up", install_module_scan},
    {"slots", fill_slots_with_defaults},
    {"modules", run_module_scan},
};

// After all others, and its failure leaves the library born: only colour calls fail then.
constexpr Step colour_step = {"colour engine", bind_colour_engine};

// All of them run; the first failure is the result.
constexpr Step death_steps[] = {
    {"multiply tables", give_multiply_tables_back},
    {"modules", unload_modules},
    {"scratch", give_scratch_back},
    {"mask taps", free_mask_taps},
    {"colour settings", free_colour_settings},
    {"colour engine", let_colour_engine_go},
    {"registries", clear_registries},
};

i32 run_guarded(const Step& step, const char* life_event) {
  const i32 error = guarded(step.run);
  if (error != ZR_Err_None)
    JRN_Log(40, "ZR", life_event, (std::string(step.name) + ": error " + std::to_string(error)).c_str());
  return error;
}

// Gives back whatever this life holds, all of it or none.
i32 end_life() {
  i32 result = ZR_Err_None;
  for (const Step& step : death_steps) {
    const i32 error = run_guarded(step, "Death");
    if (result == ZR_Err_None) result = error;
  }
  return result;
}

}  // namespace
}  // namespace zr

extern "C" i32 ZR_Birth(void) {
  return zr::guarded([] {
    zr::end_life();  // a second birth without a death: the first life's modules and memory go first
    for (const zr::Step& step : zr::birth_steps) {
      const i32 error = zr::run_guarded(step, "Birth");
      if (error == ZR_Err_None) continue;
      zr::end_life();
      zr::empty_slots();
      return error;
    }
    return zr::run_guarded(zr::colour_step, "Birth");
  });
}

extern "C" i32 ZR_Death(void) {
  return zr::guarded([] {
    zr::log_death();
    return zr::end_life();
  });
}
