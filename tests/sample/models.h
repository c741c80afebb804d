// Point samplers written plainly: one channel at a time, neighbours fetched one by one.
#pragma once

#include <cmath>

#include "sample/pictures.h"

template <class T>
inline constexpr bool is_float = std::is_same_v<T, ZR_PixelFloat>;
template <class T>
using Precision = std::conditional_t<std::is_same_v<T, ZR_Pixel16>, f64, f32>;

template <class Real, class T>
std::array<Real, 4> numbers(const T& p) {
  return {static_cast<Real>(p.alpha), static_cast<Real>(p.red), static_cast<Real>(p.green), static_cast<Real>(p.blue)};
}
template <class T, class Real>
T pixel_of(const std::array<Real, 4>& c) {
  using Channel = zr::Channel<T>;
  return {static_cast<Channel>(c[0]), static_cast<Channel>(c[1]), static_cast<Channel>(c[2]),
          static_cast<Channel>(c[3])};
}

template <class Real>
std::array<Real, 4> bilinear_weights(i32 x, i32 y) {
  const Real fx = static_cast<Real>(x & 0xffff) / 65536, fy = static_cast<Real>(y & 0xffff) / 65536;
  const Real both = fx * fy;
  return {1 - (fx - both) - (fy - both) - both, fx - both, fy - both, both};
}

// `given`: the caller's weights. Without `branches` all pixels go through the general case of 8 bits.
template <class T>
T bilinear_model(const Picture<T>& picture, i32 x, i32 y, const f64* given = nullptr, bool branches = true) {
  using Real = Precision<T>;
  const i64 ix = x >> 16, iy = y >> 16;
  const T p[4] = {picture.at(ix, iy), picture.at(ix + 1, iy), picture.at(ix, iy + 1), picture.at(ix + 1, iy + 1)};
  const auto like_first = [&](const T& one) { return std::memcmp(&one, p, sizeof one) == 0; };
  if (!is_float<T> && branches && (((x | y) & 0xffff) == 0 || std::all_of(p, p + 4, like_first))) return p[0];
  std::array<Real, 4> c[4], f = bilinear_weights<Real>(x, y);
  if (given != nullptr) std::transform(given, given + 4, f.begin(), [](f64 w) { return static_cast<Real>(w); });
  for (size_t i = 0; i < 4; ++i) c[i] = numbers<Real>(p[i]);
  const bool equal = branches && c[0][0] == c[1][0] && c[0][0] == c[2][0] && c[0][0] == c[3][0];
  const auto sum = [&](size_t k) {
    const Real s0 = f[0] * c[0][k], s1 = f[1] * c[1][k], s2 = f[2] * c[2][k], s3 = f[3] * c[3][k];
    return is_float<T> ? s0 + s1 + s2 + s3 : (s0 + s1) + (s2 + s3);
  };
  Real alpha = equal ? c[0][0] : sum(0), scale = 1;
  if (is_float<T> ? !equal && alpha == 0 : alpha == 0 || (branches && alpha < Real{0.5})) return T{};
  if (!equal) {
    if (is_float<T>) alpha = std::fmin(Real{1}, alpha);
    scale = 1 / alpha;
    for (size_t i = 0; i < 4; ++i) f[i] *= c[i][0];
  }
  std::array<Real, 4> out = {alpha, sum(1) * scale, sum(2) * scale, sum(3) * scale};
  if (!is_float<T>)
    for (Real& v : out) v = std::floor(v + Real{0.5});
  return pixel_of<T>(out);
}

// Four pixels of a row, or four rows, into one.
inline std::array<f32, 4> cubic_model(i32 position, const std::array<f32, 4> (&c)[4]) {
  const f32 t = static_cast<f32>(position & 0xffff) / 65536;
  const auto kernel = [](f64 d) {
    return d <= 1 ? (1.25 * d - 2.25) * d * d + 1 : ((-0.75 * d + 3.75) * d - 6) * d + 3;
  };
  f32 w[4] = {static_cast<f32>(kernel(1.0 + t)), static_cast<f32>(kernel(t)), static_cast<f32>(kernel(1.0 - t)),
              static_cast<f32>(kernel(2.0 - t))};
  const auto sum = [&](size_t k) { return w[0] * c[0][k] + w[1] * c[1][k] + w[2] * c[2][k] + w[3] * c[3][k]; };
  if (c[0][0] == c[1][0] && c[0][0] == c[2][0] && c[0][0] == c[3][0]) return {c[0][0], sum(1), sum(2), sum(3)};
  const f32 alpha = sum(0), scale = 1 / alpha;
  if (alpha == 0) return {};
  for (size_t i = 0; i < 4; ++i) w[i] *= c[i][0];
  return {alpha, sum(1) * scale, sum(2) * scale, sum(3) * scale};
}

template <class T>
T bicubic_model(const Picture<T>& picture, i32 x, i32 y) {
  std::array<f32, 4> rows[4];
  for (i32 j = 0; j < 4; ++j) {
    std::array<f32, 4> c[4];
    for (i32 i = 0; i < 4; ++i) c[i] = numbers<f32>(picture.at((x >> 16) - 1 + i, (y >> 16) - 1 + j));
    rows[j] = cubic_model(x, c);
  }
  std::array<f32, 4> out = cubic_model(y, rows);
  constexpr f32 white = static_cast<f32>(zr::Depth<T>::white), reciprocal = 1 / white;
  for (size_t k = 0; k < 4; ++k) {
    f32& v = out[k];
    v *= reciprocal;
    if (k == 0) v = v < 1e-16f ? 0 : std::fmin(v, 1.0f);
    if (!is_float<T>) v = v * white < 0 ? 0 : v * white > white ? white : std::floor(v * white + 0.5f);
  }
  return pixel_of<T>(out);
}

template <class T>
T point_model(const Picture<T>& picture, i32 quality, i32 x, i32 y) {
  return quality == 2 ? bicubic_model(picture, x, y) : bilinear_model(picture, x, y);
}
