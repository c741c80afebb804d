// Image files in and out of worlds.
#include "image_files.h"

#include <OpenImageIO/imageio.h>

#include <algorithm>
#include <filesystem>

#include "checked_file.h"
#include "depths.h"
#include "file_values.h"
#include "ink_jpeg.h"
#include "interrupt_state.h"
#include "nearest_name.h"
#include "quiet_stderr.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

// The image library's reasons may hold several lines and the file's name; one line is kept.
std::string first_line(const std::string& text) {
  const std::string line = text.substr(0, text.find('\n'));
  return line.empty() ? "the file is damaged" : line;
}

// Which channels of a file are what; -1: there is none.
struct ChannelPlan {
  int red = -1, green = -1, blue = -1, alpha = -1;
  bool associated = false;
  int used() const { return std::max({red, green, blue, alpha}) + 1; }
};

// Ink stands in a pixel where alpha and colours are otherwise.
constexpr ChannelPlan kInkPlan = {1, 2, 3, 0, false};

ChannelPlan plan_channels(const OIIO::ImageSpec& spec, const std::string& format) {
  ChannelPlan plan;
  const auto find = [&](const char* name) { return spec.channelindex(name); };
  plan.alpha = spec.alpha_channel;
  if (find("R") >= 0 && find("G") >= 0 && find("B") >= 0) {
    plan.red = find("R"), plan.green = find("G"), plan.blue = find("B");
  } else if (spec.nchannels >= 3) {
    plan.red = 0, plan.green = 1, plan.blue = 2;
  } else if (plan.alpha != 0) {
    plan.red = plan.green = plan.blue = 0;
  }
  // Straight alpha is asked for on opening, and formats that store it say that they have kept it.
  plan.associated = plan.alpha >= 0 && format != "png" && spec.get_int_attribute("oiio:UnassociatedAlpha", 0) == 0;
  return plan;
}

struct OpenImage {
  std::unique_ptr<OIIO::ImageInput> input;
  OIIO::ImageSpec spec;
  ChannelPlan plan;
  bool ink = false;     // the file holds cyan, magenta, yellow and black
  OIIO::TypeDesc type;  // that pixels are read as
  // The picture's place: for OpenEXR the display window, of which the data may fill a part.
  i32 width = 0, height = 0, left = 0, top = 0;
};

enum class Ink { kAsRgb, kAsItIs };

bool is_ink(const OIIO::ImageSpec& spec, const std::string& format) {
  const auto is = [&](const char* attribute) { return spec.get_string_attribute(attribute) == "CMYK"; };
  return (format == "tiff" && is("tiff:ColorSpace")) || (format == "jpeg" && is("jpeg:ColorSpace"));
}

OpenImage open_image(const std::string& file, const std::string& where, Ink ink = Ink::kAsRgb) {
  std::error_code error;
  if (!std::filesystem::exists(file, error)) throw file_error(where + ": " + file + " does not exist");
  if (std::filesystem::is_directory(file, error)) throw file_error(where + ": " + file + " is a folder");
  OIIO::ImageSpec wish;
  wish.attribute("oiio:UnassociatedAlpha", 1);
  const QuietStderr quiet;
  OpenImage image;
  image.input = OIIO::ImageInput::open(file, &wish);
  if (!image.input) throw file_error(where + ": " + file + " is no readable image: " + first_line(OIIO::geterror()));
  const std::string format = image.input->format_name();
  image.ink = is_ink(image.input->spec(), format);
  const bool raw = image.ink && ink == Ink::kAsItIs && format == "tiff";
  if (raw) {
    wish.attribute("oiio:RawColor", 1);
    image.input = OIIO::ImageInput::open(file, &wish);
    if (!image.input) throw file_error(where + ": " + file + " is no readable image: " + first_line(OIIO::geterror()));
  }
  image.spec = image.input->spec();
  const OIIO::ImageSpec& spec = image.spec;
  const bool windowed = format == "openexr" && spec.full_width > 0 && spec.full_height > 0;
  image.width = windowed ? spec.full_width : spec.width;
  image.height = windowed ? spec.full_height : spec.height;
  image.left = windowed ? spec.x - spec.full_x : 0;
  image.top = windowed ? spec.y - spec.full_y : 0;
  const auto legal = [](i32 side) { return side >= 1 && side <= kLargestSide; };
  if (!legal(image.width) || !legal(image.height) || !legal(spec.width) || !legal(spec.height))
    throw file_error(where + ": " + file + " has " + std::to_string(image.width) + " x " +
                     std::to_string(image.height) + " pixels; a side must be 1 to " + std::to_string(kLargestSide));
  if (spec.depth > 1 || spec.deep || spec.nchannels < 1) throw file_error(where + ": " + file + " is no flat picture");
  if (raw && spec.nchannels < 4) throw file_error(where + ": " + file + " is CMYK with fewer than four channels");
  image.plan = raw ? kInkPlan : plan_channels(spec, format);
  image.type = spec.format == OIIO::TypeUInt8 || spec.format == OIIO::TypeUInt16 ? spec.format : OIIO::TypeFloat;
  return image;
}

