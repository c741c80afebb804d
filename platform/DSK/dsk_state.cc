// The map from file extensions to file types.
#include <DSK/dsk.h>
#include <HB/allocator.h>

#include <algorithm>
#include <cstring>
#include <string_view>
#include <vector>

namespace {

struct Label {
  static constexpr const char* text = "file extension map";
};
struct Mapping {
  char extension[16];
  u32 type;
};
using Map = std::vector<Mapping, HB_Allocator<Mapping, Label>>;

// Written at birth and death, on the main thread; read by the module scan.
constinit Map extension_map;

bool same_extension(std::string_view a, std::string_view b) {
  const auto lower = [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; };
  return std::equal(a.begin(), a.end(), b.begin(), b.end(), [&](char x, char y) { return lower(x) == lower(y); });
}

u32 type_of_extension(std::string_view extension) {
  for (const Mapping& mapping : extension_map)
    if (same_extension(mapping.extension, extension)) return mapping.type;
  return 0;
}

}  // namespace

i32 DSK_AddExtensionMap(const char* extension, u32 type, i32) {
  Mapping added{{}, type};
  if (extension == nullptr || *extension == '\0' || std::strlen(extension) >= sizeof added.extension)
    return ZR_Err_BadParam;
  if (type_of_extension(extension) != 0) return ZR_Err_None;
  std::strcpy(added.extension, extension);
  try {
    extension_map.push_back(added);
    return ZR_Err_None;
  } catch (const std::bad_alloc&) {
    return ZR_Err_OutOfMemory;  // told by the allocator
  }
}

u32 DSK_TypeOfPath(const char* path) {
  if (path == nullptr) return 0;
  std::string_view name = path;
  if (const auto slash = name.rfind('/'); slash != name.npos) name.remove_prefix(slash + 1);
  const auto dot = name.rfind('.');
  return dot == name.npos || dot == 0 ? 0 : type_of_extension(name.substr(dot));
}

void DSK_ClearExtensionMap() { Map().swap(extension_map); }
