// The operations in which transfer modes differ from depth to depth, each under one name, so that a mode
// is told once: ModeMath<T> is Depth<T> and these.
#pragma once

#include <ZR/depth.h>

#include "composite/soft_light_state.h"

namespace zr {

template <class T>
struct ModeMath;

// What the two integer depths share. An integer channel is stored modulo its width; divisors are checked
// because 16-bit channels may be illegal.
template <class T>
struct IntegerModeMath : Depth<T> {
  using D = Depth<T>;
  using Wide = i32;

  static constexpr Wide stored(Wide v) { return static_cast<typename D::Channel>(v); }
  // Clamps that float has not.
  static constexpr Wide capped(Wide v) { return v < D::white ? v : D::white; }
  static constexpr Wide floored(Wide v) { return v > 0 ? v : 0; }
  static constexpr Wide magnitude(Wide v) { return v < 0 ? -v : v; }
  // a * b / c of the colour modes, toward zero; legal pixels come here with c > 0 only.
  static constexpr bool divides(Wide c) { return c > 0; }
  static constexpr Wide ratio(Wide a, Wide b, Wide c) { return wrap_mul(a, b) / c; }
  // The weight of a soft-light table value under a partial alpha.
  static constexpr Wide soft_weight(Wide k, Wide v, Wide A) { return D::mul(A, D::mul(k, v)); }
  static constexpr Wide quotient(Wide d, Wide s) { return d == 0 ? 0 : d >= s ? D::white : D::div(d, s); }
  static constexpr Wide luma_alpha(Wide a) { return a; }
  static constexpr Wide weighted(Wide s, Wide d, Wide f, Wide A, Wide a, Wide R) {
    const Wide both = D::mul(A, a);
    const Wide n = D::mul(A, s) + D::mul(a, d) - D::mul(d, both) - (D::mul(s, both) - D::mul(both, f));
    return D::div(stored(n), R);
  }
};

template <>
struct ModeMath<ZR_Pixel8> : IntegerModeMath<ZR_Pixel8> {
  // t drawn toward d. Not smul: the fold of a negative product rounds another way, so the sign is
  // taken out first.
  static constexpr Wide drawn(Wide t, Wide d, Wide k) { return d >= t ? t + mul(d - t, k) : t - mul(t - d, k); }
  // Twice s below half and twice s less white above, of the modes that stretch a half to the whole.
  static constexpr Wide stretched_low(Wide s) { return (s * 255 + 64) >> 7; }
  static Wide stretched_high(Wide s) { return div(s - half, 127); }
  static Wide soft_low(Wide d) { return soft_light_low_8[static_cast<u32>(d)]; }
  static Wide soft_high(Wide d) { return soft_light_high_8[static_cast<u32>(d)]; }
  static constexpr Wide hard_mix(Wide s, Wide d) { return d > mul(254, inv(s)) ? white : 0; }
  // The mask first, then the opacity; alpha unions and the other depths go the other way round.
  static constexpr Wide covered(Wide c, Wide opacity, Wide mask) { return mul(mul(mask, c), opacity); }
  static constexpr Wide marker_high = 191, marker_low = 64;  // 0.75 and 0.25 of white
  static constexpr bool dissolves(i32 random, Wide A) { return (random & 255) <= A; }
  // Source and destination by the products p and q of their alphas with the mask and its inverse.
  static constexpr Wide product(Wide a, Wide k) { return a * k; }
  static constexpr Wide mix_alpha(Wide t) { return (t + 128) / 255; }
  static constexpr Wide mix(Wide s, Wide p, Wide d, Wide q, Wide t) { return (s * p + (t >> 1) + d * q) / t; }
};

template <>
struct ModeMath<ZR_Pixel16> : IntegerModeMath<ZR_Pixel16> {
  static constexpr Wide drawn(Wide t, Wide d, Wide k) { return t + smul(k, d - t); }
  static constexpr Wide stretched_low(Wide s) { return 2 * s; }
  static constexpr Wide stretched_high(Wide s) { return 2 * s - white; }
  static Wide soft_low(Wide d) { return interpolated(soft_light_low_16, d); }
  static Wide soft_high(Wide d) { return interpolated(soft_light_high_16, d); }
  static constexpr Wide hard_mix(Wide s, Wide d) { return d > ((inv(s) * 32767 + 16384) >> 15) ? white : 0; }
  static constexpr Wide covered(Wide c, Wide opacity, Wide mask) { return mul(mask, mul(c, opacity)); }
  static constexpr Wide marker_high = 24576, marker_low = 8192;
  static constexpr bool dissolves(i32 random, Wide A) { return random < A; }
  // Products of three channels need 45 bits.
  static constexpr i64 product(i64 a, i64 k) { return a * k; }
  static constexpr Wide mix_alpha(i64 t) { return static_cast<Wide>((t + 16384) / 32768); }
  static constexpr Wide mix(i64 s, i64 p, i64 d, i64 q, i64 t) {
    return static_cast<Wide>((s * p + (t >> 1) + d * q) / t);
  }

