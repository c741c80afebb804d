// What a file's alpha means, and taking the colour away that a picture was premultiplied on.
#include "matte.h"

#include <ZR/alpha_guess.h>

#include <cstdio>

#include "filters.h"
#include "interrupt_state.h"

namespace zr::tool {

AlphaGuess guess_alpha(OwnedWorld& stored, const std::string& where) {
  AlphaGuess guess;
  i32 code = ZR_AlphaGuess_Unknown;
  char reason[256] = "";
  check(ZR_GuessAlphaMessage(nullptr, stored.layer(), nullptr, &code, &guess.matte, reason), where);
  guess.kind = code == ZR_AlphaGuess_Straight        ? AlphaGuess::Kind::kStraight
               : code == ZR_AlphaGuess_Premultiplied ? AlphaGuess::Kind::kPremultiplied
                                                     : AlphaGuess::Kind::kUnknown;
  guess.opaque = is_opaque(stored);
  guess.reason = reason;
  return guess;
}

std::string colour_name(const ZR_Pixel8& colour) {
  char text[8];
  std::snprintf(text, sizeof text, "#%02x%02x%02x", colour.red, colour.green, colour.blue);
  return text;
}

void take_matte_away(OwnedWorld& picture, const ZR_PixelFloat& matte, const std::string& where) {
  check(ZR_PremulColorFloat(&abort_on_interrupt(), picture.layer(), &matte, 0, picture.layer()), where);
  clear_hidden_colours(picture);
}

}  // namespace zr::tool
