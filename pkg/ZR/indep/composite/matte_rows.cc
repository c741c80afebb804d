// Rows premultiplied against a matte colour, and back, on lanes where the processor has them.
#include "composite/matte_rows.h"

#include <ZR/depth.h>

#include <algorithm>
#include <type_traits>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "composite/matte_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class T>
struct PixelMath : Primitive<T> {
  using Wide = Number<T>;
};

template <class T, bool forward>
HWY_INLINE Number<T> matted(Number<T> c, Number<T> a, Number<T> m) {
  using M = PixelMath<T>;
  if constexpr (forward) {
    return M::stored(m + M::smul(a, c - m));
  } else {
    const Number<T> over = c - M::mul(M::inv(a), m);
    if constexpr (std::is_same_v<T, ZR_PixelFloat>)
      return over / a;
    else
      return M::div(hn::Max(over.v, Number<T>(0).v), a);
  }
}

// The matte in the shape that pixels have in a vector.
template <class T>
HWY_INLINE Px<PixelMath<T>> spread(const T& matte) {
  constexpr i32 pixels = AlikePack<T>::pixels;
  T all[pixels];
  for (T& each : all) each = matte;
  return AlikePack<T>::template load<PixelMath<T>>(all);
}

template <class T, bool forward>
bool matte_row(i32 n, const T& matte, const T* src, T* dst) {
  using M = PixelMath<T>;
  using Pack = AlikePack<T>;
  const Px<M> m = spread(matte);
  if (!legal(m) || runs_into(src, dst, n)) return false;
  each_block<Pack>(n, src, static_cast<const T*>(nullptr), dst, [&](const T* s, const T*, T* d, i32 count) HWY_ATTR {
    const Px<M> p = Pack::template load<M>(s);
    if (!legal(p)) {
      single_matte_row<T, forward>(count, matte, s, d);
      return;
    }
    auto stays = p.alpha == M::white;
    if constexpr (!forward) stays = stays || p.alpha == 0;
    if (all(stays)) {
      if (src != dst) Pack::template store<M>(p, d);
      return;
    }
    const auto one = [&](Number<T> c, Number<T> against)
                         HWY_ATTR { return pick(stays, c, matted<T, forward>(c, p.alpha, against)); };
    Pack::template store<M>(Px<M>{p.alpha, one(p.red, m.red), one(p.green, m.green), one(p.blue, m.blue)}, d);
  });
  return true;
}

#define ZR_INSTANTIATE(T)                                        \
  template bool matte_row<T, true>(i32, const T&, const T*, T*); \
  template bool matte_row<T, false>(i32, const T&, const T*, T*);
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

template <class T, bool forward>
bool lane_matte_row(i32 n, const T& matte, const T* src, T* dst) {
  ZR_RETURN_BEST(template matte_row<T, forward>(n, matte, src, dst));
  return false;
}

// At 16 bits the product has no rounding term, unlike the plain form's.
template <class T>
Channel<T> onto_matte(Wide<T> c, Wide<T> a, Wide<T> m) {
  using D = Depth<T>;
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return m + D::smul(a, c - m);
  else
    return static_cast<Channel<T>>(wrap_add(m, D::smul(a, wrap_sub(c, m))));
}

// a is neither 0 nor white. Floats have no floor, and divide by a denormal alpha too.
template <class T>
Channel<T> off_matte(Wide<T> c, Wide<T> a, Wide<T> m) {
  using D = Depth<T>;
  const Wide<T> ground = D::mul(D::inv(a), m);
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return (c - ground) / a;
  else
    return static_cast<Channel<T>>(D::div(std::max(wrap_sub(c, ground), 0), a));
}

}  // namespace

template <class T, bool forward>
void single_matte_row(i32 n, const T& matte, const T* src, T* dst) {
  for (i32 i = 0; i < n; ++i) {
    const T p = src[i];
    const Channel<T> a = p.alpha;
    if (a == Depth<T>::white || (!forward && a == 0)) {
      dst[i] = p;
      continue;
    }
    const auto channel = [a](Channel<T> c, Channel<T> m) {
      return forward ? onto_matte<T>(c, a, m) : off_matte<T>(c, a, m);
    };
    dst[i] = {a, channel(p.red, matte.red), channel(p.green, matte.green), channel(p.blue, matte.blue)};
  }
}

template <class T, bool forward>
void matte_row(i32 n, const T& matte, const T* src, T* dst) {
  if (!lane_matte_row<T, forward>(n, matte, src, dst)) single_matte_row<T, forward>(n, matte, src, dst);
}

#define ZR_INSTANTIATE(T)                                        \
  template void matte_row<T, true>(i32, const T&, const T*, T*); \
  template void matte_row<T, false>(i32, const T&, const T*, T*);
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE

}  // namespace zr
#endif
