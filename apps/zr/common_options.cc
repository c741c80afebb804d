// Options that several verbs share, told once.
#include "common_options.h"

#include <unistd.h>

#include <cmath>

#include "nearest_name.h"
#include "tool_error.h"

namespace zr::tool {

u64 machine_memory() {
  const long pages = sysconf(_SC_PHYS_PAGES), page = sysconf(_SC_PAGESIZE);
  return pages > 0 && page > 0 ? static_cast<u64>(pages) * static_cast<u64>(page) : u64{1} << 32;
}

u64 parse_memory(const std::string& text, const std::string& option) {
  static const std::string kUnits = "bkmgt";
  const size_t letters = text.find_first_not_of("0123456789.");
  const std::string number = text.substr(0, letters);
  std::string unit = letters == std::string::npos ? "b" : plain_name(text.substr(letters));
  if (unit.size() > 1 && unit.back() == 'b') unit.pop_back();
  if (unit.size() == 2 && unit.back() == 'i') unit.pop_back();
  const size_t power = unit.size() == 1 ? kUnits.find(unit) : std::string::npos;
  char* end = nullptr;
  const f64 bytes = power == std::string::npos ? 0.0 : std::strtod(number.c_str(), &end) * std::pow(1024.0, power);
  if (number.empty() || end == nullptr || *end != '\0' || !(bytes >= 1.0 && bytes <= 0x1p60))
    throw bad_input(option + " is \"" + text + "\"; it must be a size such as 512M or 2G, 1 byte to 1 EiB");
  return static_cast<u64>(bytes);
}

}  // namespace zr::tool
