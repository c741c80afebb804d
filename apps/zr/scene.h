// A scene: what is composited, from bottom to top, and how it changes from frame to frame.
#pragma once

#include <ZR/zr.h>

#include <optional>
#include <string>
#include <vector>

#include "colour_space.h"
#include "depths.h"
#include "effects.h"
#include "frame_names.h"
#include "mask_shapes.h"
#include "placement.h"

namespace zr::tool {

struct TrackMatte {
  std::string image;  // path
  u32 kind = 0;       // ZR_MaskWorld.kind
  Placement placement;
};

struct Layer {
  std::string place;  // "layers[2]", for messages
  std::string image;  // path; empty for a solid
  ZR_PixelFloat colour{1, 0, 0, 0};
  i32 width = 0, height = 0;    // of a solid
  std::vector<MaskShape> mask;  // of its own pixels, before its effects
  std::vector<Effect> effects;  // on its own pixels, before it is placed
  Placement placement;
  Keyed<f64> opacity{1.0};
  i32 mode = 2;
  bool keep_alpha = false;
  i32 field = 0;
  i32 seed = 0;
  std::optional<TrackMatte> matte;
};

struct Scene {
  std::string file;
  i32 width = 0, height = 0;
  ZR_PixelFloat background{0, 0, 0, 0};
  FrameRange frames;
  i32 depth = 8;                                           // bits of a channel: 8, 16 or 32
  std::optional<SpaceChoice> working_space, output_space;  // an output space only with a working space
  bool linear_light = false;
  i32 field = 0;        // rows that are drawn: 0 all, 1 those of the upper field (0, 2, ...), 2 those of the lower
  Placement placement;  // its quality and motion blur are those of layers that do not say otherwise
  std::vector<Layer> layers;
};

// Reads and checks a scene file; image paths come out relative to the working folder. Throws ToolError
// naming file, line, column, value and what would be right.
Scene read_scene(const std::string& file);
// The same on a text that is at hand; `file` is for messages and for the folder of images.
Scene parse_scene(const std::string& text, const std::string& file);

// What each key means, its values and its default: the text of `zr help scene`.
std::string scene_help();
// The same of the effects of its layers: the text of `zr help effects`.
std::string effects_help();

}  // namespace zr::tool