u64 decoded_bytes(const OpenImage& image) {
  return static_cast<u64>(image.spec.width) * static_cast<u64>(image.spec.height) *
         static_cast<u64>(image.plan.used()) * image.type.size();
}

PictureColour colour_of(const OpenImage& image) {
  PictureColour colour;
  colour.ink = image.ink;
  colour.floats = image.spec.format.is_floating_point();
  if (const OIIO::ParamValue* icc = image.spec.find_attribute("ICCProfile")) {
    const u8* const data = static_cast<const u8*>(icc->data());
    colour.icc.assign(data, data + icc->datasize());
  }
  return colour;
}

OwnedWorld world_of(const InkImage& image) {
  OwnedWorld world(image.width, image.height, 16);
  for_each_row(image.height, [&](i32 y) {
    const u8* from = image.values.data() + static_cast<size_t>(y) * static_cast<size_t>(image.width) * 4;
    ZR_Pixel16* const to = world.row<ZR_Pixel16>(y);
    for (i32 x = 0; x < image.width; ++x, from += 4)
      to[x] = {widen_8_to_16(from[0]), widen_8_to_16(from[1]), widen_8_to_16(from[2]), widen_8_to_16(from[3])};
  });
  return world;
}

template <class Pixel, class File>
Pixel pixel_from_file(const File* from, const ChannelPlan& plan) {
  Pixel pixel;
  if (plan.associated) {
    const f32 alpha = float_from_file(from[plan.alpha]);
    const auto colour = [&](int channel) {
      return world_from_float<Pixel>(channel < 0 ? 1.0f
                                                 : straight_from_associated(float_from_file(from[channel]), alpha));
    };
    pixel = {world_from_float<Pixel>(alpha), colour(plan.red), colour(plan.green), colour(plan.blue)};
  } else {
    const auto value = [&](int channel) {
      return channel < 0 ? static_cast<Channel<Pixel>>(Depth<Pixel>::white) : world_from_file<Pixel>(from[channel]);
    };
    pixel = {value(plan.alpha), value(plan.red), value(plan.green), value(plan.blue)};
  }
  return pixel;
}

template <class Pixel, class File>
void place_pixels(const OpenImage& image, const std::vector<char>& decoded, OwnedWorld& world) {
  const size_t step = static_cast<size_t>(image.plan.used());
  const i32 begin = std::max(0, image.left), end = std::min(world.width(), image.left + image.spec.width);
  for_each_row(image.spec.height, [&](i32 y) {
    const i32 to_y = y + image.top;
    if (to_y < 0 || to_y >= world.height()) return;
    const File* from = reinterpret_cast<const File*>(decoded.data()) +
                       step * static_cast<size_t>(image.spec.width) * static_cast<size_t>(y);
    Pixel* to = world.row<Pixel>(to_y);
    for (i32 x = begin; x < end; ++x)
      to[x] = pixel_from_file<Pixel>(from + step * static_cast<size_t>(x - image.left), image.plan);
  });
}

// One row of a world as the file holds it: red, green, blue, alpha.
template <class Pixel>
void row_to_file(const Pixel* from, i32 width, bool associated, Channel<Pixel>* to) {
  for (i32 x = 0; x < width; ++x, ++from, to += 4) {
    to[0] = file_from_world(from->red);
    to[1] = file_from_world(from->green);
    to[2] = file_from_world(from->blue);
    to[3] = file_from_world(from->alpha);
    if constexpr (std::is_same_v<Pixel, ZR_PixelFloat>) {
      if (associated)
        for (int i = 0; i < 3; ++i) to[i] = associated_from_straight(to[i], to[3]);
    }
  }
}

OIIO::TypeDesc file_type(i32 depth) {
  return depth == 8 ? OIIO::TypeUInt8 : depth == 16 ? OIIO::TypeUInt16 : OIIO::TypeFloat;
}

}  // namespace

