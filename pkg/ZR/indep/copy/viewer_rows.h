// Rows of what a viewer shows: pixels of any depth, flattened over a background into 8 bits.
#pragma once

#include <ZR/depth.h>

#include <algorithm>
#include <type_traits>

namespace zr {

enum class ViewerStyle : u8 { checker, tint, flat, flat_black, count };

// What lies behind a row.
struct ViewerGround {
  ZR_Pixel8 first, second;  // alpha first, whatever the order of the destination
  u32 check_x, check_y;     // place of the row's first pixel among the squares

  bool shows_first(i32 i) const { return (((check_x + static_cast<u32>(i)) ^ check_y) & 8) != 0; }
};

template <class T>
using ViewerRow = void (*)(i32 n, const ViewerGround& ground, const T* src, ZR_Pixel8* dst);
// The fastest that this processor has; then the body of single numbers, and that of lanes (null where there is none).
template <class T>
ViewerRow<T> viewer_row(ViewerStyle style, bool reverse);
template <class T>
ViewerRow<T> single_viewer_row(ViewerStyle style, bool reverse);
template <class T>
ViewerRow<T> lane_viewer_row(ViewerStyle style, bool reverse);

// An 8-bit colour on the scale of the source.
template <class T>
constexpr T ground_colour(const ZR_Pixel8& c) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return {widen_8_to_float(c.alpha), widen_8_to_float(c.red), widen_8_to_float(c.green), widen_8_to_float(c.blue)};
  else
    return convert_colour<T>(c);
}

}  // namespace zr
