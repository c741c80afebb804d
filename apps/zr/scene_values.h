// Values of a scene file that several keys share: points, colours, keyframes, placements.
#pragma once

#include "frame_names.h"
#include "placement.h"
#include "scene_keys.h"
#include "scene_node.h"

namespace zr::tool {

Point read_point(const SceneNode& node);
ZR_PixelFloat read_colour(const SceneNode& node);
i32 read_quality(const SceneNode& node);
// true, false or an object; what an object leaves out is taken from `standard`.
std::optional<MotionBlur> read_motion_blur(const SceneNode& node, const MotionBlur& standard);

// What the keys of kPlacementKeys say of a layer or a matte; `standard` holds the scene's own quality and
// motion blur.
Placement read_placement(const SceneNode& node, const Placement& standard);

// A plain value, or a list of {"frame": ..., "value": ...}.
template <class Value>
Keyed<Value> read_keyed(const SceneNode& node, Value (*read)(const SceneNode&)) {
  const nlohmann::json& json = node.json();
  if (!json.is_array() || json.empty() || !json.front().is_object()) return Keyed<Value>(read(node));
  std::vector<typename Keyed<Value>::Key> keys;
  for (size_t i = 0; i < node.size(); ++i) {
    const SceneNode key = node.at(i);
    key.require_keys(key_names(kKeyframeKeys));
    for (const char* name : {"frame", "value"})
      if (!key.has(name)) key.fail(std::string("lacks \"") + name + "\"");
    const i32 frame = key.at("frame").integer(-kLastFrame, kLastFrame);
    if (!keys.empty() && frame <= keys.back().frame)
      key.at("frame").refuse("above the frame before it, " + std::to_string(keys.back().frame));
    keys.push_back({frame, read(key.at("value"))});
  }
  return Keyed<Value>(std::move(keys));
}

}  // namespace zr::tool
