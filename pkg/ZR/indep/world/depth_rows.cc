// Whole rows between the three depths. Plain loops over channels, in the shape that compilers vectorise, compiled
// once for each instruction set; floats are narrowed by lanes.
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

#include "simd/lane_depth-inl.h"

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

// The plain loops serve single numbers; the compiled baseline is what these run as.
#define ZR_NARROWS_BY_LANES (ZR_HAS_LANES && HWY_TARGET != HWY_STATIC_TARGET)
#if ZR_NARROWS_BY_LANES
// Channels by rule(vector of floats), which gives integers; what does not fit the channel saturates.
template <class To, class Rule>
HWY_INLINE void narrow_lanes(i32 n, const ZR_PixelFloat* src, To* dst, Rule rule) {
  using C = Channel<To>;
  constexpr i32 vectors = 4, lanes = lane_count(), block = vectors * lanes;
  const auto one = [&](const f32* in, C* out) HWY_ATTR {
    const hn::Rebind<C, Tag<i32>> narrow;
    for (i32 k = 0; k < vectors; ++k)
      hn::StoreU(hn::DemoteTo(narrow, rule(Floats(hn::LoadU(Tag<f32>(), in + k * lanes))).v), narrow, out + k * lanes);
  };
  const f32* const in = reinterpret_cast<const f32*>(src);
  C* const out = reinterpret_cast<C*>(dst);
  i32 i = 0;
  for (; i <= 4 * n - block; i += block) one(in + i, out + i);
  if (i >= 4 * n) return;
  const auto rest = static_cast<std::size_t>(4 * n - i);
  f32 last[block] = {};
  C made[block];
  std::memcpy(last, in + i, rest * sizeof(f32));
  one(last, made);
  std::memcpy(out + i, made, rest * sizeof(C));
}

// Clamped, with NaN as 0.
template <class To>
HWY_INLINE Floats clamped(Floats scaled) {
  return pick(scaled > 0.0f, Floats(hn::Min(scaled.v, Floats(static_cast<f32>(Depth<To>::white)).v)), 0.0f);
}
// Nearest even; what does not fit, and NaN, gives the lowest number.
HWY_INLINE Ints nearest_int(Floats a) {
#if HWY_TARGET == HWY_AVX3
  return Ints::V{_mm512_cvtps_epi32(a.v.raw)};
#elif HWY_TARGET == HWY_AVX2
  return Ints::V{_mm256_cvtps_epi32(a.v.raw)};
#elif HWY_TARGET == HWY_SSE4
  return Ints::V{_mm_cvtps_epi32(a.v.raw)};
#else
  return pick(Bools<i32>{hn::RebindMask(Tag<i32>(), (a < 2147483648.0f).mask)}, Ints(hn::NearestInt(a.v)),
              std::numeric_limits<i32>::min());
#endif
}

template <class To>
void narrow_scalar(i32 n, const ZR_PixelFloat* src, To* dst) {
  constexpr i32 bits = static_cast<i32>(std::numeric_limits<Channel<To>>::max());
  const Bools<f32> is_alpha = {hn::RebindMask(Tag<f32>(), (masked(Ints(hn::Iota(Tag<i32>(), 0)), 3) == 0).mask)};
  narrow_lanes(n, src, dst, [=](Floats c) HWY_ATTR {
    const Floats scaled = c * static_cast<f32>(Depth<To>::white);
    return masked(to_int(pick(is_alpha, scaled, clamped<To>(scaled)) + 0.5f), bits);
  });
}
template <class To>
void narrow_clamped(i32 n, const ZR_PixelFloat* src, To* dst) {
  narrow_lanes(n, src, dst, [](Floats c) HWY_ATTR {
    return fitting_int(clamped<To>(c * static_cast<f32>(Depth<To>::white)) + 0.5f);
  });
}
inline void narrow_nearest(i32 n, const ZR_PixelFloat* src, ZR_Pixel8* dst) {
  narrow_lanes(n, src, dst, [](Floats c) HWY_ATTR { return nearest_int(c * 255.0f); });
}
#else
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

template <class To>
void narrow_clamped(i32 n, const ZR_PixelFloat* src, To* dst) {
  each_channel(n, src, dst, [](f32 c, i32) { return narrow_float_colour<To>(c); });
}
inline void narrow_nearest(i32 n, const ZR_PixelFloat* src, ZR_Pixel8* dst) {
  each_channel(n, src, dst, [](f32 c, i32) { return narrow_float_to_8_nearest(c); });
}
#endif

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
    narrow_nearest(n, src, dst);
  } else {
    narrow_scalar(n, src, dst);
  }
}

template <class To>
void narrow(i32 n, const ZR_PixelFloat* src, To* dst) {
  narrow_clamped(n, src, dst);
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
