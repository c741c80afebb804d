// zr mask: a mask of shapes, as a picture of its own or merged into the alpha of one.
#include <charconv>
#include <cmath>
#include <map>
#include <memory>

#include "commands.h"
#include "common_options.h"
#include "depths.h"
#include "mask_text.h"
#include "one_picture.h"
#include "output_files.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

struct MaskOptions : PictureOptions {
  std::string size, like, fade = "1";
  std::vector<std::string> shapes[std::size(kShapeNames)];  // texts of each kind
  bool invert = false;
  const CLI::App* verb = nullptr;  // knows the order in which they came
};

struct Request {
  std::vector<MaskShape> shapes;
  MaskFinish finish;
};

Request parse_request(const MaskOptions& options) {
  Request request;
  std::map<const CLI::Option*, size_t> taken;
  for (const CLI::Option* option : options.verb->parse_order())
    for (size_t kind = 0; kind < std::size(kShapeNames); ++kind) {
      const std::string name = std::string("--") + kShapeNames[kind];
      if (option->get_name() != name) continue;
      const std::string& text = options.shapes[kind][taken[option]++];
      request.shapes.push_back(parse_shape(static_cast<MaskShape::Kind>(kind), text, "mask: " + name));
    }
  if (request.shapes.empty()) throw bad_input("mask: there is no shape; give --rectangle, --ellipse or --polygon");
  if (request.shapes.size() > kMostShapes)
    throw bad_input("mask: there are " + std::to_string(request.shapes.size()) + " shapes; a mask has at most " +
                    std::to_string(kMostShapes));
  const char *const begin = options.fade.data(), *const end = begin + options.fade.size();
  f64& fade = request.finish.fade;
  const auto [stop, error] = std::from_chars(begin, end, fade);
  if (error != std::errc() || stop != end || !(fade >= 0 && fade <= 1))
    throw bad_input("mask: --fade is \"" + options.fade + "\"; it must be a number 0 to 1");
  request.finish.invert = options.invert;
  return request;
}

void cut_picture(const MaskOptions& options) {
  const Request request = parse_request(options);
  PictureTask task;
  task.extra_bytes = [&](const ImageInfo& info, i32 depth) {
    return mask_bytes(info.width, info.height, mask_depth_for(depth), request.shapes);
  };
  const auto work = [&](Picture picture, i32 depth) -> Finished {
    Finished rgb = without_ink(std::move(picture), depth, options.input, "mask");
    const OwnedMask mask =
        draw_mask(rgb.world.width(), rgb.world.height(), mask_depth_for(depth), request.shapes, request.finish, "mask");
    merge_mask(*mask, rgb.world, "mask");
    return rgb;
  };
  turn_picture(options, "mask", {}, work, task);
}

void draw_picture(const MaskOptions& options) {
  const Request request = parse_request(options);
  const i32 depth = options.depth.empty() ? 8 : parse_depth(options.depth, "mask: --depth");
  if (depth == 32) throw bad_input("mask: --depth is \"float\"; a mask without a picture has 8 or 16");
  require_depth(output_format_of(options.output), depth, options.output);
  ImageInfo size;
  std::vector<std::string> inputs;
  if (options.like.empty()) {
    parse_size(options.size, "mask: --size", size.width, size.height);
  } else {
    inputs.push_back(options.like);
    size = probe_image(options.like, "mask: --like");
  }
  check_outputs({options.output}, inputs, options.force);
  const u64 pixels = static_cast<u64>(size.width) * static_cast<u64>(size.height);
  if (pixels * static_cast<u64>(depth / 2) + mask_bytes(size.width, size.height, depth, request.shapes) >
      machine_memory() / 4 * 3)
    throw ToolError(kExitMemory, "mask: the mask is too large for this machine's memory");
  const ToolHost host(options.threads);
  Stopwatch reading;
  reading.stop();
  finish_picture(options, host, reading, [&]() -> Finished {
    const OwnedMask mask = draw_mask(size.width, size.height, depth, request.shapes, request.finish, "mask");
    return {picture_of_mask(*mask), {}};
  });
}

void make_mask(const MaskOptions& options) {
  const int sources = !options.input.empty() + !options.size.empty() + !options.like.empty();
  if (sources != 1) throw bad_input("mask: give one of a picture, --size and --like");
  options.input.empty() ? draw_picture(options) : cut_picture(options);
}

std::string mode_list() {
  std::string list;
  for (const MaskMode& mode : mask_modes())
    list += "  " + std::string(mode.name) + std::string(17 - std::string(mode.name).size(), ' ') + mode.meaning + '\n';
  return list;
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<MaskOptions>();
  options->verb = &verb;
  add_picture_options(verb, *options);
  verb.get_option("picture")->required(false)->description("Picture whose alpha is multiplied by the mask");
  verb.add_option("--size", options->size, "In place of a picture: a mask of this size, as a grey picture")
      ->type_name("WIDTHxHEIGHT 1.." + std::to_string(kLargestSide));
  verb.add_option("--like", options->like, "The same, of the size of a picture")->type_name("PICTURE");
  const auto shape = [&](MaskShape::Kind kind, const char* description, const char* values) {
    verb.add_option(std::string("--") + name_of(kind), options->shapes[static_cast<size_t>(kind)], description)
        ->allow_extra_args(false)
        ->type_name(values);
  };
  shape(MaskShape::Kind::kRectangle, "Adds a rectangle", "\"X Y WIDTH HEIGHT [WORDS]\"");
  shape(MaskShape::Kind::kEllipse, "Adds the ellipse that fills a rectangle", "\"X Y WIDTH HEIGHT [WORDS]\"");
  shape(MaskShape::Kind::kPolygon, "Adds a polygon of 3 to 1000 points", "\"X,Y X,Y X,Y ... [WORDS]\"");
  verb.add_flag("--invert", options->invert, "White minus the mask, at the end");
  verb.add_option("--fade", options->fade, "Multiplies the mask, last of all")
      ->type_name("NUMBER 0..1")
      ->capture_default_str();
  verb.footer(
      "Examples:\n"
      "  zr mask photo.jpg -o cut.png --ellipse \"80 40 320 240 feather 12\"\n"
      "  zr mask -o ring.png --size 400x400 --ellipse \"20 20 360 360\" --ellipse \"90 90 220 220 mode subtract\"\n"
      "  zr mask -o star.png --like photo.jpg --depth 16 --polygon \"200,20 310,360 20,150 380,150 90,360 feather 3\"\n"
      "  zr mask photo.jpg -o hole.png --rectangle \"100 80 200 120 mode subtract feather 20 opacity 0.8\"\n"
      "\n"
      "Shapes are drawn in the order of the line, in pixels from the left top corner; parts of pixels count, and "
      "edges\n"
      "are smooth. After the numbers a shape may have these words, in any order:\n"
      "  feather RADIUS   0 to 1000 pixels: a Gaussian blur of that radius (default 0)\n"
      "  opacity NUMBER   0 to 1 (default 1)\n"
      "  mode NAME        how it joins the shapes before it (default screen):\n" +
      mode_list() +
      "\nA mask begins empty; but where the first shape is one that takes away (subtract, intersect, darken), it "
      "begins\n"
      "full. A polygon is filled where it winds around. A mask has 8 bits with a picture of 8 bits, else 16. Colours\n"
      "of a picture stay; its profile is kept; CMYK is converted to sRGB by its profile.");
  return [options] { make_mask(*options); };
}

}  // namespace

const Command kMaskCommand = {"mask", "Draw a mask of shapes, or cut a picture out by it", &declare};

}  // namespace zr::tool
