// Powers of floats: 2 to the (exponent times the logarithm to base 2), all in doubles, rounded to single once.
//
// The method is the textbook one (J.-M. Muller, Elementary Functions, 3rd edition, chapters 4.2 and 11): the argument
// is split into 2^k times a mantissa about 1, whose logarithm is an odd polynomial of (m - 1) / (m + 1); the product
// with the exponent is split into an integer, which goes into the exponent bits, and a rest of at most a half for
// a polynomial of 2^x. Coefficients: Chebyshev fits, off by less than 2^-52.
//
// The double is off by less than 2^-43 of itself, a millionth of the last place of a float. So the float is the
// correctly rounded one but for about one argument in a million, or one in a hundred thousand where the exponent is
// a small integer and powers lie just between two floats: there it may be the other neighbour. Only additions,
// products and one quotient, in one order: single numbers and the lanes of every instruction set agree to the last
// bit, where the C library's powf is another function on every system.
#if defined(ZR_SIMD_POWER_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SIMD_POWER_INL_H
#undef ZR_SIMD_POWER_INL_H
#else
#define ZR_SIMD_POWER_INL_H
#endif

#ifdef ZR_IN_LANES
#include "simd/lane_depth-inl.h"
#include "simd/lane_doubles-inl.h"
#else
#include <bit>

#include "simd/single-inl.h"
#endif
#include "simd/formulas.h"

ZR_BEGIN_FORMULAS

// ------------------------------------------------------------------------------ floats and doubles of one argument

#ifdef ZR_IN_LANES
HWY_INLINE Doubles held(Doubles v, f64 least, f64 most) {
  const auto one = [&](Doubles::V x)
                       HWY_ATTR { return hn::Min(hn::Max(x, hn::Set(Tag<f64>(), least)), hn::Set(Tag<f64>(), most)); };
  return {one(v.low), one(v.high)};
}
HWY_INLINE Ints bits_of(Floats v) { return hn::BitCast(Tag<i32>(), v.v); }
HWY_INLINE Floats float_of(Ints bits) { return hn::BitCast(Tag<f32>(), bits.v); }
// 2^n for the integer n in the low bits of a double.
HWY_INLINE Doubles two_to_low_bits(Doubles v) {
  const Tag<u64> d;
  const auto one = [&](Doubles::V x) HWY_ATTR {
    const auto exponent = hn::Add(hn::ShiftLeft<52>(hn::BitCast(d, x)), hn::Set(d, u64{0x3ff} << 52));
    return hn::BitCast(Tag<f64>(), exponent);
  };
  return {one(v.low), one(v.high)};
}
using Truth = Bools<f32>;
#else
using Doubles = f64;
using Floats = f32;
using Ints = i32;
using Truth = bool;
constexpr f64 to_double(f32 v) { return v; }
constexpr f64 to_double(i32 v) { return v; }
constexpr f32 narrowed(f64 v) { return static_cast<f32>(v); }
constexpr f64 held(f64 v, f64 least, f64 most) { return v < least ? least : v > most ? most : v; }
constexpr i32 bits_of(f32 v) { return std::bit_cast<i32>(v); }
constexpr f32 float_of(i32 bits) { return std::bit_cast<f32>(bits); }
constexpr f64 two_to_low_bits(f64 v) { return std::bit_cast<f64>((std::bit_cast<u64>(v) << 52) + (u64{0x3ff} << 52)); }
#endif

// ------------------------------------------------------------------------------ the power

// Of a finite exponent above 0, what all arguments share.
struct PowerExponent {
  explicit PowerExponent(f32 y) : exponent(y) {
    const bool odd = y < 0x1p24f && static_cast<f32>(static_cast<i32>(y)) == y && (static_cast<i32>(y) & 1) != 0;
    zero = odd ? -0.0f : 0.0f;
  }
  f64 exponent;
  f32 zero;  // added to a zero it gives the zero's power
};

// In pairs and fours (Estrin's order): short chains, which is what the speed of vectors hangs on here.
template <std::size_t n>
ZR_PURE Doubles polynomial(Doubles x, const f64 (&c)[n]) {
  const Doubles x2 = x * x, x4 = x2 * x2;
  const Doubles low = (x * c[1] + c[0]) + (x * c[3] + c[2]) * x2;
  if constexpr (n == 7) {
    return low + ((x * c[5] + c[4]) + x2 * c[6]) * x4;
  } else {
    static_assert(n == 12);
    const Doubles middle = (x * c[5] + c[4]) + (x * c[7] + c[6]) * x2;
    const Doubles high = (x * c[9] + c[8]) + (x * c[11] + c[10]) * x2;
    return low + (middle + high * x4) * x4;
  }
}

// Of x above 0 and finite.
ZR_PURE Doubles logarithm_2(Floats x) {
  constexpr f64 of_odd_powers[] = {0x1.71547652b82ffp+1, 0x1.ec709dc39ca3fp-1, 0x1.2776c516a09d5p-1,
                                   0x1.a6175680ea809p-2, 0x1.484fa99f9fe96p-2, 0x1.0bb8095ec8253p-2,
                                   0x1.f17e1ad199ccap-3};
  constexpr i32 root_half = 0x3f3504f3;  // its bits: mantissas lie between it and the root of 2
  const Truth tiny = x < 0x1p-126f;
  const Ints b = bits_of(pick(tiny, x * 0x1p24f, x)) - root_half;
  const Ints k = shifted_right<23>(b) - pick(of_ints(tiny), 24, 0);
  const Doubles m = to_double(float_of(masked(b, 0x7fffff) + root_half));
  const Doubles s = (m - 1.0) / (m + 1.0);
  return to_double(k) + s * polynomial(s * s, of_odd_powers);
}

// 2^t, of |t| below 1000.
ZR_PURE Doubles power_of_2(Doubles t) {
  constexpr f64 of_powers[] = {0x1.0000000000000p+0,  0x1.62e42fefa39efp-1,  0x1.ebfbdff82c5aep-3,
                               0x1.c6b08d704a0c6p-5,  0x1.3b2ab6fb9f1a5p-7,  0x1.5d87fe78a3f9cp-10,
                               0x1.430913112c61bp-13, 0x1.ffcbfc6da6ed1p-17, 0x1.62bfc2c86d700p-20,
                               0x1.b524ebd13a55fp-24, 0x1.e6228acd1c6e5p-28, 0x1.e9ec1fcb69a7fp-32};
  constexpr f64 no_fraction = 0x1.8p52;  // what is added to it is rounded to an integer, in its low bits
  const Doubles n = t + no_fraction;
  return polynomial(t - (n - no_fraction), of_powers) * two_to_low_bits(n);
}

// |c| to the exponent with the sign of c; zeros, infinities and NaN as std::pow.
ZR_PURE Floats signed_power(Floats c, const PowerExponent& y) {
  const Floats x = magnitude_of(c);
  const Truth ordinary = x > 0.0f && x < std::numeric_limits<f32>::infinity();
  const Floats power = narrowed(power_of_2(held(logarithm_2(x) * y.exponent, -300.0, 300.0)));
  return pick(ordinary, power * pick(c < 0.0f, -1.0f, 1.0f), c + y.zero);
}

ZR_END_FORMULAS

#endif
