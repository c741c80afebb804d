// The answers that `zr verify` expects.
#include "verify/manifest.h"

#include <fstream>
#include <sstream>

#include "depths.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

constexpr const char* kHead =
    "# What every operation answers to the inputs of `zr verify`, on every processor and any number of threads.\n"
    "# Written by `zr verify --write`; a line changes only together with the result that it stands for.\n";

bool is_hash(const std::string& text) {
  return text.size() == 32 && text.find_first_not_of("0123456789abcdef") == std::string::npos;
}

i32 depth_of(const std::string& text) {
  for (const i32 depth : {8, 16, 32})
    if (text == depth_name(depth)) return depth;
  return 0;
}

}  // namespace

Manifest parse_manifest(std::string_view text, const std::string& file) {
  Manifest manifest;
  std::istringstream lines{std::string(text)};
  std::string line;
  for (int number = 1; std::getline(lines, line); ++number) {
    if (line.empty() || line[0] == '#') continue;
    std::istringstream words(line);
    std::string operation, depth, hash, more;
    words >> operation >> depth >> hash;
    const auto where = [&] { return file + ", line " + std::to_string(number) + ": "; };
    if (depth_of(depth) == 0 || !is_hash(hash) || words >> more)
      throw bad_input(where() + "not an operation, a depth (8, 16, float) and a hash of 32 hexadecimal digits");
    if (!manifest.emplace(std::pair(operation, depth_of(depth)), hash).second)
      throw bad_input(where() + operation + ' ' + depth + " stands there twice");
  }
  return manifest;
}

Manifest load_manifest(const std::string& file) {
  std::ifstream stream(file, std::ios::binary);
  std::ostringstream text;
  if (!stream || !(text << stream.rdbuf())) throw file_error("manifest " + file + " cannot be read");
  return parse_manifest(text.str(), file);
}

std::string manifest_text(const Manifest& manifest) {
  std::string text = kHead;
  for (const auto& [key, hash] : manifest) text += key.first + ' ' + depth_name(key.second) + ' ' + hash + '\n';
  return text;
}

}  // namespace zr::tool
