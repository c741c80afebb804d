// The `mask` of a layer as a scene file tells it.
#pragma once

#include "mask_shapes.h"
#include "scene_node.h"

namespace zr::tool {

std::vector<MaskShape> read_mask(const SceneNode& node);

}  // namespace zr::tool
