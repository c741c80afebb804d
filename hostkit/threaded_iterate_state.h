// Process-wide state of the threaded iterate body: a slot holds a plain function, so what it needs is here.
#pragma once

#include <ZR/zr.h>
#include <oneapi/tbb/task_arena.h>

#include <atomic>

namespace zr {

struct IterateThreads {
  explicit IterateThreads(i32 threads) : count(threads), arena(threads) {}
  const i32 count;
  tbb::task_arena arena;
};

// Set by a Hostkit for its life, on the main thread while nothing renders; null without one.
extern constinit std::atomic<IterateThreads*> G_iterate_threads;

// Index under which the calling thread runs callbacks at the moment; -1 when it runs none.
extern constinit thread_local i32 G_running_index;

// Rises whenever work goes to another thread or comes back. The scheduler orders both already; this word
// orders them for race detectors, which do not see into it.
extern constinit std::atomic<u64> G_hand_over;

}  // namespace zr
