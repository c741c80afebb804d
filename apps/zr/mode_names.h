// The transfer modes by the names that scenes and listings use.
#pragma once

#include <ZR/zr.h>

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace zr::tool {

struct ModeName {
  i32 number;
  std::string name;  // "soft-light"
  std::string kind;  // how alpha enters: "grey ground"
};

const std::vector<ModeName>& all_modes();  // by number
// Letter case, '-', '_' and ' ' do not count.
std::optional<i32> find_mode(std::string_view name);
// The nearest names, for an unknown one; names of other programs are understood here.
std::vector<std::string> suggest_modes(std::string_view unknown);

}  // namespace zr::tool
