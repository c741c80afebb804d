// Reading a scene file: JSON into a Scene, with every value checked.
#include "scene.h"

#include <filesystem>
#include <fstream>
#include <set>

#include "mode_names.h"
#include "nearest_name.h"
#include "scene_effects.h"
#include "scene_keys.h"
#include "scene_mask.h"
#include "scene_node.h"
#include "scene_values.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

const std::vector<std::string> kFields = {"all", "even", "odd"};
const std::vector<std::string> kRenderFields = {"none", "upper", "lower"};
const std::vector<std::string> kMatteKinds = {"alpha", "inverted-alpha", "luma", "inverted-luma"};

f64 read_opacity(const SceneNode& node) { return node.number(0, 1); }

void read_size(const SceneNode& node, i32& width, i32& height) {
  node.require_array(2, "[width, height], each 1 to " + std::to_string(kLargestSide) + " pixels");
  width = node.at(size_t{0}).integer(1, kLargestSide);
  height = node.at(1).integer(1, kLargestSide);
}

std::string read_image_path(const SceneNode& node, const std::string& scene_file) {
  const std::filesystem::path path = node.string("the name of an image file");
  if (path.is_absolute()) return path.string();
  return (std::filesystem::path(scene_file).parent_path() / path).lexically_normal().string();
}

SpaceChoice read_space(const SceneNode& node, const std::string& scene_file) {
  const std::string text = node.string("the name of a colour space, such as \"display-p3\", or an ICC file");
  std::optional<SpaceChoice> space = find_space(text);
  if (!space) node.fail(unknown_space(text));
  if (space->named == nullptr) space->file = read_image_path(node, scene_file);
  return *space;
}

i32 read_mode(const SceneNode& node) {
  const std::string name = node.string("the name of a transfer mode, such as \"screen\"; see zr list modes");
  const std::optional<i32> mode = find_mode(name);
  if (!mode) {
    const std::vector<std::string> nearest = suggest_modes(name);
    node.fail("is an unknown transfer mode " + quoted_list({name.substr(0, 60)}) + "; the nearest " +
              (nearest.size() == 1 ? "is " : "are ") + quoted_list(nearest, " and ") + " (zr list modes shows all)");
  }
  return *mode;
}

std::vector<std::string> joined(std::vector<std::string> names, const std::vector<std::string>& more) {
  names.insert(names.end(), more.begin(), more.end());
  return names;
}

TrackMatte read_matte(const SceneNode& node, const Scene& scene) {
  node.require_keys(joined(key_names(kMatteKeys), key_names(kPlacementKeys)));
  if (!node.has("image")) node.fail("lacks \"image\"");
  TrackMatte matte;
  matte.image = read_image_path(node.at("image"), scene.file);
  if (node.has("kind")) matte.kind = static_cast<u32>(node.at("kind").one_of(kMatteKinds));
  matte.placement = read_placement(node, scene.placement);
  return matte;
}

Layer read_layer(const SceneNode& node, const Scene& scene) {
  node.require_keys(joined(key_names(kLayerKeys), key_names(kPlacementKeys)));
  Layer layer;
  layer.place = node.path();
  if (node.has("image") == node.has("colour")) node.fail("must have either \"image\" or \"colour\"");
  if (node.has("image")) {
    if (node.has("size")) node.at("size").fail("is for solids; an image has its own size");
    layer.image = read_image_path(node.at("image"), scene.file);
  } else {
    layer.colour = read_colour(node.at("colour"));
    layer.width = scene.width;
    layer.height = scene.height;
    if (node.has("size")) read_size(node.at("size"), layer.width, layer.height);
  }
  if (node.has("name")) node.at("name").string("a text");
  if (node.has("mask")) layer.mask = read_mask(node.at("mask"));
  if (node.has("effects")) layer.effects = read_effects(node.at("effects"));
  layer.placement = read_placement(node, scene.placement);
  if (node.has("opacity")) layer.opacity = read_keyed(node.at("opacity"), &read_opacity);
  if (node.has("mode")) layer.mode = read_mode(node.at("mode"));
  if (node.has("keep_alpha")) layer.keep_alpha = node.at("keep_alpha").boolean();
  if (node.has("field")) layer.field = static_cast<i32>(node.at("field").one_of(kFields));
  if (node.has("seed")) layer.seed = node.at("seed").integer(INT32_MIN, INT32_MAX);
  if (node.has("matte")) layer.matte = read_matte(node.at("matte"), scene);
  return layer;
}

FrameRange read_frames(const SceneNode& node) {
  if (node.json().is_string()) {
    try {
      return parse_frame_range(node.json().get<std::string>(), "");
    } catch (const ToolError& error) {
      node.fail(std::string(error.what()).substr(1));
    }
  }
  node.require_array(2, "[first, last] or \"first-last\"");
  const FrameRange frames{node.at(size_t{0}).integer(0, kLastFrame), node.at(1).integer(0, kLastFrame)};
  if (frames.first > frames.last) node.fail("runs backwards; the first frame comes first");
  return frames;
}

