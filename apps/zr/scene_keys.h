// The keys of a scene file, told once: what is accepted and what `zr help scene` says.
#pragma once

#include <array>
#include <span>
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
    SceneKey{"quality", "\"draft\", \"bilinear\" or \"bicubic\"", "bilinear", "of layers that do not say otherwise"},
    SceneKey{"motion_blur", "true, false or motion blur", "false", "of layers that do not say otherwise"},
    SceneKey{"field", "\"none\", \"upper\" or \"lower\"", "none",
             "draws only rows 0, 2, 4.. (upper) or 1, 3, 5.. (lower); --field overrides it"},
    SceneKey{"layers", "list of layers", "", "from bottom to top"},
};
inline constexpr std::array kLayerKeys = {
    SceneKey{"image", "file name", "", "relative to the scene file; or give \"colour\""},
    SceneKey{"colour", "colour", "", "a solid, instead of \"image\""},
    SceneKey{"size", "[width, height], each 1..30000", "the scene's", "of a solid"},
    SceneKey{"name", "text", "", "for the reader only"},
    SceneKey{"mask", "list of shapes", "none", "multiplies the alpha of its own pixels, before the effects"},
    SceneKey{"effects", "list of effects", "none",
             "what is done to its own pixels first, in this order; see zr help effects"},
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
};
// Of each shape of a layer's mask.
inline constexpr std::array kMaskKeys = {
    SceneKey{"shape", "\"rectangle\", \"ellipse\" or \"polygon\"", "", ""},
    SceneKey{"box", "[x, y, width, height], each to 1000000", "",
             "of a rectangle, or around an ellipse; pixels of the layer"},
    SceneKey{"points", "3 to 1000 points [x, y]", "", "of a polygon, filled where it winds around"},
    SceneKey{"feather", "0..1000", "0", "radius of a Gaussian blur of the shape"},
    SceneKey{"mode", "name, see zr list mask-modes", "screen",
             "how it joins the shapes before; a first one that subtracts, intersects or darkens finds a full mask"},
    SceneKey{"opacity", "0..1", "1", "of the shape"},
};
// Of layers and of mattes.
inline constexpr std::array kPlacementKeys = {
    SceneKey{"position", "[x, y], each -1000000..1000000, or keyframes", "[0, 0]",
             "where the anchor stands in the frame, in pixels; also that of a matte"},
    SceneKey{"anchor", "[x, y], each -1000000..1000000, or keyframes", "[0, 0]",
             "a point of the picture, in its pixels; it is scaled and turned about it"},
    SceneKey{"scale", "number or [x, y], each -1000..1000, or keyframes", "1",
             "1 is the picture's own size, negative mirrors, 0 draws nothing"},
    SceneKey{"rotation", "-360000..360000 or keyframes", "0", "degrees, clockwise as seen"},
    SceneKey{"skew", "number or [x, y], each -89..89, or keyframes", "0",
             "degrees; x (or the number) leans upright edges, y level ones; before the rotation"},
    SceneKey{"matrix", "nine numbers, each -1000000..1000000, or keyframes", "none",
             "row by row, the last 0, 0, 1, from points of the picture to the frame; in place of the five above"},
    SceneKey{"quality", "\"draft\", \"bilinear\" or \"bicubic\"", "the scene's",
             "draft takes the nearest pixel and moves by whole pixels; the others take means when they reduce"},
    SceneKey{"motion_blur", "true, false or motion blur", "the scene's", "from keyframes of the keys above"},
};
inline constexpr std::array kMotionBlurKeys = {
    SceneKey{"shutter_angle", "0..720", "180", "degrees that the shutter is open; 360 is a whole frame"},
    SceneKey{"shutter_phase", "-360..360", "-90", "degrees from the frame's own moment to the shutter's opening"},
    SceneKey{
        "samples", "whole number 2..1024", "16",
        "moments, evenly from opening to closing, one matrix each; 2 are joined by a straight line of 17 (draft 9)"},
};
inline constexpr std::array kKeyframeKeys = {
    SceneKey{"frame", "whole number", "", ""},
    SceneKey{"value", "as without keyframes", "",
             "straight lines between, held before and after; motion blur looks between frames too"},
};

// Effects, by the "effect" that each object of the list names.
inline constexpr std::array kBlurKeys = {
    SceneKey{"radius", "0..30000 or keyframes", "", "pixels from the middle to where the blur ends"},
    SceneKey{"shape", "\"gaussian\" or \"box\"", "gaussian", ""},
    SceneKey{"iterations", "whole number 1..100", "1", "of a box; three look like a bell"},
    SceneKey{"direction", "\"both\", \"horizontal\" or \"vertical\"", "both", ""},
    SceneKey{"channels", "letters of \"argb\"", "argb", "the other channels stay"},
    SceneKey{"keep_edges", "true or false", "false", "what is outside of the picture is left out, not transparent"},
    SceneKey{"grow", "true or false", "true unless keep_edges", "the layer gets larger by what spreads over its edges"},
    SceneKey{"premultiplied", "true or false", "false", "the layer is, and stays so"},
};
inline constexpr std::array kConvolveKeys = {
    SceneKey{"kernel", "\"1 2 1; 2 4 2; 1 2 1\" or [[1, 2, 1], ...]", "",
             "a square, a row or a column of whole numbers, odd on each side"},
    SceneKey{"channels", "letters of \"argb\"", "argb", "rgb where the taps sum to 0 or no pixel is transparent"},
    SceneKey{"normalise", "true or false", "true", "divides by the taps' sum; otherwise by 256 for each tap"},
    SceneKey{"clamp", "true or false", "true", "holds 8-bit sums to 0..255; otherwise they wrap at 65536 first"},
    SceneKey{"straight", "true or false", "false", "colours as they stand, not weighted by alpha"},
};
inline constexpr std::array kLutKeys = {
    SceneKey{"rgb", "2 to 256 numbers 0..1", "none",
             "values at inputs evenly from 0 to 1, straight lines between; [1, 0] is the negative"},
    SceneKey{"red", "the same", "rgb", ""},
    SceneKey{"green", "the same", "rgb", ""},
    SceneKey{"blue", "the same", "rgb", ""},
    SceneKey{"alpha", "the same", "none", ""},
};
inline constexpr std::array kFillKeys = {
    SceneKey{"colour", "colour", "", ""},
    SceneKey{"keep_alpha", "true or false", "false", "colours the layer's shape"},
};
inline constexpr std::array kPremultiplyKeys = {
    SceneKey{"direction", "\"forward\" or \"back\"", "forward", "back makes a premultiplied layer straight"},
    SceneKey{"colour", "colour", "#000000", "what it is premultiplied on"},
};

struct EffectKind {
  const char* name;
  const char* meaning;
  std::span<const SceneKey> keys;
};
inline constexpr EffectKind kEffectKinds[] = {
    {"blur", "a bell or boxes, as zr blur", kBlurKeys},
    {"convolve", "a kernel, as zr convolve", kConvolveKeys},
    {"lut", "a curve for each channel", kLutKeys},
    {"fill", "one colour", kFillKeys},
    {"premultiply", "onto a colour or off it", kPremultiplyKeys},
};

template <class Keys>
std::vector<std::string> key_names(const Keys& keys) {
  std::vector<std::string> names;
  for (const SceneKey& key : keys) names.emplace_back(key.name);
  return names;
}

}  // namespace zr::tool
