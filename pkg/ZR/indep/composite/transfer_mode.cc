// Names of the transfer modes, taken from their enumerators, and the lookup by name.
#include <ZR/transfer_mode.h>

#include <algorithm>
#include <array>

#include "composite/transfer_modes-inl.h"

namespace zr {
namespace {

// The name of an enumerator, from how the compiler spells this function: "... mode = XferAdd...".
template <ZR_TransferMode mode>
constexpr std::string_view enumerator() {
  std::string_view text = __PRETTY_FUNCTION__;
  text.remove_prefix(text.find("mode = ") + 7);
  return text.substr(0, text.find_first_of(";]"));
}
static_assert(enumerator<XferInFront>() == "XferInFront");

constexpr std::string_view prefix = "Xfer";

constexpr bool is_capital(char c) { return c >= 'A' && c <= 'Z'; }
constexpr char lower(char c) { return is_capital(c) ? static_cast<char>(c - 'A' + 'a') : c; }

// Both forms of a name as texts with an ending zero; a word begins at a capital.
template <ZR_TransferMode mode>
struct Names {
  static constexpr std::string_view full = enumerator<mode>();
  static constexpr auto name = [] {
    std::array<char, full.size() + 1> text{};
    std::copy(full.begin(), full.end(), text.begin());
    return text;
  }();
  static constexpr auto short_name = [] {
    std::array<char, 2 * full.size()> text{};
    std::size_t end = 0;
    for (const char c : full.substr(prefix.size())) {
      if (is_capital(c) && end != 0) text[end++] = '-';
      text[end++] = lower(c);
    }
    return text;
  }();
};

constexpr const char* kind_name(ModeKind kind) {
  switch (kind) {
    case ModeKind::copy: return "copy";
    case ModeKind::over: return "over";
    case ModeKind::row_only: return "rows only";
    case ModeKind::black_ground: return "black ground";
    case ModeKind::white_ground: return "white ground";
    case ModeKind::grey_ground: return "grey ground";
    case ModeKind::weighted: return "weighted";
    case ModeKind::colour: return "colour";
    case ModeKind::alpha_only: return "alpha only";
    case ModeKind::special: return "special";
  }
  return "";
}

constexpr auto list = [] {
  std::array<ZR_TransferModeInfo, std::tuple_size_v<AllModes>> modes{};
  std::size_t i = 0;
  for_each_mode([&]<class Mode>() {
    using Name = Names<Mode::number>;
    modes[i++] = {Mode::number, Name::name.data(), Name::short_name.data(), kind_name(Mode::kind)};
  });
  return modes;
}();
static_assert(std::is_sorted(list.begin(), list.end(), [](const auto& a, const auto& b) { return a.mode < b.mode; }),
              "AllModes is in the order of the numbers");

// Whether `typed` spells `word`, which is in lower case, apart from case and separators.
bool spells(std::string_view typed, std::string_view word) {
  for (const char c : typed) {
    if (c == '-' || c == '_' || c == ' ') continue;
    if (word.empty() || lower(c) != word.front()) return false;
    word.remove_prefix(1);
    if (!word.empty() && word.front() == '-') word.remove_prefix(1);
  }
  return word.empty();
}

}  // namespace
}  // namespace zr

const ZR_TransferModeInfo* ZR_ListTransferModes(i32* count) {
  *count = static_cast<i32>(zr::list.size());
  return zr::list.data();
}

const char* ZR_TransferModeName(i32 mode) {
  for (const ZR_TransferModeInfo& info : zr::list)
    if (info.mode == mode) return info.name;
  return nullptr;
}

bool ZR_FindTransferMode(std::string_view name, i32* mode) {
  std::string_view rest = name;
  if (rest.size() > zr::prefix.size() && std::equal(zr::prefix.begin(), zr::prefix.end(), rest.begin(),
                                                    [](char a, char b) { return zr::lower(a) == zr::lower(b); }))
    rest.remove_prefix(zr::prefix.size());
  for (const ZR_TransferModeInfo& info : zr::list) {
    if (!zr::spells(rest, info.short_name)) continue;
    *mode = info.mode;
    return true;
  }
  return false;
}
