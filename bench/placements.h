// Where the measured layers are placed and how frames are resized; ours and the peers' take the same.
#pragma once

#include <ZR/copy_bits.h>
#include <ZR/types.h>

#include <cmath>

#include "workloads.h"

namespace bench {

// Source to destination: turned and scaled around the middles of two pictures of one size, then moved.
inline GX_Matrix3 placement(f64 degrees, f64 scale, i32 width, i32 height, f64 dx = 0, f64 dy = 0) {
  const f64 angle = degrees * 3.14159265358979323846 / 180, c = scale * std::cos(angle), s = scale * std::sin(angle);
  const f64 x = width / 2.0, y = height / 2.0;
  return {{{c, -s, x - c * x + s * y + dx}, {s, c, y - s * x - c * y + dy}, {0, 0, 1}}};
}

inline constexpr f64 turned_degrees = 30, enlarged = 1.3, reduced = 0.37;

// Work with one matrix.
struct Placement {
  const char* name;
  i32 quality;  // 0 draft, 1 bilinear or area, 2 bicubic
  f64 degrees, scale, dx, dy;

  GX_Matrix3 matrix(Size size) const { return placement(degrees, scale, size.width, size.height, dx, dy); }
};
inline constexpr Placement turned_draft = {"transform-turned-draft", 0, turned_degrees, enlarged, 0, 0},
                           turned_bilinear = {"transform-turned-bilinear", 1, turned_degrees, enlarged, 0, 0},
                           turned_bicubic = {"transform-turned-bicubic", 2, turned_degrees, enlarged, 0, 0},
                           reduced_area = {"transform-reduced-area", 1, 0, reduced, 0, 0},
                           moved = {"transform-moved", 1, 0, 1, 7, 5},
                           moved_half_pixel = {"transform-moved-half-pixel", 1, 0, 1, 7.5, 5.5},
                           moved_subpixel = {"transform-moved-subpixel", 1, 0, 1, 7.3, 5.6};

// Work between frames of two sizes.
struct Resize {
  const char* name;
  decltype(&ZR_CopyBits_Draft) routine;
  f64 scale;

  Size to(Size from) const {
    return {static_cast<i32>(from.width * scale + 0.5), static_cast<i32>(from.height * scale + 0.5)};
  }
};
inline constexpr Resize nearest_half = {"copybits-draft-x0.5", &ZR_CopyBits_Draft, 0.5},
                        nearest_double = {"copybits-draft-x2", &ZR_CopyBits_Draft, 2},
                        area_third = {"copybits-hq-x0.37", &ZR_CopyBits_HQ_Straight, reduced},
                        area_half = {"copybits-hq-x0.5", &ZR_CopyBits_HQ_Straight, 0.5},
                        bilinear_larger = {"copybits-hq-x1.5", &ZR_CopyBits_HQ_Straight, 1.5};

}  // namespace bench
