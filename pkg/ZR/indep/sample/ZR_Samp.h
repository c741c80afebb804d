// What all samplers share: positions, the neighbourhood of a position with and without clipping, weights.
#pragma once

#include <ZR/depth.h>
#include <ZR/sample.h>

#include <algorithm>
#include <bit>
#include <cstddef>

namespace zr {

// Pixel (x, y). The distance of rows is formed in 64 bits: worlds of more than 2 GB are read right.
template <class T>
inline const T* pixel_at(const ZR_LayerDef& src, i32 x, i32 y) {
  const char* const row = static_cast<const char*>(src.data) + static_cast<std::ptrdiff_t>(y) * src.row_bytes;
  return reinterpret_cast<const T*>(row) + x;
}

inline bool inside(const ZR_LayerDef& src, i32 x, i32 y) {
  return x >= 0 && y >= 0 && x < src.width && y < src.height && src.data != nullptr;
}

// A 16.16 position: its pixel and how far it lies to the right of it and below, in 1/65536.
struct Position {
  i32 x, y;
  u32 fraction_x, fraction_y;

  Position(i32 x16, i32 y16)
      : x(x16 >> 16),
        y(y16 >> 16),
        fraction_x(static_cast<u32>(x16) & 0xffffu),
        fraction_y(static_cast<u32>(y16) & 0xffffu) {}
  bool whole() const { return (fraction_x | fraction_y) == 0; }
};

// ------------------------------------------------------------------------------- neighbourhoods

// side x side pixels with (x, y) at the upper left, as `side` runs of `side` pixels. The caller vouches that
// they lie inside.
struct NoClip {
  template <class T, i32 side>
  struct Block {
    const T* rows[side];

    Block(const ZR_LayerDef& src, i32 x, i32 y) {
      for (i32 j = 0; j < side; ++j) rows[j] = pixel_at<T>(src, x, y + j);
    }
    // One pixel to the right.
    void slide() {
      for (const T*& row : rows) ++row;
    }
  };
};

// The same with transparent black for whatever lies outside.
struct Clip {
  template <class T, i32 side>
  struct Block {
    const T* rows[side];
    bool all_inside;

    Block(const ZR_LayerDef& src, i32 x, i32 y) {
      all_inside = x >= 0 && y >= 0 && x + side <= src.width && y + side <= src.height && src.data != nullptr;
      if (all_inside) [[likely]] {
        for (i32 j = 0; j < side; ++j) rows[j] = pixel_at<T>(src, x, y + j);
      } else {
        gather(src, x, y);
      }
    }

   private:
    T copies_[side * side];  // written only at the borders

    void gather(const ZR_LayerDef& src, i32 x, i32 y) {
      for (i32 j = 0; j < side; ++j) {
        rows[j] = copies_ + j * side;
        for (i32 i = 0; i < side; ++i)
          copies_[j * side + i] = inside(src, x + i, y + j) ? *pixel_at<T>(src, x + i, y + j) : T{};
      }
    }
  };
};

// -------------------------------------------------------------------------------------- weights

// Of the upper left, upper right, lower left and lower right neighbour. Formed by subtraction, so that they
// add up to 1.
template <class Real>
struct BilinearWeights {
  Real w00, w10, w01, w11;

  BilinearWeights(u32 fraction_x, u32 fraction_y) {
    constexpr Real unit = static_cast<Real>(1.52587890625e-5);
    const Real fx = static_cast<Real>(fraction_x) * unit, fy = static_cast<Real>(fraction_y) * unit;
    w11 = fx * fy;
    w10 = fx - w11;
    w01 = fy - w11;
    w00 = Real{1} - w10 - w01 - w11;
  }
  explicit BilinearWeights(const Position& at) : BilinearWeights(at.fraction_x, at.fraction_y) {}
  // Of the caller, in this order.
  explicit BilinearWeights(const f64* w)
      : w00(static_cast<Real>(w[0])),
        w10(static_cast<Real>(w[1])),
        w01(static_cast<Real>(w[2])),
        w11(static_cast<Real>(w[3])) {}
};

}  // namespace zr
