// Rows of premultiply and unmultiply against black.
#include "world/premul_rows.h"

#include <ZR/depth.h>

#include <cstring>

namespace zr {
namespace {

// Runs `rule(colour, alpha)` over the colours of a row. Blocks go through local memory: in place or not,
// the compiler then knows that nothing overlaps, and vectorises.
template <class T, class Rule>
i32 colour_row(i32 n, const T* src, T* dst, Rule rule) {
  constexpr i32 block = static_cast<i32>(64 / sizeof(T));
  const T* in = src != nullptr ? src : dst;
  const auto pixels = [&](i32 count, const T* from, T* to) {
    for (i32 i = 0; i < count; ++i) {
      const T p = from[i];
      to[i] = {p.alpha, rule(p.red, p.alpha), rule(p.green, p.alpha), rule(p.blue, p.alpha)};
    }
  };
  i32 i = 0;
  for (; i <= n - block; i += block) {
    T taken[block], made[block];
    std::memcpy(taken, in + i, sizeof taken);
    pixels(block, taken, made);
    std::memcpy(dst + i, made, sizeof made);
  }
  pixels(n - i, in + i, dst + i);
  return 0;
}

}  // namespace

template <class T>
i32 premul_row(i32 n, const T* src, T* dst) {
  return colour_row(n, src, dst, [](Channel<T> c, Channel<T> a) { return premultiply<T>(c, a); });
}

template <class T>
i32 unmul_row(i32 n, const T* src, T* dst) {
  return colour_row(n, src, dst, [](Channel<T> c, Channel<T> a) { return unmultiply<T>(c, a); });
}

template i32 premul_row(i32, const ZR_Pixel8*, ZR_Pixel8*);
template i32 premul_row(i32, const ZR_Pixel16*, ZR_Pixel16*);
template i32 premul_row(i32, const ZR_PixelFloat*, ZR_PixelFloat*);
template i32 unmul_row(i32, const ZR_Pixel8*, ZR_Pixel8*);
template i32 unmul_row(i32, const ZR_Pixel16*, ZR_Pixel16*);
template i32 unmul_row(i32, const ZR_PixelFloat*, ZR_PixelFloat*);

}  // namespace zr
