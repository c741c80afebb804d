// Rows in blocks of as many pixels as there are lanes.
#if defined(ZR_SIMD_LANE_ROW_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SIMD_LANE_ROW_INL_H
#undef ZR_SIMD_LANE_ROW_INL_H
#else
#define ZR_SIMD_LANE_ROW_INL_H
#endif

#include <hwy/cache_control.h>

#include <cstdint>
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

// Asks for what the same row holds a little later: processors read ahead by themselves, but not far enough for
// streams of deep pixels. Nothing is touched, so the address may lie outside of the row.
template <i32 count, class T>
HWY_INLINE void read_ahead(const T* p) {
  constexpr std::uintptr_t distance = 4096, line = 64, bytes = count * sizeof(T);
  if constexpr (sizeof(T) == sizeof(ZR_Pixel8)) return;
  for (std::uintptr_t i = 0; i < bytes; i += line)
    hwy::Prefetch(reinterpret_cast<const char*>(reinterpret_cast<std::uintptr_t>(p) + distance + i));
}

// Calls block(src, mask, dst, count) for each vector of pixels, and for the rest of the row on copies with room for
// a vector, of which `count` are the row's. mask may be null.
template <class Pack, class T, class Block>
HWY_INLINE void each_block(i32 n, const T* src, const T* mask, T* dst, Block block) {
  constexpr i32 lanes = Pack::pixels;
  T rest[3][lanes];
  const i32 left = n % lanes, whole = n - left;
  i32 end = whole, count = lanes;
  T* d = dst;
  for (bool last = false;; last = true) {  // the same loop twice, so that the block is compiled once
    for (i32 i = 0; i < end; i += lanes) {
      read_ahead<lanes>(src + i);
      if (mask != nullptr) read_ahead<lanes>(mask + i);
      read_ahead<lanes>(d + i);
      block(src + i, mask != nullptr ? mask + i : nullptr, d + i, count);
    }
    const auto bytes = static_cast<std::size_t>(left) * sizeof(T);
    if (last) std::memcpy(dst + whole, rest[2], bytes);
    if (last || left == 0) return;
    std::memset(rest, 0, sizeof rest);
    std::memcpy(rest[0], src + whole, bytes);
    if (mask != nullptr) mask = static_cast<T*>(std::memcpy(rest[1], mask + whole, bytes));
    std::memcpy(rest[2], dst + whole, bytes);
    src = rest[0], d = rest[2], end = lanes, count = left;
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
