// Process-wide state of the threaded iterate body: a slot holds a plain function, so what it needs is here.
#pragma once

#include <ZR/zr.h>

#include <atomic>

#include "worker_pool.h"

namespace zr {

// Set by a Hostkit for its life, on the main thread while nothing renders; null without one.
extern constinit std::atomic<WorkerPool*> G_iterate_workers;

// Index under which the calling thread runs callbacks at the moment; -1 when it runs none.
extern constinit thread_local i32 G_running_index;

// Rises whenever work goes to another thread or comes back. The scheduler orders both already; this word
// orders them for race detectors, which do not see into it.
extern constinit std::atomic<u64> G_hand_over;

}  // namespace zr
