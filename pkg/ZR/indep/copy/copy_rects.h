// Rectangles of copies: which are taken, how both are clipped together, and which source pixel every destination
// pixel shows. Told once for worlds of all depths and for chunks.
#pragma once

#include <ZR/depth.h>
#include <ZR/types.h>

#include <limits>

namespace zr {

// Truncating division that wraps where the quotient does not fit; b is not 0.
constexpr i32 wrap_div(i32 a, i32 b) { return b == -1 ? wrap_sub(0, a) : a / b; }

// One side of a copy. Corners come as the caller gave them: any numbers, also inverted.
struct CopySide {
  GX_LRect rect{};
  bool full = false;  // the whole world, whether asked for by null or by its corners

  i32 width() const { return wrap_sub(rect.right, rect.left); }
  i32 height() const { return wrap_sub(rect.bottom, rect.top); }
};

// False when there is nothing to copy: an empty rectangle, or one that misses its world. An inverted one that
// touches the world passes; the copies deal with it.
bool take_rect(const GX_LRect* rect, i32 width, i32 height, CopySide* out);

inline bool same_rect(const GX_LRect& a, const GX_LRect& b) {
  return a.left == b.left && a.top == b.top && a.right == b.right && a.bottom == b.bottom;
}

// Destination rows that a part of a copy writes; what it writes there does not depend on the part.
struct CopyRows {
  i32 first = 0, end = std::numeric_limits<i32>::max();
};

// One axis of a scaled copy: from `begin` to `end` on both sides.
struct CopyAxis {
  i32 src_begin, src_end, dst_begin, dst_end;
};

// Clips the sides that are not full to their worlds, and pulls the other side in by the same proportion.
// Everything is in 32 bits: the products of far rectangles wrap, and the result may then lie anywhere.
CopyAxis clip_axis(const CopyAxis& axis, bool src_full, i32 src_size, bool dst_full, i32 dst_size);

// The walk along one axis. An error term starts at 0, gains the destination's extent with every source pixel, and
// that pixel is shown once for each whole source extent in it. So destination pixel k, counted from the beginning,
// shows source pixel ((k + 1) * src_extent - 1) / dst_extent, which is what is worked out here, for the pixels that
// lie inside both worlds only: the walk is never longer than what is written.
struct AxisWalk {
  AxisWalk(const CopyAxis& axis, i32 src_size, i32 dst_size);

  i32 src_extent, dst_extent;  // of the clipped axis; may be 0 or negative, and then count is 0
  i32 first = 0, count = 0;    // destination pixels, in the world's coordinates
  i32 src_begin, dst_begin;

  // The source pixels of the destination pixels [from, from + n), counted from `first`.
  void sources(i32 from, i32 n, i32* out) const;
};

}  // namespace zr
