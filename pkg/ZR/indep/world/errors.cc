// The common report of a bad argument.
#include <ZR/errors.h>

#include "world/guard.h"

extern "C" i32 ZR_ReportBadCallbackParam(i32 site) {
  zr::report_string(ZR_Str_BadCallbackParam, static_cast<u32>(site));
  return ZR_Err_Internal;
}
