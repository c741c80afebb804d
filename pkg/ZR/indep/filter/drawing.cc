// Single pixels, lines and soft spots.
#include <ZR/depth.h>
#include <ZR/drawing.h>

#include <algorithm>
#include <cmath>
#include <cstddef>

#include "world/guard.h"

namespace zr {
namespace {

template <class T>
i32 set_pixel(i32 x, i32 y, const T* pixel, ZR_LayerDef* layer) {
  if (pixel == nullptr || layer == nullptr || layer->data == nullptr) return 0;
  if (x < 0 || y < 0 || x >= layer->width || y >= layer->height) return 0;
  char* const row = static_cast<char*>(layer->data) + static_cast<std::ptrdiff_t>(y) * layer->row_bytes;
  reinterpret_cast<T*>(row)[x] = *pixel;
  return 1;
}

// ------------------------------------------------------------------------------ lines

// 16.16; a half is added away from zero.
i32 to_fixed(f64 v) { return truncate_i32(65536.0 * v + (v < 0 ? -0.5 : 0.5)); }

// Pixel i of a line, counted from its start, lies at (major + i * direction, (minor + i * slope) >> 16).
struct Line {
  bool steep;  // the major axis is y
  i64 major, direction;
  i64 minor, slope;
  i64 last;  // i of the last pixel
};

Line line_between(const f64 from[2], const f64 to[2]) {
  const f64 dx = to[0] - from[0], dy = to[1] - from[1];
  const i64 x = to_fixed(from[0]), y = to_fixed(from[1]);
  constexpr f64 shortest = 1e-12;
  if (std::fabs(dx) < shortest && std::fabs(dy) < shortest) return {false, (x + 32768) >> 16, 1, y + 32768, 0, 0};
  const bool steep = std::fabs(dy) >= std::fabs(dx);
  const i64 start = steep ? y : x, across = steep ? x : y;
  const f64 slope = 65536.0 * (steep ? dx : dy) / (steep ? dy : dx);
  const i64 step = truncate_i32(slope + (slope < 0 ? -0.5 : 0.5));
  // The start moves to the centre of its pixel along the major axis, and as far along the other as the slope says.
  const i64 snapped = (start + 32768) & ~i64{0xffff};
  const i64 minor = across + ((step * (snapped - start)) >> 16) + 32768;
  const i64 count = i64{truncate_i32(0.5 + (steep ? to[1] : to[0]))} - (snapped >> 16);
  return count < 0 ? Line{steep, snapped >> 16, -1, minor, -step, -count}
                   : Line{steep, snapped >> 16, 1, minor, step, count};
}

template <class T>
void draw(const Line& line, const T& pixel, const ZR_WorldX<T>& world) {
  const i64 width = world.width, height = world.height;
  const i64 length = line.steep ? height : width, breadth = line.steep ? width : height;
  // Only the pixels inside along the major axis: a line may be far longer than the world.
  const i64 first = std::max<i64>(0, line.direction > 0 ? -line.major : line.major - (length - 1));
  const i64 last = std::min(line.last, line.direction > 0 ? length - 1 - line.major : line.major);
  for (i64 i = first; i <= last; ++i) {
    const i64 major = line.major + i * line.direction, minor = (line.minor + i * line.slope) >> 16;
    if (minor < 0 || minor >= breadth) continue;
    *world.At(static_cast<i32>(line.steep ? minor : major), static_cast<i32>(line.steep ? major : minor)) = pixel;
  }
}

// Each channel times white and a half, truncated, and no more: what is above white wraps.
template <class T>
T quantised(const ZR_PixelFloat& c) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return c;
  else
    return {narrow_float_alpha<T>(c.alpha), narrow_float_alpha<T>(c.red), narrow_float_alpha<T>(c.green),
            narrow_float_alpha<T>(c.blue)};
}

bool is_finite(const f64 point[2]) { return std::isfinite(point[0]) && std::isfinite(point[1]); }

// ------------------------------------------------------------------------------ spots

// The part of a spot inside of the world, and where its weights begin.
struct SpotPart {
  i64 left, top, right, bottom;  // the last two are inside too
  std::ptrdiff_t first;          // weight of the top left pixel
  std::ptrdiff_t pitch;          // weights from one row to the next
};

SpotPart clip_spot(i64 x, i64 y, u32 flags, i32 diameter, const ZR_LayerDef& world) {
  const i64 half = diameter >> 1;
  const bool line = (flags & ZR_Spot_Line) != 0, column = (flags & ZR_Spot_Column) != 0;
  const i64 half_width = line && column ? 0 : half, half_height = line && !column ? 0 : half;
  const std::ptrdiff_t pitch = 2 * half_width + 1;
  const i64 left = std::max<i64>(x - half_width, 0), top = std::max<i64>(y - half_height, 0);
  return {left,
          top,
          std::min<i64>(x + half_width, world.width - 1),
          std::min<i64>(y + half_height, world.height - 1),
          (top - (y - half_height)) * pitch + (left - (x - half_width)),
          pitch};
}

void paint_row(const u32* weights, const ZR_Pixel8& colour, ZR_Pixel8* row, std::ptrdiff_t n) {
  static constexpr u32 white = static_cast<u32>(Depth<ZR_Pixel8>::white);
  for (std::ptrdiff_t i = 0; i < n; ++i) {
    const u32 w = weights[i];
    const auto mixed = [w](u32 c, u32 k) {
      return static_cast<u8>(std::min((c * (white - w) + k * w) / white, white));
    };
    const ZR_Pixel8 p = row[i];
    row[i] = {mixed(p.alpha, colour.alpha), mixed(p.red, colour.red), mixed(p.green, colour.green),
              mixed(p.blue, colour.blue)};
  }
}

}  // namespace
}  // namespace zr

