// Blurs and convolutions of whole pictures through the library's rows and columns.
#pragma once

#include <optional>
#include <string>

#include "channel_letters.h"
#include "kernel_text.h"
#include "owned_world.h"

namespace zr::tool {

inline constexpr i32 kLargestRadius = 30000;  // pixels
inline constexpr i32 kMostIterations = 100;   // of a box

struct Blur {
  f64 radius = 0;  // pixels
  bool box = false;
  i32 iterations = 1;  // of a box
  u32 channels = ZR_BlurFlag_AllChannels;
  bool rows = true, columns = true;
  bool keep_edges = false;     // what lies outside of the picture is left out, not taken as transparent
  bool grow = false;           // the result is larger by what spreads over the picture's edges
  bool premultiplied = false;  // the picture is, and the result is
};
// Pixels by which the result is wider (taller) on each side.
i32 growth_across(const Blur& blur);
i32 growth_down(const Blur& blur);

struct Convolution {
  Kernel kernel;
  std::optional<u32> channels;  // empty: all, but no alpha where the taps sum to 0 or the picture is opaque
  bool normalise = true, clamp = true;
  bool straight = false;  // channels as they stand; otherwise colours are weighted by alpha
};

// Bytes that an operation takes besides the picture itself.
u64 extra_bytes(const Blur& blur, i32 width, i32 height, i32 depth);
u64 extra_bytes(const Convolution& convolution, i32 width, i32 height, i32 depth);

// Each gives a new picture and may change the old one; `where` begins messages.
OwnedWorld filtered(OwnedWorld& picture, const Blur& blur, const std::string& where);
OwnedWorld filtered(OwnedWorld& picture, const Convolution& convolution, const std::string& where);

OwnedWorld copied(OwnedWorld& picture, const std::string& where);
bool is_opaque(const OwnedWorld& picture);
// Zeroes colours under alpha 0.
void clear_hidden_colours(OwnedWorld& picture);

}  // namespace zr::tool
