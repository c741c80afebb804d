// Single numbers in the words that formulas use for lanes.
#pragma once

#include <ZR/depth.h>

#include "simd/formulas.h"

ZR_BEGIN_FORMULAS

// The numbers that a depth computes with, and its channel arithmetic on them.
template <class T>
using Number = zr::Wide<T>;
template <class T>
struct Primitive : Depth<T> {
  // As it comes back from a channel: integers modulo its width.
  static constexpr Number<T> stored(Number<T> v) { return static_cast<Channel<T>>(v); }
};
template <>
struct Primitive<ZR_Pixel8> : Depth<ZR_Pixel8> {
  static constexpr i32 stored(i32 v) { return static_cast<u8>(v); }
  // Formulas work out both sides of a choice: a quotient that is not taken may be one of any numbers.
  static i32 div(i32 n, i32 r) { return ZRp_G_fcd_table[static_cast<u16>(r * 256 + n)]; }
};

constexpr i32 pick(bool condition, i32 a, i32 b) { return condition ? a : b; }
constexpr f32 pick(bool condition, f32 a, f32 b) { return condition ? a : b; }
constexpr f32 pick(bool condition, i32 a, f32 b) { return condition ? static_cast<f32>(a) : b; }
template <class F, class G>
[[gnu::always_inline]] constexpr auto choose(bool condition, F f, G g) {
  return condition ? f() : g();
}
template <class F, class G>
[[gnu::always_inline]] constexpr auto where_all(bool condition, F f, G g) {
  return condition ? f() : g();
}
template <int bits>
constexpr i32 shifted_right(i32 a) {
  return a >> bits;
}
template <int bits>
constexpr i32 shifted_left(i32 a) {
  return static_cast<i32>(static_cast<u32>(a) << bits);
}
constexpr i32 masked(i32 a, i32 bits) { return a & bits; }
constexpr i32 held(i32 v, i32 low, i32 high) { return v < low ? low : v > high ? high : v; }
constexpr i32 to_int(f32 v) { return truncate_i32(v); }
constexpr f32 to_float(i32 v) { return static_cast<f32>(v); }
constexpr f32 magnitude_of(f32 v) { return __builtin_fabsf(v); }
// a * b / c toward zero, c not 0; the product wraps.
constexpr i32 product_ratio(i32 a, i32 b, i32 c) { return wrap_mul(a, b) / c; }
template <class N>
constexpr N entry_of(const N* table, i32 index) {
  return table[index];
}
// An entry and the one behind it.
template <class N>
struct Entries {
  N first, next;
};
template <class N>
constexpr Entries<N> entries_of(const N* table, i32 index) {
  return {table[index], table[index + 1]};
}
// A condition on floats, for choices between integers.
constexpr bool of_ints(bool condition) { return condition; }

// A pixel of such numbers.
template <class M>
struct Px {
  typename M::Wide alpha, red, green, blue;
};
template <class M>
constexpr Px<M> pick(bool condition, const Px<M>& a, const Px<M>& b) {
  return condition ? a : b;
}
// Division by one number.
template <class M>
constexpr auto divisor_of(typename M::Wide r) {
  return [r](typename M::Wide n) { return M::div(n, r); };
}
// The colours of p over r, as they come back from channels.
template <class M>
constexpr Px<M> divided(const Px<M>& p, typename M::Wide r) {
  return {p.alpha, M::stored(M::div(p.red, r)), M::stored(M::div(p.green, r)), M::stored(M::div(p.blue, r))};
}

template <class M, class T>
constexpr Px<M> unpacked(const T& p) {
  return {p.alpha, p.red, p.green, p.blue};
}
// Channels take numbers modulo their width.
template <class T, class M>
constexpr T packed(const Px<M>& p) {
  using C = Channel<T>;
  return {static_cast<C>(p.alpha), static_cast<C>(p.red), static_cast<C>(p.green), static_cast<C>(p.blue)};
}

ZR_END_FORMULAS