const std::vector<OutputFormat>& output_formats() {
  static const std::vector<OutputFormat> formats = {
      {"png", {".png"}, {8, 16}, false, "straight"},
      {"tiff", {".tif", ".tiff"}, {8, 16, 32}, false, "straight, marked unassociated"},
      {"openexr", {".exr"}, {32}, true, "associated (premultiplied)"},
  };
  return formats;
}

const OutputFormat& output_format_of(const std::string& file) {
  const std::string extension = plain_name(std::filesystem::path(file).extension().string());
  std::vector<std::string> all;
  for (const OutputFormat& format : output_formats()) {
    for (const std::string& known : format.extensions) {
      if (known == extension) return format;
      all.push_back(known);
    }
  }
  throw bad_input("output \"" + file + "\" has no known extension; it must end in " + quoted_list(all));
}

void require_depth(const OutputFormat& format, i32 depth, const std::string& file) {
  const auto holds = [&](const OutputFormat& one) {
    return std::find(one.depths.begin(), one.depths.end(), depth) != one.depths.end();
  };
  if (holds(format)) return;
  std::vector<std::string> held, fits;
  for (const i32 one : format.depths) held.emplace_back(depth_name(one));
  for (const OutputFormat& other : output_formats())
    if (holds(other)) fits.push_back(other.extensions.front());
  throw bad_input("output \"" + file + "\": " + format.name + " holds depth " + quoted_list(held) + ", not \"" +
                  depth_name(depth) + "\"; write " + quoted_list(fits) + " or change --depth");
}

std::vector<std::string> readable_formats() {
  std::vector<std::string> names;
  const std::string list = OIIO::get_string_attribute("input_format_list");
  for (size_t begin = 0; begin < list.size();) {
    const size_t end = std::min(list.find(',', begin), list.size());
    names.push_back(list.substr(begin, end - begin));
    begin = end + 1;
  }
  std::sort(names.begin(), names.end());
  return names;
}

ImageInfo probe_image(const std::string& file, const std::string& where) {
  const OpenImage image = open_image(file, where);
  const u64 pixels = static_cast<u64>(image.spec.width) * static_cast<u64>(image.spec.height);
  return {image.width, image.height, decoded_bytes(image) + (image.ink ? pixels * (sizeof(ZR_Pixel16) + 4) : 0)};
}

FileFacts read_facts(const std::string& file, const std::string& where) {
  const OpenImage image = open_image(file, where, Ink::kAsItIs);
  FileFacts facts;
  facts.format = image.input->format_name();
  facts.width = image.width;
  facts.height = image.height;
  const bool ink_jpeg = image.ink && facts.format == "jpeg";
  facts.channel_count = ink_jpeg ? 4 : image.spec.nchannels;
  for (const std::string& name : image.spec.channelnames) facts.channels += (facts.channels.empty() ? "" : ", ") + name;
  if (ink_jpeg) facts.channels = "C, M, Y, K";
  const OIIO::TypeDesc type = image.spec.format;
  facts.depth = type == OIIO::TypeUInt8 ? "8" : type == OIIO::TypeUInt16 ? "16" : type.c_str();
  facts.alpha = image.ink || image.plan.alpha < 0 ? "none" : image.plan.associated ? "associated" : "straight";
  facts.colour = colour_of(image);
  return facts;
}

namespace {

OwnedWorld read_world(OpenImage& image, i32 depth, const std::string& file, const std::string& where) {
  std::vector<char> decoded(decoded_bytes(image));
  const auto stop = [](void*, float) { return interrupted(); };
  const QuietStderr quiet;
  const bool read = image.input->read_image(0, 0, 0, image.plan.used(), image.type, decoded.data(), OIIO::AutoStride,
                                            OIIO::AutoStride, OIIO::AutoStride, stop);
  const std::string reason = image.input->geterror();
  stop_if_interrupted();
  // A picture that breaks off is read with its rest grey, and told only as a reason.
  if (!read || !reason.empty()) throw file_error(where + ": " + file + " cannot be read: " + first_line(reason));
  OwnedWorld world(image.width, image.height, depth);
  with_pixel_of(depth, [&]<class Pixel>() {
    if (image.type == OIIO::TypeUInt8)
      place_pixels<Pixel, u8>(image, decoded, world);
    else if (image.type == OIIO::TypeUInt16)
      place_pixels<Pixel, u16>(image, decoded, world);
    else
      place_pixels<Pixel, f32>(image, decoded, world);
  });
  return world;
}

}  // namespace

