// A picture made to fit a frame: scaled by area means, the overhang cut off evenly.
#include "fit_image.h"

#include <algorithm>
#include <cmath>
#include <vector>

#include "file_values.h"

namespace zr::tool {
namespace {

// The source pixels under one destination pixel, and their shares.
struct Span {
  i32 begin;
  std::vector<f32> shares;  // sum 1
};

// Destination pixel i covers [start + i * step, start + (i + 1) * step) of the source; where it covers
// less than a pixel it takes a pixel's width, so that enlarging is linear interpolation.
std::vector<Span> make_spans(i32 count, f64 start, f64 step, i32 limit) {
  std::vector<Span> spans;
  const f64 width = std::max(step, 1.0);
  for (i32 i = 0; i < count; ++i) {
    const f64 centre = start + (i + 0.5) * step, low = centre - width / 2, high = centre + width / 2;
    Span span{std::clamp(static_cast<i32>(std::floor(low)), 0, limit - 1), {}};
    const i32 end = std::clamp(static_cast<i32>(std::ceil(high)), span.begin + 1, limit);
    f64 total = 0;
    for (i32 at = span.begin; at < end; ++at) {
      const f64 share = std::max(0.0, std::min<f64>(at + 1, high) - std::max<f64>(at, low));
      span.shares.push_back(static_cast<f32>(share));
      total += share;
    }
    if (total <= 0) span.shares = {1.0f}, total = 1;
    for (f32& share : span.shares) share = static_cast<f32>(share / total);
    spans.push_back(std::move(span));
  }
  return spans;
}

}  // namespace

OwnedWorld fit_image(const OwnedWorld& picture, i32 width, i32 height) {
  const f64 step = std::min(static_cast<f64>(picture.width()) / width, static_cast<f64>(picture.height()) / height);
  const auto spans_of = [&](i32 count, i32 limit) {
    return make_spans(count, (limit - count * step) / 2, step, limit);
  };
  const std::vector<Span> columns = spans_of(width, picture.width()), rows = spans_of(height, picture.height());
  OwnedWorld fitted(width, height, 8);
  for_each_row(height, [&](i32 y) {
    const Span& row = rows[static_cast<size_t>(y)];
    for (i32 x = 0; x < width; ++x) {
      const Span& column = columns[static_cast<size_t>(x)];
      ZR_PixelFloat sum{0, 0, 0, 0};
      for (size_t j = 0; j < row.shares.size(); ++j) {
        const ZR_PixelFloat* from = picture.row<ZR_PixelFloat>(row.begin + static_cast<i32>(j)) + column.begin;
        for (size_t i = 0; i < column.shares.size(); ++i) {
          const f32 alpha = from[i].alpha * row.shares[j] * column.shares[i];
          sum.alpha += alpha;
          sum.red += from[i].red * alpha;
          sum.green += from[i].green * alpha;
          sum.blue += from[i].blue * alpha;
        }
      }
      const auto colour = [&](f32 value) {
        return world_from_float<ZR_Pixel8>(straight_from_associated(value, sum.alpha));
      };
      fitted.row<ZR_Pixel8>(y)[x] = {world_from_float<ZR_Pixel8>(sum.alpha), colour(sum.red), colour(sum.green),
                                     colour(sum.blue)};
    }
  });
  return fitted;
}

}  // namespace zr::tool
