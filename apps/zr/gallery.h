// One labelled picture of every transfer mode, made by the modes themselves.
#pragma once

#include "owned_world.h"

namespace zr::tool {

// `base` and `layer` are float worlds of any size. The base fills the left of each cell and the layer
// its right, each with a soft edge, so that a cell shows either alone and both together.
OwnedWorld draw_gallery(const OwnedWorld& base, const OwnedWorld& layer);
// Bytes that the drawing takes besides the two pictures.
u64 gallery_bytes();

}  // namespace zr::tool
