// What the verbs that turn one picture file into another have in common.
#pragma once

#include <CLI/CLI.hpp>

#include <functional>
#include <string>

#include "image_files.h"
#include "stopwatch.h"
#include "tool_host.h"

namespace zr::tool {

struct PictureOptions {
  std::string input, output, depth;
  int threads = 0;
  bool force = false, stats = false;
};
enum class OutputDepth { kChosen, kAlways8 };  // whether there is a --depth
void add_picture_options(CLI::App& verb, PictureOptions& options, OutputDepth depth = OutputDepth::kChosen);

// What sets some verbs apart.
struct PictureTask {
  OutputDepth depth = OutputDepth::kChosen;  // kAlways8: the picture still comes at its own depth
  bool stored = false;                       // pixels as the file holds them, see load_stored
  std::function<u64(const ImageInfo& info, i32 depth)> extra_bytes = {};  // that `work` takes besides the picture
};

struct Finished {
  OwnedWorld world;
  std::vector<u8> icc;
};
// Loads the picture, at the depth of --depth or else that of its file where the output can hold it, calls
// `work` while the host lives, and writes what it gives. `profiles` are other files that are read.
void turn_picture(const PictureOptions& options, const std::string& verb, const std::vector<std::string>& profiles,
                  const std::function<Finished(Picture picture, i32 depth)>& work, const PictureTask& task = {});

// The end of the former, for a picture that comes from no file: makes it, writes it and tells of it.
void finish_picture(const PictureOptions& options, const ToolHost& host, const Stopwatch& reading,
                    const std::function<Finished()>& work);

// RGB of a picture that may be ink: CMYK is converted to sRGB by its profile. The ICC data are what goes with it.
Finished without_ink(Picture picture, i32 depth, const std::string& file, const std::string& verb);

}  // namespace zr::tool
