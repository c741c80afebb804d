// A picture made to fit a frame: scaled by area means, the overhang cut off evenly.
#pragma once

#include "owned_world.h"

namespace zr::tool {

// `picture` is a float world; the result is 8-bit. Colours are weighted by alpha.
OwnedWorld fit_image(const OwnedWorld& picture, i32 width, i32 height);

}  // namespace zr::tool
