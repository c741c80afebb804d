// zr convert: one picture from its colour space to another.
#include <memory>

#include "commands.h"
#include "nearest_name.h"
#include "one_picture.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

struct ConvertOptions : PictureOptions {
  std::string to, from, intent = "relative";
};

i32 intent_of(const std::string& name) {
  if (name == "perceptual") return PRISMA_Intent_Perceptual;
  if (name == "saturation") return PRISMA_Intent_Saturation;
  return name == "absolute" ? PRISMA_Intent_AbsoluteColorimetric : PRISMA_Intent_RelativeColorimetric;
}

void convert(const ConvertOptions& options) {
  const SpaceChoice to = parse_space(options.to, "convert: --to");
  SpaceChoice from;
  if (!options.from.empty()) from = parse_space(options.from, "convert: --from");
  turn_picture(options, "convert", {to.file, from.file}, [&](Picture picture, i32 depth) -> Finished {
    const Profile target = load_space(to, Device::kRgb, "convert: --to");
    const Profile source = options.from.empty() ? Profile() : load_space(from, Device::kRgbOrInk, "convert: --from");
    return {
        world_in_space(std::move(picture), source, target, depth, intent_of(options.intent), options.input, "convert"),
        icc_data(*target)};
  });
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<ConvertOptions>();
  add_picture_options(verb, *options);
  verb.add_option("--to", options->to, "Space of the result: a name, see zr list spaces, or an RGB profile")
      ->required()
      ->type_name("NAME|FILE.icc");
  verb.add_option("--from", options->from, "Space of the picture, instead of what its file says")
      ->type_name("NAME|FILE.icc");
  verb.add_option("--intent", options->intent, "How colours are fitted")
      ->check(CLI::IsMember({"relative", "absolute", "perceptual", "saturation"}).description(""))
      ->type_name("relative|absolute|perceptual|saturation")
      ->capture_default_str();
  verb.footer(
      "Examples:\n"
      "  zr convert photo.jpg -o photo.png --to display-p3 --depth 16\n"
      "  zr convert page.tif -o page.png --to srgb --from press.icc --intent perceptual\n"
      "\n"
      "A picture without a profile is sRGB at 8 or 16 bits and linear sRGB in float; CMYK must carry one\n"
      "or be given one by --from. PNG and TIFF carry the profile of the result; OpenEXR cannot.");
  return [options] { convert(*options); };
}

}  // namespace

const Command kConvertCommand = {"convert", "Convert one picture to another colour space", &declare};

}  // namespace zr::tool
