// zr transform: one picture scaled, turned, leaned or put through a matrix.
#include <algorithm>
#include <charconv>
#include <cmath>
#include <memory>

#include <ZR/hostkit.h>
#include <ZR/transfer_mode.h>
#include <ZR/transform_world.h>

#include "colour_text.h"
#include "commands.h"
#include "common_options.h"
#include "depths.h"
#include "interrupt_state.h"
#include "one_picture.h"
#include "placement.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

constexpr f64 kHairline = 1e-9;  // pixels; what rounding leaves beyond an edge is no pixel

struct TransformOptions : PictureOptions {
  std::string scale = "1", rotate = "0", skew = "0", translate = "0,0", matrix, size, background = "none";
  std::string quality = "bilinear";
};

// What is to be done, checked; lengths in pixels.
struct Request {
  GX_Matrix3 turning;
  bool exact = false;  // `turning` is a whole matrix: it says where the picture stands
  Point translate;
  i32 width = 0, height = 0;  // 0: as large as the result
  std::optional<ZR_PixelFloat> background;
  i32 quality = 1;
};

std::string range_text(f64 limit) {
  const std::string text = std::to_string(static_cast<i64>(limit));
  return '-' + text + " to " + text;
}

// Numbers with commas or blanks between them; empty when the text is anything else.
std::vector<f64> parse_numbers(const std::string& text, f64 limit) {
  std::vector<f64> numbers;
  const char *at = text.data(), *const end = at + text.size();
  for (;;) {
    while (at != end && *at == ' ') ++at;
    f64 number = 0;
    const auto [stop, error] = std::from_chars(at, end, number);
    if (error != std::errc() || !(std::abs(number) <= limit)) return {};
    numbers.push_back(number);
    at = stop;
    while (at != end && *at == ' ') ++at;
    if (at == end) return numbers;
    if (*at == ',') ++at;
  }
}

// `single` stands in for the second of a pair that is given as one number.
Point parse_pair(const std::string& text, const char* option, f64 limit, std::optional<f64> single, bool both) {
  const std::vector<f64> numbers = parse_numbers(text, limit);
  if (numbers.size() == 2) return {numbers[0], numbers[1]};
  if (numbers.size() == 1 && both) return {numbers[0], numbers[0]};
  if (numbers.size() == 1 && single) return {numbers[0], *single};
  throw bad_input(
      std::string("transform: ") + option + " is \"" + text + "\"; it must be " +
      (both || single ? "a number or two with a comma between them" : "two numbers with a comma between them") +
      ", each " + range_text(limit));
}

GX_Matrix3 parse_matrix(const std::string& text) {
  const std::vector<f64> numbers = parse_numbers(text, kFarthest);
  if (numbers.size() != 9 || numbers[6] != 0 || numbers[7] != 0 || numbers[8] != 1)
    throw bad_input("transform: --matrix is \"" + text + "\"; it must be nine numbers, row by row, " +
                    range_text(kFarthest) + ", the last row 0,0,1");
  GX_Matrix3 matrix;
  std::copy(numbers.begin(), numbers.end(), &matrix.m[0][0]);
  return matrix;
}

Request parse_request(const TransformOptions& options) {
  Request request;
  request.exact = !options.matrix.empty();
  const Point scale = parse_pair(options.scale, "--scale", kLargestScale, {}, true);
  const Point skew = parse_pair(options.skew, "--skew", kLargestSkew, 0, false);
  const std::vector<f64> rotation = parse_numbers(options.rotate, kLargestRotation);
  if (rotation.size() != 1)
    throw bad_input("transform: --rotate is \"" + options.rotate + "\"; it must be a number of degrees, " +
                    range_text(kLargestRotation));
  request.translate = parse_pair(options.translate, "--translate", kFarthest, {}, false);
  request.turning = request.exact ? parse_matrix(options.matrix) : turning_matrix(scale, skew, rotation[0]);
  const auto& m = request.turning.m;
  const f64 surface = m[0][0] * m[1][1] - m[0][1] * m[1][0];
  const f64 unleaned = std::hypot(m[0][0], m[1][0]) * std::hypot(m[0][1], m[1][1]);
  if (!(std::abs(surface) > unleaned * 1e-12))
    throw bad_input("transform: this " + std::string(request.exact ? "--matrix" : "--scale and --skew") +
                    " flattens the picture to nothing" + (request.exact ? "" : "; neither scale may be 0"));
  if (!options.size.empty()) parse_size(options.size, "transform: --size", request.width, request.height);
  if (options.background != "none") {
    request.background = parse_colour(options.background);
    if (!request.background)
      throw bad_input("transform: --background is \"" + options.background +
                      "\"; it must be none, \"#rrggbb\" or \"#rrggbbaa\"");
  }
  const std::vector<std::string>& names = quality_names();
  request.quality = static_cast<i32>(std::find(names.begin(), names.end(), options.quality) - names.begin());
  return request;
}

struct Box {
  f64 left, top, right, bottom;
};

// Of the four corners.
Box box_of(const GX_Matrix3& matrix, f64 width, f64 height) {
  const auto& m = matrix.m;
  const auto ends = [&](int row) {
    const f64 across = m[row][0] * width, down = m[row][1] * height;
    return Point{m[row][2] + std::min(across, 0.0) + std::min(down, 0.0),
                 m[row][2] + std::max(across, 0.0) + std::max(down, 0.0)};
  };
  const Point x = ends(0), y = ends(1);
  return {x.x, y.x, x.y, y.y};
}

