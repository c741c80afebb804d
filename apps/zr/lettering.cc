// Small labels on 8-bit worlds, with letters of our own: no font files are needed.
//
// A letter is a few strokes of a round pen. Points are two digits of base 36, x then y: capitals stand
// on y = 10 and reach 0, small letters reach 4, descenders 13. A stroke begins with its kind:
//   '-' straight from point to point; '~' a smooth curve from the first to the last, drawn toward the
//   points between (a quadratic B-spline); '@' the same, closed.
#include "lettering.h"

#include <algorithm>
#include <cmath>
#include <vector>

namespace zr::tool {
namespace {

struct Letter {
  char character;
  i32 width;
  const char* strokes;  // parted by spaces
};

constexpr Letter kLetters[] = {
    {'a', 6, "@04646a0a -646a"},
    {'b', 6, "-000a @04646a0a"},
    {'c', 6, "~6544040a4a69"},
    {'d', 6, "@04646a0a -606a"},
    {'e', 6, "-0767 ~6764040a4a69"},
    {'f', 4, "~402023232a -0444"},
    {'g', 6, "@04646a0a ~646a6d2d0c"},
    {'h', 6, "-000a ~070464676a"},
    {'i', 0, "-040a -0101"},
    {'j', 2, "~242b2d0d -2121"},
    {'k', 5, "-000a -5408 -265a"},
    {'l', 0, "-000a"},
    {'m', 8, "-040a ~070444474a ~474484878a"},
    {'n', 6, "-040a ~070464676a"},
    {'o', 6, "@04646a0a"},
    {'p', 6, "-040d @04646a0a"},
    {'q', 6, "@04646a0a -646d"},
    {'r', 4, "-040a ~070444"},
    {'s', 5,
     "~5544040757"
     "5a1a09"},
    {'t', 4, "~21272a4a -0444"},
    {'u', 6, "~04070a6a67 -646a"},
    {'v', 6, "-043a64"},
    {'w', 8, "-042a446a84"},
    {'x', 6, "-046a -640a"},
    {'y', 6, "-043a -642c"},
    {'z', 6, "-04640a6a"},
    {'0', 6, "@00606a0a"},
    {'1', 4, "-12303a"},
    {'2', 6, "~020060650a -0a6a"},
    {'3', 6, "~0120606525 ~25656a2a09"},
    {'4', 6, "-4a400767"},
    {'5', 6, "-601004 ~04646a2a09"},
    {'6', 6, "@04646a0a ~500007"},
    {'7', 6, "-00602a"},
    {'8', 6, "@10505515 @05656a0a"},
    {'9', 6, "@00606606 ~636a1a"},
    {'Z', 6, "-00600a6a"},
    {'R', 6, "-000a -0030 ~30606535 -3505 -356a"},
    {'-', 4, "-0747"},
    {'.', 0, "-0a0a"},
};
constexpr f32 kCapital = 10, kGap = 3.2f, kBlank = 4;

struct Spot {
  f32 x, y;
};
Spot middle(Spot a, Spot b) { return {(a.x + b.x) / 2, (a.y + b.y) / 2}; }

const Letter* find_letter(char character) {
  const auto* found = std::find_if(std::begin(kLetters), std::end(kLetters),
                                   [&](const Letter& one) { return one.character == character; });
  return found == std::end(kLetters) ? nullptr : found;
}

f32 digit(char c) { return static_cast<f32>(c <= '9' ? c - '0' : c - 'a' + 10); }

void add_curve(std::vector<Spot>& line, Spot from, Spot toward, Spot to) {
  constexpr int kSteps = 8;
  for (int i = 1; i <= kSteps; ++i) {
    const f32 t = static_cast<f32>(i) / kSteps, u = 1 - t;
    line.push_back(
        {u * u * from.x + 2 * u * t * toward.x + t * t * to.x, u * u * from.y + 2 * u * t * toward.y + t * t * to.y});
  }
}

// A stroke as straight pieces.
std::vector<Spot> flatten(std::string_view stroke) {
  std::vector<Spot> points;
  for (size_t i = 1; i + 1 < stroke.size(); i += 2) points.push_back({digit(stroke[i]), digit(stroke[i + 1])});
  if (stroke[0] == '-' || points.size() < 3) return points;
  std::vector<Spot> line;
  const size_t count = points.size();
  if (stroke[0] == '@') {
    line.push_back(middle(points[count - 1], points[0]));
    for (size_t i = 0; i < count; ++i)
      add_curve(line, line.back(), points[i], middle(points[i], points[(i + 1) % count]));
  } else {
    line.push_back(points[0]);
    for (size_t i = 1; i + 1 < count; ++i)
      add_curve(line, line.back(), points[i], i + 2 == count ? points[i + 1] : middle(points[i], points[i + 1]));
  }
  return line;
}

f32 distance_to(const std::vector<Spot>& line, Spot p) {
  f32 least = 1e9f;
  for (size_t i = 0; i < line.size(); ++i) {
    const Spot a = line[i], b = line[std::min(i + 1, line.size() - 1)];
    const f32 dx = b.x - a.x, dy = b.y - a.y, length = dx * dx + dy * dy;
    const f32 t = length > 0 ? std::clamp(((p.x - a.x) * dx + (p.y - a.y) * dy) / length, 0.0f, 1.0f) : 0.0f;
    least = std::min(least, std::hypot(p.x - a.x - t * dx, p.y - a.y - t * dy));
  }
  return least;
}

void blend(ZR_Pixel8& pixel, const ZR_Pixel8& colour, f32 cover) {
  const auto mix = [cover](u8 a, u8 b) {
    return static_cast<u8>(static_cast<f32>(a) + (static_cast<f32>(b) - static_cast<f32>(a)) * cover + 0.5f);
  };
  pixel = {mix(pixel.alpha, 255), mix(pixel.red, colour.red), mix(pixel.green, colour.green),
           mix(pixel.blue, colour.blue)};
}

void draw_letter(OwnedWorld& world, const Letter& letter, f32 left, f32 top, f32 unit, const ZR_Pixel8& colour) {
  std::vector<std::vector<Spot>> strokes;
  for (std::string_view rest = letter.strokes; !rest.empty();) {
    const size_t end = std::min(rest.find(' '), rest.size());
    strokes.push_back(flatten(rest.substr(0, end)));
    rest.remove_prefix(std::min(end + 1, rest.size()));
  }
  const f32 pen = std::max(0.62f, 0.62f * unit);  // radius in pixels
  const auto bound = [](f32 value, i32 limit) { return std::clamp(static_cast<i32>(std::floor(value)), 0, limit); };
  const i32 x_end = bound(left + (static_cast<f32>(letter.width) + 2) * unit + 2, world.width());
  const i32 y_end = bound(top + 15 * unit + 2, world.height());
  for (i32 y = bound(top - 2 * unit, world.height()); y < y_end; ++y) {
    for (i32 x = bound(left - 2 * unit, world.width()); x < x_end; ++x) {
      const Spot at{(static_cast<f32>(x) + 0.5f - left) / unit, (static_cast<f32>(y) + 0.5f - top) / unit};
      f32 least = 1e9f;
      for (const auto& stroke : strokes) least = std::min(least, distance_to(stroke, at));
      const f32 cover = std::clamp(pen + 0.5f - least * unit, 0.0f, 1.0f);
      if (cover > 0) blend(world.row<ZR_Pixel8>(y)[x], colour, cover);
    }
  }
}

}  // namespace

i32 text_width(std::string_view text, i32 height) {
  f32 units = 0;
  for (const char c : text) {
    const Letter* letter = find_letter(c);
    units += (letter != nullptr ? static_cast<f32>(letter->width) : kBlank - kGap) + kGap;
  }
  return static_cast<i32>(std::ceil(std::max(0.0f, units - kGap) * static_cast<f32>(height) / kCapital));
}

void draw_text(OwnedWorld& world, std::string_view text, i32 x, i32 y, i32 height, const ZR_Pixel8& colour) {
  const f32 unit = static_cast<f32>(height) / kCapital;
  f32 left = static_cast<f32>(x);
  for (const char c : text) {
    const Letter* letter = find_letter(c);
    if (letter != nullptr) draw_letter(world, *letter, left, static_cast<f32>(y), unit, colour);
    left += ((letter != nullptr ? static_cast<f32>(letter->width) : kBlank - kGap) + kGap) * unit;
  }
}

}  // namespace zr::tool
