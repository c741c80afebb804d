// Where a picture stands in a frame, how it is turned, sampled and blurred by its own motion.
//
// Matrices take points of the picture to points of the frame. Points are measured in pixels from a left top
// corner, so the centre of the first pixel is (0.5, 0.5).
#pragma once

#include <ZR/zr.h>

#include <optional>
#include <string>
#include <vector>

#include "keyframes.h"

namespace zr::tool {

inline constexpr f64 kLargestScale = 1000;     // either way
inline constexpr f64 kLargestRotation = 36e4;  // degrees, either way: 1000 turns
inline constexpr f64 kLargestSkew = 89;        // degrees, either way
inline constexpr f64 kFarthest = 1e6;          // pixels from the origin; keeps sums of coordinates inside 32 bits

const std::vector<std::string>& quality_names();  // by the library's number

// scale: 1 is the picture's own size; rotation: degrees, clockwise as seen; skew: degrees, x leans upright
// edges, y level ones. Scaled first, then skewed, then rotated. Quarter turns are exact.
GX_Matrix3 turning_matrix(const Point& scale, const Point& skew, f64 rotation);
// `anchor`, a point of the picture, comes to stand on `position`.
GX_Matrix3 placed(const GX_Matrix3& turning, const Point& anchor, const Point& position);
// For a picture that has got `border` more pixels on each side: what it had before stands where it stood.
GX_Matrix3 with_border(const GX_Matrix3& matrix, const GX_LPoint& border);
// Whether the picture is moved by whole pixels and nothing else.
bool moves_whole_pixels(const GX_Matrix3& matrix);

struct MotionBlur {
  f64 shutter_angle = 180;  // how long the shutter is open; 360 is a whole frame
  f64 shutter_phase = -90;  // when it opens, from the frame's own moment
  i32 samples = 16;         // matrices, from opening to closing
};

struct Placement {
  Keyed<Point> position{Point{}}, anchor{Point{}}, scale{Point{1, 1}}, skew{Point{}};
  Keyed<f64> rotation{0.0};
  std::optional<Keyed<GX_Matrix3>> matrix;  // in place of those above
  i32 quality = 1;
  std::optional<MotionBlur> motion_blur;

  GX_Matrix3 matrix_at(f64 time) const;  // in frames
  // One where nothing moves while the shutter is open, else as many as there are motion samples.
  std::vector<GX_Matrix3> matrices_of(i32 frame) const;
};

}  // namespace zr::tool
