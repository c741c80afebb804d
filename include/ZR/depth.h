// Channel arithmetic of the three depths: the one home of 255, 32768 and 1.0f.
//
// Every rule that moves a value between depths, multiplies, divides or inverts it stands here under a
// name; no other file rounds by a rule of its own. Where two depths round differently the difference
// is part of the result, and the reason stands next to it.
//
// Threads: all functions are pure, except that 8-bit division reads ZRp_G_fcd_table (set by ZR_Birth).
#pragma once

#include <ZR/zr.h>

#include <bit>
#include <limits>
#include <type_traits>

extern "C" {
// 256 x 256 byte tables, index row * 256 + column; null before ZR_Birth.
// Multiply: row * column / 255, rounded. Divide: column * 255 / row, rounded, 255 from column >= row on.
ZR_API extern const u8* ZRp_G_fcm_table;
ZR_API extern const u8* ZRp_G_fcd_table;
// Entry i holds the float i, for i in 0..255.
ZR_API extern f32 ZR_G_FloatRamp[256];
}

namespace zr {

// ------------------------------------------------------------------------------ number helpers

// Truncation toward zero; what does not fit, and NaN, gives INT32_MIN on every processor.
constexpr i32 truncate_i32(f32 v) {
  const bool fits = v >= -2147483648.0f && v < 2147483648.0f;
  const i32 truncated = static_cast<i32>(fits ? v : 0.0f);
  return fits ? truncated : std::numeric_limits<i32>::min();
}
constexpr i32 truncate_i32(f64 v) {
  const bool fits = v > -2147483649.0 && v < 2147483648.0;
  const i32 truncated = static_cast<i32>(fits ? v : 0.0);
  return fits ? truncated : std::numeric_limits<i32>::min();
}

// Products and sums that wrap at 32 bits: legal channels never reach the wrap, illegal ones stay defined.
constexpr i32 wrap_mul(i32 a, i32 b) { return static_cast<i32>(static_cast<u32>(a) * static_cast<u32>(b)); }
constexpr i32 wrap_add(i32 a, i32 b) { return static_cast<i32>(static_cast<u32>(a) + static_cast<u32>(b)); }
constexpr i32 wrap_sub(i32 a, i32 b) { return static_cast<i32>(static_cast<u32>(a) - static_cast<u32>(b)); }

// Exponent bits all zero: +-0 and the denormals, which no float path divides by.
constexpr bool is_zero_or_denormal(f32 v) { return (std::bit_cast<u32>(v) & 0x7f800000u) == 0; }

// The weights of red, green and blue in luma, in 1/32768; they sum to 32768.
inline constexpr i32 luma_red = 9798, luma_green = 19235, luma_blue = 3735;

// ------------------------------------------------------------------------------ one depth each

template <class Pixel>
struct Depth;

template <>
struct Depth<ZR_Pixel8> {
  using Channel = u8;
  using Wide = i32;
  static constexpr i32 bits = 8;
  static constexpr u32 layer_flags = 0;
  static constexpr Wide white = 255, half = 128;

  // a * b / 255 rounded to nearest, exact for all pairs of bytes.
  static constexpr Wide mul(Wide a, Wide b) { return fold(wrap_mul(a, b)); }
  static constexpr Wide inv(Wide a) { return white - a; }
  // The same fold with a signed second operand; shifts are arithmetic.
  static constexpr Wide smul(Wide k, Wide x) { return fold(wrap_mul(k, x)); }
  // n * 255 / r by table, clamped to 255; row 0 is 255 throughout. n and r are 0..255.
  static Wide div(Wide n, Wide r) { return ZRp_G_fcd_table[r * 256 + n]; }
  static constexpr Wide luma(Wide r, Wide g, Wide b) {
    return (luma_red * r + luma_green * g + luma_blue * b + 16384) >> 15;
  }
  // t / 255 for a product of two channels.
  static constexpr Wide fold(Wide t) { return (t + ((t + 128) >> 8) + 128) >> 8; }
};

template <>
struct Depth<ZR_Pixel16> {
  using Channel = u16;
  using Wide = i32;
  static constexpr i32 bits = 16;
  static constexpr u32 layer_flags = 0x1000001;
  static constexpr Wide white = 32768, half = 16384;

