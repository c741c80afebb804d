// Values of a scene file that several keys share: points, colours, keyframes, placements.
#include "scene_values.h"

#include <cmath>

#include "colour_text.h"

namespace zr::tool {
namespace {

constexpr i32 kMostSamples = 1024;

// A number for both axes, or two.
Point read_scale(const SceneNode& node) {
  if (node.json().is_array()) {
    node.require_array(2, "a number or [x, y]; 1 is the picture's own size");
    return {node.at(size_t{0}).number(-kLargestScale, kLargestScale), node.at(1).number(-kLargestScale, kLargestScale)};
  }
  const f64 both = node.number(-kLargestScale, kLargestScale);
  return {both, both};
}

// A number leans upright edges.
Point read_skew(const SceneNode& node) {
  if (node.json().is_array()) {
    node.require_array(2, "a number or [x, y] in degrees");
    return {node.at(size_t{0}).number(-kLargestSkew, kLargestSkew), node.at(1).number(-kLargestSkew, kLargestSkew)};
  }
  return {node.number(-kLargestSkew, kLargestSkew), 0};
}

f64 read_rotation(const SceneNode& node) { return node.number(-kLargestRotation, kLargestRotation); }

// Rows are drawn along straight, even steps, so there is no perspective.
GX_Matrix3 read_matrix(const SceneNode& node) {
  node.require_array(9, "nine numbers, row by row: [a, b, x,  c, d, y,  0, 0, 1]");
  GX_Matrix3 matrix;
  for (size_t i = 0; i < 9; ++i) matrix.m[i / 3][i % 3] = node.at(i).number(-kFarthest, kFarthest);
  for (size_t i = 6; i < 9; ++i)
    if (matrix.m[2][i - 6] != (i == 8 ? 1.0 : 0.0))
      node.at(i).refuse(i == 8 ? "1: the last row is 0, 0, 1" : "0: the last row is 0, 0, 1");
  return matrix;
}

}  // namespace

Point read_point(const SceneNode& node) {
  node.require_array(2, "[x, y] in pixels");
  return {node.at(size_t{0}).number(-kFarthest, kFarthest), node.at(1).number(-kFarthest, kFarthest)};
}

ZR_PixelFloat read_colour(const SceneNode& node) {
  static const char* const expected =
      "[red, green, blue] or [red, green, blue, alpha], each 0 to 1, or \"#rrggbb[aa]\"";
  const nlohmann::json& json = node.json();
  if (json.is_string()) {
    const std::optional<ZR_PixelFloat> colour = parse_colour(json.get_ref<const std::string&>());
    if (!colour) node.refuse(expected);
    return *colour;
  }
  if (!json.is_array() || (json.size() != 3 && json.size() != 4)) node.refuse(expected);
  const auto channel = [&](size_t i) { return static_cast<f32>(node.at(i).number(0, 1)); };
  return {json.size() == 4 ? channel(3) : 1.0f, channel(0), channel(1), channel(2)};
}

i32 read_quality(const SceneNode& node) { return static_cast<i32>(node.one_of(quality_names())); }

std::optional<MotionBlur> read_motion_blur(const SceneNode& node, const MotionBlur& standard) {
  if (node.json().is_boolean()) return node.boolean() ? std::optional(standard) : std::nullopt;
  if (!node.json().is_object()) node.refuse("true, false or an object { ... }");
  node.require_keys(key_names(kMotionBlurKeys));
  MotionBlur blur = standard;
  if (node.has("shutter_angle")) blur.shutter_angle = node.at("shutter_angle").number(0, 720);
  if (node.has("shutter_phase")) blur.shutter_phase = node.at("shutter_phase").number(-360, 360);
  if (node.has("samples")) blur.samples = node.at("samples").integer(2, kMostSamples);
  return blur;
}

Placement read_placement(const SceneNode& node, const Placement& standard) {
  Placement placement = standard;
  if (node.has("matrix")) {
    for (const char* other : {"position", "anchor", "scale", "rotation", "skew"})
      if (node.has(other)) node.at(other).fail("cannot stand beside \"matrix\", which says it all");
    placement.matrix = read_keyed(node.at("matrix"), &read_matrix);
  }
  if (node.has("position")) placement.position = read_keyed(node.at("position"), &read_point);
  if (node.has("anchor")) placement.anchor = read_keyed(node.at("anchor"), &read_point);
  if (node.has("scale")) placement.scale = read_keyed(node.at("scale"), &read_scale);
  if (node.has("rotation")) placement.rotation = read_keyed(node.at("rotation"), &read_rotation);
  if (node.has("skew")) placement.skew = read_keyed(node.at("skew"), &read_skew);
  if (node.has("quality")) placement.quality = read_quality(node.at("quality"));
  if (node.has("motion_blur"))
    placement.motion_blur = read_motion_blur(node.at("motion_blur"), standard.motion_blur.value_or(MotionBlur{}));
  return placement;
}

}  // namespace zr::tool
