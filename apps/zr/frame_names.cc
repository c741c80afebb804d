// Frame ranges ("1-48") and the file names of frames ("out/frame.####.png").
#include "frame_names.h"

#include <charconv>
#include <optional>

#include "tool_error.h"

namespace zr::tool {
namespace {

std::optional<i32> whole_number(std::string_view text) {
  i32 value = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
  if (error != std::errc() || end != text.data() + text.size() || value < 0 || value > kLastFrame) return std::nullopt;
  return value;
}

}  // namespace

FrameRange parse_frame_range(const std::string& text, const std::string& where) {
  const size_t dash = text.find('-');
  const std::optional<i32> first = whole_number(std::string_view(text).substr(0, dash));
  const std::optional<i32> last =
      dash == std::string::npos ? first : whole_number(std::string_view(text).substr(dash + 1));
  if (!first || !last)
    throw bad_input(where + " is \"" + text + "\"; it must be a frame or a range such as 1-48, numbers 0 to " +
                    std::to_string(kLastFrame));
  if (*first > *last)
    throw bad_input(where + " is \"" + text + "\", which runs backwards; the first frame comes first: " +
                    std::to_string(*last) + "-" + std::to_string(*first));
  return {*first, *last};
}

FrameNames::FrameNames(const std::string& pattern) : before_(pattern) {
  const size_t folder = pattern.rfind('/');
  const size_t name = folder == std::string::npos ? 0 : folder + 1;
  if (pattern.find_first_of("#%") < name)
    throw bad_input("output \"" + pattern + "\": the frame number belongs in the file name, not in the folder");
  size_t begin = pattern.find('#', name), end = begin;
  if (begin != std::string::npos) {
    end = pattern.find_first_not_of('#', begin);
    if (end == std::string::npos) end = pattern.size();
    digits_ = static_cast<int>(end - begin);
  } else if (begin = pattern.find('%', name); begin != std::string::npos) {
    end = pattern.find_first_not_of("0123456789", begin + 1);
    const std::string width = end == std::string::npos ? "" : pattern.substr(begin + 1, end - begin - 1);
    const bool valid = end != std::string::npos && pattern[end] == 'd' &&
                       (width.empty() || (width.size() == 2 && width[0] == '0' && width[1] != '0'));
    if (!valid) throw bad_input("output \"" + pattern + "\": a frame number is written %d or %04d (or ####)");
    digits_ = width.empty() ? 0 : width[1] - '0';
    ++end;
  } else {
    return;
  }
  before_ = pattern.substr(0, begin);
  after_ = pattern.substr(end);
  if (after_.find_first_of("#%") != std::string::npos)
    throw bad_input("output \"" + pattern + "\" has more than one place for the frame number");
}

std::string FrameNames::name(i32 frame) const {
  if (!numbered()) return before_;
  const std::string number = std::to_string(frame);
  const size_t width = static_cast<size_t>(digits_);
  return before_ + std::string(number.size() < width ? width - number.size() : 0, '0') + number + after_;
}

void FrameNames::require_for(const FrameRange& frames) const {
  if (numbered() || frames.count() == 1) return;
  const size_t dot = before_.rfind('.');
  throw bad_input("output \"" + before_ + "\" has no place for the numbers of " + std::to_string(frames.count()) +
                  " frames; write #### there, as in \"" + before_.substr(0, dot) + ".####" +
                  (dot == std::string::npos ? "" : before_.substr(dot)) + "\"");
}

}  // namespace zr::tool
