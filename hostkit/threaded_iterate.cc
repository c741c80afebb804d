// Iteration on threads: each worker of a call has an index of its own and takes bands of iterations.
#include "threaded_iterate.h"

#include <ZR/platform.h>

#include <algorithm>
#include <exception>
#include <new>

#include "threaded_iterate_state.h"

namespace zr {
namespace {

constexpr i32 iterate_site = 70;
constexpr i32 bands_per_worker = 16;  // small enough to even out rows of unlike cost

// Nothing thrown may leave a worker: it would cross threads.
i32 invoke(ZR_GenericFunc fn, void* refcon, i32 thread_index, i32 i, i32 iterations) noexcept {
  try {
    return fn(refcon, thread_index, i, iterations);
  } catch (const i32 code) {
    return code != ZR_Err_None ? code : static_cast<i32>(ZR_Err_Internal);
  } catch (const std::exception& error) {
    HBp_ReportErrString(0x250000u | iterate_site, 8, error.what());
    return dynamic_cast<const std::bad_alloc*>(&error) != nullptr ? ZR_Err_OutOfMemory : ZR_Err_Internal;
  } catch (...) {
    return ZR_Err_Internal;
  }
}

class IndexScope {
 public:
  explicit IndexScope(i32 index) : before_(G_running_index) { G_running_index = index; }
  ~IndexScope() { G_running_index = before_; }
  IndexScope(const IndexScope&) = delete;
  IndexScope& operator=(const IndexScope&) = delete;

 private:
  i32 before_;
};

// The failure of the smallest index. Bands are handed out in rising order and those before the failure are
// finished, so this is the failure that a serial walk meets, whatever the number of threads.
class FirstFailure {
 public:
  void note(i32 index, i32 code) {
    const u64 mine = static_cast<u64>(static_cast<u32>(index)) << 32 | static_cast<u32>(code);
    u64 seen = word_.load(std::memory_order_relaxed);
    while (mine < seen && !word_.compare_exchange_weak(seen, mine, std::memory_order_relaxed)) {}
  }
  // No need to run this index.
  bool comes_before(i32 index) const {
    return word_.load(std::memory_order_relaxed) >> 32 < static_cast<u64>(static_cast<u32>(index));
  }
  i32 code() const {
    const u64 word = word_.load(std::memory_order_relaxed);
    return word == none ? 0 : static_cast<i32>(static_cast<u32>(word));
  }

 private:
  static constexpr u64 none = ~u64{0};
  std::atomic<u64> word_ = none;
};

struct Call {
  ZR_GenericFunc fn;
  void* refcon;
  i32 iterations;  // -1: once for each thread index
  i32 workers;
  i32 band;
  alignas(64) std::atomic<i64> next = 0;
  alignas(64) FirstFailure failure{};

  void run(i32 worker) {
    const IndexScope scope(worker);
    if (iterations == -1)
      run_index(worker);
    else
      run_bands(worker);
  }

 private:
  void run_index(i32 worker) {
    if (failure.comes_before(worker)) return;
    const i32 code = invoke(fn, refcon, worker, worker, workers);
    if (code != 0) failure.note(worker, code);
  }
  void run_bands(i32 worker) {
    for (;;) {
      const i64 first = next.fetch_add(band, std::memory_order_relaxed);
      if (first >= iterations) return;
      const i32 last = static_cast<i32>(std::min<i64>(first + band, iterations));
      for (i32 i = static_cast<i32>(first); i < last; ++i) {
        if (failure.comes_before(i)) return;
        const i32 code = invoke(fn, refcon, worker, i, iterations);
        if (code == 0) continue;
        failure.note(i, code);
        return;
      }
    }
  }
};

void run_workers(WorkerPool& pool, Call& call) {
  G_hand_over.fetch_add(1, std::memory_order_release);
  pool.run(
      call.workers,
      [](void* refcon, i32 worker) {
        G_hand_over.load(std::memory_order_acquire);
        static_cast<Call*>(refcon)->run(worker);
        G_hand_over.fetch_add(1, std::memory_order_release);
      },
      &call);
  G_hand_over.load(std::memory_order_acquire);
}

// Inside a callback: all of it here and now, with scratch that no other thread uses at the moment.
i32 iterate_nested(i32 threads, i32 iterations, void* refcon, ZR_GenericFunc fn) {
  const i32 own_index = G_running_index;
  const bool each_index = iterations == -1;
  const i32 count = each_index ? threads : iterations;
  for (i32 i = 0; i < count; ++i) {
    const i32 code = invoke(fn, refcon, each_index ? i : own_index, i, count);
    if (code != 0) return code;
  }
  return 0;
}

}  // namespace

i32 threaded_iterate(i32 iterations, void* refcon, ZR_GenericFunc fn) {
  if (fn == nullptr) return ZR_ReportBadCallbackParam(iterate_site);
  if (iterations < 1 && iterations != -1) return 0;
  WorkerPool* const pool = G_iterate_workers.load(std::memory_order_acquire);
  if (pool == nullptr) return ZR_IterateGeneric_Static(iterations, refcon, fn);
  if (G_running_index >= 0) return iterate_nested(pool->count(), iterations, refcon, fn);
  if (iterations == 1) return invoke(fn, refcon, 0, 0, 1);  // not counted as inside: what it calls may be parallel

  const i32 workers = iterations == -1 ? pool->count() : std::min(pool->count(), iterations);
  Call call{.fn = fn,
            .refcon = refcon,
            .iterations = iterations,
            .workers = workers,
            .band = std::max(1, iterations / (workers * bands_per_worker))};
  try {
    run_workers(*pool, call);
  } catch (...) {  // the scheduler found no memory for its tasks; part of the work may be done
    return ZR_Err_OutOfMemory;
  }
  return call.failure.code();
}

}  // namespace zr
