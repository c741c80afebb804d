// Rows of the mix through a mask, of lanes.
#if defined(ZR_COMPOSITE_LANE_MATTE_MIX_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_COMPOSITE_LANE_MATTE_MIX_INL_H
#undef ZR_COMPOSITE_LANE_MATTE_MIX_INL_H
#else
#define ZR_COMPOSITE_LANE_MATTE_MIX_INL_H
#endif

#include "composite/mode_kinds-inl.h"
#include "composite/mode_row.h"
#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// Source and destination by the products p and q of their alphas with the mask and its inverse, t their sum. What a
// sum of 0 gives is not taken.
template <class T>
struct MixMath;
template <>
struct MixMath<ZR_Pixel8> {
  // Floats hold the integers, and a quotient lies further below the next one than they round.
  static HWY_INLINE Ints mix_alpha(Ints t) { return fitting_int(to_float(t + 128) / 255.0f); }
  static HWY_INLINE Ints mix(Ints s, Ints p, Ints d, Ints q, Ints t) {
    return fitting_int(to_float(s * p + shifted_right<1>(t) + d * q) / to_float(t));
  }
};
template <>
struct MixMath<ZR_Pixel16> {
  static HWY_INLINE Ints mix_alpha(Ints t) { return shifted_right<15>(t + 16384); }
  // Doubles hold products of 45 bits, and a quotient lies further below the next integer than they round.
  static HWY_INLINE Ints mix(Ints s, Ints p, Ints d, Ints q, Ints t) {
    using Half = hn::Rebind<f64, hn::Half<Tag<i32>>>;
    const Half f;
    const hn::Rebind<i32, Half> i;
    const Ints round = shifted_right<1>(t);
    const auto quotient = [&](auto part) HWY_ATTR {
      const auto wide = [&](Ints v) HWY_ATTR { return hn::PromoteTo(f, part(v)); };
      const auto sum = hn::Add(hn::Add(hn::Mul(wide(s), wide(p)), wide(round)), hn::Mul(wide(d), wide(q)));
      return hn::DemoteTo(i, hn::Div(sum, wide(t)));
    };
    const auto lower = quotient([&](Ints v) HWY_ATTR { return hn::LowerHalf(i, v.v); });
    const auto upper = quotient([&](Ints v) HWY_ATTR { return hn::UpperHalf(i, v.v); });
    return hn::Combine(Tag<i32>(), upper, lower);
  }
};
template <>
struct MixMath<ZR_PixelFloat> {
  static HWY_INLINE Floats mix_alpha(Floats t) { return t; }
  static HWY_INLINE Floats mix(Floats s, Floats p, Floats d, Floats q, Floats t) {
    return Primitive<ZR_PixelFloat>::div(s * p + d * q, t);
  }
};

// False when a channel is illegal, and then nothing is written.
template <class T>
HWY_INLINE bool matte_mix(const T* src, const T* mask, T* dst) {
  using M = ModeMath<T>;
  using Pack = AlikePack<T>;
  using Wide = typename M::Wide;
  const Wide k = Pack::template load<M>(mask).alpha;
  const Px<M> s = Pack::template load<M>(src), d = Pack::template load<M>(dst);
  if (!legal_alpha<M>(k) || !legal(s) || !legal(d)) return false;
  if (all(k == 0)) return true;
  const Wide p = s.alpha * k, q = M::inv(k) * d.alpha, t = p + q;
  const auto mixed = [&](Wide from, Wide to) HWY_ATTR { return MixMath<T>::mix(from, p, to, q, t); };
  const Px<M> both = {MixMath<T>::mix_alpha(t), mixed(s.red, d.red), mixed(s.green, d.green), mixed(s.blue, d.blue)};
  Pack::template store<M>(pick(k == M::white, s, pick(k == 0 || t == 0, d, both)), dst);
  return true;
}

// Reads the mask in either variant.
template <class T>
i32 matte_mix_row(i32 n, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables, const T* src,
                  const T* mask, T* dst) {
  const auto single = single_rows<T, true>()[MatteMix::number - first_mode];
  if (mask == nullptr || runs_into(src, dst, n) || runs_into(mask, dst, n))
    return single(n, mode, tables, src, mask, dst);
  each_block<AlikePack<T>>(n, src, mask, dst, [&](const T* s, const T* m, T* d, i32 count) HWY_ATTR {
    if (!matte_mix(s, m, d)) single(count, mode, tables, s, m, d);
  });
  return 0;
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
