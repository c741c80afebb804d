// zr resize: one picture in another size.
#include <algorithm>
#include <charconv>
#include <cmath>
#include <memory>
#include <optional>

#include <ZR/hostkit.h>

#include "commands.h"
#include "common_options.h"
#include "depths.h"
#include "interrupt_state.h"
#include "one_picture.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

constexpr f64 kLargestPercent = 100000;

struct ResizeOptions : PictureOptions {
  std::string size, quality = "best";
};

// A number of pixels, 0 where it follows from the picture's shape; or a part of the picture's size.
struct Request {
  i32 width = 0, height = 0;
  std::optional<f64> percent;
};

template <class Number>
std::optional<Number> whole_number(std::string_view text, Number least, Number most) {
  Number number = 0;
  const auto [stop, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc() || stop != text.data() + text.size() || !(number >= least && number <= most)) return {};
  return number;
}

Request parse_size(const std::string& text) {
  const auto side = [](std::string_view digits) { return whole_number<i32>(digits, 1, kLargestSide); };
  const std::string_view all = text;
  const size_t cross = all.find('x');
  std::optional<i32> width, height;
  if (!all.empty() && all.back() == '%') {
    const auto percent = whole_number<f64>(all.substr(0, all.size() - 1), 1e-3, kLargestPercent);
    if (percent) return {0, 0, percent};
  } else if (cross == std::string_view::npos) {
    if ((width = side(all))) return {*width, 0, {}};
  } else {
    const std::string_view left = all.substr(0, cross), right = all.substr(cross + 1);
    width = side(left), height = side(right);
    if ((width || left.empty()) && (height || right.empty()) && (width || height))
      return {width.value_or(0), height.value_or(0), {}};
  }
  throw bad_input("resize: the size is \"" + text +
                  "\"; it must be WIDTHxHEIGHT, WIDTHx, xHEIGHT or a percentage such as 50%; a side has 1 to " +
                  std::to_string(kLargestSide) + " pixels");
}

struct PixelSize {
  i32 width, height;
};

PixelSize size_for(const Request& request, i32 width, i32 height) {
  f64 across = request.width, down = request.height;
  if (request.percent) {
    across = std::round(width * *request.percent / 100);
    down = std::round(height * *request.percent / 100);
  } else if (request.height == 0) {
    down = std::round(across * height / width);
  } else if (request.width == 0) {
    across = std::round(down * width / height);
  }
  across = std::max(across, 1.0), down = std::max(down, 1.0);
  if (across > kLargestSide || down > kLargestSide)
    throw bad_input("resize: the result would have " + std::to_string(static_cast<i64>(across)) + " x " +
                    std::to_string(static_cast<i64>(down)) + " pixels; a side has at most " +
                    std::to_string(kLargestSide));
  return {static_cast<i32>(across), static_cast<i32>(down)};
}

void copy(OwnedWorld& from, const GX_LRect& in, OwnedWorld& to, const GX_LRect& out) {
  check(ZRHost_CopyBits_Draft(nullptr, from.layer(), to.layer(), &in, &out), "resize");
}

// The picture with its edge pixels once more around it: samplers see transparent black outside of a world, and
// an enlarged picture would fade towards its edges.
OwnedWorld with_border(OwnedWorld& picture) {
  const i32 w = picture.width(), h = picture.height();
  OwnedWorld framed(w + 2, h + 2, picture.depth());
  copy(picture, {0, 0, w, h}, framed, {1, 1, w + 1, h + 1});
  copy(framed, {1, 1, 2, h + 1}, framed, {0, 1, 1, h + 1});
  copy(framed, {w, 1, w + 1, h + 1}, framed, {w + 1, 1, w + 2, h + 1});
  copy(framed, {0, 1, w + 2, 2}, framed, {0, 0, w + 2, 1});
  copy(framed, {0, h, w + 2, h + 1}, framed, {0, h + 1, w + 2, h + 2});
  return framed;
}

void sample(OwnedWorld& from, const GX_LRect& in, OwnedWorld& to) {
  check(ZRHost_CopyBits_HQ_Straight(&abort_on_interrupt(), from.layer(), to.layer(), &in, nullptr), "resize");
}

OwnedWorld resized(OwnedWorld& picture, PixelSize size, bool best) {
  const i32 w = picture.width(), h = picture.height();
  if (static_cast<u64>(size.width) * static_cast<u64>(size.height) * static_cast<u64>(picture.depth() / 2) >
      machine_memory() / 4 * 3)
    throw ToolError(kExitMemory, "resize: the result is too large for this machine's memory");
  OwnedWorld result(size.width, size.height, picture.depth());
  if (!best || (size.width == w && size.height == h)) {
    copy(picture, picture.bounds(), result, result.bounds());
  } else if ((size.width > w || size.height > h) && std::max(w, h) + 2 <= kLargestSide) {
    OwnedWorld framed = with_border(picture);
    sample(framed, {1, 1, w + 1, h + 1}, result);
  } else {
    sample(picture, picture.bounds(), result);
  }
  return result;
}

void resize(const ResizeOptions& options) {
  const Request request = parse_size(options.size);
  const ImageInfo info = probe_image(options.input, "resize");
  const PixelSize size = size_for(request, info.width, info.height);
  const bool best = options.quality == "best";
  turn_picture(options, "resize", {}, [&](Picture picture, i32 depth) -> Finished {
    Finished rgb = without_ink(std::move(picture), depth, options.input, "resize");
    return {resized(rgb.world, size, best), std::move(rgb.icc)};
  });
}

Run declare(CLI::App& verb) {
  const auto options = std::make_shared<ResizeOptions>();
  add_picture_options(verb, *options);
  verb.add_option("size", options->size, "Pixels of the result, 1..30000 a side; one side alone keeps the shape")
      ->required()
      ->type_name("WIDTHxHEIGHT|WIDTHx|xHEIGHT|PERCENT%");
  verb.add_option("--quality", options->quality,
                  "draft takes the nearest pixel; best takes means when it reduces and interpolates when it enlarges")
      ->check(CLI::IsMember({"draft", "best"}).description(""))
      ->type_name("draft|best")
      ->capture_default_str();
  verb.footer(
      "Examples:\n"
      "  zr resize photo.jpg -o frame.png 1920x1080\n"
      "  zr resize photo.jpg -o small.png 640x\n"
      "  zr resize icon.png -o large.png 400% --quality draft\n"
      "\n"
      "Colours are weighted by alpha, so that a cut-out keeps its edge's colour. The picture's profile is kept; CMYK\n"
      "is converted to sRGB by its profile.");
  return [options] { resize(*options); };
}

}  // namespace

const Command kResizeCommand = {"resize", "Write one picture in another size", &declare};

}  // namespace zr::tool
