// zr blur: one picture blurred along its rows, its columns or both.
#include <charconv>
#include <memory>

#include "commands.h"
#include "depths.h"
#include "filters.h"
#include "one_picture.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

struct BlurOptions : PictureOptions {
  std::string radius, iterations = "1", channels = "argb";
  bool gaussian = false, box = false, horizontal = false, vertical = false;
  bool keep_edges = false, grow = false, premultiplied = false;
};

template <class Number>
std::optional<Number> parse_number(const std::string& text, Number least, Number most) {
  Number number = 0;
  const auto [stop, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  const bool whole = error == std::errc() && stop == text.data() + text.size();
  return whole && number >= least && number <= most ? std::optional(number) : std::nullopt;
}

Blur parse_request(const BlurOptions& options) {
  Blur blur;
  blur.box = options.box;
  const auto radius = parse_number<f64>(options.radius, 0, kLargestRadius);
  if (!radius)
    throw bad_input("blur: --radius is \"" + options.radius + "\"; it must be a number of pixels, 0 to " +
                    std::to_string(kLargestRadius));
  blur.radius = *radius;
  const auto iterations = parse_number<i32>(options.iterations, 1, kMostIterations);
  if (!iterations)
    throw bad_input("blur: --iterations is \"" + options.iterations + "\"; it must be a whole number 1 to " +
                    std::to_string(kMostIterations));
  blur.iterations = *iterations;
  const std::optional<u32> channels = parse_channels(options.channels);
  if (!channels) throw bad_input("blur: --channels is \"" + options.channels + "\"; it must be " + kChannelsExpected);
  blur.channels = *channels;
  blur.rows = options.horizontal || !options.vertical;
  blur.columns = options.vertical || !options.horizontal;
  blur.keep_edges = options.keep_edges;
  blur.grow = options.grow;
  blur.premultiplied = options.premultiplied;
  return blur;
}

void require_sides(const Blur& blur, const ImageInfo& info) {
  const i32 width = info.width + 2 * growth_across(blur), height = info.height + 2 * growth_down(blur);
  if (width > kLargestSide || height > kLargestSide)
    throw bad_input("blur: with --grow the result would have " + std::to_string(width) + " x " +
                    std::to_string(height) + " pixels; a side has at most " + std::to_string(kLargestSide));
}

void blur_picture(const BlurOptions& options) {
  const Blur blur = parse_request(options);
  PictureTask task;
  task.extra_bytes = [&](const ImageInfo& info, i32 depth) {
    require_sides(blur, info);
    return extra_bytes(blur, info.width, info.height, depth);
  };
  const auto work = [&](Picture picture, i32 depth) -> Finished {
    Finished rgb = without_ink(std::move(picture), depth, options.input, "blur");
    return {filtered(rgb.world, blur, "blur"), std::move(rgb.icc)};
  };
  turn_picture(options, "blur", {}, work, task);
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<BlurOptions>();
  add_picture_options(verb, *options);
  verb.add_option("--radius", options->radius, "Pixels from the middle to where the blur ends; parts of pixels count")
      ->required()
      ->type_name("NUMBER 0.." + std::to_string(kLargestRadius));
  CLI::Option* const gaussian = verb.add_flag("--gaussian", options->gaussian, "A bell: the default");
  CLI::Option* const box =
      verb.add_flag("--box", options->box, "A plain mean, whose time does not depend on the radius")
          ->excludes(gaussian);
  verb.add_option("--iterations", options->iterations, "Times that the box is applied; three look like a bell")
      ->needs(box)
      ->type_name("NUMBER 1.." + std::to_string(kMostIterations))
      ->capture_default_str();
  verb.add_option("--channels", options->channels, "What is blurred; the other channels stay")
      ->type_name("LETTERS of argb")
      ->capture_default_str();
  verb.add_flag("--horizontal", options->horizontal, "Along the rows only");
  verb.add_flag("--vertical", options->vertical, "Along the columns only");
  CLI::Option* const keep = verb.add_flag("--keep-edges", options->keep_edges,
                                          "The picture's edges do not fade: what is outside is left out");
  verb.add_flag("--grow", options->grow, "Makes the result larger by what spreads over the edges")->excludes(keep);
  verb.add_flag("--premultiplied", options->premultiplied, "The picture's colours are premultiplied, and stay so");
  verb.footer(
      "Examples:\n"
      "  zr blur photo.jpg -o soft.png --radius 6 --keep-edges\n"
      "  zr blur logo.png -o glow.png --radius 12.5 --box --iterations 3 --grow\n"
      "  zr blur photo.jpg -o streaks.png --radius 40 --box --horizontal --keep-edges\n"
      "  zr blur layer.png -o feathered.png --radius 4 --channels a\n"
      "\n"
      "What lies outside of the picture counts as transparent, so that its edges fade, unless --keep-edges. Colours\n"
      "are weighted by alpha. At 8 bits a box of more than 8192 pixels of a row or column is refused. The picture's\n"
      "profile is kept; CMYK is converted to sRGB by its profile.");
  return [options] { blur_picture(*options); };
}

}  // namespace

const Command kBlurCommand = {"blur", "Blur one picture, by a bell or by boxes", &declare};

}  // namespace zr::tool
