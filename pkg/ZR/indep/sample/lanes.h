// The four channels of a pixel side by side, alpha in lane 0, for the arithmetic that all of them share.
//
// Each operation is one vector instruction or two, and rounds as the same operation on single numbers does.
#pragma once

#include <ZR/depth.h>

#include <bit>
#include <cstring>

namespace zr {

static_assert(std::endian::native == std::endian::little, "a pixel's alpha is the low part of its word");

using u8x16 = u8 __attribute__((vector_size(16)));
using u16x8 = u16 __attribute__((vector_size(16)));
using i32x2 = i32 __attribute__((vector_size(8)));
using i32x4 = i32 __attribute__((vector_size(16)));
using u64x2 = u64 __attribute__((vector_size(16)));
using i64x2 = i64 __attribute__((vector_size(16)));
using f32x4 = f32 __attribute__((vector_size(16)));
using f64x2 = f64 __attribute__((vector_size(16)));

template <class Real>
struct Lanes;

template <>
struct Lanes<f32> {
  f32x4 v;

  static Lanes all(f32 s) { return {f32x4{s, s, s, s}}; }
  void set_alpha(f32 s) { v[0] = s; }
  f32 alpha() const { return v[0]; }
  friend Lanes operator+(Lanes a, Lanes b) { return {a.v + b.v}; }
  friend Lanes operator*(f32 s, Lanes a) { return {f32x4{s, s, s, s} * a.v}; }
};

// Two registers, so that a processor of 16-byte vectors passes them without memory.
template <>
struct Lanes<f64> {
  f64x2 low, high;

  static Lanes all(f64 s) { return {f64x2{s, s}, f64x2{s, s}}; }
  void set_alpha(f64 s) { low[0] = s; }
  f64 alpha() const { return low[0]; }
  friend Lanes operator+(Lanes a, Lanes b) { return {a.low + b.low, a.high + b.high}; }
  friend Lanes operator*(Lanes a, Lanes b) { return {a.low * b.low, a.high * b.high}; }
  friend Lanes operator*(f64 s, Lanes a) { return {f64x2{s, s} * a.low, f64x2{s, s} * a.high}; }
};

// ---------------------------------------------------------------------------- pixel to lanes

inline i32x4 whole_lanes(const ZR_Pixel8& p) {
  const u8x16 bytes = std::bit_cast<u8x16>(i32x4{std::bit_cast<i32>(p), 0, 0, 0});
  const u8x16 words = __builtin_shufflevector(bytes, u8x16{}, 0, 16, 1, 17, 2, 18, 3, 19, 4, 20, 5, 21, 6, 22, 7, 23);
  return std::bit_cast<i32x4>(__builtin_shufflevector(std::bit_cast<u16x8>(words), u16x8{}, 0, 8, 1, 9, 2, 10, 3, 11));
}
inline i32x4 whole_lanes(const ZR_Pixel16& p) {
  const u16x8 words = std::bit_cast<u16x8>(i64x2{std::bit_cast<i64>(p), 0});
  return std::bit_cast<i32x4>(__builtin_shufflevector(words, u16x8{}, 0, 8, 1, 9, 2, 10, 3, 11));
}

template <class Real, class Pixel>
inline Lanes<Real> channels(const Pixel& p) {
  if constexpr (std::is_same_v<Real, f32>) {
    if constexpr (std::is_same_v<Pixel, ZR_PixelFloat>)
      return {std::bit_cast<f32x4>(p)};
    else
      return {__builtin_convertvector(whole_lanes(p), f32x4)};
  } else if constexpr (std::is_same_v<Pixel, ZR_PixelFloat>) {
    return {f64x2{p.alpha, p.red}, f64x2{p.green, p.blue}};
  } else {
    // A whole number below the exponent of 2^52 is that much above 2^52: there is no vector instruction for this
    // conversion that all compilers take.
    constexpr f64 base = 4503599627370496.0;
    constexpr i32 exponent = 0x43300000;
    const i32x4 whole = whole_lanes(p), above{exponent, exponent, exponent, exponent};
    const f64x2 bases{base, base};
    return {std::bit_cast<f64x2>(__builtin_shufflevector(whole, above, 0, 4, 1, 5)) - bases,
            std::bit_cast<f64x2>(__builtin_shufflevector(whole, above, 2, 6, 3, 7)) - bases};
  }
}

// ---------------------------------------------------------------------------- lanes to pixel

// The low bits of each lane, moved together. (Two 64-bit words, as processors lack a narrowing shuffle of bytes.)
inline ZR_Pixel8 low_bytes(i32x4 v) {
  const u64x2 pairs = std::bit_cast<u64x2>(v & i32x4{255, 255, 255, 255});
  const u64x2 packed = pairs | (pairs >> 24);
  return std::bit_cast<ZR_Pixel8>(static_cast<u32>((packed[0] & 0xffffu) | (packed[1] << 16)));
}
inline ZR_Pixel16 low_words(i32x4 v) {
  const u64x2 pairs = std::bit_cast<u64x2>(v & i32x4{65535, 65535, 65535, 65535});
  const i32x4 packed = std::bit_cast<i32x4>(pairs | (pairs >> 16));
  return std::bit_cast<ZR_Pixel16>(std::bit_cast<u64x2>(__builtin_shufflevector(packed, packed, 0, 2, 0, 2))[0]);
}

// Lanes that satisfy the mask; 0 elsewhere.
inline f32x4 where(i32x4 mask, f32x4 v) { return mask ? v : f32x4{}; }
inline f64x2 where(i64x2 mask, f64x2 v) { return mask ? v : f64x2{}; }

// Truncated and limited to 0..white; NaN gives 0.
template <class Pixel>
inline i32x4 truncate_limited(f32x4 v) {
  constexpr f32 white = static_cast<f32>(Depth<Pixel>::white);
  const f32x4 above_zero = where(v > f32x4{}, v);
  const f32x4 limit{white, white, white, white};
  return __builtin_convertvector(above_zero < limit ? above_zero : limit, i32x4);
}

// Truncated to 32 bits, of which the channels keep the low ones. What does not fit, and NaN, counts as the
// lowest integer, of which those bits are 0.
template <class Pixel>
inline Pixel truncate_low_bits(Lanes<f32> c) {
  constexpr f32 end = 2147483648.0f;
  const f32x4 high{end, end, end, end};
  const i32x4 whole = __builtin_convertvector(where((c.v >= -high) & (c.v < high), c.v), i32x4);
  if constexpr (std::is_same_v<Pixel, ZR_Pixel8>)
    return low_bytes(whole);
  else
    return low_words(whole);
}
inline ZR_Pixel16 truncate_low_bits(Lanes<f64> c) {
  const f64x2 low{-2147483649.0, -2147483649.0}, high{2147483648.0, 2147483648.0};
  const auto half = [&](f64x2 v) { return __builtin_convertvector(where((v > low) & (v < high), v), i32x2); };
  return low_words(__builtin_shufflevector(half(c.low), half(c.high), 0, 1, 2, 3));
}

}  // namespace zr
