// Building the tables of tone curves.
#include "TON/curve_table.h"

#include <cmath>

namespace zr::prisma {

// lcms knows no numbers beyond 1e22: it gives its lowest for them, and for NaN.
f32 FormulaCurve::exact(f32 x) const {
  constexpr f32 largest = 1e20f;
  const auto bounded = [](f32 v) { return v < -largest ? -largest : v > largest ? largest : v; };
  return x == x ? bounded(cmsEvalToneCurveFloat(curve_, bounded(x))) : x;
}

// Through the curve at both ends and the middle of a piece; false when it misses the curve in between.
// *y0 is the curve at the near end, and then at the far one.
bool FormulaCurve::fit(i32 piece, f32 sign, f64* at_near) {
  const auto edge = [](i32 at) { return std::bit_cast<f32>(static_cast<u32>(at + first_piece) << mantissa_shift); };
  const bool first = piece == 0;
  const f32 near = first ? 0.0f : edge(piece), far = edge(piece + 1);
  const f32 x0 = sign * near, x2 = sign * far, x1 = 0.5f * (x0 + x2);
  const f64 y0 = *at_near, y1 = exact(x1), y2 = exact(x2);
  *at_near = y2;
  const f64 half = (static_cast<f64>(x2) - x0) * 0.5;
  // Newton's form about x0, x1, then powers of x. The first piece is a chord: a parabola would bend back.
  const f64 slope = first ? (y2 - y0) / (2 * half) : (y1 - y0) / half;
  const f64 bend = first ? 0.0 : ((y2 - y1) / half - slope) / (2 * half);
  Parabola& p = parabolas_[static_cast<size_t>(piece + (sign < 0 ? pieces : 0))];
  p = {static_cast<f32>(y0 - slope * x0 + bend * x0 * x1), static_cast<f32>(slope - bend * (static_cast<f64>(x0) + x1)),
       static_cast<f32>(bend), 0};
  for (const f32 part : {0.25f, 0.75f}) {
    const f32 x = x0 + part * (x2 - x0);
    const f64 is = p.a + x * (p.b + x * p.c), should = exact(x);
    // Below 2^lowest nothing is checked but that it is a number: the curve itself is next to f(0) there.
    const f64 allowed = first ? 1e-4 : 2e-6 * (1.0 + std::fabs(should));
    if (!(std::fabs(is - should) <= allowed)) return false;
  }
  return true;
}

bool FormulaCurve::build(const cmsToneCurve* curve) {
  curve_ = curve;
  parabolas_.resize(2 * static_cast<size_t>(pieces));
  // A formula's numbers are rounded in a profile, so its parts may meet with a step of some millionths.
  int left_to_formula = 8;
  for (const f32 sign : {1.0f, -1.0f}) {
    f64 y = exact(0.0f);
    for (i32 piece = 0; piece < pieces; ++piece) {
      if (fit(piece, sign, &y)) continue;
      if (left_to_formula-- == 0) return false;
      parabolas_[static_cast<size_t>(piece + (sign < 0 ? pieces : 0))].by_formula = 1;
    }
  }
  return true;
}

void SampledCurve::build(const cmsToneCurve* curve) {
  values_.resize(65536);
  for (u32 i = 0; i < 65536; ++i)
    values_[i] = static_cast<f32>(cmsEvalToneCurve16(curve, static_cast<u16>(i)) / 65535.0);
}

}  // namespace zr::prisma