extern "C" {

i32 ZR_SetPixel8(i32 x, i32 y, const ZR_Pixel8* pixel, ZR_LayerDef* world) { return zr::set_pixel(x, y, pixel, world); }
i32 ZR_SetPixel16(i32 x, i32 y, const ZR_Pixel16* pixel, ZR_LayerDef* world) {
  return zr::set_pixel(x, y, pixel, world);
}
i32 ZR_SetPixelFloat(i32 x, i32 y, const ZR_PixelFloat* pixel, ZR_LayerDef* world) {
  return zr::set_pixel(x, y, pixel, world);
}

i32 ZR_DrawLine(const f64 from[2], const f64 to[2], const ZR_PixelFloat* colour, ZR_LayerDef* world) {
  return zr::guarded([&]() -> i32 {
    if (from == nullptr || to == nullptr || colour == nullptr || world == nullptr || world->data == nullptr)
      return ZR_ReportBadCallbackParam(ZR_Site_DrawLine);
    return zr::on_depth(ZRp_WorldDepth(world), zr::unknown_depth_text, [&]<class T>() -> i32 {
      if (zr::is_finite(from) && zr::is_finite(to))
        zr::draw<T>(zr::line_between(from, to), zr::quantised<T>(*colour), ZR_WorldX<T>(world, false));
      return ZR_Err_None;
    });
  });
}

i32 ZR_PaintSpot(void*, i32 x, i32 y, u32 flags, i32 diameter, const u32* spot, ZR_Pixel8 colour, ZR_LayerDef* world) {
  return zr::guarded([&]() -> i32 {
    if (world == nullptr || world->data == nullptr || spot == nullptr || diameter < 0 || (diameter & 1) == 0 ||
        ZRp_WorldDepth(world) != zr::Depth<ZR_Pixel8>::bits)
      return ZR_ReportBadCallbackParam(ZR_Site_PaintSpot);
    const zr::SpotPart part = zr::clip_spot(x, y, flags, diameter, *world);
    const ZR_WorldX<ZR_Pixel8> target(world, false);
    if (part.right < part.left) return ZR_Err_None;
    for (i64 row = part.top; row <= part.bottom; ++row)
      zr::paint_row(spot + part.first + (row - part.top) * part.pitch, colour,
                    target.At(static_cast<i32>(part.left), static_cast<i32>(row)), part.right - part.left + 1);
    return ZR_Err_None;
  });
}

}  // extern "C"
