// The `effects` of a layer as a scene file tells them.
#include "scene_effects.h"

#include "nearest_name.h"
#include "scene_keys.h"
#include "scene_values.h"

namespace zr::tool {
namespace {

f64 read_radius(const SceneNode& node) { return node.number(0, kLargestRadius); }

bool read_flag(const SceneNode& node, const char* key, bool standard) {
  return node.has(key) ? node.at(key).boolean() : standard;
}

void require(const SceneNode& node, const char* key, const std::string& kind) {
  if (!node.has(key)) node.fail("(" + kind + ") lacks \"" + key + '"');
}

u32 read_channels(const SceneNode& node) {
  const std::optional<u32> channels =
      node.json().is_string() ? parse_channels(node.json().get_ref<const std::string&>()) : std::nullopt;
  if (!channels) node.refuse(kChannelsExpected);
  return *channels;
}

BlurEffect read_blur(const SceneNode& node) {
  require(node, "radius", "blur");
  BlurEffect effect;
  Blur& blur = effect.blur;
  effect.radius = read_keyed(node.at("radius"), &read_radius);
  if (node.has("shape")) blur.box = node.at("shape").one_of({"gaussian", "box"}) == 1;
  if (node.has("iterations")) {
    if (!blur.box) node.at("iterations").fail("is for the shape \"box\"");
    blur.iterations = node.at("iterations").integer(1, kMostIterations);
  }
  if (node.has("direction")) {
    const size_t direction = node.at("direction").one_of({"both", "horizontal", "vertical"});
    blur.rows = direction != 2;
    blur.columns = direction != 1;
  }
  if (node.has("channels")) blur.channels = read_channels(node.at("channels"));
  blur.keep_edges = read_flag(node, "keep_edges", false);
  blur.grow = read_flag(node, "grow", !blur.keep_edges);
  if (blur.grow && blur.keep_edges) node.at("grow").fail("cannot stand beside \"keep_edges\"");
  blur.premultiplied = read_flag(node, "premultiplied", false);
  return effect;
}

Kernel read_kernel(const SceneNode& node) {
  const nlohmann::json& json = node.json();
  try {
    if (json.is_string()) return parse_kernel(json.get<std::string>());
    if (!json.is_array()) node.refuse("a text such as \"1 2 1; 2 4 2; 1 2 1\" or a list of rows");
    std::vector<std::vector<i32>> rows;
    for (size_t y = 0; y < node.size(); ++y) {
      const SceneNode row = node.at(y);
      if (!row.json().is_array()) row.refuse("a list of whole numbers");
      rows.emplace_back();
      for (size_t x = 0; x < row.size(); ++x) rows.back().push_back(row.at(x).integer(-kLargestTap, kLargestTap));
    }
    return kernel_of_rows(rows);
  } catch (const KernelError& error) {
    node.fail(error.what());
  }
}

Convolution read_convolution(const SceneNode& node) {
  require(node, "kernel", "convolve");
  Convolution convolution;
  convolution.kernel = read_kernel(node.at("kernel"));
  if (node.has("channels")) convolution.channels = read_channels(node.at("channels"));
  convolution.normalise = read_flag(node, "normalise", true);
  convolution.clamp = read_flag(node, "clamp", true);
  convolution.straight = read_flag(node, "straight", false);
  return convolution;
}

std::vector<f32> read_curve(const SceneNode& node) {
  if (!node.json().is_array() || node.size() < 2 || node.size() > 256) node.refuse("a list of 2 to 256 numbers 0 to 1");
  std::vector<f32> curve;
  for (size_t i = 0; i < node.size(); ++i) curve.push_back(static_cast<f32>(node.at(i).number(0, 1)));
  return curve;
}

LutEffect read_lut(const SceneNode& node) {
  LutEffect lut;
  if (node.size() < 2) node.fail("(lut) has no curve; it must have \"rgb\", \"red\", \"green\", \"blue\" or \"alpha\"");
  if (node.has("rgb"))
    for (size_t i = 1; i < 4; ++i) lut.curves[i] = read_curve(node.at("rgb"));
  static constexpr const char* kNames[] = {"alpha", "red", "green", "blue"};
  for (size_t i = 0; i < 4; ++i)
    if (node.has(kNames[i])) lut.curves[i] = read_curve(node.at(kNames[i]));
  return lut;
}

FillEffect read_fill(const SceneNode& node) {
  require(node, "colour", "fill");
  FillEffect fill;
  fill.colour = read_colour(node.at("colour"));
  fill.keep_alpha = read_flag(node, "keep_alpha", false);
  return fill;
}

PremultiplyEffect read_premultiply(const SceneNode& node) {
  PremultiplyEffect effect;
  if (node.has("direction")) effect.forward = node.at("direction").one_of({"forward", "back"}) == 0;
  if (node.has("colour")) effect.colour = read_colour(node.at("colour"));
  return effect;
}

Effect read_effect(const SceneNode& node) {
  if (!node.json().is_object()) node.refuse("an object such as { \"effect\": \"blur\", \"radius\": 8 }");
  std::vector<std::string> names;
  for (const EffectKind& kind : kEffectKinds) names.emplace_back(kind.name);
  if (!node.has("effect")) node.fail("lacks \"effect\", which is " + quoted_list(names));
  const std::string name = node.at("effect").string(quoted_list(names));
  for (const EffectKind& kind : kEffectKinds) {
    if (name != kind.name) continue;
    std::vector<std::string> keys = {"effect"};
    for (const SceneKey& key : kind.keys) keys.emplace_back(key.name);
    node.require_keys(keys, name);
    Effect effect{node.path() + " (" + name + ')', BlurEffect{}};
    if (name == "blur")
      effect.what = read_blur(node);
    else if (name == "convolve")
      effect.what = read_convolution(node);
    else if (name == "lut")
      effect.what = read_lut(node);
    else if (name == "fill")
      effect.what = read_fill(node);
    else
      effect.what = read_premultiply(node);
    return effect;
  }
  node.at("effect").fail("is an unknown effect " + quoted_list({name.substr(0, 60)}) + "; the nearest is " +
                         quoted_list(nearest_names(name, names, 1)));
}

}  // namespace

std::vector<Effect> read_effects(const SceneNode& node) {
  if (!node.json().is_array()) node.refuse("a list [ ... ] of effects, in the order they are applied");
  std::vector<Effect> effects;
  for (size_t i = 0; i < node.size(); ++i) effects.push_back(read_effect(node.at(i)));
  return effects;
}

}  // namespace zr::tool
