// What the verbs that turn one picture file into another have in common.
#pragma once

#include <CLI/CLI.hpp>

#include <functional>
#include <string>

#include "image_files.h"

namespace zr::tool {

struct PictureOptions {
  std::string input, output, depth;
  int threads = 0;
  bool force = false;
};
void add_picture_options(CLI::App& verb, PictureOptions& options);

struct Finished {
  OwnedWorld world;
  std::vector<u8> icc;
};
// Loads the picture, at the depth of --depth or else that of its file where the output can hold it, calls
// `work` while the host lives, and writes what it gives. `profiles` are other files that are read.
void turn_picture(const PictureOptions& options, const std::string& verb, const std::vector<std::string>& profiles,
                  const std::function<Finished(Picture picture, i32 depth)>& work);

}  // namespace zr::tool
