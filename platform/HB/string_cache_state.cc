// Texts of message tables with their markers resolved, kept for the life of the process.
#include <HB/hb.h>

#include <mutex>
#include <string>
#include <string_view>
#include <unordered_map>

namespace {

constexpr std::string_view apostrophe_marker = "#{rsquo}";
constexpr std::string_view apostrophe = "\xE2\x80\x99";  // U+2019

// By the text as it stands in its table, so that equal texts share an entry. A node never moves, and the
// whole is never destroyed: a message may be shown while the process ends.
struct Cache {
  std::mutex lock;
  std::unordered_map<std::string_view, std::string> resolved;
};
Cache& cache() {
  static auto* const instance = new Cache;
  return *instance;
}

}  // namespace

const char* HB_ZLookupLStrCache(const HB_StringTable* table, i32 index, i32, i32) {
  if (table == nullptr || table->strings == nullptr || index < 0 || index >= table->count) return nullptr;
  if (table->strings[index] == nullptr) return nullptr;
  std::string_view text = table->strings[index];
  if (const auto equals = text.find('='); equals != text.npos) text.remove_prefix(equals + 1);
  if (text.find(apostrophe_marker) == text.npos) return text.data();  // the table's own text serves
  try {
    const std::lock_guard hold(cache().lock);
    const auto [entry, added] = cache().resolved.try_emplace(text, text);
    if (added) {
      std::string& made = entry->second;
      for (auto at = made.find(apostrophe_marker); at != made.npos; at = made.find(apostrophe_marker, at))
        made.replace(at, apostrophe_marker.size(), apostrophe);
    }
    return entry->second.c_str();
  } catch (const std::exception&) {
    return text.data();  // memory is short: better the marker than no message
  }
}
