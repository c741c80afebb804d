// Depths and sizes of pictures as people write them.
#include "depths.h"

#include <charconv>
#include <cstdio>

#include "tool_error.h"

namespace zr::tool {

const char* depth_name(i32 depth) { return depth == 8 ? "8" : depth == 16 ? "16" : "float"; }

i32 parse_depth(const std::string& text, const std::string& where) {
  for (const i32 depth : {8, 16, 32})
    if (text == depth_name(depth)) return depth;
  throw bad_input(where + " is \"" + text + "\"; it must be 8, 16 or float");
}

void parse_size(const std::string& text, const std::string& where, i32& width, i32& height) {
  const char *begin = text.data(), *const end = begin + text.size();
  const auto [cross, first] = std::from_chars(begin, end, width);
  const bool crossed = first == std::errc() && cross != end && *cross == 'x';
  const auto [stop, second] = std::from_chars(crossed ? cross + 1 : end, end, height);
  const auto fits = [](i32 side) { return side >= 1 && side <= kLargestSide; };
  if (!crossed || second != std::errc() || stop != end || !fits(width) || !fits(height))
    throw bad_input(where + " is \"" + text + "\"; it must be WIDTHxHEIGHT, each 1 to " + std::to_string(kLargestSide));
}

std::string bytes_text(u64 bytes) {
  static constexpr const char* kUnits[] = {"B", "KiB", "MiB", "GiB", "TiB"};
  f64 value = static_cast<f64>(bytes);
  size_t unit = 0;
  while (value >= 1024.0 && unit + 1 < std::size(kUnits)) value /= 1024.0, ++unit;
  char text[32];
  std::snprintf(text, sizeof text, unit == 0 || value >= 100.0 ? "%.0f %s" : "%.1f %s", value, kUnits[unit]);
  return text;
}

}  // namespace zr::tool
