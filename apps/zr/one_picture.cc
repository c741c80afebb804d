// What the verbs that turn one picture file into another have in common.
#include "one_picture.h"

#include <ZR/platform.h>

#include <algorithm>
#include <cstdio>

#include "common_options.h"
#include "depths.h"
#include "output_files.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

// That a file of the format, if it can, has as the picture has it.
i32 own_depth(const PictureOptions& options, const OutputFormat* format, const std::string& verb) {
  const FileFacts facts = read_facts(options.input, verb);
  const i32 own = facts.colour.floats ? 32 : facts.depth == "8" ? 8 : 16;
  if (format == nullptr) return own;
  const bool held = std::find(format->depths.begin(), format->depths.end(), own) != format->depths.end();
  return held ? own : format->depths.back();
}

void print_stats(const Stopwatch& reading, const Stopwatch& working, const Stopwatch& writing, const ToolHost& host) {
  HB_MemoryStats memory;
  HB_GetMemoryStats(&memory);
  std::printf("reading  %.3f s\nworking  %.3f s, %d threads\nwriting  %.3f s\n", reading.seconds(), working.seconds(),
              host.threads(), writing.seconds());
  std::printf("memory   %s of the library at most\n", bytes_text(memory.peak_bytes).c_str());
}

}  // namespace

void add_picture_options(CLI::App& verb, PictureOptions& options, OutputDepth depth) {
  const bool chosen = depth == OutputDepth::kChosen;
  verb.add_option("picture", options.input, "Picture to read")->required()->type_name("IN");
  verb.add_option("-o,--output", options.output,
                  chosen ? "File to write: .png, .tif or .exr" : "File to write, 8 bits: .png or .tif")
      ->required()
      ->type_name("OUT");
  if (chosen)
    verb.add_option("--depth", options.depth, "Channels of the file (default: the picture's, where the file can)")
        ->type_name("8|16|float");
  add_threads(verb, options.threads);
  add_force(verb, options.force);
  verb.add_flag("--stats", options.stats, "Print times and memory at the end");
}

void turn_picture(const PictureOptions& options, const std::string& verb, const std::vector<std::string>& profiles,
                  const std::function<Finished(Picture picture, i32 depth)>& work, const PictureTask& task) {
  const OutputFormat& format = output_format_of(options.output);
  const bool chosen = task.depth == OutputDepth::kChosen;
  const i32 depth = options.depth.empty() ? own_depth(options, chosen ? &format : nullptr, verb)
                                          : parse_depth(options.depth, verb + ": --depth");
  require_depth(format, chosen ? depth : 8, options.output);
  std::vector<std::string> inputs = profiles;
  inputs.push_back(options.input);
  check_outputs({options.output}, inputs, options.force);
  const ImageInfo info = probe_image(options.input, verb);
  const u64 pixels = static_cast<u64>(info.width) * static_cast<u64>(info.height);
  const u64 extra = task.extra_bytes ? task.extra_bytes(info, depth) : 0;
  if (info.decoded_bytes + pixels * static_cast<u64>(depth / 2) + extra > machine_memory() / 4 * 3)
    throw ToolError(kExitMemory, verb + ": the picture is too large for this machine's memory");
  const ToolHost host(options.threads);
  Stopwatch reading;
  Picture picture = task.stored ? load_stored(options.input, depth, verb) : load_picture(options.input, depth, verb);
  reading.stop();
  finish_picture(options, host, reading, [&] { return work(std::move(picture), depth); });
}

void finish_picture(const PictureOptions& options, const ToolHost& host, const Stopwatch& reading,
                    const std::function<Finished()>& work) {
  const OutputFormat& format = output_format_of(options.output);
  Stopwatch working;
  const Finished finished = work();
  working.stop();
  Stopwatch writing;
  OutputFolders folders;
  folders.make_for(options.output);
  write_then_rename(options.output,
                    [&](const std::string& part) { save_image(finished.world, format, false, part, finished.icc); });
  writing.stop();
  std::printf("%s: %d x %d\n", options.output.c_str(), finished.world.width(), finished.world.height());
  if (options.stats) print_stats(reading, working, writing, host);
}

Finished without_ink(Picture picture, i32 depth, const std::string& file, const std::string& verb) {
  if (!picture.colour.ink) return {std::move(picture.world), std::move(picture.colour.icc)};
  const Profile srgb = standard_space(PRISMA_Profile_sRGB);
  return {world_in_space(std::move(picture), {}, srgb, depth, PRISMA_Intent_RelativeColorimetric, file, verb),
          icc_data(*srgb)};
}

}  // namespace zr::tool
