// How much of each pixel a shape covers.
#include "mask_coverage.h"

#include <algorithm>
#include <array>
#include <cmath>

#include "interrupt_state.h"

namespace zr::tool {
namespace {

// One row of coverage, held as steps from pixel to pixel: a span costs the same however long it is.
class CoverageRow {
 public:
  explicit CoverageRow(i32 width) : width_(width), steps_(static_cast<size_t>(width) + 2) {}
  // left <= right, in pixels of the row; what is outside is cut off.
  void add(f64 left, f64 right, f64 weight) {
    step(left, weight);
    step(right, -weight);
  }
  // Hands over the row's values and clears it.
  template <class Value>
  void take(f64 white, Value* row) {
    f64 covered = 0;
    for (i32 x = 0; x < width_; ++x) {
      covered += steps_[static_cast<size_t>(x)];
      row[x] = static_cast<Value>(std::clamp(covered, 0.0, 1.0) * white + 0.5);
    }
    std::fill(steps_.begin(), steps_.end(), 0.0);
  }

 private:
  void step(f64 at, f64 weight) {
    at = std::clamp(at, 0.0, static_cast<f64>(width_));
    const size_t pixel = static_cast<size_t>(at);
    const f64 part = at - static_cast<f64>(pixel);
    steps_[pixel] += weight * (1 - part);
    steps_[pixel + 1] += weight * part;
  }
  i32 width_;
  std::vector<f64> steps_;
};

// Each adds the row whose upper edge is at `top`; `left` is the row's first pixel.
void add_rectangle(const MaskShape& shape, f64 left, f64 top, CoverageRow& row) {
  const f64 height = std::min(top + 1, shape.y + shape.height) - std::max(top, shape.y);
  if (height > 0) row.add(shape.x - left, shape.x + shape.width - left, height);
}

void add_ellipse(const MaskShape& shape, f64 left, f64 top, CoverageRow& row) {
  const f64 across = shape.width / 2, down = shape.height / 2;
  const f64 middle = shape.x + across - left;
  for (i32 line = 0; line < kLinesPerRow; ++line) {
    const f64 y = (top + (line + 0.5) / kLinesPerRow - shape.y - down) / down;
    if (!(y > -1 && y < 1)) continue;
    const f64 half = across * std::sqrt(1 - y * y);
    row.add(middle - half, middle + half, 1.0 / kLinesPerRow);
  }
}

struct Crossing {
  f64 x;
  i32 winding;  // 1 where the edge runs down
};

void add_polygon(const MaskShape& shape, f64 left, f64 top, CoverageRow& row) {
  std::array<Crossing, kMostPoints> crossings;
  for (i32 line = 0; line < kLinesPerRow; ++line) {
    const f64 y = top + (line + 0.5) / kLinesPerRow;
    size_t count = 0;
    Point from = shape.points.back();
    for (const Point& to : shape.points) {
      if ((from.y <= y) != (to.y <= y))
        crossings[count++] = {mix(from.x, to.x, (y - from.y) / (to.y - from.y)) - left, from.y < to.y ? 1 : -1};
      from = to;
    }
    std::sort(crossings.begin(), crossings.begin() + static_cast<ptrdiff_t>(count),
              [](const Crossing& a, const Crossing& b) { return a.x < b.x; });
    for (size_t i = 0, winding = 0; i + 1 < count; ++i) {
      winding += static_cast<size_t>(crossings[i].winding);  // wraps back to 0
      if (winding != 0) row.add(crossings[i].x, crossings[i + 1].x, 1.0 / kLinesPerRow);
    }
  }
}

void add_row(const MaskShape& shape, f64 left, f64 top, CoverageRow& row) {
  switch (shape.kind) {
    case MaskShape::Kind::kRectangle: return add_rectangle(shape, left, top, row);
    case MaskShape::Kind::kEllipse: return add_ellipse(shape, left, top, row);
    case MaskShape::Kind::kPolygon: return add_polygon(shape, left, top, row);
  }
}

template <class Value>
void draw_rows(const MaskShape& shape, const GX_LPoint& corner, f64 white, ZR_UnoBuffer& buffer) {
  CoverageRow row(buffer.width);
  for (i32 y = 0; y < buffer.height; ++y) {
    stop_if_interrupted();
    add_row(shape, corner.x, static_cast<f64>(corner.y) + y, row);
    row.take(white, static_cast<Value*>(*buffer.data) + static_cast<ptrdiff_t>(y) * buffer.width);
  }
}

}  // namespace

GX_LRect bounds_of(const MaskShape& shape) {
  f64 left = shape.x, top = shape.y, right = shape.x + shape.width, bottom = shape.y + shape.height;
  if (shape.kind == MaskShape::Kind::kPolygon) {
    left = right = shape.points.front().x;
    top = bottom = shape.points.front().y;
    for (const Point& point : shape.points) {
      left = std::min(left, point.x);
      right = std::max(right, point.x);
      top = std::min(top, point.y);
      bottom = std::max(bottom, point.y);
    }
  }
  return {static_cast<i32>(std::floor(left)), static_cast<i32>(std::floor(top)), static_cast<i32>(std::ceil(right)),
          static_cast<i32>(std::ceil(bottom))};
}

void draw_shape(const MaskShape& shape, const GX_LPoint& corner, ZR_UnoBuffer& buffer) {
  if (buffer.depth == 8)
    draw_rows<u8>(shape, corner, 255, buffer);
  else
    draw_rows<u16>(shape, corner, 32768, buffer);
}

}  // namespace zr::tool