OwnedWorld load_image(const std::string& file, i32 depth, const std::string& where) {
  OpenImage image = open_image(file, where);
  return read_world(image, depth, file, where);
}

Picture load_picture(const std::string& file, i32 depth, const std::string& where) {
  OpenImage image = open_image(file, where, Ink::kAsItIs);
  PictureColour colour = colour_of(image);
  if (image.ink && std::string(image.input->format_name()) == "jpeg")
    return {world_of(read_ink_jpeg(file, where)), std::move(colour)};
  return {read_world(image, image.ink ? 16 : depth, file, where), std::move(colour)};
}

Picture load_stored(const std::string& file, i32 depth, const std::string& where) {
  OpenImage image = open_image(file, where);
  image.plan.associated = false;
  PictureColour colour = colour_of(image);
  if (colour.ink) colour = {};  // the profile is one of ink
  return {read_world(image, depth, file, where), std::move(colour)};
}

OwnedWorld world_in_space(Picture picture, Profile from, const Profile& to, i32 depth, i32 intent,
                          const std::string& file, const std::string& where) {
  if (!from) from = profile_of(picture.colour, file, where);
  const bool ink_profile = with_engine(where, [&] { return from->GetColourSpace(); }) == PRISMA_Word("CMYK");
  if (ink_profile != picture.colour.ink)
    throw bad_input(where + ": " + file + (picture.colour.ink ? " is CMYK, but not" : " is not CMYK, as is") +
                    " the profile that is given for it");
  if (same_space(from, to)) return std::move(picture.world);
  const TON_PRISMA_Transform transform = make_transform(from, to, intent, where + ": " + file);
  if (picture.colour.ink) return world_from_ink(picture.world, depth, transform, where + ": " + file);
  convert_world(picture.world, transform, where + ": " + file);
  return std::move(picture.world);
}

void save_image(const OwnedWorld& world, const OutputFormat& format, bool half, const std::string& file,
                const std::vector<u8>& icc) {
  const QuietStderr quiet;
  CheckedFile checked(file);  // outlives the writer, which may still write when it goes
  const std::unique_ptr<OIIO::ImageOutput> output = OIIO::ImageOutput::create(format.name);
  if (!output) throw file_error("the image library here cannot write " + std::string(format.name));
  OIIO::ImageSpec spec(world.width(), world.height(), 4, half ? OIIO::TypeHalf : file_type(world.depth()));
  spec.alpha_channel = 3;
  if (!format.associated) spec.attribute("oiio:UnassociatedAlpha", 1);
  spec.attribute("compression", "zip");
  spec.attribute("png:compressionLevel", 4);  // half the time of the usual 6, a twentieth larger
  spec.attribute("Software", "zr");
  if (!icc.empty())
    spec.attribute("ICCProfile", OIIO::TypeDesc(OIIO::TypeDesc::UINT8, static_cast<int>(icc.size())), icc.data());
  const auto fail = [&] {
    const std::string reason = output->geterror();
    throw file_error(file +
                     " cannot be written: " + (checked.failure().empty() ? first_line(reason) : checked.failure()));
  };
  if (!checked.failure().empty() || !output->set_ioproxy(&checked) || !output->open(file, spec)) fail();
  static constexpr i32 kStrip = 256;  // rows between two looks at the interrupt flag
  with_pixel_of(world.depth(), [&]<class Pixel>() {
    const size_t row_values = static_cast<size_t>(world.width()) * 4;
    std::vector<Channel<Pixel>> strip(row_values * static_cast<size_t>(std::min(kStrip, world.height())));
    for (i32 top = 0; top < world.height(); top += kStrip) {
      stop_if_interrupted();
      const i32 rows = std::min(kStrip, world.height() - top);
      for_each_row(rows, [&](i32 y) {
        row_to_file(world.row<Pixel>(top + y), world.width(), format.associated,
                    strip.data() + row_values * static_cast<size_t>(y));
      });
      if (!output->write_scanlines(top, top + rows, 0, file_type(world.depth()), strip.data())) fail();
    }
  });
  const bool written = output->close();
  checked.close();
  if (!written || !checked.failure().empty()) fail();
}

void set_image_threads(int threads) {
  OIIO::attribute("threads", threads);
  OIIO::attribute("exr_threads", threads > 1 ? threads : -1);
}

}  // namespace zr::tool
