// Small services: shared tables handed out, the random generator, the host's memory purge.
#include <GX/gx.h>
#include <ZR/composite.h>
#include <ZR/errors.h>
#include <ZR/zr.h>

#include <cmath>
#include <cstdarg>

#include "world/guard.h"
#include "world/random.h"

extern "C" {

i32 ZR_FreeUpSomeMemory() {
  constexpr i32 width_after_birth = 1024;
  void* record[10] = {};
  return zr::guarded([&] { return ZRp_ReallocScratch(width_after_birth, 1, true, record); });
}

i32 ZR_OverrideStdFuncs() {
  zr::report_string(ZR_Str_ObsoleteRoutine, ZR_Site_OverrideStdFuncs);
  return ZR_Err_BadSelector;
}

i32 ZR_AppCallback(void* /*ref*/, i32 selector, ...) {
  if (selector >= 6 && selector <= 9) return selector < 8 ? GX_UnprepareFCMD() : GX_UnprepareFTrig();
  if (selector < 2 || selector > 5) return ZR_Err_None;
  va_list arguments;
  va_start(arguments, selector);
  const void** const out = va_arg(arguments, const void**);
  va_end(arguments);
  const u8* bytes = nullptr;
  const void* table = nullptr;
  i32 error;
  switch (selector) {
    case 2: error = GX_PrepareFCMD(1, 0, 0, &bytes, nullptr), table = bytes; break;
    case 3: error = GX_PrepareFCMD(1, 0, 0, nullptr, &bytes), table = bytes; break;
    default: error = GX_PrepareFTrig(1, 0, 0, &table); break;
  }
  if (error == 0) *out = table;
  return error;
}

f64 ZR_Hypot(f64 x, f64 y) { return std::sqrt(x * x + y * y); }

i32 ZR_Rand(u32* seed) { return zr::random_number(*seed = zr::next_seed(*seed)); }

}  // extern "C"
