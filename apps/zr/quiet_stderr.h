// Keeps what other libraries print on stderr away from it.
#pragma once

#include <fcntl.h>
#include <unistd.h>

#include <cstdio>

namespace zr::tool {

// While alive, stderr goes nowhere: libpng and its like print a line of their own for a damaged file, and
// users are promised one line in all. Process-wide, so only where no other thread of the tool writes.
class QuietStderr {
 public:
  QuietStderr() {
    std::fflush(stderr);
    kept_ = fcntl(STDERR_FILENO, F_DUPFD_CLOEXEC, 3);
    const int nowhere = open("/dev/null", O_WRONLY | O_CLOEXEC);
    if (kept_ >= 0 && nowhere >= 0) dup2(nowhere, STDERR_FILENO);
    if (nowhere >= 0) close(nowhere);
  }
  ~QuietStderr() {
    if (kept_ < 0) return;
    dup2(kept_, STDERR_FILENO);
    close(kept_);
  }
  QuietStderr(const QuietStderr&) = delete;
  QuietStderr& operator=(const QuietStderr&) = delete;

 private:
  int kept_;
};

}  // namespace zr::tool
