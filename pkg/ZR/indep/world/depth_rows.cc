// Whole rows between the three depths. Plain loops over channels, in the shape that compilers vectorise.
#include "world/depth_rows.h"

#include <ZR/depth.h>
#include <ZR/platform.h>

#include <algorithm>
#include <cstdint>
#include <type_traits>
#include <utility>

#include "world/dither_state.h"

namespace zr {
namespace {

constexpr i32 block_pixels = 16;  // pixels that are converted together
constexpr i32 block_channels = 4 * block_pixels;

// Runs rule(channel value, index of the channel in its pixel) over n pixels.
template <class To, class From, class Rule>
void each_channel(i32 n, const From* src, To* dst, Rule rule) {
  const auto* __restrict in = reinterpret_cast<const Channel<From>*>(src);
  auto* __restrict out = reinterpret_cast<Channel<To>*>(dst);
  i32 left = n;
  for (; left >= 4; left -= 4, in += 16, out += 16)  // a count that the compiler knows: no index to reduce
    for (i32 k = 0; k < 16; ++k) out[k] = rule(in[k], k);
  for (i32 k = 0; k < 4 * left; ++k) out[k] = rule(in[k], k);
}

// The same with a dither word for every channel, in the order in which the words are drawn.
template <class To, class From, class Rule>
void each_channel_with_words(i32 n, const From* src, To* dst, Rule rule) {
  DitherRow dither;
  const auto* __restrict in = reinterpret_cast<const Channel<From>*>(src);
  auto* __restrict out = reinterpret_cast<Channel<To>*>(dst);
  for (i32 left = n; left > 0; left -= block_pixels, in += block_channels, out += block_channels) {
    const i32 channels = 4 * std::min(left, block_pixels);
    u32 words[block_channels];
    dither.draw(static_cast<std::size_t>(channels), words);
    if constexpr (std::is_same_v<From, ZR_PixelFloat>)  // drawn for alpha, red, blue, green
      for (i32 k = 0; k < channels; k += 4) std::swap(words[k + 2], words[k + 3]);
    if (channels == block_channels)
      for (i32 k = 0; k < block_channels; ++k) out[k] = rule(in[k], words[k]);
    else
      for (i32 k = 0; k < channels; ++k) out[k] = rule(in[k], words[k]);
  }
}

template <class To>
void narrow_scalar(i32 n, const ZR_PixelFloat* src, To* dst) {
  // Limits by the channel's place, alpha first, so that alpha and colours run through one expression.
  f32 floor[16], ceiling[16];
  for (i32 k = 0; k < 16; ++k) {
    const f32* limit = k % 4 == 0 ? narrow_alpha_limit : narrow_colour_limit<To>;
    floor[k] = limit[0];
    ceiling[k] = limit[1];
  }
  each_channel(n, src, dst, [&](f32 c, i32 k) { return narrow_float<To>(c, floor[k], ceiling[k]); });
}

bool takes_vector_rule(const ZR_PixelFloat* row) {
  return HB_G_CPU_DataP[2] != 0 && reinterpret_cast<std::uintptr_t>(row) % 16 == 0;
}

}  // namespace

template <class To, class From>
void convert_row(i32 n, const From* src, To* dst, bool dither) {
  constexpr bool from8 = std::is_same_v<From, ZR_Pixel8>, from16 = std::is_same_v<From, ZR_Pixel16>;
  constexpr bool to8 = std::is_same_v<To, ZR_Pixel8>, to16 = std::is_same_v<To, ZR_Pixel16>;
  if constexpr (from8 && to16) {
    each_channel(n, src, dst, [](u8 v, i32) { return widen_8_to_16(v); });
  } else if constexpr (from8) {
    each_channel(n, src, dst, [](u8 v, i32) { return widen_8_to_float(v); });
  } else if constexpr (from16 && to8) {
    if (dither)
      each_channel_with_words(n, src, dst, [](u16 v, u32 word) { return narrow_16_to_8_dither(v, word); });
    else
      each_channel(n, src, dst, [](u16 v, i32) { return narrow_16_to_8(v); });
  } else if constexpr (from16) {
    each_channel(n, src, dst, [](u16 v, i32) { return widen_16_to_float(v); });
  } else if constexpr (to16) {
    narrow_scalar(n, src, dst);
  } else if (dither) {
    if (takes_vector_rule(src))
      each_channel_with_words(n, src, dst,
                              [](f32 c, u32 word) { return narrow_float_to_8_nearest(c + dither_offset(word)); });
    else  // with dither the scalar rule clamps alpha too
      each_channel_with_words(n, src, dst,
                              [](f32 c, u32 word) { return narrow_float_colour<To>(c + dither_offset(word)); });
  } else if (takes_vector_rule(src)) {
    each_channel(n, src, dst, [](f32 c, i32) { return narrow_float_to_8_nearest(c); });
  } else {
    narrow_scalar(n, src, dst);
  }
}

template void convert_row(i32, const ZR_Pixel8*, ZR_Pixel16*, bool);
template void convert_row(i32, const ZR_Pixel8*, ZR_PixelFloat*, bool);
template void convert_row(i32, const ZR_Pixel16*, ZR_Pixel8*, bool);
template void convert_row(i32, const ZR_Pixel16*, ZR_PixelFloat*, bool);
template void convert_row(i32, const ZR_PixelFloat*, ZR_Pixel8*, bool);
template void convert_row(i32, const ZR_PixelFloat*, ZR_Pixel16*, bool);

}  // namespace zr
