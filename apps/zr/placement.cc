// Where a picture stands in a frame, how it is turned, sampled and blurred by its own motion.
#include "placement.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace zr::tool {
namespace {

constexpr f64 kDegree = std::numbers::pi / 180;

// Exact at quarter turns, where the library's sines and cosines are a hair off.
Point cosine_and_sine(f64 degrees) {
  const f64 turned = std::remainder(degrees, 360.0);
  if (turned == 0) return {1, 0};
  if (turned == 90) return {0, 1};
  if (turned == -90) return {0, -1};
  if (std::abs(turned) == 180) return {-1, 0};
  return {std::cos(turned * kDegree), std::sin(turned * kDegree)};
}

bool same(const GX_Matrix3& a, const GX_Matrix3& b) { return std::equal(&a.m[0][0], &a.m[0][0] + 9, &b.m[0][0]); }

}  // namespace

const std::vector<std::string>& quality_names() {
  static const std::vector<std::string> names = {"draft", "bilinear", "bicubic"};
  return names;
}

GX_Matrix3 turning_matrix(const Point& scale, const Point& skew, f64 rotation) {
  const auto [cosine, sine] = cosine_and_sine(rotation);
  const f64 lean_x = std::tan(skew.x * kDegree), lean_y = std::tan(skew.y * kDegree);
  return {{{(cosine - sine * lean_y) * scale.x, (cosine * lean_x - sine) * scale.y, 0},
           {(sine + cosine * lean_y) * scale.x, (sine * lean_x + cosine) * scale.y, 0},
           {0, 0, 1}}};
}

GX_Matrix3 placed(const GX_Matrix3& turning, const Point& anchor, const Point& position) {
  GX_Matrix3 matrix = turning;
  const auto& m = turning.m;
  matrix.m[0][2] = position.x - (m[0][0] * anchor.x + m[0][1] * anchor.y);
  matrix.m[1][2] = position.y - (m[1][0] * anchor.x + m[1][1] * anchor.y);
  return matrix;
}

GX_Matrix3 with_border(const GX_Matrix3& matrix, const GX_LPoint& border) {
  GX_Matrix3 moved = matrix;
  if (border.x == 0 && border.y == 0) return moved;
  for (auto& row : moved.m) row[2] -= row[0] * border.x + row[1] * border.y;
  return moved;
}

bool moves_whole_pixels(const GX_Matrix3& matrix) {
  const auto& m = matrix.m;
  const bool unturned = m[0][0] == 1 && m[0][1] == 0 && m[1][0] == 0 && m[1][1] == 1;
  return unturned && m[0][2] == std::floor(m[0][2]) && m[1][2] == std::floor(m[1][2]);
}

GX_Matrix3 Placement::matrix_at(f64 time) const {
  if (matrix) return matrix->at(time);
  return placed(turning_matrix(scale.at(time), skew.at(time), rotation.at(time)), anchor.at(time), position.at(time));
}

std::vector<GX_Matrix3> Placement::matrices_of(i32 frame) const {
  if (!motion_blur) return {matrix_at(frame)};
  std::vector<GX_Matrix3> matrices;
  const f64 opens = frame + motion_blur->shutter_phase / 360, open = motion_blur->shutter_angle / 360;
  for (i32 i = 0; i < motion_blur->samples; ++i)
    matrices.push_back(matrix_at(opens + open * i / (motion_blur->samples - 1)));
  const auto stands_still = [&](const GX_Matrix3& one) { return same(one, matrices.front()); };
  if (std::all_of(matrices.begin(), matrices.end(), stands_still)) matrices.resize(1);
  return matrices;
}

}  // namespace zr::tool
