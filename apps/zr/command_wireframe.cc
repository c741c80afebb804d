// zr wireframe: the outline of a picture's alpha, drawn over it or alone.
#include <ZR/drawing.h>

#include <algorithm>
#include <charconv>
#include <cstdio>
#include <memory>

#include "colour_text.h"
#include "commands.h"
#include "depths.h"
#include "interrupt_state.h"
#include "one_picture.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

struct WireframeOptions : PictureOptions {
  std::string colour = "#00e5ff", background = "none", step = "1";
  bool alone = false, any_alpha = false;
};

struct Request {
  ZR_PixelFloat colour{}, background{0, 0, 0, 0};
  i32 step = 1;
};

ZR_PixelFloat parse_line_colour(const char* option, const std::string& text, const char* expected) {
  const std::optional<ZR_PixelFloat> colour = parse_colour(text);
  if (!colour) throw bad_input("wireframe: " + std::string(option) + " is \"" + text + "\"; it must be " + expected);
  return *colour;
}

Request parse_request(const WireframeOptions& options) {
  Request request;
  request.colour = parse_line_colour("--colour", options.colour, "\"#rrggbb\" or \"#rrggbbaa\"");
  if (options.background != "none")
    request.background = parse_line_colour("--background", options.background, "none, \"#rrggbb\" or \"#rrggbbaa\"");
  const char *const begin = options.step.data(), *const end = begin + options.step.size();
  const auto [stop, error] = std::from_chars(begin, end, request.step);
  if (error != std::errc() || stop != end || request.step < 1 || request.step > kLargestSide)
    throw bad_input("wireframe: --step is \"" + options.step + "\"; it must be a whole number of rows, 1 to " +
                    std::to_string(kLargestSide));
  return request;
}

// Freed with the scope.
struct OwnedWireframe {
  OwnedWireframe() = default;
  ~OwnedWireframe() { ZR_DisposeWireframe(&record); }
  OwnedWireframe(const OwnedWireframe&) = delete;
  OwnedWireframe& operator=(const OwnedWireframe&) = delete;
  ZR_Wireframe record{};
};

struct Drawn {
  i32 loops = 0, points = 0;
};

// Points lie on corners of pixels; those on the far edges are drawn into the last row and column.
Drawn draw(const ZR_Wireframe& wireframe, const ZR_PixelFloat& colour, OwnedWorld& world) {
  Drawn drawn;
  const f64 right = world.width() - 1, bottom = world.height() - 1;
  i32 count = 0;
  while (const ZR_WireframePoint* loop = ZR_GetWireframeLoop(&wireframe, drawn.loops, &count)) {
    stop_if_interrupted();
    for (i32 i = 0; i < count; ++i) {
      const ZR_WireframePoint a = loop[i], b = loop[(i + 1) % count];
      const f64 from[2] = {std::min<f64>(a.x, right), std::min<f64>(a.y, bottom)};
      const f64 to[2] = {std::min<f64>(b.x, right), std::min<f64>(b.y, bottom)};
      check(ZR_DrawLine(from, to, &colour, world.layer()), "wireframe");
    }
    ++drawn.loops;
    drawn.points += count;
  }
  return drawn;
}

void trace(const WireframeOptions& options) {
  const Request request = parse_request(options);
  Drawn drawn;
  const auto work = [&](Picture picture, i32 depth) -> Finished {
    Finished rgb = without_ink(std::move(picture), depth, options.input, "wireframe");
    OwnedWireframe wireframe;
    const u32 flags = options.any_alpha ? u32{ZR_Wireframe_AnyAlpha} : 0;
    check(ZR_GenerateWireframe(nullptr, rgb.world.layer(), nullptr, request.step, flags, 0, &wireframe.record),
          "wireframe");
    if (options.alone) check(ZR_FillFloat(nullptr, &request.background, nullptr, rgb.world.layer()), "wireframe");
    drawn = draw(wireframe.record, request.colour, rgb.world);
    return rgb;
  };
  turn_picture(options, "wireframe", {}, work);
  std::printf("%d outline%s, %d points\n", drawn.loops, drawn.loops == 1 ? "" : "s", drawn.points);
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<WireframeOptions>();
  add_picture_options(verb, *options);
  verb.add_option("--colour", options->colour, "Of the outline")->type_name("\"#rrggbb[aa]\"")->capture_default_str();
  verb.add_option("--step", options->step, "Rows from one that is looked at to the next; more give straighter lines")
      ->type_name("NUMBER 1.." + std::to_string(kLargestSide))
      ->capture_default_str();
  verb.add_flag("--any-alpha", options->any_alpha, "Soft edges and shadows count as inside; otherwise from half on");
  CLI::Option* const alone = verb.add_flag("--alone", options->alone, "The outline without the picture");
  verb.add_option("--background", options->background, "What is behind an outline that is --alone")
      ->needs(alone)
      ->type_name("none|COLOUR")
      ->capture_default_str();
  verb.footer(
      "Examples:\n"
      "  zr wireframe logo.png -o traced.png\n"
      "  zr wireframe logo.png -o outline.png --alone --colour \"#ffffff\" --background \"#102030\"\n"
      "  zr wireframe logo.png -o coarse.png --step 8 --any-alpha\n"
      "\n"
      "Outlines are closed lines, one pixel wide, around what is inside of the picture's alpha and around its holes.\n"
      "A picture without transparency has one, its border. The picture's profile is kept.");
  return [options] { trace(*options); };
}

}  // namespace

const Command kWireframeCommand = {"wireframe", "Draw the outline of a picture's alpha", &declare};

}  // namespace zr::tool
