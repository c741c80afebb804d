// Seconds that a part of a run takes.
#pragma once

#include <ZR/zr.h>

#include <chrono>
#include <optional>

namespace zr::tool {

// Runs from its making to the first stop.
class Stopwatch {
 public:
  void stop() {
    if (!stopped_) stopped_ = Clock::now();
  }
  f64 seconds() const { return std::chrono::duration<f64>(stopped_.value_or(Clock::now()) - begun_).count(); }

 private:
  using Clock = std::chrono::steady_clock;
  Clock::time_point begun_ = Clock::now();
  std::optional<Clock::time_point> stopped_;
};

}  // namespace zr::tool
