// Image files in and out of worlds.
//
// Values go in and out as they are, with what the file says about them beside. Worlds hold straight
// alpha. PNG and TIFF are written with straight alpha (TIFF marked "unassociated"), OpenEXR with associated
// (premultiplied) alpha, as those formats are read elsewhere.
#pragma once

#include <ZR/zr.h>

#include <string>
#include <vector>

#include "colour_space.h"
#include "owned_world.h"

namespace zr::tool {

struct OutputFormat {
  const char* name;  // also the name that the image library knows it by
  std::vector<std::string> extensions;
  std::vector<i32> depths;
  bool associated;    // alpha, and the format also knows half
  const char* alpha;  // how alpha is stored, for listings
};
const std::vector<OutputFormat>& output_formats();
// By the extension of a file name; throws ToolError naming those that there are.
const OutputFormat& output_format_of(const std::string& file);
// Throws ToolError, naming what fits, when the format cannot hold the depth.
void require_depth(const OutputFormat& format, i32 depth, const std::string& file);
// Names of the formats that can be read.
std::vector<std::string> readable_formats();

struct ImageInfo {
  i32 width = 0, height = 0;
  u64 decoded_bytes = 0;  // what reading it takes besides the world
};
// Opens the file and reads its header; `where` ("scene.json: layers[0].image") begins messages.
ImageInfo probe_image(const std::string& file, const std::string& where);
// What a file's header says, for people.
struct FileFacts {
  std::string format, channels;  // "png", "R, G, B, A"
  i32 width = 0, height = 0, channel_count = 0;
  std::string depth;  // "8", "16", "half", "float" or the name of another type
  std::string alpha;  // "none", "straight" or "associated"
  PictureColour colour;
};
FileFacts read_facts(const std::string& file, const std::string& where);
// Grey, grey with alpha, RGB or RGBA of 8 or 16 bits, half or float, as a world of `depth`.
OwnedWorld load_image(const std::string& file, i32 depth, const std::string& where);
// The same with its colours' meaning. CMYK TIFF and JPEG files are not turned to RGB as load_image does it:
// their world is one of ink at 16 bits, cyan, magenta, yellow and black in place of alpha, red, green, blue.
struct Picture {
  OwnedWorld world;
  PictureColour colour;
};
Picture load_picture(const std::string& file, i32 depth, const std::string& where);
// The pixels as the file holds them, for asking what its alpha means: colours are not divided by alpha, whatever
// the file says of them. CMYK is turned to RGB as load_image does it.
Picture load_stored(const std::string& file, i32 depth, const std::string& where);
// The picture in the space `to`, at `depth`, which is that it was loaded at; `from` stands in for the
// file's own profile unless it is empty.
OwnedWorld world_in_space(Picture picture, Profile from, const Profile& to, i32 depth, i32 intent,
                          const std::string& file, const std::string& where);
// Writes a world at its depth; `half` stores 16-bit floats in OpenEXR. A profile goes into the file where
// it is not empty; OpenEXR has no place for one. The file is the caller's to remove when this throws.
void save_image(const OwnedWorld& world, const OutputFormat& format, bool half, const std::string& file,
                const std::vector<u8>& icc = {});

void set_image_threads(int threads);

}  // namespace zr::tool
