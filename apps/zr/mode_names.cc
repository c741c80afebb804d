// The transfer modes by the names that scenes and listings use.
#include "mode_names.h"

#include <ZR/transfer_mode.h>

#include "nearest_name.h"

namespace zr::tool {
namespace {

// What people call the ordinary modes elsewhere.
struct OtherName {
  const char* other;
  const char* name;
};
constexpr OtherName kOtherNames[] = {
    {"normal", "in-front"},
    {"over", "in-front"},
    {"source-over", "in-front"},
    {"alpha-over", "in-front"},
    {"under", "behind"},
    {"replace", "copy"},
    {"plus", "add"},
    {"lighter", "add"},
    {"min", "darken"},
    {"max", "lighten"},
    {"linear-add", "linear-dodge"},
    {"minus", "subtract"},
    {"luminance", "luminosity"},
    {"silhouette", "multiply-not-alpha"},
    {"stencil", "multiply-alpha"},
};

}  // namespace

const std::vector<ModeName>& all_modes() {
  static const std::vector<ModeName> modes = [] {
    i32 count = 0;
    const ZR_TransferModeInfo* const list = ZR_ListTransferModes(&count);
    std::vector<ModeName> names;
    for (i32 i = 0; i < count; ++i) names.push_back({list[i].mode, list[i].short_name, list[i].kind});
    return names;
  }();
  return modes;
}

std::optional<i32> find_mode(std::string_view name) {
  i32 mode = 0;
  if (!ZR_FindTransferMode(name, &mode)) return std::nullopt;
  return mode;
}

std::vector<std::string> suggest_modes(std::string_view unknown) {
  const std::string plain = plain_name(unknown);
  for (const OtherName& known : kOtherNames)
    if (plain == known.other) return {known.name};
  std::vector<std::string> names;
  for (const ModeName& mode : all_modes()) names.push_back(mode.name);
  return nearest_names(unknown, names);
}

}  // namespace zr::tool