  // One less than half as rounding term: exactly one half goes down, and white * white is white.
  static constexpr Wide mul(Wide a, Wide b) { return wrap_add(wrap_mul(a, b), 16383) >> 15; }
  static constexpr Wide inv(Wide a) { return white - a; }
  // No rounding term: a signed product goes toward minus infinity.
  static constexpr Wide smul(Wide k, Wide x) { return wrap_mul(k, x) >> 15; }
  // n * 32768 / r rounded, white from n >= r on (so also for r = 0). Unsigned, so that operands made of
  // illegal channels, negative ones too, divide by nothing that is zero and overflow nothing.
  static constexpr Wide div(Wide n, Wide r) {
    const u32 top = static_cast<u32>(n), below = static_cast<u32>(r);
    return top >= below ? white : static_cast<Wide>((top * 32768u + (below >> 1)) / below);
  }
  static constexpr Wide luma(Wide r, Wide g, Wide b) {
    return static_cast<Wide>((static_cast<u32>(luma_red) * static_cast<u32>(r) +
                              static_cast<u32>(luma_green) * static_cast<u32>(g) +
                              static_cast<u32>(luma_blue) * static_cast<u32>(b) + 16384u) >>
                             15);
  }
};

template <>
struct Depth<ZR_PixelFloat> {
  using Channel = f32;
  using Wide = f32;
  static constexpr i32 bits = 32;
  static constexpr u32 layer_flags = 0x2000000;
  static constexpr Wide white = 1.0f, half = 0.5f;

