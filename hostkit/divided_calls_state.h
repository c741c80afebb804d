// Process-wide state of the divided calls: they are plain functions, so what they draw with is here.
#pragma once

#include <atomic>

#include "scratch_records.h"

namespace zr {

// Set by a Hostkit for its life, on the main thread while nothing renders; null without one.
extern constinit std::atomic<ScratchRecords*> G_scratch_records;

}  // namespace zr
