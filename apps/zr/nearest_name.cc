// "Did you mean": the names that are nearest to a mistyped one.
#include "nearest_name.h"

#include <algorithm>

namespace zr::tool {
namespace {

// Insertions, deletions, replacements and swaps of neighbours that turn a into b.
size_t edit_distance(std::string_view a, std::string_view b) {
  std::vector<std::vector<size_t>> cost(a.size() + 1, std::vector<size_t>(b.size() + 1));
  for (size_t i = 0; i <= a.size(); ++i) {
    for (size_t j = 0; j <= b.size(); ++j) {
      if (i == 0 || j == 0) {
        cost[i][j] = i + j;
        continue;
      }
      cost[i][j] =
          std::min({cost[i - 1][j] + 1, cost[i][j - 1] + 1, cost[i - 1][j - 1] + (a[i - 1] == b[j - 1] ? 0 : 1)});
      if (i > 1 && j > 1 && a[i - 1] == b[j - 2] && a[i - 2] == b[j - 1])
        cost[i][j] = std::min(cost[i][j], cost[i - 2][j - 2] + 1);
    }
  }
  return cost[a.size()][b.size()];
}

size_t distance(const std::string& word, const std::string& name) {
  const size_t edits = edit_distance(word, name);
  const bool contains = word.size() >= 3 && (name.find(word) != std::string::npos || word.find(name) == 0);
  return contains ? std::min<size_t>(edits, 2) : edits;
}

}  // namespace

std::string plain_name(std::string_view name) {
  std::string plain(name);
  for (char& c : plain) {
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
    if (c == '_' || c == ' ') c = '-';
  }
  return plain;
}

std::vector<std::string> nearest_names(std::string_view word, const std::vector<std::string>& names, size_t most) {
  // Nobody mistypes a name at this length, and the table grows with its square.
  const std::string plain = plain_name(word.substr(0, 64));
  std::vector<std::pair<size_t, const std::string*>> ranked;
  for (const std::string& name : names) ranked.emplace_back(distance(plain, plain_name(name)), &name);
  std::stable_sort(ranked.begin(), ranked.end(), [](const auto& a, const auto& b) { return a.first < b.first; });
  std::vector<std::string> nearest;
  for (const auto& [edits, name] : ranked) {
    const bool near = edits <= std::max<size_t>(2, plain.size() / 3) && edits <= ranked.front().first + 1;
    if (nearest.size() < most && (near || nearest.empty())) nearest.push_back(*name);
  }
  return nearest;
}

std::string quoted_list(const std::vector<std::string>& names, const char* last_joint) {
  std::string list;
  for (size_t i = 0; i < names.size(); ++i) {
    if (i > 0) list += i + 1 == names.size() ? last_joint : ", ";
    list += '"' + names[i] + '"';
  }
  return list;
}

}  // namespace zr::tool
