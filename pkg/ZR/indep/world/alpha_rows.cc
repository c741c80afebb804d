// Rows of which only the alpha is written, on lanes where the processor has them.
#include "world/alpha_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "world/alpha_rows.cc"
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

// Channels as they lie in memory: the alphas of a vector of whole pixels become made(the channels of src).
template <class T, class Made>
HWY_INLINE void each_alpha(i64 n, const T* src, T* out, Made made) {
  using C = Channel<T>;
  const Tag<C> d;
  constexpr i64 lanes = static_cast<i64>(HWY_LANES(C)), pixels = lanes / 4;
  C places[lanes] = {};
  for (i64 i = 0; i < lanes; i += 4) places[i] = 1;
  const auto is_alpha = hn::Eq(hn::LoadU(d, places), hn::Set(d, C{1}));
  const auto one = [&](const T* from, T* to) HWY_ATTR {
    const auto kept = hn::LoadU(d, reinterpret_cast<const C*>(to));
    const auto v = made(hn::LoadU(d, reinterpret_cast<const C*>(from)));
    hn::StoreU(hn::IfThenElse(is_alpha, v, kept), d, reinterpret_cast<C*>(to));
  };
  i64 i = 0;
  for (; i <= n - pixels; i += pixels) one(src + i, out + i);
  if (i >= n) return;
  const auto bytes = static_cast<std::size_t>(n - i) * sizeof(T);
  T in[pixels] = {}, rest[pixels] = {};
  std::memcpy(in, src + i, bytes);
  std::memcpy(rest, out + i, bytes);
  one(in, rest);
  std::memcpy(out + i, rest, bytes);
}

template <class T>
bool fill_alpha(T* row, i64 n, Channel<T> alpha) {
  const auto value = hn::Set(Tag<Channel<T>>(), alpha);
  each_alpha(n, row, row, [&](auto) HWY_ATTR { return value; });
  return true;
}

template <class T, bool inverted>
HWY_INLINE void luma_row(i64 n, const T* src, T* out) {
  using M = PixelMath<T>;
  each_block<Apart>(static_cast<i32>(n), src, static_cast<const T*>(nullptr), out,
                    [&](const T* s, const T*, T* d, i32 count) HWY_ATTR {
                      const Px<M> p = load<M>(s);
                      if (!legal(p)) {
                        single_mask_values<T>(inverted ? MaskValue::luma_inverted : MaskValue::luma, count, s, d);
                        return;
                      }
                      auto value = M::mul(p.alpha, M::luma(p.red, p.green, p.blue));
                      if constexpr (inverted) value = M::inv(value);
                      Px<M> cell = load<M>(d);
                      cell.alpha = value;
                      store<M>(cell, d);
                    });
}

template <class T>
bool mask_values(MaskValue value, i64 n, const T* src, T* out) {
  switch (value) {
    case MaskValue::alpha: each_alpha(n, src, out, [](auto v) HWY_ATTR { return v; }); break;
    case MaskValue::inverted: {
      const auto white = hn::Set(Tag<Channel<T>>(), static_cast<Channel<T>>(Depth<T>::white));
      each_alpha(n, src, out, [&](auto v) HWY_ATTR { return hn::Sub(white, v); });
      break;
    }
    case MaskValue::luma: luma_row<T, false>(n, src, out); break;
    case MaskValue::luma_inverted: luma_row<T, true>(n, src, out); break;
  }
  return true;
}

#define ZR_INSTANTIATE(T)                           \
  template bool fill_alpha<T>(T*, i64, Channel<T>); \
  template bool mask_values<T>(MaskValue, i64, const T*, T*);
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include <functional>

#include "simd/variant.h"

namespace zr {
namespace {

template <class T>
bool lane_fill_alpha(T* row, i64 n, Channel<T> alpha) {
  ZR_RETURN_BEST(fill_alpha(row, n, alpha));
  return false;
}
template <class T>
bool lane_mask_values(MaskValue value, i64 n, const T* src, T* out) {
  ZR_RETURN_BEST(mask_values(value, n, src, out));
  return false;
}

template <class T, bool luma, bool inverted>
void each_value(i64 n, const T* src, T* out) {
  using D = Depth<T>;
  for (i64 i = 0; i < n; ++i) {
    Wide<T> value = src[i].alpha;
    if constexpr (luma) value = D::mul(value, D::luma(src[i].red, src[i].green, src[i].blue));
    if constexpr (inverted) value = D::inv(value);
    out[i].alpha = static_cast<Channel<T>>(value);
  }
}

}  // namespace

template <class T>
void single_mask_values(MaskValue value, i64 n, const T* src, T* out) {
  switch (value) {
    case MaskValue::alpha: return each_value<T, false, false>(n, src, out);
    case MaskValue::inverted: return each_value<T, false, true>(n, src, out);
    case MaskValue::luma: return each_value<T, true, false>(n, src, out);
    case MaskValue::luma_inverted: return each_value<T, true, true>(n, src, out);
  }
}

template <class T>
void fill_alpha_row(T* row, i64 n, Channel<T> alpha) {
  if (lane_fill_alpha(row, n, alpha)) return;
  for (i64 i = 0; i < n; ++i) row[i].alpha = alpha;
}
template <class T>
void invert_alpha_row(T* row, i64 n) {
  mask_value_row(MaskValue::inverted, n, row, row);
}
template <class T>
void mask_value_row(MaskValue value, i64 n, const T* src, T* out) {
  // Cells that are written before they are read as pixels: their order is part of the result.
  const bool overlap = std::less<>()(src, out) && std::less<const T*>()(out, src + n);
  if (overlap || !lane_mask_values(value, n, src, out)) single_mask_values(value, n, src, out);
}

#define ZR_INSTANTIATE(T)                               \
  template void fill_alpha_row<T>(T*, i64, Channel<T>); \
  template void invert_alpha_row<T>(T*, i64);           \
  template void mask_value_row<T>(MaskValue, i64, const T*, T*);
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE

}  // namespace zr
#endif
