// Boxes of area samples: how a box of 16.16 edges falls into whole and partial pixels. Told once for straight
// and premultiplied samples.
#pragma once

#include "sample/ZR_Samp.h"

namespace zr {

// One axis of a box, moved by half a pixel so that pixel n covers n..n + 1. Arithmetic wraps at 32 bits.
struct BoxAxis {
  i32 from, to;

  BoxAxis(i32 position, i32 radius)
      : from(wrap_add(wrap_sub(position, radius), 32768)), to(wrap_add(wrap_add(position, radius), 32768)) {}
  i32 length() const { return wrap_sub(to, from); }
  bool empty() const { return from >= to; }
  void clip(i32 size) {
    const i32 end = std::clamp(size, 0, 32767) << 16;  // pixels that positions reach
    from = std::clamp(from, 0, end);
    to = std::clamp(to, 0, end);
  }

  // Calls part(pixel, extent) for the pixels that the axis covers in part and whole(first, end) for those in
  // between, from left to right. Extents are 16.16.
  template <class Part, class Whole>
  void walk(Part&& part, Whole&& whole) const {
    const u32 before = static_cast<u32>(from) & 0xffffu, behind = static_cast<u32>(to) & 0xffffu;
    if (before != 0) part(from >> 16, 0x10000u - before);
    whole((from >> 16) + (before != 0), to >> 16);
    if (behind != 0) part(to >> 16, behind);
  }
};

inline constexpr i32 half_a_pixel = 32768;  // radii up to this one are thin

// The four ways to walk a box: `point(x, y, w, h)` takes a point sample for an area of w by h, 16.16 each;
// `box(across, down)` reads the pixels of a box that is thin in neither direction and clipped to the world.
template <class Point, class Box>
void walk_box(i32 x, i32 y, const ZR_SampPB& params, Point&& point, Box&& box) {
  BoxAxis across(x, params.x_radius), down(y, params.y_radius);
  const ZR_LayerDef& src = *params.src;
  const bool wide = params.x_radius > half_a_pixel, high = params.y_radius > half_a_pixel;
  // Whole pixels of a thin box; those that no sampler reaches from the world are left out.
  const auto along = [](const BoxAxis& axis, i32 size, auto&& sample) {
    constexpr i32 reach = 4;
    axis.walk(sample, [&](i32 first, i32 end) {
      for (i32 i = std::max(first, -reach); i < std::min(end, std::clamp(size, 0, 32767) + reach); ++i)
        sample(i, 0x10000u);
    });
  };
  if (!wide && !high) {
    point(x, y, across.length(), down.length());
  } else if (!high) {
    along(across, src.width, [&](i32 column, u32 extent) {
      point(wrap_mul(column, 65536), y, static_cast<i64>(extent), 2 * static_cast<i64>(params.y_radius));
    });
  } else if (!wide) {
    along(down, src.height, [&](i32 row, u32 extent) {
      point(x, wrap_mul(row, 65536), 2 * static_cast<i64>(params.x_radius), static_cast<i64>(extent));
    });
  } else if (src.data != nullptr) {
    across.clip(src.width), down.clip(src.height);
    if (!across.empty() && !down.empty()) box(across, down);
  }
}

}  // namespace zr
