// The settings of callers that have none.
#pragma once

#include <ZR/zr.h>

namespace zr {

// Frees the settings and their pool; ZR_Death calls it. 0.
i32 free_emergency_settings();

}  // namespace zr
