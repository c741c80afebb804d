// The answers that `zr verify` expects: lines of `operation depth hash`.
#pragma once

#include <ZR/zr.h>

#include <map>
#include <string>
#include <string_view>
#include <utility>

namespace zr::tool {

// Hash by operation and depth (8, 16, 32), in the order of lines.
using Manifest = std::map<std::pair<std::string, i32>, std::string>;

// The one that was in the repository when this program was built.
std::string_view embedded_manifest();
// Empty lines and lines that begin with '#' do not count. Throws ToolError that names `file` and line.
Manifest parse_manifest(std::string_view text, const std::string& file);
Manifest load_manifest(const std::string& file);
std::string manifest_text(const Manifest& manifest);

}  // namespace zr::tool
