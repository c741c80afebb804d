// zr convolve: one picture through a kernel of whole numbers.
#include <memory>

#include "commands.h"
#include "filters.h"
#include "one_picture.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

struct ConvolveOptions : PictureOptions {
  std::string kernel, channels = "auto";
  bool normalised = false, unnormalised = false, unclamped = false, straight = false;
};

void convolve(const ConvolveOptions& options) {
  Convolution convolution;
  try {
    convolution.kernel = parse_kernel(options.kernel);
  } catch (const KernelError& error) {
    throw bad_input(std::string("convolve: --kernel ") + error.what());
  }
  convolution.normalise = !options.unnormalised;
  convolution.clamp = !options.unclamped;
  convolution.straight = options.straight;
  if (options.channels != "auto") {
    convolution.channels = parse_channels(options.channels);
    if (!convolution.channels)
      throw bad_input("convolve: --channels is \"" + options.channels + "\"; it must be auto or " + kChannelsExpected);
  }
  PictureTask task;
  task.extra_bytes = [&](const ImageInfo& info, i32 depth) {
    return extra_bytes(convolution, info.width, info.height, depth);
  };
  const auto work = [&](Picture picture, i32 depth) -> Finished {
    Finished rgb = without_ink(std::move(picture), depth, options.input, "convolve");
    return {filtered(rgb.world, convolution, "convolve"), std::move(rgb.icc)};
  };
  turn_picture(options, "convolve", {}, work, task);
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<ConvolveOptions>();
  add_picture_options(verb, *options);
  verb.add_option("--kernel", options->kernel,
                  "Rows of whole numbers with ; between them: a square, one row or one column, odd on each side")
      ->required()
      ->type_name("\"TAPS; TAPS\"");
  verb.add_option(
          "--channels", options->channels,
          "What is convolved, the others stay; auto is argb, or rgb if the taps sum to 0 or no pixel is transparent")
      ->type_name("auto|LETTERS of argb")
      ->capture_default_str();
  CLI::Option* const normalise = verb.add_flag("--normalise", options->normalised,
                                               "Divide by the sum of the taps, by 1 if that is 0: the default");
  verb.add_flag("--no-normalise", options->unnormalised, "Divide by 256 for each tap instead")->excludes(normalise);
  verb.add_flag("--no-clamp", options->unclamped, "8-bit results wrap at 65536 before they are held to 0..255");
  verb.add_flag("--straight", options->straight, "Take colours as they stand, not weighted by alpha");
  verb.footer(
      "Examples:\n"
      "  zr convolve photo.jpg -o soft.png --kernel \"1 2 1; 2 4 2; 1 2 1\"\n"
      "  zr convolve photo.jpg -o sharp.png --kernel \"0 -1 0; -1 5 -1; 0 -1 0\"\n"
      "  zr convolve photo.jpg -o edges.png --kernel \"-1 -1 -1; -1 8 -1; -1 -1 -1\"\n"
      "  zr convolve photo.jpg -o streaks.png --kernel \"1 1 1 1 1 1 1 1 1\"\n"
      "\n"
      "A side has 1 to " +
      std::to_string(kLargestKernel) + " taps, a tap is a whole number -" + std::to_string(kLargestTap) + " to " +
      std::to_string(kLargestTap) +
      ". The first tap belongs to the pixel\n"
      "above and left: kernels are not mirrored. What lies outside of the picture counts as black and transparent.\n"
      "The picture's profile is kept; CMYK is converted to sRGB by its profile.");
  return [options] { convolve(*options); };
}

}  // namespace

const Command kConvolveCommand = {"convolve", "Put one picture through a kernel, to sharpen, soften or find edges",
                                  &declare};

}  // namespace zr::tool
