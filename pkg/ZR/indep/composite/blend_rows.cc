// Rows mixed by a ratio, on lanes where the processor has them.
#include "composite/blend_rows.h"

#include <ZR/depth.h>

#include <type_traits>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "composite/blend_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "simd/lane_doubles-inl.h"
#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class T>
struct PixelMath : Primitive<T> {
  using Wide = Number<T>;
};

template <int bits>
HWY_INLINE Ints shifted_right_unsigned(Ints v) {
  const hn::Rebind<u32, Tag<i32>> unsigned_tag;
  return hn::BitCast(Tag<i32>(), hn::ShiftRight<bits>(hn::BitCast(unsigned_tag, v.v)));
}
// Of one ratio for both, rounded; the sum stays below 2^32.
HWY_INLINE Ints mixed(Ints first, Ints second, Ints part) {
  return shifted_right_unsigned<16>(shifted_left<16>(first) + (second - first) * part + ratio_one / 2);
}

// ------------------------------------------------------------------------------ by the weight of each alpha

// Quotients (c1 * a1 + c2 * a2 + t / 2) / t of weights a1, a2 and their sum t: one division for three colours.
template <class T>
class Quotients;

// The estimate is off by less than 1/1000; made that much smaller it is the quotient or one less.
template <>
class Quotients<ZR_Pixel8> {
 public:
  HWY_INLINE Quotients(Ints alpha1, Ints alpha2, i32 w1, i32 w2)
      : a1_(alpha1 * w1), a2_(alpha2 * w2), t_(a1_ + a2_), per_(1.0f / to_float(t_)) {}
  HWY_INLINE Ints operator()(Ints c1, Ints c2) const {
    const Ints half = shifted_right<1>(t_), sum = c1 * a1_ + c2 * a2_ + half;
    const Floats near = (to_float(c1) * to_float(a1_) + to_float(c2) * to_float(a2_) + to_float(half)) * per_;
    const Ints least = fitting_int(near - 0.001f);
    return pick(sum - least * t_ >= t_, least + 1, least);
  }
  HWY_INLINE Ints alpha() const { return shifted_right_unsigned<16>(t_ + ratio_one / 2); }

 private:
  Ints a1_, a2_, t_;
  Floats per_;
};

// Sums are exact in doubles. A quotient lies 2^-32 or more below the next integer, and its estimate is off by less
// than 2^-35: made 2^-34 greater it is on the right side.
template <>
class Quotients<ZR_Pixel16> {
 public:
  HWY_INLINE Quotients(Ints alpha1, Ints alpha2, i32 w1, i32 w2)
      : t_(alpha1 * w1 + alpha2 * w2),
        a1_(to_double(alpha1) * static_cast<f64>(w1)),
        a2_(to_double(alpha2) * static_cast<f64>(w2)),
        half_(to_double(shifted_right_unsigned<1>(t_))),
        per_(1.0 / (a1_ + a2_)) {}
  HWY_INLINE Ints operator()(Ints c1, Ints c2) const {
    return fitting_int((to_double(c1) * a1_ + to_double(c2) * a2_ + half_) * per_ + 0x1p-34);
  }
  HWY_INLINE Ints alpha() const { return shifted_right_unsigned<16>(t_ + ratio_one / 2); }

 private:
  Ints t_;  // modulo 2^32, which it does not reach
  Doubles a1_, a2_, half_, per_;
};

template <class T>
HWY_INLINE Px<PixelMath<T>> straight(const Px<PixelMath<T>>& p, const Px<PixelMath<T>>& q, i32 w1, i32 w2) {
  using M = PixelMath<T>;
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    const Ints a1 = to_int(p.alpha * static_cast<f32>(w1)), a2 = to_int(q.alpha * static_cast<f32>(w2));
    const Floats f1 = to_float(a1), f2 = to_float(a2), total = to_float(a1 + a2);
    const Bools<f32> none1 = {hn::RebindMask(Tag<f32>(), (a1 == 0).mask)},
                     none2 = {hn::RebindMask(Tag<f32>(), (a2 == 0).mask)};
    const auto colour = [&](Floats c1, Floats c2)
                            HWY_ATTR { return pick(none1, c2, pick(none2, c1, (c1 * f1 + c2 * f2) / total)); };
    return {of_ratio_one * total, colour(p.red, q.red), colour(p.green, q.green), colour(p.blue, q.blue)};
  } else {
    const Bools<i32> none1 = p.alpha == 0, none2 = q.alpha == 0;
    if (all(p.alpha == q.alpha)) {  // the alpha cancels out
      const auto colour = [&](Ints c1, Ints c2) HWY_ATTR { return pick(none1, c2, mixed(c1, c2, w2)); };
      return Px<M>{p.alpha, colour(p.red, q.red), colour(p.green, q.green), colour(p.blue, q.blue)};
    }
    const Quotients<T> quotient(p.alpha, q.alpha, w1, w2);
    const auto colour = [&](Ints c1, Ints c2) HWY_ATTR { return pick(none1, c2, pick(none2, c1, quotient(c1, c2))); };
    return Px<M>{quotient.alpha(), colour(p.red, q.red), colour(p.green, q.green), colour(p.blue, q.blue)};
  }
}

template <class T>
void straight_row(i32 n, const T* first, const T* second, i32 w1, i32 w2, T* dst) {
  using M = PixelMath<T>;
  using Pack = AlikePack<T>;
  each_block<Pack>(n, first, second, dst, [&](const T* s, const T* m, T* d, i32) HWY_ATTR {
    Pack::template store<M>(straight<T>(Pack::template load<M>(s), Pack::template load<M>(m), w1, w2), d);
  });
}

