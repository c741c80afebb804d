// Masks of tests, and the arithmetic of their values written down plainly.
#pragma once

#include <ZR/depth.h>
#include <ZR/mask_buffer.h>
#include <gtest/gtest.h>

#include <memory>
#include <random>
#include <type_traits>
#include <vector>

#include "support/born_library.h"

template <class C>
inline constexpr i32 depth_of = static_cast<i32>(8 * sizeof(C));
template <class C>
inline constexpr i64 white_of = sizeof(C) == 1   ? 255
                                : sizeof(C) == 2 ? 32768
                                                 : 1;

template <class C>
struct Mask : ZR_UnoBuffer {
  Mask(i32 w, i32 h, u32 seed = 0) : ZR_UnoBuffer(w, h, depth_of<C>) {
    std::mt19937 random(seed);
    for (i32 i = 0; seed != 0 && i < w * h; ++i) {
      const u32 word = static_cast<u32>(random()), kind = word % 5;
      const double part = kind == 0 ? 0 : kind == 1 ? 1 : (word >> 8) / 16777216.0;
      values()[i] = static_cast<C>(part * white_of<C>);
    }
  }
  C* values() const { return static_cast<C*>(*data); }
  C& at(i32 x, i32 y) const { return values()[y * width + x]; }
  std::vector<C> all() const { return {values(), values() + width * height}; }
};

template <class To, class From>
To at_depth(From v) {
  if constexpr (sizeof(To) == sizeof(From))
    return v;
  else if constexpr (sizeof(To) == 1)
    return zr::narrow_16_to_8(v);
  else if constexpr (sizeof(To) == 2)
    return zr::widen_8_to_16(v);
  else
    return static_cast<f32>(v) * (sizeof(From) == 1 ? 0.003921569f : 0x1p-15f);
}

// Products and sums in numbers that hold them whole.
template <class C>
struct Plain {
  using N = std::conditional_t<std::is_same_v<C, f32>, f32, i64>;
  static constexpr N white = white_of<C>;
  static N mul(N a, N b) {
    if constexpr (sizeof(C) == 1) return (2 * a * b + 255) / 510;
    if constexpr (sizeof(C) == 2) return (a * b + 16383) / 32768;
    if constexpr (sizeof(C) == 4) return a * b;
  }
  static N mode(i32 mode, N s, N d) {
    switch (mode) {
      case 2: return mul(white - s, d);
      case 3: return mul(s, d);
      case 4: return s > d ? s : d;
      case 5: return s < d ? s : d;
      case 6: return s > d ? s - d : d - s;
      case 7: return s + d > white ? white : s + d;
      default: return white - mul(white - s, white - d);
    }
  }
  // Toward a ceiling: a product without rounding at 16 bits.
  static N rise(N s, N d, N ceiling) {
    if (d >= ceiling) return d;
    return d + (sizeof(C) == 2 ? s * (ceiling - d) / 32768 : mul(s, ceiling - d));
  }
};
