// How far a run is: a line that rewrites itself on a terminal, or one JSON object a frame.
#include "progress_line.h"

#include <unistd.h>

#include <cmath>
#include <nlohmann/json.hpp>

namespace zr::tool {

std::string duration_text(f64 seconds) {
  char text[64];
  const i64 whole = std::llround(seconds);
  if (seconds < 9.95)
    std::snprintf(text, sizeof text, "%.1f s", seconds);
  else if (whole < 60)
    std::snprintf(text, sizeof text, "%d s", static_cast<int>(whole));
  else if (whole < 3600)
    std::snprintf(text, sizeof text, "%d min %02d s", static_cast<int>(whole / 60), static_cast<int>(whole % 60));
  else
    std::snprintf(text, sizeof text, "%lld h %02d min", static_cast<long long>(whole / 3600),
                  static_cast<int>(whole / 60 % 60));
  return text;
}

f64 seconds_left(f64 seconds, i32 done, i32 total) {
  return done > 0 ? seconds / static_cast<f64>(done) * static_cast<f64>(total - done) : 0.0;
}

std::string progress_json(i32 frame, i32 done, i32 total, const std::string& file, f64 seconds) {
  const auto milliseconds = [](f64 value) { return std::round(value * 1000.0) / 1000.0; };
  nlohmann::ordered_json line;
  line["frame"] = frame;
  line["done"] = done;
  line["total"] = total;
  line["file"] = file;
  line["seconds"] = milliseconds(seconds);
  line["seconds_left"] = milliseconds(seconds_left(seconds, done, total));
  return line.dump(-1, ' ', false, nlohmann::json::error_handler_t::replace);
}

ProgressLine::ProgressLine(ProgressMode mode, i32 total)
    : line_(mode == ProgressMode::kAuto && isatty(STDERR_FILENO) == 1),
      json_(mode == ProgressMode::kJson),
      total_(total) {}

void ProgressLine::wipe() {
  if (line_) std::fputs("\r\033[K", stderr);
}

void ProgressLine::say(const std::string& text) {
  if (line_) std::fprintf(stderr, "\r\033[K%s", text.c_str());
}

void ProgressLine::frame_done(i32 frame, const std::string& file) {
  ++done_;
  const Clock::time_point now = Clock::now();
  const f64 seconds = std::chrono::duration<f64>(now - begun_).count();
  if (json_) {
    std::puts(progress_json(frame, done_, total_, file, seconds).c_str());
    std::fflush(stdout);
  }
  // Ten times a second is as fast as anybody reads.
  if (line_ && (now - shown_ >= std::chrono::milliseconds(100) || done_ == total_)) {
    shown_ = now;
    say("frame " + std::to_string(frame) + ": " + std::to_string(done_) + " of " + std::to_string(total_) + " (" +
        std::to_string(static_cast<i64>(done_) * 100 / total_) + " %), " +
        duration_text(seconds_left(seconds, done_, total_)) + " left");
  }
}

}  // namespace zr::tool
