// zr sheet: many pictures, such as the frames of a sequence, small on one.
#include <CLI/CLI.hpp>
#include <ZR/transfer_mode.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <memory>

#include "commands.h"
#include "common_options.h"
#include "depths.h"
#include "fit_image.h"
#include "image_files.h"
#include "interrupt_state.h"
#include "lettering.h"
#include "output_files.h"
#include "tool_error.h"
#include "tool_host.h"

namespace zr::tool {
namespace {

constexpr i32 kGap = 12, kLabel = 26, kLabelHeight = 8, kLabelDrop = 7;  // pixels
constexpr ZR_Pixel8 kPage{255, 24, 26, 31}, kInk{255, 128, 132, 142};

struct SheetOptions {
  std::vector<std::string> pictures;
  std::string output;
  i32 columns = 0, width = 320;
  int threads = 0;
  bool force = false, plain = false;
};

// Where the pictures stand; the first gives all places their shape.
struct SheetPlan {
  i32 columns, rows, width, height, label;
  i32 page_width() const { return kGap + columns * (width + kGap); }
  i32 page_height() const { return kGap + rows * (height + label); }
};

SheetPlan plan_sheet(const SheetOptions& options, const ImageInfo& first) {
  const auto count = static_cast<i32>(options.pictures.size());
  const i32 square = static_cast<i32>(std::ceil(std::sqrt(static_cast<f64>(count))));
  SheetPlan plan{};
  plan.columns = std::min(count, options.columns > 0 ? options.columns : square);
  plan.rows = (count + plan.columns - 1) / plan.columns;
  plan.width = options.width;
  plan.height = std::max(1, static_cast<i32>(static_cast<i64>(first.height) * options.width / first.width));
  plan.label = options.plain ? kGap : kLabel;
  const f64 across = static_cast<f64>(plan.columns) * (plan.width + kGap),
            down = static_cast<f64>(plan.rows) * (plan.height + plan.label);
  if (across + kGap > kLargestSide || down + kGap > kLargestSide)
    throw bad_input("sheet: " + std::to_string(count) + " pictures of " + std::to_string(plan.width) + " x " +
                    std::to_string(plan.height) + " pixels in " + std::to_string(plan.columns) +
                    " columns need more than " + std::to_string(kLargestSide) + " pixels; choose a smaller --width");
  return plan;
}

// In sRGB, as it will be looked at; in float, so that little is lost on the way to 8 bits.
OwnedWorld load_small(const std::string& file, const SheetPlan& plan) {
  const OwnedWorld picture = world_in_space(load_picture(file, 32, "sheet"), {}, standard_space(PRISMA_Profile_sRGB),
                                            32, PRISMA_Intent_RelativeColorimetric, file, "sheet");
  const f64 step =
      std::max(static_cast<f64>(picture.width()) / plan.width, static_cast<f64>(picture.height()) / plan.height);
  const auto fitted = [&](i32 side) { return std::max(1, static_cast<i32>(std::lround(side / step))); };
  return fit_image(picture, std::min(fitted(picture.width()), plan.width),
                   std::min(fitted(picture.height()), plan.height));
}

void make_sheet(const SheetOptions& options) {
  const OutputFormat& format = output_format_of(options.output);
  require_depth(format, 8, options.output);
  check_outputs({options.output}, options.pictures, options.force);
  u64 decoding = 0;
  SheetPlan plan{};
  for (const std::string& file : options.pictures) {
    stop_if_interrupted();
    const ImageInfo info = probe_image(file, "sheet");
    if (&file == &options.pictures.front()) plan = plan_sheet(options, info);
    decoding = std::max(decoding, info.decoded_bytes + static_cast<u64>(info.width) * static_cast<u64>(info.height) *
                                                           sizeof(ZR_PixelFloat));
  }
  if (decoding + static_cast<u64>(plan.page_width()) * static_cast<u64>(plan.page_height()) * 8 >
      machine_memory() / 4 * 3)
    throw ToolError(kExitMemory, "sheet: the pictures are too large for this machine's memory");

  const ToolHost host(options.threads);
  OwnedWorld page(plan.page_width(), plan.page_height(), 8);
  check(ZR_Fill(nullptr, &kPage, nullptr, page.layer()), "drawing the sheet");
  const ZR_CompositeModePlus over(XferInFront, 1.0f, nullptr, false, 0);
  for (size_t i = 0; i < options.pictures.size(); ++i) {
    stop_if_interrupted();
    const i32 x = kGap + static_cast<i32>(i) % plan.columns * (plan.width + kGap);
    const i32 y = kGap + static_cast<i32>(i) / plan.columns * (plan.height + plan.label);
    OwnedWorld small = load_small(options.pictures[i], plan);
    const GX_LRect all = small.bounds();
    check(ZR_TransferRect(&abort_on_interrupt(), 1, 0, 0, &all, small.layer(), &over, nullptr, nullptr,
                          x + (plan.width - small.width()) / 2, y + (plan.height - small.height()) / 2, page.layer()),
          "drawing the sheet");
    if (!options.plain)
      draw_text(page, std::filesystem::path(options.pictures[i]).stem().string(), x, y + plan.height + kLabelDrop,
                kLabelHeight, kInk);
  }
  OutputFolders folders;
  folders.make_for(options.output);
  write_then_rename(options.output, [&](const std::string& part) { save_image(page, format, false, part); });
  std::printf("%s: %zu pictures, %d x %d\n", options.output.c_str(), options.pictures.size(), page.width(),
              page.height());
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<SheetOptions>();
  verb.add_option("pictures", options->pictures, "Pictures to show, in this order")->required()->type_name("IN...");
  verb.add_option("-o,--output", options->output, "Picture to write, 8 bits: .png or .tif")
      ->required()
      ->type_name("OUT");
  verb.add_option("--columns", options->columns, "Pictures side by side; 0 makes as many columns as rows")
      ->check(CLI::Range(0, 1000).description(""))
      ->type_name("NUMBER 0..1000")
      ->capture_default_str();
  verb.add_option("--width", options->width, "Pixels of each picture across; the first one's shape gives the height")
      ->check(CLI::Range(16, 4096).description(""))
      ->type_name("NUMBER 16..4096")
      ->capture_default_str();
  verb.add_flag("--plain", options->plain, "No file names under the pictures");
  add_threads(verb, options->threads);
  add_force(verb, options->force);
  verb.footer(
      "Examples:\n"
      "  zr sheet out/frame.*.png -o out/sheet.png --columns 8\n"
      "  zr sheet a.jpg b.tif c.exr -o three.png --width 480 --plain\n"
      "\n"
      "Pictures are shown in sRGB, by the profile in their file; without one, files of 8 or 16 bits are sRGB\n"
      "and float files linear sRGB. The first picture gives the places their shape; others are fitted inside.");
  return [options] { make_sheet(*options); };
}

}  // namespace

const Command kSheetCommand = {"sheet", "Show many pictures, such as the frames of a sequence, small on one", &declare};

}  // namespace zr::tool
