// Depths and sizes of pictures as people write them.
#include "depths.h"

#include <cstdio>

#include "tool_error.h"

namespace zr::tool {

const char* depth_name(i32 depth) { return depth == 8 ? "8" : depth == 16 ? "16" : "float"; }

i32 parse_depth(const std::string& text, const std::string& where) {
  for (const i32 depth : {8, 16, 32})
    if (text == depth_name(depth)) return depth;
  throw bad_input(where + " is \"" + text + "\"; it must be 8, 16 or float");
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
