// Workers on oneTBB. All that its headers bring is compiled here alone: the scheduler's own library is not
// built for race detectors, so in builds for them this file is compiled without one.
#include "worker_pool.h"

#include <oneapi/tbb/global_control.h>
#include <oneapi/tbb/info.h>
#include <oneapi/tbb/parallel_for.h>
#include <oneapi/tbb/partitioner.h>
#include <oneapi/tbb/task_arena.h>

#include <optional>

namespace zr {

struct WorkerPool::Scheduler {
  explicit Scheduler(i32 threads) : arena(threads) {
    if (threads > machine_threads())
      more_threads.emplace(tbb::global_control::max_allowed_parallelism, static_cast<size_t>(threads));
  }
  tbb::task_arena arena;
  std::optional<tbb::global_control> more_threads;
};

i32 WorkerPool::machine_threads() { return tbb::info::default_concurrency(); }

WorkerPool::WorkerPool(i32 threads) : count_(threads), scheduler_(std::make_unique<Scheduler>(threads)) {}
WorkerPool::~WorkerPool() = default;

void WorkerPool::run(i32 workers, Body body, void* refcon) {
  scheduler_->arena.execute([=] {
    tbb::parallel_for(
        0, workers, [=](i32 worker) { tbb::this_task_arena::isolate([=] { body(refcon, worker); }); },
        tbb::simple_partitioner{});
  });
}

}  // namespace zr
