// zr display: one picture as a monitor needs it.
#include <memory>

#include "commands.h"
#include "one_picture.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

struct DisplayOptions : PictureOptions {
  std::string profile, working = "srgb", simulate;
};

TON_PRISMA_Transform display_transform(const Profile& space, const Profile& screen) {
  return with_engine("display",
                     [&] { return ZR_NewDisplayTransform(*space, *screen, nullptr, nullptr, false, false); });
}

// Ink goes through in one piece. Of an RGB device the values must be had in between: what it cannot show is
// cut off there, which a transform in one piece would carry through.
void simulate(OwnedWorld& world, const Profile& space, const Profile& device, const Profile& screen,
              const std::string& name) {
  const bool ink = with_engine("display", [&] { return device->GetColourSpace(); }) == PRISMA_Word("CMYK");
  const std::string useless = "display: --simulate: " + name +
                              " cannot be simulated; it tells what the device's values look like, but not how "
                              "colours are put into them";
  try {
    const TON_PRISMA_Transform transform =
        ink ? ZR_NewDisplayTransform(*space, *screen, device.get(), device.get(), true, false)
            : TON_PRISMA_Transform(*space, *device, PRISMA_Intent_RelativeColorimetric, TON_GetFastPRISMAOptions());
    // The engine may find out only with the first pixel.
    ZR_PixelFloat pixel{1, 0, 0, 0};
    TON_PRISMA_ETX(
        TON_PRISMA_Apply(transform.Get(), PRISMA_Layout_RGBFloat, &pixel, PRISMA_Layout_RGBFloat, &pixel, 1, nullptr));
    convert_world(world, transform, "display");
  } catch (const i32 status) {
    if (status == PRISMA_Err_BadProfile) throw file_error(useless);
    check(status, "display");
  }
  if (!ink) convert_world(world, display_transform(device, screen), "display");
}

void show(const DisplayOptions& options) {
  const SpaceChoice monitor = parse_space(options.profile, "display: --profile");
  const SpaceChoice working = parse_space(options.working, "display: --working");
  SpaceChoice simulated;
  if (!options.simulate.empty()) simulated = parse_space(options.simulate, "display: --simulate");
  const auto work = [&](Picture picture, i32 depth) -> Finished {
    const Profile screen = load_space(monitor, Device::kRgb, "display: --profile");
    const Profile space = load_space(working, Device::kRgb, "display: --working");
    OwnedWorld world = world_in_space(std::move(picture), {}, space, depth, PRISMA_Intent_RelativeColorimetric,
                                      options.input, "display");
    if (options.simulate.empty())
      convert_world(world, display_transform(space, screen), "display");
    else
      simulate(world, space, load_space(simulated, Device::kRgbOrInk, "display: --simulate"), screen, options.simulate);
    return {std::move(world), icc_data(*screen)};
  };
  turn_picture(options, "display", {monitor.file, working.file, simulated.file}, work);
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<DisplayOptions>();
  add_picture_options(verb, *options);
  verb.add_option("--profile", options->profile, "The monitor: an RGB profile, or a name of zr list spaces")
      ->required()
      ->type_name("NAME|FILE.icc");
  verb.add_option("--working", options->working, "Space that the picture is worked on in")
      ->type_name("NAME|FILE.icc")
      ->capture_default_str();
  verb.add_option("--simulate", options->simulate, "Show the picture as this device would: an RGB or CMYK profile")
      ->type_name("NAME|FILE.icc");
  verb.footer(
      "Examples:\n"
      "  zr display photo.jpg -o screen.png --profile monitor.icc\n"
      "  zr display photo.jpg -o proof.png --profile monitor.icc --working display-p3 --simulate press.icc\n"
      "\n"
      "The values that go to the monitor are written, with the monitor's profile beside them.");
  return [options] { show(*options); };
}

}  // namespace

const Command kDisplayCommand = {"display", "Show one picture as a monitor, or a simulated device, would", &declare};

}  // namespace zr::tool
