// The host that the tool runs the library in.
#pragma once

#include <ZR/hostkit.h>

namespace zr::tool {

// Threads: 0 takes the machine's count. Throws ToolError when the library cannot start.
class ToolHost {
 public:
  explicit ToolHost(int threads);
  int threads() const { return kit_.threads(); }

 private:
  Hostkit kit_;
};

}  // namespace zr::tool
