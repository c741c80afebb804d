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
  // Threads for row-parallel work: 0 takes the machine's count, 1 keeps the serial body.
  int threads = 0;
  // Folders that are scanned for .ZNX acceleration modules, in this order.
  std::vector<std::string> module_folders;
  // Receives every message; null leaves them to the log. Called on whichever thread reports.
  std::function<void(u32 code, i32 severity, const std::string& text)> message_sink;
  // Receives failed verifications; null leaves them to the log.
  std::function<void(u32 code, i32 line, const std::string& text)> verification_sink;
  // Bytes that the frame pool may keep for reuse; negative leaves the pool's default.
  i64 frame_pool_limit = -1;
};

// One at a time in a process; construct and destroy on the main thread while nothing renders.
class Hostkit {
 public:
  explicit Hostkit(HostkitOptions options = {});  // throws std::runtime_error when birth fails
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
