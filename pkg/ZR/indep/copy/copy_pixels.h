// Pixels between depths, as copies convert them: channel by channel, alpha like any other, without dither.
#pragma once

#include <ZR/depth.h>

#include <cstring>
#include <type_traits>

#include "world/depth_rows.h"

namespace zr {

template <class To, class From>
constexpr Channel<To> copy_channel(Channel<From> c) {
  constexpr bool from8 = std::is_same_v<From, ZR_Pixel8>;
  if constexpr (std::is_same_v<To, From>)
    return c;
  else if constexpr (std::is_same_v<From, ZR_PixelFloat>)
    return narrow_float_colour<To>(c);  // unlike a world's own copy, which leaves alpha unclamped
  else if constexpr (from8 && std::is_same_v<To, ZR_Pixel16>)
    return widen_8_to_16(c);
  else if constexpr (from8)
    return widen_8_to_float(c);
  else if constexpr (std::is_same_v<To, ZR_Pixel8>)
    return narrow_16_to_8(c);
  else
    return widen_16_to_float(c);
}

template <class To, class From>
constexpr To copy_pixel(const From& p) {
  if constexpr (std::is_same_v<To, From>)
    return p;
  else
    return {copy_channel<To, From>(p.alpha), copy_channel<To, From>(p.red), copy_channel<To, From>(p.green),
            copy_channel<To, From>(p.blue)};
}

// n pixels to another depth; the rows do not overlap.
template <class To, class From>
void copy_row(i32 n, const From* src, To* dst) {
  if constexpr (std::is_same_v<From, ZR_PixelFloat>)
    narrow_row(n, src, dst);
  else
    convert_row(n, src, dst, false);
}

}  // namespace zr
