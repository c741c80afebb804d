// What the verbs that turn one picture file into another have in common.
#include "one_picture.h"

#include <algorithm>
#include <cstdio>

#include "common_options.h"
#include "depths.h"
#include "output_files.h"
#include "tool_error.h"
#include "tool_host.h"

namespace zr::tool {
namespace {

i32 chosen_depth(const PictureOptions& options, const OutputFormat& format, const std::string& verb) {
  if (!options.depth.empty()) return parse_depth(options.depth, verb + ": --depth");
  const FileFacts facts = read_facts(options.input, verb);
  const i32 own = facts.colour.floats ? 32 : facts.depth == "8" ? 8 : 16;
  const bool held = std::find(format.depths.begin(), format.depths.end(), own) != format.depths.end();
  return held ? own : format.depths.back();
}

}  // namespace

void add_picture_options(CLI::App& verb, PictureOptions& options) {
  verb.add_option("picture", options.input, "Picture to read")->required()->type_name("IN");
  verb.add_option("-o,--output", options.output, "File to write: .png, .tif or .exr")->required()->type_name("OUT");
  verb.add_option("--depth", options.depth, "Channels of the file (default: the picture's, where the file can)")
      ->type_name("8|16|float");
  add_threads(verb, options.threads);
  add_force(verb, options.force);
}

void turn_picture(const PictureOptions& options, const std::string& verb, const std::vector<std::string>& profiles,
                  const std::function<Finished(Picture picture, i32 depth)>& work) {
  const OutputFormat& format = output_format_of(options.output);
  const i32 depth = chosen_depth(options, format, verb);
  require_depth(format, depth, options.output);
  std::vector<std::string> inputs = profiles;
  inputs.push_back(options.input);
  check_outputs({options.output}, inputs, options.force);
  const ImageInfo info = probe_image(options.input, verb);
  const u64 pixels = static_cast<u64>(info.width) * static_cast<u64>(info.height);
  if (info.decoded_bytes + pixels * static_cast<u64>(depth / 2) > machine_memory() / 4 * 3)
    throw ToolError(kExitMemory, verb + ": the picture is too large for this machine's memory");
  const ToolHost host(options.threads);
  const Finished finished = work(load_picture(options.input, depth, verb), depth);
  OutputFolders folders;
  folders.make_for(options.output);
  write_then_rename(options.output,
                    [&](const std::string& part) { save_image(finished.world, format, false, part, finished.icc); });
  std::printf("%s: %d x %d\n", options.output.c_str(), finished.world.width(), finished.world.height());
}

}  // namespace zr::tool
