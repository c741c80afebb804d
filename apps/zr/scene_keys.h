// The keys of a scene file, told once: what is accepted and what `zr help scene` says.
#pragma once

#include <array>
#include <string>
#include <vector>

namespace zr::tool {

struct SceneKey {
  const char* name;
  const char* values;
  const char* standard;  // the default; "" where the key must be given
  const char* meaning;
};

inline constexpr std::array kSceneKeys = {
    SceneKey{"size", "[width, height], each 1..30000", "", "pixels of every frame"},
    SceneKey{"background", "colour", "[0, 0, 0, 0]", "what the frame is filled with first"},
    SceneKey{"frames", "[first, last] or \"first-last\"", "[1, 1]", "frames to render; --frames overrides it"},
    SceneKey{"depth", "8, 16 or \"float\"", "8", "channels of the composite; --depth overrides it"},
    SceneKey{"working_space", "name, see zr list spaces, or ICC file", "none: values as they are",
             "images are converted to it by their profile; colours are its values"},
    SceneKey{"output_space", "the same", "the working space", "of the files that are written"},
    SceneKey{"linear_light", "true or false", "false",
             "layers are blended in linear light of the working space, or sRGB"},
    SceneKey{"layers", "list of layers", "", "from bottom to top"},
};
inline constexpr std::array kLayerKeys = {
    SceneKey{"image", "file name", "", "relative to the scene file; or give \"colour\""},
    SceneKey{"colour", "colour", "", "a solid, instead of \"image\""},
    SceneKey{"size", "[width, height], each 1..30000", "the scene's", "of a solid"},
    SceneKey{"name", "text", "", "for the reader only"},
    SceneKey{"position", "[x, y] or keyframes", "[0, 0]", "left top corner, rounded to whole pixels"},
    SceneKey{"opacity", "0..1 or keyframes", "1", ""},
    SceneKey{"mode", "name, see zr list modes", "in-front", "how the layer meets what is below"},
    SceneKey{"keep_alpha", "true or false", "false", "leaves the alpha below as it is"},
    SceneKey{"field", "\"all\", \"even\" or \"odd\"", "all", "rows of the frame that are touched"},
    SceneKey{"seed", "whole number, 32 bits", "0", "pattern of dissolve"},
    SceneKey{"matte", "matte", "none", "shapes the layer by another image"},
};
inline constexpr std::array kMatteKeys = {
    SceneKey{"image", "file name", "", "relative to the scene file"},
    SceneKey{"kind", "\"alpha\", \"inverted-alpha\", \"luma\" or \"inverted-luma\"", "alpha",
             "inverted kinds are open outside of the image"},
    SceneKey{"position", "[x, y] or keyframes", "[0, 0]", "in the frame, not in the layer"},
};
inline constexpr std::array kKeyframeKeys = {
    SceneKey{"frame", "whole number", "", ""},
    SceneKey{"value", "as without keyframes", "", "straight lines between, held before and after"},
};

template <class Keys>
std::vector<std::string> key_names(const Keys& keys) {
  std::vector<std::string> names;
  for (const SceneKey& key : keys) names.emplace_back(key.name);
  return names;
}

}  // namespace zr::tool