  static constexpr Wide mul(Wide a, Wide b) { return a * b; }
  static constexpr Wide inv(Wide a) { return 1.0f - a; }
  static constexpr Wide smul(Wide k, Wide x) { return k * x; }
  // n / r; white where r is zero or denormal.
  static constexpr Wide div(Wide n, Wide r) { return is_zero_or_denormal(r) ? 1.0f : n / r; }
  static constexpr Wide luma(Wide r, Wide g, Wide b) { return 0.299f * r + 0.587f * g + 0.114f * b; }
};

template <class Pixel>
using Channel = typename Depth<Pixel>::Channel;
template <class Pixel>
using Wide = typename Depth<Pixel>::Wide;

static_assert(Depth<ZR_Pixel8>::mul(255, 255) == 255 && Depth<ZR_Pixel8>::mul(1, 127) == 0 &&
              Depth<ZR_Pixel8>::mul(1, 128) == 1);
static_assert(Depth<ZR_Pixel16>::mul(32768, 32768) == 32768);
static_assert(Depth<ZR_Pixel16>::mul(16384, 1) == 0, "exactly one half goes down");

// ------------------------------------------------------------------------------ between depths

// (v * 0x808080 + 33200) >> 16, in steps that fit 16 bits, so that vectors hold twice as many channels.
constexpr u16 widen_8_to_16(u8 v) { return static_cast<u16>((v << 7) + ((v + 1 + ((v + 2) >> 8)) >> 1)); }
// Undoes widen_8_to_16 for every byte. It is (v * 255 + 16384) >> 15, likewise.
constexpr u8 narrow_16_to_8(u16 v) { return static_cast<u8>((((v * 1020u) >> 16) + 1) >> 1); }
static_assert([] {
  for (u32 v = 0; v < 256; ++v)
    if (widen_8_to_16(static_cast<u8>(v)) != (v * 0x808080u + 33200u) >> 16) return false;
  return true;
}());
// `word` is the next word of the dither table; its low 15 bits replace the rounding term.
constexpr u8 narrow_16_to_8_dither(u16 v, u32 word) { return static_cast<u8>((v * 255u + (word & 0x7fffu)) >> 15); }
// Of worlds copied to worlds.
constexpr f32 widen_8_to_float(u8 v) { return static_cast<f32>(v) * 0.003921569f; }
// Of fill colours: the product is formed in double precision.
constexpr f32 widen_8_to_float_d(u8 v) { return static_cast<f32>(static_cast<f64>(v) * 0.00392156862745098); }
constexpr f32 widen_16_to_float(u16 v) { return static_cast<f32>(v) * 3.0517578e-5f; }  // exactly v / 32768
static_assert(0.003921569f == 1.0f / 255.0f && 3.0517578e-5f == 1.0f / 32768.0f);

// All bits set where the condition holds: choices made this way stay out of the way of vectorisation.
constexpr u32 mask_where(bool condition) { return 0u - static_cast<u32>(condition); }

// Float narrowed to an integer depth, the scalar rule: the channel times white and a half, both in single
// precision, truncated; 0 below `floor`, white above `ceiling`. NaN passes both tests and truncates to 0.
template <class Pixel>
constexpr Channel<Pixel> narrow_float(f32 c, f32 floor, f32 ceiling) {
  const f32 scaled = c * static_cast<f32>(Depth<Pixel>::white);
  const u32 truncated = static_cast<u32>(truncate_i32(scaled + 0.5f));
  const u32 below = mask_where(floor > scaled), above = mask_where(scaled > ceiling);
  return static_cast<Channel<Pixel>>((truncated & ~below & ~above) | (static_cast<u32>(Depth<Pixel>::white) & above));
}
// Colours are clamped. Alpha is not: out of range it wraps in the low 8 or 16 bits. Kept on purpose.
template <class Pixel>
inline constexpr f32 narrow_colour_limit[2] = {0.0f, static_cast<f32>(Depth<Pixel>::white)};
inline constexpr f32 narrow_alpha_limit[2] = {-std::numeric_limits<f32>::infinity(),
                                              std::numeric_limits<f32>::infinity()};
template <class Pixel>
constexpr Channel<Pixel> narrow_float_colour(f32 c) {
  return narrow_float<Pixel>(c, narrow_colour_limit<Pixel>[0], narrow_colour_limit<Pixel>[1]);
}
template <class Pixel>
constexpr Channel<Pixel> narrow_float_alpha(f32 a) {
  return narrow_float<Pixel>(a, narrow_alpha_limit[0], narrow_alpha_limit[1]);
}
// The vector rule, for aligned rows to 8 bits: nearest even, then clamped to 0..255, alpha alike. A
// product above 32 bits counts as the lowest integer, as the processor's conversion gives it: 0, like NaN.
constexpr u8 narrow_float_to_8_nearest(f32 c) {
  constexpr f32 white = static_cast<f32>(Depth<ZR_Pixel8>::white);
  const f32 scaled = c * white;
  const u32 snapped = std::bit_cast<u32>(scaled + 8388608.0f);  // 2^23: no room for a fraction, so adding rounds
  const u32 inside = mask_where(scaled > 0.0f) & mask_where(scaled < white);
  const u32 above = mask_where(scaled >= white) & mask_where(scaled < 2147483648.0f);
  return static_cast<u8>((snapped & inside) | above);
}
// What a dither word adds to a float before it is narrowed: [-1/512, +1/512]; the factor is 2^-40.
constexpr f32 dither_offset(u32 word) {
  return static_cast<f32>(word) * (std::bit_cast<f32>(0x2f800000u) * 0.00390625f) - 0.001953125f;
}

// A colour argument at another depth. Float to integer leaves alpha unclamped.
template <class To, class From>
constexpr To convert_colour(const From& c) {
  if constexpr (std::is_same_v<To, From>) {
    return c;
  } else if constexpr (std::is_same_v<From, ZR_PixelFloat>) {
    return {narrow_float_alpha<To>(c.alpha), narrow_float_colour<To>(c.red), narrow_float_colour<To>(c.green),
            narrow_float_colour<To>(c.blue)};
  } else {
    const auto one = [](auto v) {
      if constexpr (std::is_same_v<From, ZR_Pixel8> && std::is_same_v<To, ZR_Pixel16>)
        return widen_8_to_16(v);
      else if constexpr (std::is_same_v<From, ZR_Pixel8>)
        return widen_8_to_float_d(v);
      else if constexpr (std::is_same_v<To, ZR_Pixel8>)
        return narrow_16_to_8(v);
      else
        return widen_16_to_float(v);
    };
    return {one(c.alpha), one(c.red), one(c.green), one(c.blue)};
  }
}

// ------------------------------------------------------------------------------ against black

// Colour times alpha.
template <class Pixel>
constexpr Channel<Pixel> premultiply(Channel<Pixel> c, Channel<Pixel> a) {
  return static_cast<Channel<Pixel>>(Depth<Pixel>::mul(c, a));
}
// The same product as Depth::mul, kept to 16 bits, which it never leaves: rows of it vectorise twice as wide.
template <>
constexpr u8 premultiply<ZR_Pixel8>(u8 c, u8 a) {
  const u16 t = static_cast<u16>(c * a);
  const u16 carry = static_cast<u16>(static_cast<u16>(t + 128) >> 8);
  return static_cast<u8>(static_cast<u16>(t + carry + 128) >> 8);
}
// Colour over alpha: white where c >= a at the integer depths (so everywhere under alpha 0), white
// under a zero or denormal float alpha.
template <class Pixel>
inline Channel<Pixel> unmultiply(Channel<Pixel> c, Channel<Pixel> a) {
  return static_cast<Channel<Pixel>>(Depth<Pixel>::div(c, a));
}
// The same quotient as Depth::div, by a double: rows of it vectorise, and integer division does not. Exact,
// because the numerator fits 31 bits: what lies below an integer lies far more below it than a double rounds.
template <>
constexpr u16 unmultiply<ZR_Pixel16>(u16 c, u16 a) {
  constexpr i32 white = Depth<ZR_Pixel16>::white;
  const f64 quotient = static_cast<f64>(c * white + (a >> 1)) / static_cast<f64>(a + (a == 0));
  const u32 full = mask_where(c >= a);
  return static_cast<u16>((static_cast<u32>(static_cast<i32>(quotient)) & ~full) | (static_cast<u32>(white) & full));
}

}  // namespace zr
