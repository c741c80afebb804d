// The operations in which transfer modes differ from depth to depth, each under one name, so that a mode
// is told once: ModeMath<T> is the channel arithmetic of T and these. Of single numbers or of lanes.
#if defined(ZR_COMPOSITE_MODE_ARITHMETIC_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_COMPOSITE_MODE_ARITHMETIC_INL_H
#undef ZR_COMPOSITE_MODE_ARITHMETIC_INL_H
#else
#define ZR_COMPOSITE_MODE_ARITHMETIC_INL_H
#endif

#include "composite/soft_light_state.h"
#ifdef ZR_IN_LANES
#include "simd/lane_bytes-inl.h"
#else
#include "simd/single-inl.h"
#endif
#include "simd/formulas.h"

ZR_BEGIN_FORMULAS

template <class T>
struct ModeMath;

// What the two integer depths share. An integer channel is stored modulo its width; divisors are checked
// because 16-bit channels may be illegal.
template <class T>
struct IntegerModeMath : Primitive<T> {
  using D = Primitive<T>;
  using Wide = Number<T>;

  // Clamps that float has not.
  static ZR_PURE Wide capped(Wide v) { return pick(v < D::white, v, D::white); }
  static ZR_PURE Wide floored(Wide v) { return pick(v > 0, v, 0); }
  static ZR_PURE Wide magnitude(Wide v) { return pick(v < 0, 0 - v, v); }
  // a * b / c of the colour modes, toward zero; legal pixels come here with c > 0 only.
  static ZR_PURE auto divides(Wide c) { return c > 0; }
  static ZR_PURE Wide ratio(Wide a, Wide b, Wide c) { return product_ratio(a, b, pick(divides(c), c, 1)); }
  static ZR_PURE Wide toward(Wide from, Wide to, Wide k) { return from + D::smul(k, to - from); }
  // The weight of a soft-light table value under a partial alpha.
  static ZR_PURE Wide soft_weight(Wide k, Wide v, Wide A) { return D::mul(A, D::mul(k, v)); }
  // d moved by the weight of |twice - white|, down (less) or up.
  static ZR_PURE Wide moved(auto less, Wide d, Wide twice, auto weight) {
    const Wide by = weight(pick(less, D::inv(twice), twice - D::white));
    return pick(less, d - by, d + by);
  }
  static ZR_PURE Wide quotient(Wide d, Wide s) { return pick(d == 0, d, pick(d >= s, D::white, D::div(d, s))); }
  static ZR_PURE Wide luma_alpha(Wide a) { return a; }
  // What is left to divide by the alpha of both.
  static ZR_PURE Wide weighted(Wide s, Wide d, Wide f, Wide A, Wide a) {
    const Wide both = D::mul(A, a);
    return D::mul(A, s) + D::mul(a, d) - D::mul(d, both) - (D::mul(s, both) - D::mul(both, f));
  }
  // n / r of n < r, else white. Illegal numbers, of which lanes have none, count as they are signed here.
  static ZR_PURE Wide fraction(Wide n, Wide r) {
#ifdef ZR_IN_LANES
    return D::div(n, r);
#else
    return pick(n >= r, D::white, D::div(n, r));
#endif
  }
};

// Of bytes, in numbers of any width.
template <class T>
struct ByteModeMath : IntegerModeMath<T> {
  using D = Primitive<T>;
  using Wide = Number<T>;

  // t drawn toward d. Not smul: the fold of a negative product rounds another way, so the sign is
  // taken out first.
  static ZR_PURE Wide drawn(Wide t, Wide d, Wide k) { return pick(d >= t, t + D::mul(d - t, k), t - D::mul(t - d, k)); }
  // Twice s below half and twice s less white above, of the modes that stretch a half to the whole.
  static ZR_PURE Wide stretched_low(Wide s) { return shifted_right<7>(s * 255 + 64); }
  static inline Wide stretched_high(Wide s) { return D::div(s - D::half, 127); }
  // How far soft light moves d toward dark (low) or light.
  static inline Wide soft(auto low, Wide d) {
    return entry_of(soft_light_8.data(), masked(d, 255) + pick(low, 0, soft_light_reach_8));
  }
  static ZR_PURE Wide hard_mix(Wide s, Wide d) { return pick(d > D::mul(254, D::inv(s)), D::white, 0); }
  // The mask first, then the opacity; alpha unions and the other depths go the other way round.
  static ZR_PURE Wide covered(Wide c, Wide opacity, Wide mask) { return D::mul(D::mul(mask, c), opacity); }
  static constexpr i32 marker_high = 191, marker_low = 64;  // 0.75 and 0.25 of white
};
template <>
struct ModeMath<ZR_Pixel8> : ByteModeMath<ZR_Pixel8> {};
#ifdef ZR_IN_LANES
template <>
struct ModeMath<NarrowPixel8> : ByteModeMath<NarrowPixel8> {
  using Primitive<NarrowPixel8>::toward;
  static HWY_INLINE Shorts drawn(Shorts t, Shorts d, Shorts k) { return mixed(t, d, k); }
  // What is low is its formula at every entry of the table.
  static HWY_INLINE Shorts soft(Bools<i16> low, Shorts d) {
    return pick(low, mul(d, inv(d)), entry_of(soft_light_8.data() + soft_light_reach_8, d));
  }
};
#endif

