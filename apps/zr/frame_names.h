// Frame ranges ("1-48") and the file names of frames ("out/frame.####.png").
#pragma once

#include <ZR/zr.h>

#include <string>

namespace zr::tool {

inline constexpr i32 kLastFrame = 9999999;

struct FrameRange {
  i32 first = 1, last = 1;  // both inclusive, 0..kLastFrame
  i32 count() const { return last - first + 1; }
};

// "7" or "1-48". `where` begins the message when the text is no range.
FrameRange parse_frame_range(const std::string& text, const std::string& where);

// A file name with at most one place for the frame number: a run of '#' as wide as the padding, or
// "%d" or "%04d". Numbers that need more digits than the place has take them.
class FrameNames {
 public:
  explicit FrameNames(const std::string& pattern);
  bool numbered() const { return digits_ >= 0; }
  std::string name(i32 frame) const;
  // Throws when several frames would get one name.
  void require_for(const FrameRange& frames) const;

 private:
  std::string before_, after_;
  int digits_ = -1;  // padding; -1: no number in the name
};

}  // namespace zr::tool