// ------------------------------------------------------------------------------ by the ratio alone

// Channels as they lie in memory.
template <class T>
void premul_row(i32 n, const T* first, const T* second, i32 w1, i32 w2, T* dst) {
  using C = Channel<T>;
  const hn::Rebind<C, Tag<i32>> d;
  constexpr i32 lanes = lane_count(), pixels = lanes / 4;
  each_block<Together>(n, first, second, dst, [&](const T* s, const T* m, T* to, i32) HWY_ATTR {
    static_assert(Together::pixels == pixels);
    const auto c1 = hn::LoadU(d, reinterpret_cast<const C*>(s)), c2 = hn::LoadU(d, reinterpret_cast<const C*>(m));
    C* const out = reinterpret_cast<C*>(to);
    if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
      const Floats sum = Floats(c1) * static_cast<f32>(w1) + Floats(c2) * static_cast<f32>(w2);
      hn::StoreU((sum * of_ratio_one).v, d, out);
    } else {
      const Ints made = mixed(hn::PromoteTo(Tag<i32>(), c1), hn::PromoteTo(Tag<i32>(), c2), w2);
      hn::StoreU(hn::DemoteTo(d, made.v), d, out);
    }
  });
}

template <class T, bool premul>
bool blend(i32 n, const T* first, const T* second, i32 w1, i32 w2, T* dst) {
  if (runs_into(first, dst, n) || runs_into(second, dst, n)) return false;
  premul ? premul_row(n, first, second, w1, w2, dst) : straight_row(n, first, second, w1, w2, dst);
  return true;
}

#define ZR_INSTANTIATE(T)                                              \
  template bool blend<T, true>(i32, const T*, const T*, i32, i32, T*); \
  template bool blend<T, false>(i32, const T*, const T*, i32, i32, T*);
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {
namespace {

template <class T, bool premul>
bool lane_blend(i32 n, const T* first, const T* second, i32 w1, i32 w2, T* dst) {
  ZR_RETURN_BEST(template blend<T, premul>(n, first, second, w1, w2, dst));
  return false;
}

// The integer in which alpha times ratio and sums with it are told. At 16 bits a product with a colour needs
// 64 bits; at 8 bits all sums stay below 2^32. Floats truncate their products to 32-bit integers.
template <class T>
using Weight = std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, i32,
                                  std::conditional_t<std::is_same_v<T, ZR_Pixel16>, u64, u32>>;

template <class T>
Weight<T> weigh(Channel<T> alpha, i32 ratio) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return truncate_i32(alpha * static_cast<f32>(ratio));
  else
    return static_cast<Weight<T>>(alpha) * static_cast<Weight<T>>(ratio);
}

// Two straight pixels; a colour that has no weight leaves the other as it is, the second where neither has.
template <class T>
struct Straight {
  static T mix(const T& first, const T& second, i32 w1, i32 w2) {
    const Weight<T> a1 = weigh<T>(first.alpha, w1), a2 = weigh<T>(second.alpha, w2);
    T out;
    if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
      // Two alphas far above white may wrap here.
      const f32 total = static_cast<f32>(wrap_add(a1, a2));
      const f32 f1 = static_cast<f32>(a1), f2 = static_cast<f32>(a2);
      const auto colour = [&](f32 c1, f32 c2) { return a1 == 0 ? c2 : a2 == 0 ? c1 : (c1 * f1 + c2 * f2) / total; };
      out = {of_ratio_one * total, colour(first.red, second.red), colour(first.green, second.green),
             colour(first.blue, second.blue)};
    } else {
      const Weight<T> total = a1 + a2;
      const auto colour = [&](Weight<T> c1, Weight<T> c2) {
        const Weight<T> c = a1 == 0 ? c2 : a2 == 0 ? c1 : (c1 * a1 + c2 * a2 + (total >> 1)) / total;
        return static_cast<Channel<T>>(c);
      };
      out = {static_cast<Channel<T>>((total + ratio_one / 2) >> 16), colour(first.red, second.red),
             colour(first.green, second.green), colour(first.blue, second.blue)};
    }
    return out;
  }
};

template <class T>
struct Premul {
  static T mix(const T& first, const T& second, i32 w1, i32 w2) {
    const auto channel = [&](Channel<T> c1, Channel<T> c2) -> Channel<T> {
      if constexpr (std::is_same_v<T, ZR_PixelFloat>)
        return (c1 * static_cast<f32>(w1) + c2 * static_cast<f32>(w2)) * of_ratio_one;
      else
        return static_cast<Channel<T>>((c1 * static_cast<u32>(w1) + c2 * static_cast<u32>(w2) + ratio_one / 2) >> 16);
    };
    return {channel(first.alpha, second.alpha), channel(first.red, second.red), channel(first.green, second.green),
            channel(first.blue, second.blue)};
  }
};

}  // namespace

template <class T, bool premul>
void blend_row(i32 n, const T* first, const T* second, i32 second_part, T* dst) {
  using Form = std::conditional_t<premul, Premul<T>, Straight<T>>;
  const i32 w1 = ratio_one - second_part, w2 = second_part;
  if (lane_blend<T, premul>(n, first, second, w1, w2, dst)) return;
  for (i32 i = 0; i < n; ++i) dst[i] = Form::mix(first[i], second[i], w1, w2);
}

#define ZR_INSTANTIATE(T)                                             \
  template void blend_row<T, true>(i32, const T*, const T*, i32, T*); \
  template void blend_row<T, false>(i32, const T*, const T*, i32, T*);
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE

}  // namespace zr
#endif
