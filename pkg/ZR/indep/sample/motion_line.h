// The samples of one pixel of a layer that moves while the shutter is open.
#pragma once

#include <ZR/depth.h>
#include <ZR/types.h>

#include <algorithm>

namespace zr {

// Evenly spaced from where the first matrix puts the pixel to where the last one does. All of them together step over
// at most half of the number circle, so that between two inside samples every one is inside, also where the line wraps.
class SampleLine {
 public:
  SampleLine(i32 x0, i32 y0, i32 x1, i32 y1, i32 samples)
      : x0_(x0),
        y0_(y0),
        x1_(x1),
        y1_(y1),
        dx_(wrap_sub(x1, x0) / (samples - 1)),
        dy_(wrap_sub(y1, y0) / (samples - 1)),
        samples_(samples) {}

  // Position of sample k counted from the first, and of the k-th before the last; they differ by what the
  // division dropped.
  GX_LPoint from_first(i32 k) const { return {wrap_add(x0_, wrap_mul(k, dx_)), wrap_add(y0_, wrap_mul(k, dy_))}; }
  GX_LPoint from_last(i32 k) const { return {wrap_sub(x1_, wrap_mul(k, dx_)), wrap_sub(y1_, wrap_mul(k, dy_))}; }
  // No sample sees the world, however wide its kernel.
  bool misses(i32 width, i32 height) const {
    constexpr i64 reach = 3 * i64{65536};
    return std::max(x0_, x1_) <= -reach || std::max(y0_, y1_) <= -reach ||
           std::min(x0_, x1_) >= i64{width} * 65536 + reach || std::min(y0_, y1_) >= i64{height} * 65536 + reach;
  }
  i32 dx() const { return dx_; }
  i32 dy() const { return dy_; }
  i32 samples() const { return samples_; }

 private:
  i32 x0_, y0_, x1_, y1_, dx_, dy_, samples_;
};

// The samples [first, end) that are walked from the first one without a look; before and behind them samples are
// taken one by one until one needs no clipping, behind them from the last one on.
struct InnerSamples {
  i32 first, end;
};
// Of a line whose samples all lie inside, for samplers that do not say so of whole positions.
inline InnerSamples inner_samples(const SampleLine& line) {
  const i32 n = line.samples();
  const auto whole = [](GX_LPoint p) { return ((p.x | p.y) & 0xffff) == 0; };
  InnerSamples inner = {0, n};
  for (bool in = false; inner.first < n && !in; ++inner.first) in = !whole(line.from_first(inner.first));
  for (bool in = false; inner.end > inner.first && !in; --inner.end) in = !whole(line.from_last(n - inner.end));
  return inner;
}

}  // namespace zr
