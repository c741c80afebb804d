// What is done to a layer's own pixels before it is placed: a list of filters, in order.
#pragma once

#include <array>
#include <string>
#include <variant>
#include <vector>

#include "filters.h"
#include "keyframes.h"

namespace zr::tool {

struct BlurEffect {
  Blur blur;  // its radius is that of the frame
  Keyed<f64> radius{0.0};
};
// A curve for each of alpha, red, green, blue: values at evenly spaced inputs from 0 to 1, straight lines between.
struct LutEffect {
  std::array<std::vector<f32>, 4> curves;  // empty: the channel stays
};
struct FillEffect {
  ZR_PixelFloat colour{};
  bool keep_alpha = false;
};
struct PremultiplyEffect {
  bool forward = true;
  ZR_PixelFloat colour{1, 0, 0, 0};  // what it is premultiplied on
};
struct Effect {
  std::string place;  // "layers[2].effects[0] (blur)", for messages
  std::variant<BlurEffect, Convolution, LutEffect, FillEffect, PremultiplyEffect> what;
};

// Whether the effects are the same in every frame.
bool stand_still(const std::vector<Effect>& effects);

// Pixels by which the effects make a picture larger on the left and right (x), above and below (y), at most.
GX_LPoint largest_growth(const std::vector<Effect>& effects);

// A picture after its effects, and by how much it is larger on each side than before.
struct Filtered {
  OwnedWorld world;
  GX_LPoint grown;
};
Filtered with_effects(OwnedWorld& picture, const std::vector<Effect>& effects, i32 frame, const std::string& where);

}  // namespace zr::tool
