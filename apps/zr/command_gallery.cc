// zr gallery: one labelled picture of all transfer modes.
#include <CLI/CLI.hpp>

#include <cstdio>
#include <filesystem>
#include <memory>

#include "commands.h"
#include "common_options.h"
#include "gallery.h"
#include "image_files.h"
#include "output_files.h"
#include "tool_error.h"
#include "tool_host.h"

namespace zr::tool {
namespace {

namespace fs = std::filesystem;

struct GalleryOptions {
  std::string output, base, layer;
  int threads = 0;
  bool force = false;
};

// A shipped photograph: in share/zr/scenes/media of a folder above the program, which holds for the
// installed tool and for the build tree alike.
std::string shipped_photo(const std::string& name, const std::string& option) {
  std::error_code error;
  for (fs::path folder = fs::read_symlink("/proc/self/exe", error).parent_path(); !folder.empty();
       folder = folder.parent_path()) {
    const fs::path photo = folder / "share" / "zr" / "scenes" / "media" / name;
    if (fs::exists(photo, error)) return photo.string();
    if (folder == folder.parent_path()) break;
  }
  throw file_error("gallery: the shipped photograph " + name + " is not installed; choose one with " + option);
}

void make_gallery(GalleryOptions options) {
  const OutputFormat& format = output_format_of(options.output);
  require_depth(format, 8, options.output);
  if (options.base.empty()) options.base = shipped_photo("coffee.jpg", "--base");
  if (options.layer.empty()) options.layer = shipped_photo("cat.jpg", "--layer");
  check_outputs({options.output}, {options.base, options.layer}, options.force);
  u64 needed = gallery_bytes();
  for (const std::string& file : {options.base, options.layer}) {
    const ImageInfo info = probe_image(file, "gallery");
    needed += info.decoded_bytes + static_cast<u64>(info.width) * static_cast<u64>(info.height) * sizeof(ZR_PixelFloat);
  }
  if (needed > machine_memory() / 4 * 3)
    throw ToolError(kExitMemory, "gallery: the pictures are too large for this machine's memory");
  const ToolHost host(options.threads);
  const OwnedWorld picture =
      draw_gallery(load_image(options.base, 32, "gallery: --base"), load_image(options.layer, 32, "gallery: --layer"));
  OutputFolders folders;
  folders.make_for(options.output);
  write_then_rename(options.output, [&](const std::string& part) { save_image(picture, format, false, part); });
  std::printf("%s: %d x %d\n", options.output.c_str(), picture.width(), picture.height());
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<GalleryOptions>();
  verb.add_option("-o,--output", options->output, "Picture to write, 8 bits: .png or .tif")
      ->required()
      ->type_name("FILE");
  verb.add_option("--base", options->base, "Picture below (default: the shipped cup of coffee)")->type_name("IMAGE");
  verb.add_option("--layer", options->layer, "Picture on top (default: the shipped cat)")->type_name("IMAGE");
  add_threads(verb, options->threads);
  add_force(verb, options->force);
  verb.footer(
      "Examples:\n"
      "  zr gallery -o modes.png\n"
      "  zr gallery -o modes.png --base street.jpg --layer face.png --force\n"
      "\n"
      "Each cell holds the base on its left and the layer on its right, both with a soft edge and\n"
      "overlapping in the middle, over a checkerboard that shows where the result is transparent.");
  return [options] { make_gallery(*options); };
}

}  // namespace

const Command kGalleryCommand = {"gallery", "Draw one labelled picture of all transfer modes", &declare};

}  // namespace zr::tool