// Pixels from `low`, which is a pixel's edge, to the pixel that still touches `high`.
f64 pixels_between(f64 low, f64 high) { return std::max(1.0, std::ceil(high - low - kHairline)); }

OwnedWorld transformed(OwnedWorld& picture, const Request& request) {
  GX_Matrix3 matrix = request.turning;
  Box box = box_of(matrix, picture.width(), picture.height());
  f64 &x = matrix.m[0][2], &y = matrix.m[1][2];
  if (!request.exact) {
    x = request.translate.x - box.left;
    y = request.translate.y - box.top;
    box = box_of(matrix, picture.width(), picture.height());
  }
  i32 width = request.width, height = request.height;
  if (width == 0) {
    const f64 left = std::floor(box.left + kHairline), top = std::floor(box.top + kHairline);
    const f64 across = pixels_between(left, box.right), down = pixels_between(top, box.bottom);
    if (across > kLargestSide || down > kLargestSide)
      throw bad_input("transform: the result would have " + std::to_string(static_cast<i64>(across)) + " x " +
                      std::to_string(static_cast<i64>(down)) + " pixels; a side has at most " +
                      std::to_string(kLargestSide) + " (--size takes a part of it)");
    width = static_cast<i32>(across);
    height = static_cast<i32>(down);
    x -= left;
    y -= top;
  } else if (!request.exact) {
    // In the middle, to whole pixels: what is not turned stays sharp.
    x += std::floor((width - pixels_between(0, box.right - box.left)) / 2);
    y += std::floor((height - pixels_between(0, box.bottom - box.top)) / 2);
  }
  if (static_cast<u64>(width) * static_cast<u64>(height) * static_cast<u64>(picture.depth() / 2) >
      machine_memory() / 4 * 3)
    throw ToolError(kExitMemory, "transform: the result is too large for this machine's memory");
  OwnedWorld result(width, height, picture.depth());
  if (request.background)
    check(ZR_FillFloat(nullptr, &*request.background, nullptr, result.layer()), "transform: --background");
  const ZR_CompositeModePlus mode(request.background ? XferInFront : XferCopy, 1.0f, nullptr, false, 0);
  const GX_LRect all = result.bounds();
  check(ZRHost_TransformWorld(&abort_on_interrupt(), request.quality, 0, 0, picture.layer(), &mode, nullptr, nullptr,
                              &matrix, 1, true, &all, result.layer()),
        "transform");
  return result;
}

void transform(const TransformOptions& options) {
  const Request request = parse_request(options);
  turn_picture(options, "transform", {}, [&](Picture picture, i32 depth) -> Finished {
    Finished rgb = without_ink(std::move(picture), depth, options.input, "transform");
    return {transformed(rgb.world, request), std::move(rgb.icc)};
  });
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<TransformOptions>();
  add_picture_options(verb, *options);
  const auto text = [&](const char* name, std::string& value, const char* meaning, const char* type) {
    return verb.add_option(name, value, meaning)->type_name(type);
  };
  CLI::Option* parts[] = {
      text("--scale", options->scale, "1 is the picture's own size; negative mirrors", "NUMBER|X,Y -1000..1000")
          ->capture_default_str(),
      text("--rotate", options->rotate, "Degrees, clockwise as seen", "DEGREES -360000..360000")->capture_default_str(),
      text("--skew", options->skew, "Degrees; X leans upright edges, Y level ones; before the rotation",
           "X|X,Y -89..89")
          ->capture_default_str(),
      text("--translate", options->translate, "Pixels; whole ones matter only with --size", "X,Y -1000000..1000000")
          ->capture_default_str()};
  CLI::Option* matrix = text("--matrix", options->matrix,
                             "Row by row, the last row 0,0,1: from points of the picture to points of the result, in "
                             "place of the four above",
                             "NINE,NUMBERS");
  for (CLI::Option* part : parts) matrix->excludes(part);
  text("--size", options->size, "Pixels of the result (default: what holds all of it)", "WIDTHxHEIGHT 1..30000");
  verb.add_option("--quality", options->quality,
                  "draft takes the nearest pixel; the others take means when they reduce")
      ->check(CLI::IsMember(quality_names()).description(""))
      ->type_name("draft|bilinear|bicubic")
      ->capture_default_str();
  text("--background", options->background, "What is behind the picture: none, \"#rrggbb\" or \"#rrggbbaa\"",
       "none|COLOUR")
      ->capture_default_str();
  verb.footer(
      "Examples:\n"
      "  zr transform photo.jpg -o small.png --scale 0.37 --rotate 30 --quality bicubic\n"
      "  zr transform logo.png -o logo-left.png --rotate -90\n"
      "  zr transform photo.jpg -o card.png --skew 12 --size 960x540 --background \"#102030\"\n"
      "  zr transform photo.jpg -o part.png --matrix 2,0,-300,0,2,-200,0,0,1 --size 640x360\n"
      "\n"
      "The picture is scaled, then skewed, then rotated. Without --size the result is its bounding box, which\n"
      "begins at a pixel's edge; with --size the box stands in the middle, to whole pixels, moved by --translate.\n"
      "A matrix says by itself where the picture stands. Around the picture the result is transparent unless\n"
      "--background fills it. The picture's profile is kept; CMYK is converted to sRGB by its profile.");
  return [options] { transform(*options); };
}

}  // namespace

const Command kTransformCommand = {"transform", "Scale, turn or lean one picture, or put it through a matrix",
                                   &declare};

}  // namespace zr::tool
