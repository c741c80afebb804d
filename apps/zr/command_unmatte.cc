// zr unmatte: a picture that was premultiplied on a colour, made straight.
#include <cstdio>
#include <memory>

#include "colour_text.h"
#include "commands.h"
#include "matte.h"
#include "one_picture.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

struct UnmatteOptions : PictureOptions {
  std::string colour = "auto";
};

// Empty: there is none to take away. The guess looks at 8 bits.
std::optional<ZR_PixelFloat> guessed_matte(const std::string& file) {
  Picture eight = load_stored(file, 8, "unmatte");
  const AlphaGuess guess = guess_alpha(eight.world, "unmatte: " + file);
  if (guess.kind == AlphaGuess::Kind::kUnknown)
    throw ToolError(kExitFailure, "unmatte: " + file + ": " + guess.reason + " Choose one with --colour");
  if (guess.kind == AlphaGuess::Kind::kStraight) return std::nullopt;
  const auto channel = [](u8 value) { return widen_8_to_float(value); };
  return ZR_PixelFloat{1, channel(guess.matte.red), channel(guess.matte.green), channel(guess.matte.blue)};
}

void unmatte(const UnmatteOptions& options) {
  std::optional<ZR_PixelFloat> matte;
  const bool automatic = options.colour == "auto";
  if (!automatic) {
    if (options.colour.size() == 7) matte = parse_colour(options.colour);
    if (!matte) throw bad_input("unmatte: --colour is \"" + options.colour + "\"; it must be auto or \"#rrggbb\"");
  }
  PictureTask task;
  task.stored = true;
  const auto work = [&](Picture picture, i32) -> Finished {
    if (automatic) matte = guessed_matte(options.input);
    if (matte) take_matte_away(picture.world, *matte, "unmatte");
    return {std::move(picture.world), std::move(picture.colour.icc)};
  };
  turn_picture(options, "unmatte", {}, work, task);
  if (!automatic) return;
  if (!matte) {
    std::printf("colours are straight already and were left as they are\n");
    return;
  }
  const ZR_Pixel8 taken = {255, narrow_float_colour<ZR_Pixel8>(matte->red),
                           narrow_float_colour<ZR_Pixel8>(matte->green), narrow_float_colour<ZR_Pixel8>(matte->blue)};
  std::printf("was premultiplied on %s\n", colour_name(taken).c_str());
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<UnmatteOptions>();
  add_picture_options(verb, *options);
  verb.add_option("--colour", options->colour, "What it was premultiplied on; auto looks as zr guess-alpha does")
      ->type_name("auto|\"#rrggbb\"")
      ->capture_default_str();
  verb.footer(
      "Examples:\n"
      "  zr unmatte logo.png -o clean.png\n"
      "  zr unmatte logo.png -o clean.png --colour \"#ffffff\"\n"
      "\n"
      "Takes dark or light fringes from a cut-out: the share of the colour in each pixel, as its alpha tells, is\n"
      "subtracted and the rest divided by alpha. What is fully transparent becomes black. Pixels are taken as the\n"
      "file holds them, whatever it says of its alpha. The picture's profile is kept.");
  return [options] { unmatte(*options); };
}

}  // namespace

const Command kUnmatteCommand = {"unmatte", "Take away the colour that a picture was premultiplied on", &declare};

}  // namespace zr::tool
