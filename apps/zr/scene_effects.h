// The `effects` of a layer as a scene file tells them.
#pragma once

#include "effects.h"
#include "scene_node.h"

namespace zr::tool {

// A list of objects, each with "effect": its name, and keys of its own.
std::vector<Effect> read_effects(const SceneNode& node);

}  // namespace zr::tool
