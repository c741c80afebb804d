// CMYK JPEG files, which the image library would turn to RGB by itself without looking at the profile.
#pragma once

#include <ZR/zr.h>

#include <string>
#include <vector>

namespace zr::tool {

struct InkImage {
  i32 width = 0, height = 0;
  std::vector<u8> values;  // cyan, magenta, yellow, black; 0 is no ink, 255 full ink
};
// `file` is a JPEG file with four channels. Throws ToolError.
InkImage read_ink_jpeg(const std::string& file, const std::string& where);

}  // namespace zr::tool