 private:
  // The tables have an entry for every eighth value.
  static Wide interpolated(const u16* table, Wide d) {
    const Wide v = d < white ? d : white;  // an illegal channel stays inside the table
    const u16* const entry = table + (v >> 3);
    const Wide between = v & 7;
    return between == 0 ? entry[0] : entry[0] + ((between * (entry[1] - entry[0]) + 4) >> 3);
  }
};

// Float: no clamps and no storing, other roundings of the same formulas, and two formulas of its own.
template <>
struct ModeMath<ZR_PixelFloat> : Depth<ZR_PixelFloat> {
  static constexpr Wide stored(Wide v) { return v; }
  static constexpr Wide capped(Wide v) { return v; }
  static constexpr Wide floored(Wide v) { return v; }
  static constexpr Wide magnitude(Wide v) { return __builtin_fabsf(v); }
  static constexpr bool divides(Wide c) { return c != 0.0f; }
  static constexpr Wide ratio(Wide a, Wide b, Wide c) { return a * b / c; }
  static constexpr Wide drawn(Wide t, Wide d, Wide k) { return t + (d - t) * k; }
  static constexpr Wide stretched_low(Wide s) { return 2.0f * s; }
  static constexpr Wide stretched_high(Wide s) { return (s - 0.5f) * 2.0f; }
  static Wide soft_low(Wide d) { return interpolated(soft_light_low_float, d); }
  static Wide soft_high(Wide d) { return interpolated(soft_light_high_float, d); }
  static constexpr Wide soft_weight(Wide k, Wide v, Wide A) { return k * (v * A); }
  // A ramp of the width of `step` instead of a threshold.
  static constexpr Wide hard_mix(Wide s, Wide d) {
    constexpr Wide step = 1.001358e-5f;
    const Wide w = (1.0f - s) * 0.99999f;
    if (d <= w) return 0.0f;
    const Wide t = d - w;
    return t >= step ? 1.0f : t / step;
  }
  // Sources nearer to black than `least` divide by it.
  static constexpr Wide quotient(Wide d, Wide s) {
    constexpr Wide least = 1.8189894e-6f;
    return magnitude(s) > least ? d / s : d / least;
  }
  // An alpha that was multiplied by a luma is the only one that is clamped.
  static constexpr Wide luma_alpha(Wide a) { return a > 1.0f ? 1.0f : a < 1e-16f ? 0.0f : a; }
  static constexpr Wide weighted(Wide s, Wide d, Wide f, Wide A, Wide a, Wide R) {
    return div(((f - s - d) * a + s) * A + a * d, R);
  }
  static constexpr Wide covered(Wide c, Wide opacity, Wide mask) { return mask * (c * opacity); }
  static constexpr Wide marker_high = 0.75f, marker_low = 0.25f;
  static constexpr bool dissolves(i32 random, Wide A) { return static_cast<f32>(random) / 32768.0f < A; }
  static constexpr Wide product(Wide a, Wide k) { return a * k; }
  static constexpr Wide mix_alpha(Wide t) { return t; }
  static constexpr Wide mix(Wide s, Wide p, Wide d, Wide q, Wide t) { return div(s * p + d * q, t); }

 private:
  // Below 0 the first segment goes on; above 1 the tables read zero.
  static Wide interpolated(const f32* table, Wide d) {
    const Wide t = 4096.0f * d;
    const i32 whole = truncate_i32(t);
    const i32 i = whole < 0 ? 0 : whole > 4096 ? 4096 : whole;
    const Wide between = t - static_cast<f32>(i);
    return between != 0.0f ? table[i] + (table[i + 1] - table[i]) * between : table[i];
  }
};

}  // namespace zr
