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
         section("The scene", kSceneKeys) + section("A layer", kLayerKeys) + section("A shape of a mask", kMaskKeys) +
         section("A matte", kMatteKeys) + section("Placing a layer or a matte", kPlacementKeys) +
         section("Motion blur", kMotionBlurKeys) + section("A keyframe, in a list of rising frames", kKeyframeKeys) +
         "\nA colour is [red, green, blue], [red, green, blue, alpha], each 0..1, \"#rrggbb\" or \"#rrggbbaa\".\n"
         "An unknown key is an error. zr help effects tells of the effects.\n";
}

std::string effects_help() {
  std::string text =
      "Effects change the pixels of a scene's layer before it is placed, one after the other. Example:\n"
      "\n"
      "  { \"image\": \"media/logo.png\", \"position\": [12, 16], \"opacity\": 0.6,\n"
      "    \"effects\": [ { \"effect\": \"fill\", \"colour\": \"#000000\", \"keep_alpha\": true },\n"
      "                 { \"effect\": \"blur\", \"radius\": 12 } ] },\n"
      "  { \"image\": \"media/logo.png\" }\n"
      "\n"
      "which is a logo above its soft shadow.\n";
  for (const EffectKind& kind : kEffectKinds)
    text += section(("\"effect\": \"" + std::string(kind.name) + "\", " + kind.meaning).c_str(), kind.keys);
  return text + "\nA radius may have keyframes, see zr help scene. An unknown effect or key is an error.\n";
}

}  // namespace zr::tool
