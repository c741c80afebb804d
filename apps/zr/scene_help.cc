// The text of `zr help scene`, from the table of keys.
#include <algorithm>

#include "scene.h"
#include "scene_keys.h"

namespace zr::tool {
namespace {

template <class Keys>
std::string section(const char* title, const Keys& keys) {
  std::string text = std::string("\n") + title + '\n';
  for (const SceneKey& key : keys) {
    std::string line = std::string("  ") + key.name;
    line.resize(std::max<size_t>(line.size() + 1, 16), ' ');
    line += key.values;
    if (*key.standard != '\0') line += std::string(" (default ") + key.standard + ')';
    text += line + '\n';
    if (*key.meaning != '\0') text += std::string(16, ' ') + key.meaning + '\n';
  }
  return text;
}

std::string effect_sections() {
  std::string text;
  for (const EffectKind& kind : kEffectKinds)
    text += section(("Effect \"" + std::string(kind.name) + "\": " + kind.meaning).c_str(), kind.keys);
  return text;
}

}  // namespace

std::string scene_help() {
  return std::string(
             "A scene is a JSON file (UTF-8). Example:\n"
             "\n"
             "  { \"size\": [960, 540], \"background\": \"#102030\", \"frames\": [1, 48],\n"
             "    \"layers\": [\n"
             "      { \"image\": \"media/street.jpg\" },\n"
             "      { \"image\": \"media/logo.png\", \"position\": [480, 270], \"anchor\": [320, 160],\n"
             "        \"scale\": 0.5, \"motion_blur\": true,\n"
             "        \"rotation\": [ { \"frame\": 1, \"value\": 0 }, { \"frame\": 48, \"value\": 360 } ] },\n"
             "      { \"image\": \"media/balloon.png\", \"mode\": \"screen\", \"opacity\": 0.8,\n"
             "        \"position\": [ { \"frame\": 1, \"value\": [0, 300] },\n"
             "                      { \"frame\": 48, \"value\": [700, 40] } ] } ] }\n") +
         section("The scene", kSceneKeys) + section("A layer", kLayerKeys) + section("A matte", kMatteKeys) +
         section("Placing a layer or a matte", kPlacementKeys) + section("Motion blur", kMotionBlurKeys) +
         effect_sections() +
         "\nAn effect is an object { \"effect\": name, ... } of the keys above. Example of a layer with a soft "
         "shadow's "
         "shape:\n"
         "  { \"image\": \"media/logo.png\", \"effects\": [ { \"effect\": \"fill\", \"colour\": \"#000000\",\n"
         "      \"keep_alpha\": true }, { \"effect\": \"blur\", \"radius\": 12 } ], \"opacity\": 0.6 }\n" +
         section("A keyframe, in a list of rising frames", kKeyframeKeys) +
         "\nA colour is [red, green, blue], [red, green, blue, alpha], each 0..1, \"#rrggbb\" or \"#rrggbbaa\".\n"
         "An unknown key is an error.\n";
}

}  // namespace zr::tool
