// The value of a mask at one pixel, in exact integers.
#pragma once

#include <ZR/depth.h>
#include <ZR/zr.h>

#include <type_traits>

template <class T>
zr::Channel<T> mask_value(const T& p, u32 kind) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    const f32 value = (kind & 2) != 0 ? p.alpha * (0.299f * p.red + 0.587f * p.green + 0.114f * p.blue) : p.alpha;
    return (kind & 1) != 0 ? 1.0f - value : value;
  } else {
    const u64 luma = (p.red * u64{9798} + p.green * u64{19235} + p.blue * u64{3735} + 16384) / 32768;
    u64 value = p.alpha;
    if ((kind & 2) != 0) value = sizeof(T) == 4 ? (2 * value * luma + 255) / 510 : (value * luma + 16383) / 32768;
    const u64 white = sizeof(T) == 4 ? 255 : 32768;
    return static_cast<zr::Channel<T>>((kind & 1) != 0 ? white - value : value);
  }
}
