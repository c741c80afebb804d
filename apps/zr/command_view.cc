// zr view: what a viewer shows of a picture with transparency.
#include <ZR/viewer_blit.h>

#include <memory>

#include "colour_text.h"
#include "commands.h"
#include "one_picture.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

struct ViewOptions : PictureOptions {
  bool checker = false, tint = false, flat = false;
  std::string colour, colour2;
};

struct Look {
  ZR_SpecialCaseBlitStyle style = ZR_BlitStyle_Checker;
  ZR_PixelFloat first{}, second{};
};

ZR_PixelFloat parse_ground(const char* option, const std::string& text, const char* standard) {
  const std::optional<ZR_PixelFloat> colour = parse_colour(text.empty() ? standard : text);
  if (!colour)
    throw bad_input("view: " + std::string(option) + " is \"" + text + "\"; it must be \"#rrggbb\" or \"#rrggbbaa\"");
  return *colour;
}

Look parse_look(const ViewOptions& options) {
  Look look;
  const char* first = "#ffffff";
  if (options.tint) look.style = ZR_BlitStyle_Tint, first = "#ff0000b3";
  if (options.flat) look.style = ZR_BlitStyle_Flat, first = "#000000";
  if (look.style != ZR_BlitStyle_Checker && !options.colour2.empty())
    throw bad_input("view: --colour2 is for --checker, which has two colours");
  look.first = parse_ground("--colour", options.colour, first);
  look.second = parse_ground("--colour2", options.colour2, "#cccccc");
  return look;
}

OwnedWorld viewed(OwnedWorld& picture, const Look& look) {
  OwnedWorld shown(picture.width(), picture.height(), 8);
  const GX_LRect all = shown.bounds();
  ZR_WorldX<ZR_Pixel8> target(shown.layer(), true);
  with_pixel_of(picture.depth(), [&]<class Pixel>() {
    const ZR_WorldX<Pixel> source(picture.layer(), true);
    ZR_SpecialCasePixelBlit(&source, {0, 0}, look.style, false, {0, 0}, look.first, look.second, all, &target);
  });
  target.FillAlpha();  // a screen has none; the blit leaves what was there
  return shown;
}

void view(const ViewOptions& options) {
  const Look look = parse_look(options);
  PictureTask task;
  task.depth = OutputDepth::kAlways8;
  task.extra_bytes = [](const ImageInfo& info, i32) {
    return static_cast<u64>(info.width) * static_cast<u64>(info.height) * sizeof(ZR_Pixel8);
  };
  const auto work = [&](Picture picture, i32 depth) -> Finished {
    Finished rgb = without_ink(std::move(picture), depth, options.input, "view");
    return {viewed(rgb.world, look), std::move(rgb.icc)};
  };
  turn_picture(options, "view", {}, work, task);
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<ViewOptions>();
  add_picture_options(verb, *options, OutputDepth::kAlways8);
  CLI::Option* const checker =
      verb.add_flag("--checker", options->checker, "Over squares of 8 pixels in two colours: the default");
  CLI::Option* const tint =
      verb.add_flag("--tint", options->tint, "What is transparent shows its colour, mixed with that of --colour")
          ->excludes(checker);
  verb.add_flag("--flat", options->flat, "Over one colour")->excludes(checker)->excludes(tint);
  verb.add_option("--colour", options->colour,
                  "Of the squares, of the tint, whose alpha is its strength, or of the ground (default: #ffffff, "
                  "#ff0000b3, #000000)")
      ->type_name("\"#rrggbb[aa]\"");
  verb.add_option("--colour2", options->colour2, "Of the other squares, the first among them (default: #cccccc)")
      ->type_name("\"#rrggbb\"");
  verb.footer(
      "Examples:\n"
      "  zr view logo.png -o logo-checker.png --checker\n"
      "  zr view logo.png -o logo-tint.png --tint --colour \"#00ff0080\"\n"
      "  zr view logo.png -o logo-flat.png --flat --colour \"#204060\"\n"
      "\n"
      "The result is opaque, at 8 bits. Without --tint the colour of what is fully transparent does not show; with it\n"
      "a colour that hides under alpha 0 can be seen. The picture's profile is kept; CMYK is converted to sRGB.");
  return [options] { view(*options); };
}

}  // namespace

const Command kViewCommand = {"view", "Show one picture's transparency as a viewer does", &declare};

}  // namespace zr::tool
