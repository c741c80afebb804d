// The arithmetic of one channel at each depth, written down once more, slowly and from its definition.
//
// This model shares nothing with the library but the C records: it is a second opinion, so it prefers the
// plainest form of every rule. Values travel as V (i32 or f32) and become channels only when stored.
#pragma once

#include <ZR/zr.h>

#include <cmath>
#include <cstring>
#include <vector>

namespace model {

// A float that does not fit gives INT32_MIN, NaN too.
inline i32 truncate(f32 v) { return v >= -2147483648.0f && v < 2147483648.0f ? static_cast<i32>(v) : INT32_MIN; }
inline i32 widen(i32 v) { return static_cast<i32>((static_cast<u32>(v) * 0x808080u + 33200u) >> 16); }
inline i32 narrow(i32 v) { return (v * 255 + 16384) >> 15; }
inline bool zero_or_denormal(f32 v) { return v == 0 || std::fpclassify(v) == FP_SUBNORMAL; }

// Position x of a soft-light curve, 0..1.
inline f64 soft_high(f64 x) { return (x <= 0.25 ? ((16 * x - 12) * x + 4) * x : std::sqrt(x)) - x; }
inline f64 soft_low(f64 x) { return x * (1 - x); }

struct Eight {
  using V = i32;
  using Channel = u8;
  using Pixel = ZR_Pixel8;
  static constexpr const char* name = "8-bit";
  static constexpr V white = 255, half = 128;
  static constexpr u32 flags = 0;
  static V fold(V t) { return (t + ((t + 128) >> 8) + 128) >> 8; }
  static V mul(V a, V b) { return fold(a * b); }
  static V smul(V k, V x) { return fold(k * x); }
  static V inv(V a) { return 255 - a; }
  static V div(V n, V r) { return n >= r ? 255 : (n * 255 + (r >> 1)) / r; }
  static V luma(V r, V g, V b) { return (9798 * r + 19235 * g + 3735 * b + 16384) >> 15; }
  static V soft(bool high, V d) { return static_cast<V>(std::lround(255 * (high ? soft_high : soft_low)(d / 255.0))); }
};

struct Sixteen {
  using V = i32;
  using Channel = u16;
  using Pixel = ZR_Pixel16;
  static constexpr const char* name = "16-bit";
  static constexpr V white = 32768, half = 16384;
  static constexpr u32 flags = 0x1000001;
  static V mul(V a, V b) { return static_cast<V>((i64{a} * b + 16383) >> 15); }
  static V smul(V k, V x) { return static_cast<V>((i64{k} * x) >> 15); }
  static V inv(V a) { return 32768 - a; }
  static V div(V n, V r) { return n >= r ? 32768 : static_cast<V>((i64{n} * 32768 + (r >> 1)) / r); }
  static V luma(V r, V g, V b) { return (9798 * r + 19235 * g + 3735 * b + 16384) >> 15; }
  static V soft(bool high, V d) {
    const auto entry = [high](V i) {
      return i > 4095 ? 0 : static_cast<V>(32768 * (high ? soft_high : soft_low)(i / 4096.0) + 0.5);
    };
    const V at = entry(d >> 3);
    return (d & 7) == 0 ? at : at + (((d & 7) * (entry((d >> 3) + 1) - at) + 4) >> 3);
  }
};

struct Float {
  using V = f32;
  using Channel = f32;
  using Pixel = ZR_PixelFloat;
  static constexpr const char* name = "float";
  static constexpr V white = 1, half = 0.5f;
  static constexpr u32 flags = 0x2000000;
  static V mul(V a, V b) { return a * b; }
  static V smul(V k, V x) { return k * x; }
  static V inv(V a) { return 1 - a; }
  static V div(V n, V r) { return zero_or_denormal(r) ? 1 : n / r; }
  static V luma(V r, V g, V b) { return 0.299f * r + 0.587f * g + 0.114f * b; }
  static V soft(bool high, V d) {
    const auto entry = [high](i32 i) {
      return i > 4095 ? 0.0f : static_cast<f32>((high ? soft_high : soft_low)(i / 4096.0));
    };
    const f32 t = 4096 * d;
    const i32 whole = truncate(t), i = whole < 0 ? 0 : whole > 4096 ? 4096 : whole;
    const f32 rest = t - static_cast<f32>(i);
    return rest == 0 ? entry(i) : entry(i) + (entry(i + 1) - entry(i)) * rest;
  }
};

template <class D>
constexpr bool is_float = std::is_same_v<D, Float>;
template <class D>
constexpr bool is_eight = std::is_same_v<D, Eight>;

// A pixel on its way through the arithmetic.
template <class D>
struct Px {
  typename D::V a;
  typename D::V c[3];
};

template <class D>
Px<D> load(const typename D::Pixel& p) {
  return {p.alpha, {p.red, p.green, p.blue}};
}
template <class D>
typename D::Pixel store(const Px<D>& p) {
  using C = typename D::Channel;
  return {static_cast<C>(p.a), static_cast<C>(p.c[0]), static_cast<C>(p.c[1]), static_cast<C>(p.c[2])};
}
// What a store to the channels and a load again leave of a pixel.
template <class D>
Px<D> stored(const Px<D>& p) {
  return load<D>(store<D>(p));
}
template <class D>
typename D::V luma(const Px<D>& p) {
  return D::luma(p.c[0], p.c[1], p.c[2]);
}

// ------------------------------------------------------------------------------ linear light

inline i32 interpolate_into(const u16* to_linear, i32 v) {
  const i32 t = v * 255, i = t >> 15, f = t & 0x7fff, u = to_linear[i];
  return f == 0 ? u : u + ((f * (to_linear[i + 1] - u) + 16384) >> 15);
}

// Tables of a plain power curve, by the construction that tables of a profile have.
inline ZR_LinearBlendingTables gamma_tables(f64 gamma) {
  ZR_LinearBlendingTables t;
  for (i32 i = 0; i < 256; ++i)
    t.to_linear[i] = static_cast<u16>(std::lround(32768 * std::pow(widen(i) / 32768.0, gamma)));
  std::vector<i32> u(4097);
  for (i32 k = 0; k < 4096; ++k) u[static_cast<size_t>(k)] = interpolate_into(t.to_linear, 8 * k);
  u[4096] = t.to_linear[255];
  for (size_t k = 0; k < 4096; ++k)
    if (u[k + 1] < u[k]) u[k + 1] = u[k];
  size_t j = 0;
  for (i32 k = 0; k <= 4096; ++k) {
    const i32 y = 8 * k;
    while (j < 4095 && y >= u[j + 1]) ++j;
    const i32 lo = u[j], hi = u[j + 1], p = 8 * static_cast<i32>(j);
    const i32 v = hi > y && y >= lo ? (((hi - lo) >> 1) + (y - lo) * 8) / (hi - lo) + p : hi > y ? p : p + 8;
    t.from_linear[k] = static_cast<u16>(v);
  }
  t.to_linear_gamma = static_cast<f32>(gamma);
  t.from_linear_gamma = static_cast<f32>(1.0 / static_cast<f64>(t.to_linear_gamma));
  return t;
}

// The depth that linear light is computed in.
template <class D>
using Linear = std::conditional_t<is_eight<D>, Sixteen, D>;

// The power that is nearest in single precision.
inline f32 signed_power(f32 c, f32 exponent) {
  const auto power = [&](f64 v) { return static_cast<f32>(std::pow(v, static_cast<f64>(exponent))); };
  return c >= 0 ? power(c) : -power(-c);
}

template <class D>
typename Linear<D>::V alpha_into(typename D::V a) {
  if constexpr (is_eight<D>)
    return widen(a);
  else
    return a;
}
template <class D>
Px<Linear<D>> into_linear(const ZR_LinearBlendingTables& t, const Px<D>& p) {
  const auto colour = [&t](typename D::V v) {
    if constexpr (is_float<D>)
      return signed_power(v, t.to_linear_gamma);
    else
      return is_eight<D> ? i32{t.to_linear[v]} : interpolate_into(t.to_linear, v);
  };
  return {alpha_into<D>(p.a), {colour(p.c[0]), colour(p.c[1]), colour(p.c[2])}};
}
template <class D>
Px<D> from_linear(const ZR_LinearBlendingTables& t, const Px<Linear<D>>& p) {
  const auto colour = [&t](typename D::V v) {
    if constexpr (is_float<D>) {
      return signed_power(v, t.from_linear_gamma);
    } else {
      i32 u = t.from_linear[v >> 3];
      if ((v & 7) != 0) u += ((v & 7) * (t.from_linear[(v >> 3) + 1] - u) + 4) >> 3;
      return is_eight<D> ? narrow(u) : u;
    }
  };
  Px<D> out{p.a, {colour(p.c[0]), colour(p.c[1]), colour(p.c[2])}};
  if constexpr (is_eight<D>) out.a = narrow(p.a);
  return out;
}

// ------------------------------------------------------------------------------------ random

inline i32 rand(u32& seed) {
  u32 next = (seed % 44488u) * 48271u + (seed / 44488u) * 3399u;
  if (next == 0) next = 0x7fffffff;
  seed = next;
  return static_cast<i32>((next >> 7) & 0x7fff);
}

}  // namespace model
