// A pixel into linear light and back. 8-bit pixels are worked on at 16 bits there.
#pragma once

#include <ZR/depth.h>

#include "composite/raised.h"

namespace zr {

// The depth at which pixels are blended in linear light.
template <class T>
struct LinearDepth {
  using type = T;
};
template <>
struct LinearDepth<ZR_Pixel8> {
  using type = ZR_Pixel16;
};
template <class T>
using Linear = typename LinearDepth<T>::type;

// An alpha, opacity or mask value at the working depth.
template <class T>
constexpr Wide<Linear<T>> linear_amount(Wide<T> a) {
  if constexpr (std::is_same_v<T, ZR_Pixel8>)
    return widen_8_to_16(static_cast<u8>(a));
  else
    return a;
}

// 16-bit channels through the 8-bit-indexed table, between its entries. Illegal channels count as white.
inline u16 to_linear_16(u16 channel, const ZR_LinearBlendingTables& tables) {
  const i32 t = (channel < 32768 ? channel : 32768) * 255;
  const u16* const entry = tables.to_linear + (t >> 15);
  const i32 between = t & 0x7fff;
  if (between == 0) return entry[0];
  return static_cast<u16>(entry[0] + ((between * (entry[1] - entry[0]) + 16384) >> 15));
}
inline u16 from_linear_16(u16 channel, const ZR_LinearBlendingTables& tables) {
  const i32 v = channel < 32768 ? channel : 32768;
  const u16* const entry = tables.from_linear + (v >> 3);
  const i32 between = v & 7;
  if (between == 0) return entry[0];
  return static_cast<u16>(entry[0] + ((between * (entry[1] - entry[0]) + 4) >> 3));
}

inline ZR_Pixel16 to_linear(const ZR_Pixel8& p, const ZR_LinearBlendingTables& tables) {
  return {widen_8_to_16(p.alpha), tables.to_linear[p.red], tables.to_linear[p.green], tables.to_linear[p.blue]};
}
inline ZR_Pixel16 to_linear(const ZR_Pixel16& p, const ZR_LinearBlendingTables& tables) {
  return {p.alpha, to_linear_16(p.red, tables), to_linear_16(p.green, tables), to_linear_16(p.blue, tables)};
}
inline ZR_PixelFloat to_linear(const ZR_PixelFloat& p, const ZR_LinearBlendingTables& tables) {
  const f32 gamma = tables.to_linear_gamma;
  return {p.alpha, raised(p.red, gamma), raised(p.green, gamma), raised(p.blue, gamma)};
}

// Back to the depth named by T.
template <class T>
T from_linear(const Linear<T>& p, const ZR_LinearBlendingTables& tables) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    const f32 gamma = tables.from_linear_gamma;
    return {p.alpha, raised(p.red, gamma), raised(p.green, gamma), raised(p.blue, gamma)};
  } else {
    const ZR_Pixel16 back = {p.alpha, from_linear_16(p.red, tables), from_linear_16(p.green, tables),
                             from_linear_16(p.blue, tables)};
    return convert_colour<T>(back);
  }
}

}  // namespace zr
