// Small labels on 8-bit worlds, with letters of our own: no font files are needed.
#pragma once

#include <string_view>

#include "owned_world.h"

namespace zr::tool {

// Lower-case letters, digits, Z, R, '-', '.' and space; anything else is left blank. `height` is that of
// a capital in pixels. Width that the text takes, in pixels.
i32 text_width(std::string_view text, i32 height);
// The capitals' left top corner at (x, y); what falls outside of the world is cut off.
void draw_text(OwnedWorld& world, std::string_view text, i32 x, i32 y, i32 height, const ZR_Pixel8& colour);

}  // namespace zr::tool
