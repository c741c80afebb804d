// What a file's alpha means, and taking the colour away that a picture was premultiplied on.
#pragma once

#include <optional>
#include <string>

#include "owned_world.h"

namespace zr::tool {

struct AlphaGuess {
  enum class Kind { kStraight, kPremultiplied, kUnknown };
  Kind kind = Kind::kUnknown;
  ZR_Pixel8 matte{};    // of kPremultiplied
  bool opaque = false;  // no pixel is transparent: the guess makes no difference
  std::string reason;   // of kUnknown
};
// Of a picture with its values as the file holds them, 8-bit.
AlphaGuess guess_alpha(OwnedWorld& stored, const std::string& where);

std::string colour_name(const ZR_Pixel8& colour);  // "#rrggbb"

// The picture is premultiplied on `matte` and comes out straight; what is fully transparent becomes zero.
void take_matte_away(OwnedWorld& picture, const ZR_PixelFloat& matte, const std::string& where);

}  // namespace zr::tool
