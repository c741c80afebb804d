// Modes whose rows are not made of one function for each pixel: copies, the mix through a mask, dissolving.
#pragma once

#include <ZR/composite.h>

#include <cstring>

#include "composite/mode_kinds-inl.h"
#include "world/random.h"

namespace zr {

template <class T, bool masked>
struct Row {
  i32 n;
  const ZR_BlendingMode<T>* mode;
  const T* src;
  const T* mask;
  T* dst;

  // A source channel under opacity and mask; of the alpha, the effective alpha.
  class Cover {
   public:
    explicit Cover(const Row& row) : opacity_(row.mode->opacity), mask_(row.mask) {}
    Wide<T> operator()(Wide<T> c, i32 i) const {
      if constexpr (masked)
        return ModeMath<T>::covered(c, opacity_, mask_[i].alpha);
      else
        return ModeMath<T>::mul(c, opacity_);
    }

   private:
    Wide<T> opacity_;
    const T* mask_;
  };
};

// What these modes compute with, besides the arithmetic of a depth.
template <class T>
struct RowMath;
template <>
struct RowMath<ZR_Pixel8> {
  static constexpr bool dissolves(i32 random, i32 A) { return (random & 255) <= A; }
  // Source and destination by the products p and q of their alphas with the mask and its inverse.
  static constexpr i32 product(i32 a, i32 k) { return a * k; }
  static constexpr i32 mix_alpha(i32 t) { return (t + 128) / 255; }
  static constexpr i32 mix(i32 s, i32 p, i32 d, i32 q, i32 t) { return (s * p + (t >> 1) + d * q) / t; }
};
template <>
struct RowMath<ZR_Pixel16> {
  static constexpr bool dissolves(i32 random, i32 A) { return random < A; }
  // Products of three channels need 45 bits.
  static constexpr i64 product(i64 a, i64 k) { return a * k; }
  static constexpr i32 mix_alpha(i64 t) { return static_cast<i32>((t + 16384) / 32768); }
  static constexpr i32 mix(i64 s, i64 p, i64 d, i64 q, i64 t) {
    return static_cast<i32>((s * p + (t >> 1) + d * q) / t);
  }
};
template <>
struct RowMath<ZR_PixelFloat> {
  static constexpr bool dissolves(i32 random, f32 A) { return static_cast<f32>(random) / 32768.0f < A; }
  static constexpr f32 product(f32 a, f32 k) { return a * k; }
  static constexpr f32 mix_alpha(f32 t) { return t; }
  static constexpr f32 mix(f32 s, f32 p, f32 d, f32 q, f32 t) { return Depth<ZR_PixelFloat>::div(s * p + d * q, t); }
};

template <class T>
void copy_colour(const T& s, T& d) {
  d.red = s.red;
  d.green = s.green;
  d.blue = s.blue;
}

template <class T, bool masked>
void run_row(Copy, const Row<T, masked>& row) {
  if (row.mode->keep_alpha != 0) {
    for (i32 i = 0; i < row.n; ++i) copy_colour(row.src[i], row.dst[i]);
  } else if (!masked && row.mode->opacity == Depth<T>::white) {
    if (row.n > 0) std::memmove(row.dst, row.src, static_cast<std::size_t>(row.n) * sizeof(T));
  } else {
    const typename Row<T, masked>::Cover cover(row);
    for (i32 i = 0; i < row.n; ++i) {
      const T s = row.src[i];
      row.dst[i] = {static_cast<Channel<T>>(cover(s.alpha, i)), s.red, s.green, s.blue};
    }
  }
}
template <class T, bool masked>
void run_row(CopyFast, const Row<T, masked>& row) {
  run_row(Copy{}, row);
}

// Reads neither opacity nor mode record, and a mask in either variant; without one it counts as white.
template <class T, bool masked>
void run_row(MatteMix, const Row<T, masked>& row) {
  using M = RowMath<T>;
  constexpr Wide<T> white = Depth<T>::white;
  for (i32 i = 0; i < row.n; ++i) {
    const T s = row.src[i];
    T& d = row.dst[i];
    const Wide<T> k = row.mask != nullptr ? Wide<T>{row.mask[i].alpha} : white;
    if (k == white) {
      d = s;
    } else if (k != 0) {
      const auto p = M::product(s.alpha, k);
      const auto q = M::product(Depth<T>::inv(k), d.alpha);
      const auto t = p + q;
      if (t == 0) continue;
      d = {static_cast<Channel<T>>(M::mix_alpha(t)), static_cast<Channel<T>>(M::mix(s.red, p, d.red, q, t)),
           static_cast<Channel<T>>(M::mix(s.green, p, d.green, q, t)),
           static_cast<Channel<T>>(M::mix(s.blue, p, d.blue, q, t))};
    }
  }
}

// A lot is drawn only under a partial alpha, but the seed steps on with every pixel.
template <class T, bool masked>
void run_row(Dissolve, const Row<T, masked>& row) {
  using M = RowMath<T>;
  const typename Row<T, masked>::Cover cover(row);
  const bool keep_alpha = row.mode->keep_alpha != 0;
  u32 seed = static_cast<u32>(row.mode->seed);
  for (i32 i = 0; i < row.n; ++i, ++seed) {
    const T s = row.src[i];
    const Wide<T> A = cover(s.alpha, i);
    bool wins = A >= Depth<T>::white;
    if (!wins && A > 0) wins = M::dissolves(random_number(seed = next_seed(seed)), A);
    if (!wins) continue;
    copy_colour(s, row.dst[i]);
    if (!keep_alpha) row.dst[i].alpha = static_cast<Channel<T>>(Depth<T>::white);
  }
}

}  // namespace zr
