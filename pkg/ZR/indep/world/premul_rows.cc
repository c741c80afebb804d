// Rows of premultiply and unmultiply against black.
#include "world/premul_rows.h"

#include <ZR/depth.h>

#include <bit>
#include <cstring>
#include <type_traits>

#include "world/lane_premul_rows.h"

namespace zr {
namespace {

// Long enough that what one loop of a block stores has left the store buffer before the next loop loads it in
// another width.
constexpr i32 block_pixels = 64;

// Runs `block(pixels in, pixels out)` over a row, and over a last part of a block. The pixels pass through
// local memory: in place or not, the compiler then knows that nothing overlaps, and vectorises.
template <class T, class Block>
i32 in_blocks(i32 n, const T* src, T* dst, Block block) {
  constexpr i32 pixels = block_pixels;
  const T* const in = src != nullptr ? src : dst;
  T taken[pixels], made[pixels];
  i32 i = 0;
  for (; i <= n - pixels; i += pixels) {
    std::memcpy(taken, in + i, sizeof taken);
    block(taken, made);
    std::memcpy(dst + i, made, sizeof made);
  }
  if (const std::size_t rest = static_cast<std::size_t>(n > i ? n - i : 0); rest != 0) {
    std::memset(taken, 0, sizeof taken);
    std::memcpy(taken, in + i, rest * sizeof(T));
    block(taken, made);
    std::memcpy(dst + i, made, rest * sizeof(T));
  }
  return 0;
}

// What the channels of a block are multiplied or divided by: white for alpha, else the pixel's alpha. Worked
// out in 32-bit words, of which alpha is the low part of a pixel's first.
template <class T>
void spread_alpha(const T* in, Channel<T>* factor) {
  constexpr u32 white = static_cast<u32>(Depth<T>::white);
  constexpr i32 words = sizeof(T) / sizeof(u32);
  u32 pixel[block_pixels * words], spread[block_pixels * words];
  std::memcpy(pixel, in, sizeof pixel);
  for (i32 i = 0; i < block_pixels; ++i) {
    if constexpr (words == 1) {
      const u32 alpha = pixel[i] & 0xffu;
      spread[i] = white | alpha << 8 | alpha << 16 | alpha << 24;
    } else {
      const u32 alpha = pixel[2 * i] & 0xffffu;
      spread[2 * i] = white | alpha << 16;
      spread[2 * i + 1] = alpha | alpha << 16;
    }
  }
  std::memcpy(factor, spread, sizeof spread);
}
static_assert(std::endian::native == std::endian::little);

// Every channel of a block of an integer depth by rule(channel, factor), in one flat loop. Alpha over white
// is alpha again, except for an illegal one: `keep_alpha` puts that back.
template <class T, bool keep_alpha, class Rule>
void by_channel(const T* in, T* out, Rule rule) {
  constexpr i32 channels = 4 * block_pixels;
  Channel<T> value[channels], factor[channels];
  spread_alpha(in, factor);
  std::memcpy(value, in, sizeof value);
  for (i32 k = 0; k < channels; ++k) value[k] = rule(value[k], factor[k]);
  if constexpr (keep_alpha)
    for (i32 k = 0; k < channels; k += 4) value[k] = in[k / 4].alpha;
  std::memcpy(out, value, sizeof value);
}

template <class T, class Rule>
void by_pixel(const T* in, T* out, Rule rule) {
  for (i32 i = 0; i < block_pixels; ++i) {
    const T p = in[i];
    out[i] = {p.alpha, rule(p.red, p.alpha), rule(p.green, p.alpha), rule(p.blue, p.alpha)};
  }
}

template <class T>
i32 single_premul(i32 n, const T* src, T* dst) {
  return in_blocks(n, src, dst, [](const T* in, T* out) {
    if constexpr (std::is_same_v<T, ZR_PixelFloat>)
      by_pixel(in, out, premultiply<T>);
    else
      by_channel<T, false>(in, out, premultiply<T>);
  });
}

template <class T>
i32 single_unmul(i32 n, const T* src, T* dst) {
  return in_blocks(n, src, dst, [](const T* in, T* out) {
    if constexpr (std::is_same_v<T, ZR_Pixel16>)
      by_channel<T, true>(in, out, unmultiply<T>);
    else
      by_pixel(in, out, unmultiply<T>);
  });
}

template <class T>
const PremulRows<T>& best_rows() {
  const PremulRows<T>* const lanes = lane_premul_rows<T>();
  return lanes != nullptr ? *lanes : single_premul_rows<T>();
}

}  // namespace

template <class T>
const PremulRows<T>& single_premul_rows() {
  static constexpr PremulRows<T> rows = {&single_premul<T>, &single_unmul<T>};
  return rows;
}
template const PremulRows<ZR_Pixel8>& single_premul_rows();
template const PremulRows<ZR_Pixel16>& single_premul_rows();
template const PremulRows<ZR_PixelFloat>& single_premul_rows();

template <class T>
i32 premul_row(i32 n, const T* src, T* dst) {
  return best_rows<T>().premul(n, src, dst);
}
template <class T>
i32 unmul_row(i32 n, const T* src, T* dst) {
  return best_rows<T>().unmul(n, src, dst);
}

template i32 premul_row(i32, const ZR_Pixel8*, ZR_Pixel8*);
template i32 premul_row(i32, const ZR_Pixel16*, ZR_Pixel16*);
template i32 premul_row(i32, const ZR_PixelFloat*, ZR_PixelFloat*);
template i32 unmul_row(i32, const ZR_Pixel8*, ZR_Pixel8*);
template i32 unmul_row(i32, const ZR_Pixel16*, ZR_Pixel16*);
template i32 unmul_row(i32, const ZR_PixelFloat*, ZR_PixelFloat*);

}  // namespace zr
