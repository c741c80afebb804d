// zr render: the frames of a scene as picture files.
#include <CLI/CLI.hpp>
#include <ZR/platform.h>

#include <cstdio>
#include <memory>
#include <nlohmann/json.hpp>

#include "commands.h"
#include "common_options.h"
#include "depths.h"
#include "image_files.h"
#include "interrupt_state.h"
#include "output_files.h"
#include "progress_line.h"
#include "render.h"
#include "stopwatch.h"
#include "tool_error.h"
#include "tool_host.h"

namespace zr::tool {
namespace {

struct RenderOptions {
  std::string scene, output, frames, depth, field, exr = "float", memory, progress = "auto";
  int threads = 0;
  bool force = false, stats = false;
};

constexpr const char* kFooter =
    "Examples:\n"
    "  zr render scene.json -o out/frame.####.png\n"
    "  zr render scene.json -o still.tif --frames 12 --depth 16\n"
    "  zr render scene.json -o out/f%04d.exr --depth float --exr half --progress=json\n"
    "\n"
    "Frames are numbered where the name has #### (as many digits as there are #) or %04d.\n"
    "zr help scene describes the scene file.\n"
    "\n"
    "What the files hold:\n"
    "  .png .tif   depth 8 or 16 (0..65535), straight alpha; TIFF also float\n"
    "  .exr        float or half, associated (premultiplied) alpha\n"
    "  Without a working_space in the scene, values are read and written as they are. With one:\n"
    "    - an image is converted from the ICC profile in its file; without one, files of 8 or 16\n"
    "      bits are sRGB and float files linear sRGB\n"
    "    - CMYK TIFF and JPEG files are converted by their profile, which they must carry; without a\n"
    "      working_space they become RGB as 1 - ink, times 1 - black; grey profiles are refused\n"
    "    - PNG and TIFF carry the profile of the output_space; OpenEXR has no place for one, so\n"
    "      choose \"srgb-linear\" for what readers of OpenEXR take it to be\n"
    "  16-bit files and the 0..32768 of the composite: v * 65535 / 32768, rounded, and back; white\n"
    "  stays white and every value of the composite survives the way out and in again.\n"
    "  Colour under alpha 0 is kept in PNG and TIFF; in OpenEXR it becomes 0.\n"
    "  A layer that is moved by whole pixels and not turned is copied as it is, in every quality.";

struct Timings {
  f64 load = 0, draw = 0, write = 0;
};

i32 parse_field(const std::string& name) { return name == "upper" ? 1 : name == "lower" ? 2 : 0; }

ProgressMode progress_mode(const std::string& name) {
  return name == "json" ? ProgressMode::kJson : name == "off" ? ProgressMode::kOff : ProgressMode::kAuto;
}

void check_memory(const Scene& scene, const RenderOptions& options) {
  const u64 limit =
      options.memory.empty() ? machine_memory() / 4 * 3 : parse_memory(options.memory, "render: --memory");
  const u64 needed = memory_needed(scene);
  if (needed > limit)
    throw ToolError(kExitMemory, scene.file + ": size " + std::to_string(scene.width) + " x " +
                                     std::to_string(scene.height) + " at depth " + depth_name(scene.depth) +
                                     " with its layers needs " + bytes_text(needed) + ", above the --memory limit of " +
                                     bytes_text(limit));
}

void print_stats(const Scene& scene, const Renderer& renderer, const ToolHost& host, const Timings& timings,
                 bool json) {
  HB_MemoryStats memory;
  HB_GetMemoryStats(&memory);
  const i32 frames = scene.frames.count();
  if (json) {
    nlohmann::ordered_json line;
    line["stats"] = {{"frames", frames},
                     {"images", renderer.image_count()},
                     {"threads", host.threads()},
                     {"load_seconds", timings.load},
                     {"draw_seconds", timings.draw},
                     {"write_seconds", timings.write},
                     {"peak_bytes", memory.peak_bytes}};
    std::puts(line.dump().c_str());
    return;
  }
  const auto each = [&](f64 seconds) { return seconds * 1000.0 / static_cast<f64>(frames); };
  std::printf("frames   %d of %d x %d, depth %s, %d threads\n", frames, scene.width, scene.height,
              depth_name(scene.depth), host.threads());
  std::printf("images   %zu, read in %.3f s\n", renderer.image_count(), timings.load);
  std::printf("drawing  %.3f s, %.2f ms a frame\n", timings.draw, each(timings.draw));
  std::printf("writing  %.3f s, %.2f ms a frame\n", timings.write, each(timings.write));
  std::printf("memory   %s of the library at most\n", bytes_text(memory.peak_bytes).c_str());
}

void render(const RenderOptions& options) {
  const FrameNames names(options.output);
  const OutputFormat& format = output_format_of(options.output);
  Scene scene = read_scene(options.scene);
  if (!options.frames.empty()) scene.frames = parse_frame_range(options.frames, "render: --frames");
  if (!options.depth.empty()) scene.depth = parse_depth(options.depth, "render: --depth");
  if (!options.field.empty()) scene.field = parse_field(options.field);
  require_depth(format, scene.depth, options.output);
  names.require_for(scene.frames);

  std::vector<std::string> files, inputs = {options.scene};
  for (i32 frame = scene.frames.first; frame <= scene.frames.last; ++frame) files.push_back(names.name(frame));
  for (const SceneImage& image : images_of(scene)) inputs.push_back(image.file);
  check_outputs(files, inputs, options.force);
  check_memory(scene, options);

  const ProgressMode mode = progress_mode(options.progress);
  const Stopwatch all, loading;
  Timings timings;
  ProgressLine progress(mode, scene.frames.count());
  progress.say("reading images");
  const ToolHost host(options.threads);
  Renderer renderer(scene);
  timings.load = loading.seconds();
  OutputFolders folders;
  folders.make_for(options.output);
  for (size_t i = 0; i < files.size(); ++i) {
    const i32 frame = scene.frames.first + static_cast<i32>(i);
    const Stopwatch drawing;
    const OwnedWorld& picture = renderer.draw(frame);
    timings.draw += drawing.seconds();
    const Stopwatch writing;
    write_then_rename(files[i], [&](const std::string& part) {
      save_image(picture, format, options.exr == "half" && format.associated, part, renderer.output_icc());
    });
    timings.write += writing.seconds();
    progress.frame_done(frame, files[i]);
  }
  progress.wipe();
  if (mode == ProgressMode::kAuto)
    std::printf("%zu frame%s in %s: %s%s\n", files.size(), files.size() == 1 ? "" : "s",
                duration_text(all.seconds()).c_str(), files.front().c_str(),
                files.size() == 1 ? "" : (" to " + files.back()).c_str());
  if (options.stats) print_stats(scene, renderer, host, timings, mode == ProgressMode::kJson);
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<RenderOptions>();
  verb.add_option("scene", options->scene, "Scene file (JSON)")->required()->type_name("SCENE.json");
  verb.add_option("-o,--output", options->output, "Files to write; the extension chooses the format: .png, .tif, .exr")
      ->required()
      ->type_name("PATTERN");
  verb.add_option("--frames", options->frames, "A frame or a range, as 12 or 1-48 (default: the scene's)")
      ->type_name("RANGE");
  verb.add_option("--depth", options->depth, "Channels of the composite and of the file (default: the scene's)")
      ->type_name("8|16|float");
  verb.add_option("--field", options->field,
                  "Draw only rows 0, 2, 4.. (upper) or 1, 3, 5.. (lower) of the frames (default: the scene's)")
      ->check(CLI::IsMember({"none", "upper", "lower"}).description(""))
      ->type_name("none|upper|lower");
  verb.add_option("--exr", options->exr, "Channels of OpenEXR files; half holds up to 65504")
      ->check(CLI::IsMember({"float", "half"}).description(""))
      ->type_name("float|half")
      ->capture_default_str();
  add_threads(verb, options->threads);
  verb.add_option("--memory", options->memory,
                  "Refuse scenes whose pictures need more, as 512M or 2G (default: three quarters of the machine's)")
      ->type_name("SIZE");
  add_force(verb, options->force);
  verb.add_option("--progress", options->progress,
                  "auto: a line with the time left on a terminal; json: one object a frame on stdout")
      ->check(CLI::IsMember({"auto", "json", "off"}).description(""))
      ->type_name("auto|json|off")
      ->capture_default_str();
  verb.add_flag("--stats", options->stats, "Print times and memory at the end");
  verb.footer(kFooter);
  return [options] { render(*options); };
}

}  // namespace

const Command kRenderCommand = {"render", "Render the frames of a scene to PNG, TIFF or OpenEXR", &declare};

}  // namespace zr::tool
