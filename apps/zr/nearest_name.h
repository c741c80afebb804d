// "Did you mean": the names that are nearest to a mistyped one.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace zr::tool {

// Up to `most` names, best first; never empty unless `names` is. Letter case, '_' and ' ' for '-' do
// not count. A name that contains the word, or is contained in it, is near.
std::vector<std::string> nearest_names(std::string_view word, const std::vector<std::string>& names, size_t most = 3);

// `"a"`, `"a" or "b"`, `"a", "b" or "c"`.
std::string quoted_list(const std::vector<std::string>& names, const char* last_joint = " or ");

// Lower case, with '-' for '_' and ' '.
std::string plain_name(std::string_view name);

}  // namespace zr::tool
