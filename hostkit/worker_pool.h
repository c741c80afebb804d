// The threads of a Hostkit: the one file that knows the scheduler.
#pragma once

#include <ZR/zr.h>

#include <memory>

namespace zr {

class WorkerPool {
 public:
  // Threads that the machine offers this process.
  static i32 machine_threads();

  // Up to `threads` callbacks at once, those of the callers of `run` among them; more than the machine offers
  // are really started. Throws std::bad_alloc.
  explicit WorkerPool(i32 threads);
  ~WorkerPool();
  i32 count() const { return count_; }

  using Body = void (*)(void* refcon, i32 worker);
  // Calls body once for each worker 0..workers-1, on this thread and others, and returns when all are done. While
  // a body waits for parallel work of its own its thread is not given another worker. body must not throw.
  // Any thread; throws std::bad_alloc, and then some workers may have run.
  void run(i32 workers, Body body, void* refcon);

 private:
  struct Scheduler;
  i32 count_;
  std::unique_ptr<Scheduler> scheduler_;
};

}  // namespace zr
