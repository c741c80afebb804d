// Counts of all memory of the library, and the failure that tests can order.
#include <HB/hb.h>

#include <atomic>

namespace {

// Written by every thread that allocates. Only sums are read, so no order between them is needed.
constinit std::atomic<u64> live_blocks{0}, live_bytes{0}, peak_bytes{0}, attempts{0};
// Attempts left until one fails, that one included; 0 when none is ordered.
constinit std::atomic<u64> until_failure{0};

}  // namespace

bool HB_AllocationMayProceed() {
  attempts.fetch_add(1, std::memory_order_relaxed);
  u64 left = until_failure.load(std::memory_order_relaxed);
  while (left != 0)  // each attempt takes exactly one step, whatever the other threads do
    if (until_failure.compare_exchange_weak(left, left - 1, std::memory_order_relaxed)) return left != 1;
  return true;
}

void HB_CountAllocated(std::size_t bytes) {
  live_blocks.fetch_add(1, std::memory_order_relaxed);
  const u64 now = live_bytes.fetch_add(bytes, std::memory_order_relaxed) + bytes;
  u64 peak = peak_bytes.load(std::memory_order_relaxed);
  while (peak < now && !peak_bytes.compare_exchange_weak(peak, now, std::memory_order_relaxed)) {}
}

void HB_CountFreed(std::size_t bytes) {
  live_blocks.fetch_sub(1, std::memory_order_relaxed);
  live_bytes.fetch_sub(bytes, std::memory_order_relaxed);
}

extern "C" void HB_GetMemoryStats(HB_MemoryStats* out) {
  if (out == nullptr) return;
  out->live_blocks = live_blocks.load(std::memory_order_relaxed);
  out->live_bytes = live_bytes.load(std::memory_order_relaxed);
  out->peak_bytes = peak_bytes.load(std::memory_order_relaxed);
  out->allocations = attempts.load(std::memory_order_relaxed);
}

extern "C" void HB_FailNthAllocation(u64 n) { until_failure.store(n, std::memory_order_relaxed); }