template <>
struct ModeMath<ZR_Pixel16> : IntegerModeMath<ZR_Pixel16> {
  static ZR_PURE Wide drawn(Wide t, Wide d, Wide k) { return t + smul(k, d - t); }
  static ZR_PURE Wide stretched_low(Wide s) { return 2 * s; }
  static ZR_PURE Wide stretched_high(Wide s) { return 2 * s - white; }
  // The tables have an entry for every eighth value.
  static inline Wide soft(auto low, Wide d) {
#ifdef ZR_IN_LANES
    const Wide v = d;
#else
    const Wide v = held(d, 0, white);  // an illegal channel stays inside the table
#endif
    const Wide entry = entry_of(soft_light_16, shifted_right<3>(v) + pick(low, 0, soft_light_reach));
    return shifted_right<3>(eighths(entry, masked(v, 7)) + 4);
  }
  // Eight times the upper half of an entry, and `count` times the lower, which is signed.
  static ZR_PURE Wide eighths(Wide entry, Wide count) {
#if defined(ZR_IN_LANES) && HWY_ARCH_X86
    const Tag<i16> d;
    auto none = hn::Zero(Tag<i32>());
    const Wide factors = hn::Or(count.v, Wide(8 << 16).v);  // both products and their sum are one instruction there
    return hn::ReorderWidenMulAccumulate(Tag<i32>(), hn::BitCast(d, entry.v), hn::BitCast(d, factors.v), none, none);
#else
    const Wide curve = shifted_right<16>(entry), step = shifted_right<16>(shifted_left<16>(entry));
    return 8 * curve + count * step;
#endif
  }
  static ZR_PURE Wide hard_mix(Wide s, Wide d) { return pick(d > shifted_right<15>(inv(s) * 32767 + 16384), white, 0); }
  static ZR_PURE Wide covered(Wide c, Wide opacity, Wide mask) { return mul(mask, mul(c, opacity)); }
  static constexpr i32 marker_high = 24576, marker_low = 8192;
};

// Float: no clamps and no storing, other roundings of the same formulas, and two formulas of its own.
template <>
struct ModeMath<ZR_PixelFloat> : Primitive<ZR_PixelFloat> {
  using Wide = Number<ZR_PixelFloat>;

  static ZR_PURE Wide capped(Wide v) { return v; }
  static ZR_PURE Wide floored(Wide v) { return v; }
  static ZR_PURE Wide magnitude(Wide v) { return magnitude_of(v); }
  static ZR_PURE auto divides(Wide c) { return c != 0.0f; }
  static ZR_PURE Wide ratio(Wide a, Wide b, Wide c) { return a * b / c; }
  static ZR_PURE Wide toward(Wide from, Wide to, Wide k) { return from + k * (to - from); }
  static ZR_PURE Wide drawn(Wide t, Wide d, Wide k) { return t + (d - t) * k; }
  static ZR_PURE Wide stretched_low(Wide s) { return 2.0f * s; }
  static ZR_PURE Wide stretched_high(Wide s) { return (s - 0.5f) * 2.0f; }
  // Below 0 the first segment goes on; above 1 the tables read zero.
  static inline Wide soft(auto low, Wide d) {
    const Wide t = 4096.0f * d;
    const auto i = held(to_int(t), 0, 4096);
    const Wide between = t - to_float(i);
    const auto ends = entries_of(soft_light_float, i + pick(of_ints(low), 0, soft_light_reach));
    return ends.first + (ends.next - ends.first) * between;
  }
  static ZR_PURE Wide soft_weight(Wide k, Wide v, Wide A) { return k * (v * A); }
  // Alike down and up, as products of floats are.
  static ZR_PURE Wide moved(auto, Wide d, Wide twice, auto weight) { return d + weight(twice - white); }
  // A ramp of the width of `step` instead of a threshold.
  static ZR_PURE Wide hard_mix(Wide s, Wide d) {
    constexpr f32 step = 1.001358e-5f;
    const Wide w = (1.0f - s) * 0.99999f;
    const Wide t = d - w;
    return pick(d <= w, 0.0f, pick(t >= step, 1.0f, t / step));
  }
  // Sources nearer to black than `least` divide by it.
  static ZR_PURE Wide quotient(Wide d, Wide s) {
    constexpr f32 least = 1.8189894e-6f;
    return d / pick(magnitude(s) > least, s, least);
  }
  // An alpha that was multiplied by a luma is the only one that is clamped.
  static ZR_PURE Wide luma_alpha(Wide a) { return pick(a > 1.0f, 1.0f, pick(a < 1e-16f, 0.0f, a)); }
  static ZR_PURE Wide weighted(Wide s, Wide d, Wide f, Wide A, Wide a) { return ((f - s - d) * a + s) * A + a * d; }
  static ZR_PURE Wide fraction(Wide n, Wide r) { return pick(n >= r, white, div(n, r)); }
  static ZR_PURE Wide covered(Wide c, Wide opacity, Wide mask) { return mask * (c * opacity); }
  static constexpr f32 marker_high = 0.75f, marker_low = 0.25f;
};

ZR_END_FORMULAS

#endif
