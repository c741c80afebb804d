// Tone curves tabulated for fast evaluation, within 1e-6 of the curve itself.
#pragma once

#include <HB/allocator.h>
#include <ZR/depth.h>
#include <lcms2.h>

#include <bit>
#include <vector>

#include "TON/pixel_layout.h"

namespace zr::prisma {

struct CurveLabel {
  static constexpr const char* text = "tone curve tables";
};
template <class T>
using CurveVector = std::vector<T, HB_Allocator<T, CurveLabel>>;

// A curve given by a formula, which is one or two smooth parts. Pieces of 1/64 of an octave hold a parabola each: near
// zero, where the inverse of a gamma is steep, they are as fine as the numbers themselves. Magnitudes above 1e20 count
// as 1e20; NaN stays NaN.
class FormulaCurve {
 public:
  // False when the curve is smooth in too few pieces: then it is not to be used.
  bool build(const cmsToneCurve* curve);
  f32 operator()(f32 x) const {
    const u32 bits = std::bit_cast<u32>(x);
    i32 piece = static_cast<i32>((bits & 0x7fffffffu) >> mantissa_shift) - first_piece;
    piece = piece < 0 ? 0 : piece;
    if (piece >= pieces) return exact(x);
    const Parabola& p = parabolas_[static_cast<size_t>(piece + static_cast<i32>(bits >> 31) * pieces)];
    return p.by_formula ? exact(x) : p.a + x * (p.b + x * p.c);
  }
  // The same for arguments of 0..1.
  f32 in_unit(f32 x) const {
    i32 piece = static_cast<i32>(std::bit_cast<u32>(x) >> mantissa_shift) - first_piece;
    piece = piece < 0 ? 0 : piece;
    const Parabola& p = parabolas_[static_cast<size_t>(piece)];
    return p.by_formula ? exact(x) : p.a + x * (p.b + x * p.c);
  }
  // The formula itself, to the last place of lcms.
  f32 exact(f32 x) const;

 private:
  struct Parabola {
    f32 a, b, c;
    u32 by_formula;  // the curve has a corner or a step here
  };
  static constexpr int mantissa_bits = 6, mantissa_shift = 23 - mantissa_bits;
  static constexpr int lowest_exponent = -40, beyond_exponent = 10;
  // Piece 0 reaches from 0 to 2^lowest; the last one ends at 2^beyond.
  static constexpr i32 first_piece = ((127 + lowest_exponent) << mantissa_bits) - 1;
  static constexpr i32 pieces = ((beyond_exponent - lowest_exponent) << mantissa_bits) + 1;

  bool fit(i32 piece, f32 sign, f64* y0);

  const cmsToneCurve* curve_ = nullptr;
  CurveVector<Parabola> parabolas_;
};

// A curve given by samples. It is defined on 16-bit words, as the profile format has it.
class SampledCurve {
 public:
  void build(const cmsToneCurve* curve);
  f32 operator()(f32 x) const {
    const f64 word = static_cast<f64>(x) * 65535.0 + 0.5;
    return values_[!(word > 0.0) ? 0 : word >= 65535.0 ? 65535u : floor_of(word)];
  }
  f32 in_unit(f32 x) const { return (*this)(x); }
  f32 exact(f32 x) const { return (*this)(x); }

 private:
  // As lcms has it: of the nearest multiple of 1/65536, so that what is just below a whole number counts as it.
  static u32 floor_of(f64 word) {
    constexpr f64 to_fixed = 0x1.8p36;  // leaves the number in 16.16 in the low bits
    const i32 fixed = static_cast<i32>(std::bit_cast<u64>(word - 32767.0 + to_fixed));
    return static_cast<u32>((fixed >> 16) + 32767);
  }
  CurveVector<f32> values_;
};

}  // namespace zr::prisma
