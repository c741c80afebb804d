// The `mask` of a layer as a scene file tells it.
#include "scene_mask.h"

#include "nearest_name.h"
#include "scene_keys.h"

namespace zr::tool {
namespace {

f64 read_place(const SceneNode& node) { return node.number(-kFarthestPoint, kFarthestPoint); }

void read_box(const SceneNode& node, MaskShape& shape) {
  node.require_array(4, "[x, y, width, height] in pixels of the layer");
  shape.x = read_place(node.at(size_t{0}));
  shape.y = read_place(node.at(1));
  shape.width = read_place(node.at(2));
  shape.height = read_place(node.at(3));
  if (const auto wrong = wrong_with_box(shape.width, shape.height)) node.fail(*wrong);
}

void read_points(const SceneNode& node, MaskShape& shape) {
  if (!node.json().is_array() || node.size() < 3 || node.size() > kMostPoints)
    node.refuse("a list of 3 to " + std::to_string(kMostPoints) + " points [x, y]");
  for (size_t i = 0; i < node.size(); ++i) {
    const SceneNode point = node.at(i);
    point.require_array(2, "[x, y] in pixels of the layer");
    shape.points.push_back({read_place(point.at(size_t{0})), read_place(point.at(1))});
  }
}

MaskShape read_shape(const SceneNode& node) {
  if (!node.json().is_object()) node.refuse("an object such as { \"shape\": \"ellipse\", \"box\": [0, 0, 90, 60] }");
  const std::vector<std::string> names(std::begin(kShapeNames), std::end(kShapeNames));
  if (!node.has("shape")) node.fail("lacks \"shape\", which is " + quoted_list(names));
  MaskShape shape;
  shape.kind = static_cast<MaskShape::Kind>(node.at("shape").one_of(names));
  const bool polygon = shape.kind == MaskShape::Kind::kPolygon;
  const char* const place = polygon ? "points" : "box";
  std::vector<std::string> keys = key_names(kMaskKeys);
  std::erase(keys, polygon ? "box" : "points");
  node.require_keys(keys, name_of(shape.kind));
  if (!node.has(place)) node.fail(std::string("(") + name_of(shape.kind) + ") lacks \"" + place + '"');
  if (polygon)
    read_points(node.at(place), shape);
  else
    read_box(node.at(place), shape);
  if (node.has("feather")) shape.feather = node.at("feather").number(0, kWidestFeather);
  if (node.has("opacity")) shape.opacity = node.at("opacity").number(0, 1);
  if (node.has("mode")) {
    const std::string name = node.at("mode").string("the name of a mask mode, such as \"subtract\"");
    const auto mode = find_mask_mode(name);
    if (!mode) node.at("mode").fail(unknown_mask_mode(name));
    shape.mode = *mode;
  }
  return shape;
}

}  // namespace

std::vector<MaskShape> read_mask(const SceneNode& node) {
  if (!node.json().is_array() || node.size() == 0 || node.size() > kMostShapes)
    node.refuse("a list of 1 to " + std::to_string(kMostShapes) + " shapes, in the order they are drawn");
  std::vector<MaskShape> shapes;
  for (size_t i = 0; i < node.size(); ++i) shapes.push_back(read_shape(node.at(i)));
  return shapes;
}

}  // namespace zr::tool
