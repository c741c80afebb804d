// Whole rows between the three depths. Plain loops over channels, in the shape that compilers vectorise; compiled
// once for each instruction set.
#include "world/depth_rows.h"

#include <ZR/depth.h>
#include <ZR/platform.h>

#include <cstdint>
#include <type_traits>

#include "world/dither_state.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "world/depth_rows.cc"
#include <hwy/foreach_target.h>
#include <hwy/highway.h>

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

constexpr i32 block_channels = 256;  // dither words drawn together

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

// The same with something drawn for every channel: draw(count, drawn) fills a block, or less at the end.
template <class Drawn, class To, class From, class Draw, class Rule>
void each_channel_with_drawn(i32 n, const From* src, To* dst, Draw draw, Rule rule) {
  const auto* __restrict in = reinterpret_cast<const Channel<From>*>(src);
  auto* __restrict out = reinterpret_cast<Channel<To>*>(dst);
  Drawn drawn[block_channels];
  i32 left = 4 * n;
  for (; left >= block_channels; left -= block_channels, in += block_channels, out += block_channels) {
    draw(block_channels, drawn);
    for (i32 k = 0; k < block_channels; ++k) out[k] = rule(in[k], drawn[k]);
  }
  draw(left, drawn);
  for (i32 k = 0; k < left; ++k) out[k] = rule(in[k], drawn[k]);
}

inline void narrow_16_dithered(i32 n, const ZR_Pixel16* src, ZR_Pixel8* dst) {
  DitherRow dither;
  const auto draw = [&](i32 count, u32* words) { dither.draw(static_cast<std::size_t>(count), words); };
  each_channel_with_drawn<u32>(n, src, dst, draw, [](u16 v, u32 word) { return narrow_16_to_8_dither(v, word); });
}

template <class Rule>
void narrow_float_dithered(i32 n, const ZR_PixelFloat* src, ZR_Pixel8* dst, Rule rule) {
  DitherRow dither;
  const auto draw = [&](i32 count, f32* offsets) {
    u32 words[block_channels];
    dither.draw(static_cast<std::size_t>(count), words);
    for (i32 k = 0; k < count; k += 4) {  // drawn for alpha, red, blue, green
      offsets[k] = dither_offset(words[k]);
      offsets[k + 1] = dither_offset(words[k + 1]);
      offsets[k + 2] = dither_offset(words[k + 3]);
      offsets[k + 3] = dither_offset(words[k + 2]);
    }
  };
  each_channel_with_drawn<f32>(n, src, dst, draw, [rule](f32 c, f32 offset) { return rule(c + offset); });
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

inline bool takes_vector_rule(const ZR_PixelFloat* row) {
  return HB_G_CPU_DataP[2] != 0 && reinterpret_cast<std::uintptr_t>(row) % 16 == 0;
}

template <class To, class From>
void convert(i32 n, const From* src, To* dst, bool dither) {
  constexpr bool from8 = std::is_same_v<From, ZR_Pixel8>, from16 = std::is_same_v<From, ZR_Pixel16>;
  constexpr bool to8 = std::is_same_v<To, ZR_Pixel8>, to16 = std::is_same_v<To, ZR_Pixel16>;
  if constexpr (from8 && to16) {
    each_channel(n, src, dst, [](u8 v, i32) { return widen_8_to_16(v); });
  } else if constexpr (from8) {
    each_channel(n, src, dst, [](u8 v, i32) { return widen_8_to_float(v); });
  } else if constexpr (from16 && to8) {
    if (dither)
      narrow_16_dithered(n, src, dst);
    else
      each_channel(n, src, dst, [](u16 v, i32) { return narrow_16_to_8(v); });
  } else if constexpr (from16) {
    each_channel(n, src, dst, [](u16 v, i32) { return widen_16_to_float(v); });
  } else if constexpr (to16) {
    narrow_scalar(n, src, dst);
  } else if (dither) {
    if (takes_vector_rule(src))
      narrow_float_dithered(n, src, dst, [](f32 c) { return narrow_float_to_8_nearest(c); });
    else  // with dither the scalar rule clamps alpha too
      narrow_float_dithered(n, src, dst, [](f32 c) { return narrow_float_colour<To>(c); });
  } else if (takes_vector_rule(src)) {
    each_channel(n, src, dst, [](f32 c, i32) { return narrow_float_to_8_nearest(c); });
  } else {
    narrow_scalar(n, src, dst);
  }
}

template <class To>
void narrow(i32 n, const ZR_PixelFloat* src, To* dst) {
  each_channel(n, src, dst, [](f32 c, i32) { return narrow_float_colour<To>(c); });
}

template void convert(i32, const ZR_Pixel8*, ZR_Pixel16*, bool);
template void convert(i32, const ZR_Pixel8*, ZR_PixelFloat*, bool);
template void convert(i32, const ZR_Pixel16*, ZR_Pixel8*, bool);
template void convert(i32, const ZR_Pixel16*, ZR_PixelFloat*, bool);
template void convert(i32, const ZR_PixelFloat*, ZR_Pixel8*, bool);
template void convert(i32, const ZR_PixelFloat*, ZR_Pixel16*, bool);
template void narrow(i32, const ZR_PixelFloat*, ZR_Pixel8*);
template void narrow(i32, const ZR_PixelFloat*, ZR_Pixel16*);

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class To, class From>
void convert_row(i32 n, const From* src, To* dst, bool dither) {
  ZR_RETURN_BEST(convert(n, src, dst, dither));
  HWY_STATIC_DISPATCH(convert)(n, src, dst, dither);
}

template <class To>
void narrow_row(i32 n, const ZR_PixelFloat* src, To* dst) {
  ZR_RETURN_BEST(narrow(n, src, dst));
  HWY_STATIC_DISPATCH(narrow)(n, src, dst);
}

template void narrow_row(i32, const ZR_PixelFloat*, ZR_Pixel8*);
template void narrow_row(i32, const ZR_PixelFloat*, ZR_Pixel16*);
template void convert_row(i32, const ZR_Pixel8*, ZR_Pixel16*, bool);
template void convert_row(i32, const ZR_Pixel8*, ZR_PixelFloat*, bool);
template void convert_row(i32, const ZR_Pixel16*, ZR_Pixel8*, bool);
template void convert_row(i32, const ZR_Pixel16*, ZR_PixelFloat*, bool);
template void convert_row(i32, const ZR_PixelFloat*, ZR_Pixel8*, bool);
template void convert_row(i32, const ZR_PixelFloat*, ZR_Pixel16*, bool);

}  // namespace zr
#endif
