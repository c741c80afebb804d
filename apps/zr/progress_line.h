// How far a run is: a line that rewrites itself on a terminal, or one JSON object a frame.
#pragma once

#include <ZR/zr.h>

#include <chrono>
#include <cstdio>
#include <string>

namespace zr::tool {

enum class ProgressMode {
  kAuto,  // a line on stderr if that is a terminal
  kJson,  // one object a line on stdout
  kOff,
};

// "0.8 s", "42 s", "3 min 05 s", "2 h 10 min"
std::string duration_text(f64 seconds);
// What is left after `done` of `total` took `seconds`.
f64 seconds_left(f64 seconds, i32 done, i32 total);
// {"frame":1,"done":1,"total":48,"file":"...","seconds":0.05,"seconds_left":2.35}
std::string progress_json(i32 frame, i32 done, i32 total, const std::string& file, f64 seconds);

class ProgressLine {
 public:
  ProgressLine(ProgressMode mode, i32 total);
  ~ProgressLine() { wipe(); }
  ProgressLine(const ProgressLine&) = delete;
  ProgressLine& operator=(const ProgressLine&) = delete;
  // Before the first frame.
  void say(const std::string& text);
  void frame_done(i32 frame, const std::string& file);
  void wipe();

 private:
  using Clock = std::chrono::steady_clock;
  bool line_, json_;
  i32 total_, done_ = 0;
  Clock::time_point begun_ = Clock::now(), shown_{};
};

}  // namespace zr::tool
