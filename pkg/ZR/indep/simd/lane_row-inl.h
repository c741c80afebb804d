// Rows in blocks of as many pixels as there are lanes.
#if defined(ZR_SIMD_LANE_ROW_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SIMD_LANE_ROW_INL_H
#undef ZR_SIMD_LANE_ROW_INL_H
#else
#define ZR_SIMD_LANE_ROW_INL_H
#endif

#include <functional>

#include "simd/lane_depth-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// Whether writing a row pixel by pixel changes what it reads later: then its order is part of the result.
template <class T>
HWY_INLINE bool runs_into(const T* read, const T* written, i32 n) {
  return std::less<>()(read, written) && std::less<>()(written, read + n);
}

// Calls block(src, mask, dst, count) for each vector of pixels, and for the rest of the row on copies with room for
// a vector, of which `count` are the row's. mask may be null.
template <class Pack, class T, class Block>
HWY_INLINE void each_block(i32 n, const T* src, const T* mask, T* dst, Block block) {
  constexpr i32 lanes = Pack::pixels;
  T rest[3][lanes] = {};
  for (i32 i = 0; i < n; i += lanes) {
    const i32 count = n - i < lanes ? n - i : lanes;
    const T *s = src + i, *m = mask != nullptr ? mask + i : nullptr;
    T* d = dst + i;
    if (count < lanes) {
      const auto bytes = static_cast<std::size_t>(count) * sizeof(T);
      s = static_cast<T*>(std::memcpy(rest[0], s, bytes));
      if (m != nullptr) m = static_cast<T*>(std::memcpy(rest[1], m, bytes));
      d = static_cast<T*>(std::memcpy(rest[2], d, bytes));
    }
    block(s, m, d, count);
    if (count < lanes) std::memcpy(dst + i, rest[2], static_cast<std::size_t>(count) * sizeof(T));
  }
}

// A row of pixels that change by themselves: change(pixel) by lanes, single(n, src, dst) where a channel is illegal
// or rows overlap. src null or equal to dst works in place; then `idle(pixel)` tells vectors that stay as they are.
template <class Pack, class T, class M, class Idle, class Change>
HWY_INLINE i32 change_row(i32 n, const T* src, T* dst, i32 (*single)(i32, const T*, T*), Idle idle, Change change) {
  const T* const in = src != nullptr ? src : dst;
  if (runs_into(in, dst, n)) return single(n, src, dst);
  each_block<Pack, T>(n, in, nullptr, dst, [&](const T* s, const T*, T* d, i32 count) HWY_ATTR {
    const Px<M> p = Pack::template load<M>(s);
    if (!legal(p))
      single(count, s, d);
    else if (in != dst || !idle(p))
      Pack::template store<M>(change(p), d);
  });
  return 0;
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
