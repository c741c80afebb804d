// Colours as people write them: "#rrggbb" or "#rrggbbaa".
#pragma once

#include <ZR/zr.h>

#include <optional>
#include <string>

namespace zr::tool {

// Empty for anything else. Straight, alpha 1 where it is not given.
std::optional<ZR_PixelFloat> parse_colour(const std::string& text);

}  // namespace zr::tool