[[noreturn]] void fail_in_text(const SceneText& source, size_t byte, const std::string& what) {
  const TextPlace place = place_of_byte(source.text, byte);
  throw bad_input(source.file + ':' + std::to_string(place.line) + ':' + std::to_string(place.column) + ": " + what);
}

nlohmann::json parse_json(const SceneText& source) {
  // A key that stands twice would silently lose its first value.
  std::vector<std::set<std::string>> open;
  std::optional<std::string> twice;
  const auto watch = [&](int, nlohmann::json::parse_event_t event, nlohmann::json& parsed) {
    using Event = nlohmann::json::parse_event_t;
    if (event == Event::object_start) open.emplace_back();
    if (event == Event::object_end && !open.empty()) open.pop_back();
    if (event == Event::key && !open.empty() && !open.back().insert(parsed.get<std::string>()).second && !twice)
      twice = parsed.get<std::string>();
    return true;
  };
  try {
    nlohmann::json json = nlohmann::json::parse(source.text, watch);
    if (twice) throw bad_input(source.file + ": the key " + quoted_list({*twice}) + " stands twice in one object");
    return json;
  } catch (const nlohmann::json::parse_error& error) {
    // What follows "column N: " in the parser's text is the part for people.
    std::string what = error.what();
    const size_t column = what.find("column ");
    const size_t begin = column == std::string::npos ? std::string::npos : what.find(": ", column);
    if (begin != std::string::npos) what = what.substr(begin + 2);
    fail_in_text(source, error.byte > 0 ? error.byte - 1 : 0, "not valid JSON: " + what);
  } catch (const nlohmann::json::out_of_range& error) {
    const std::string what = error.what();
    const size_t quote = what.find('\'');
    const std::string number = quote == std::string::npos ? "" : what.substr(quote + 1, what.rfind('\'') - quote - 1);
    const size_t byte = source.text.find(number);
    fail_in_text(source, byte == std::string::npos ? 0 : byte, "a number is too large: " + number.substr(0, 60));
  }
}

}  // namespace

Scene parse_scene(const std::string& text, const std::string& file) {
  const SceneText source{file, text};
  const nlohmann::json json = parse_json(source);
  const SceneNode top(source, json, {});
  top.require_keys(key_names(kSceneKeys));
  Scene scene;
  scene.file = file;
  if (!top.has("size")) top.fail("lacks \"size\": [width, height]");
  read_size(top.at("size"), scene.width, scene.height);
  if (top.has("background")) scene.background = read_colour(top.at("background"));
  if (top.has("frames")) scene.frames = read_frames(top.at("frames"));
  if (top.has("depth")) {
    const SceneNode depth = top.at("depth");
    const std::string name = depth.json().is_string() ? depth.json().get<std::string>() : depth.json().dump();
    if (name != "8" && name != "16" && name != "float") depth.refuse("8, 16 or \"float\"");
    scene.depth = parse_depth(name, "");
  }
  if (top.has("working_space")) scene.working_space = read_space(top.at("working_space"), file);
  if (top.has("output_space")) {
    if (!scene.working_space) top.at("output_space").fail("needs \"working_space\" beside it");
    scene.output_space = read_space(top.at("output_space"), file);
  }
  if (top.has("linear_light")) scene.linear_light = top.at("linear_light").boolean();
  if (top.has("field")) scene.field = static_cast<i32>(top.at("field").one_of(kRenderFields));
  if (top.has("quality")) scene.placement.quality = read_quality(top.at("quality"));
  if (top.has("motion_blur")) scene.placement.motion_blur = read_motion_blur(top.at("motion_blur"), {});
  if (!top.has("layers")) top.fail("lacks \"layers\": [ ... ], from bottom to top");
  const SceneNode layers = top.at("layers");
  if (!layers.json().is_array()) layers.refuse("a list [ ... ] of layers, from bottom to top");
  for (size_t i = 0; i < layers.size(); ++i) scene.layers.push_back(read_layer(layers.at(i), scene));
  return scene;
}

Scene read_scene(const std::string& file) {
  std::error_code error;
  if (!std::filesystem::exists(file, error)) throw file_error("scene file " + file + " does not exist");
  if (std::filesystem::is_directory(file, error)) throw file_error("scene file " + file + " is a folder");
  std::ifstream stream(file, std::ios::binary);
  std::string text((std::istreambuf_iterator<char>(stream)), std::istreambuf_iterator<char>());
  if (!stream) throw file_error("scene file " + file + " cannot be read");
  return parse_scene(text, file);
}

}  // namespace zr::tool
