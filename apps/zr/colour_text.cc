// Colours as people write them: "#rrggbb" or "#rrggbbaa".
#include "colour_text.h"

namespace zr::tool {

std::optional<ZR_PixelFloat> parse_colour(const std::string& text) {
  const bool valid = (text.size() == 7 || text.size() == 9) && text[0] == '#' &&
                     text.find_first_not_of("0123456789abcdefABCDEF", 1) == std::string::npos;
  if (!valid) return std::nullopt;
  const auto channel = [&](size_t at) {
    return static_cast<f32>(static_cast<f64>(std::stoi(text.substr(at, 2), nullptr, 16)) / 255.0);
  };
  return ZR_PixelFloat{text.size() == 9 ? channel(7) : 1.0f, channel(1), channel(3), channel(5)};
}

}  // namespace zr::tool
