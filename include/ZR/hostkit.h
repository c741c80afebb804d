// A working host in one object: births the library with threads in the iterate slot, a message sink and
// module folders, and ends it again. Link ZR::hostkit.
#pragma once

#include <ZR/zr.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace zr {

struct HostkitOptions {
  // Threads for row-parallel work: 0 takes the machine's count, 1 keeps the serial body. HB_GetNumThreads
  // answers with the same number, so that operations size their scratch by it.
  int threads = 0;
  // Folders that are scanned for .ZNX acceleration modules, in this order; none leaves the preference.
  std::vector<std::string> module_folders = {};
  // Receives every message; null leaves them to the log. Called on whichever thread reports, also on two at
  // once; must not throw.
  std::function<void(u32 code, i32 severity, const std::string& text)> message_sink = nullptr;
  // Receives failed verifications; null leaves them to the log.
  std::function<void(u32 code, i32 line, const std::string& text)> verification_sink = nullptr;
  // Bytes that the frame pool may keep for reuse; negative leaves the pool's default.
  i64 frame_pool_limit = -1;
};

// One at a time in a process; construct and destroy on the main thread while nothing renders.
//
// With more than one thread, ZR_IterateGeneric works like this:
//   - thread_index is in 0..threads()-1; two callbacks of one call that run at the same time have two indices.
//   - A count runs every i once, in bands of consecutive i, in any order. -1 calls fn(refcon, t, t, threads())
//     once for each index t, at the same time as far as threads are free; callbacks must not wait for each other.
//   - After a failure no iteration behind it is started any more. Those before it are finished, so the result is
//     that of the smallest failing i, the one that a serial walk returns.
//   - A call from inside a callback is done there and then on the calling thread: a count under the caller's
//     index, -1 for all indices in order. What the only iteration of a call calls may be parallel again.
//   - fn may throw an i32: it counts as returned. Other exceptions become codes; none crosses threads.
//   - Calls from several threads at once are independent and share the threads.
// A body that a module brought for this slot is replaced.
class Hostkit {
 public:
  // Throws std::runtime_error when birth fails, or when there is one already; nothing is left changed then.
  explicit Hostkit(HostkitOptions options = {});
  ~Hostkit();
  Hostkit(const Hostkit&) = delete;
  Hostkit& operator=(const Hostkit&) = delete;

  int threads() const;
  // ZR_Death's result; the destructor then does nothing more.
  i32 End();

 private:
  struct State;
  std::unique_ptr<State> state_;
};

}  // namespace zr
