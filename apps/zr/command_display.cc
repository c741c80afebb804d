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

void show(const DisplayOptions& options) {
  const SpaceChoice monitor = parse_space(options.profile, "display: --profile");
  const SpaceChoice working = parse_space(options.working, "display: --working");
  SpaceChoice simulated;
  if (!options.simulate.empty()) simulated = parse_space(options.simulate, "display: --simulate");
  turn_picture(
      options, "display", {monitor.file, working.file, simulated.file}, [&](Picture picture, i32 depth) -> Finished {
        const Profile screen = load_space(monitor, Device::kRgb, "display: --profile");
        const Profile space = load_space(working, Device::kRgb, "display: --working");
        const Profile device =
            options.simulate.empty() ? Profile() : load_space(simulated, Device::kRgbOrInk, "display: --simulate");
        OwnedWorld world = world_in_space(std::move(picture), {}, space, depth, PRISMA_Intent_RelativeColorimetric,
                                          options.input, "display");
        // What the device makes of the picture is taken for its own output.
        const TON_PRISMA_Transform transform = with_engine("display", [&] {
          return ZR_NewDisplayTransform(*space, *screen, device.get(), device.get(), true, false);
        });
        convert_world(world, transform, "display");
        return {std::move(world), icc_data(*screen)};
      });
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
