// The serial default body of the iterate slot, through which all row-parallel work goes.
#include <ZR/errors.h>
#include <ZR/zr.h>

#include "world/guard.h"

extern "C" i32 ZR_IterateGeneric_Static(i32 iterations, void* refcon, ZR_GenericFunc fn) {
  return zr::guarded([&] {
    if (fn == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_IterateGeneric);
    if (iterations == -1) return fn(refcon, 0, 0, 1);  // one call for each thread: there is one
    for (i32 i = 0; i < iterations; ++i)
      if (const i32 result = fn(refcon, 0, i, iterations); result != 0) return result;
    return static_cast<i32>(ZR_Err_None);
  });
}
