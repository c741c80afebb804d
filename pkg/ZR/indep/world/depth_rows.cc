// Whole rows between the three depths. Plain loops over channels, in the shape that compilers vectorise, compiled
// once for each instruction set; floats are narrowed by lanes.
#include "world/depth_rows.h"

#include <ZR/depth.h>
#include <ZR/platform.h>

#include <algorithm>
#include <cstdint>
#include <type_traits>

#include "world/dither_state.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "world/depth_rows.cc"
#include <hwy/foreach_target.h>
#include <hwy/highway.h>

#include "simd/lane_depth-inl.h"
#include "simd/lane_stream-inl.h"

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

// The same over `count` channels with something drawn for each of them.
template <class To, class From, class Drawn, class Rule>
void each_drawn(i32 count, const From* src, const Drawn* drawn, To* dst, Rule rule) {
  const auto* __restrict in = reinterpret_cast<const Channel<From>*>(src);
  auto* __restrict out = reinterpret_cast<Channel<To>*>(dst);
  if (count == block_channels)  // a count that the compiler knows
    for (i32 k = 0; k < block_channels; ++k) out[k] = rule(in[k], drawn[k]);
  else
    for (i32 k = 0; k < count; ++k) out[k] = rule(in[k], drawn[k]);
}

// Calls convert(count, words, first pixel) with the words of block after block; a whole block may be read of any.
template <class Convert>
HWY_INLINE void each_dithered_block(i32 n, DitherRow& dither, Convert convert) {
  u32 words[block_channels] = {};
  for (i32 first = 0; first < n; first += block_channels / 4) {
    const i32 count = 4 * std::min(n - first, block_channels / 4);
    const auto drawn = static_cast<std::size_t>(count);
    if (count == block_channels)
      convert(count, dither.next(drawn, words), first);
    else
      dither.draw(drawn, words), convert(count, words, first);
  }
}

inline void narrow_16_dithered(i32 n, const ZR_Pixel16* src, ZR_Pixel8* dst, DitherRow& dither) {
  each_dithered_block(n, dither, [&](i32 count, const u32* words, i32 first) HWY_ATTR {
    each_drawn(count, src + first, words, dst + first, [](u16 v, u32 word) { return narrow_16_to_8_dither(v, word); });
  });
}

// The plain loops serve single numbers; the compiled baseline is what these run as.
#define ZR_NARROWS_BY_LANES (ZR_HAS_LANES && HWY_TARGET != HWY_STATIC_TARGET)
#if ZR_NARROWS_BY_LANES
// Channels by rule(vector of floats, index of the first), which gives integers; what does not fit the channel
// saturates.
template <class To, class Rule>
HWY_INLINE void narrow_lanes(i32 n, const ZR_PixelFloat* src, To* dst, Rule rule) {
  using C = Channel<To>;
  constexpr i32 vectors = 4, lanes = lane_count(), block = vectors * lanes;
  const auto one = [&](const f32* in, C* out, i32 first) HWY_ATTR {
    const hn::Rebind<C, Tag<i32>> narrow;
    for (i32 k = 0; k < vectors * lanes; k += lanes)
      hn::StoreU(hn::DemoteTo(narrow, rule(Floats(hn::LoadU(Tag<f32>(), in + k)), first + k).v), narrow, out + k);
  };
  const f32* const in = reinterpret_cast<const f32*>(src);
  C* const out = reinterpret_cast<C*>(dst);
  i32 i = 0;
  for (; i <= 4 * n - block; i += block) one(in + i, out + i, i);
  if (i >= 4 * n) return;
  const auto rest = static_cast<std::size_t>(4 * n - i);
  f32 last[block] = {};
  C made[block];
  std::memcpy(last, in + i, rest * sizeof(f32));
  one(last, made, i);
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
  narrow_lanes(n, src, dst, [=](Floats c, i32) HWY_ATTR {
    const Floats scaled = c * static_cast<f32>(Depth<To>::white);
    return masked(to_int(pick(is_alpha, scaled, clamped<To>(scaled)) + 0.5f), bits);
  });
}
template <class To>
void narrow_clamped(i32 n, const ZR_PixelFloat* src, To* dst) {
  narrow_lanes(n, src, dst, [](Floats c, i32) HWY_ATTR {
    return fitting_int(clamped<To>(c * static_cast<f32>(Depth<To>::white)) + 0.5f);
  });
}
inline void narrow_nearest(i32 n, const ZR_PixelFloat* src, ZR_Pixel8* dst) {
  narrow_lanes(n, src, dst, [](Floats c, i32) HWY_ATTR { return nearest_int(c * 255.0f); });
}

// What is added to whole pixels: words are drawn for alpha, red, blue, green.
HWY_INLINE Floats dither_offsets(const u32* drawn) {
  const Tag<u32> d;
  const Tag<u64> pairs;
  const auto words = hn::LoadU(d, drawn);
  const auto swapped = hn::BitCast(pairs, hn::Shuffle2301(words));
  const Ints ordered = hn::BitCast(Tag<i32>(), hn::OddEven(swapped, hn::BitCast(pairs, words)));
  // Both halves are exact, so that their sum is rounded once.
  const Floats high = to_float(Ints(hn::BitCast(Tag<i32>(), hn::ShiftRight<16>(hn::BitCast(d, ordered.v)))));
  const Floats word = high * 65536.0f + to_float(masked(ordered, 65535));
  return word * 0x1p-40f - 0x1p-9f;
}
inline void narrow_float_dithered(i32 n, const ZR_PixelFloat* src, ZR_Pixel8* dst, bool nearest, DitherRow& dither) {
  each_dithered_block(n, dither, [&](i32 count, const u32* words, i32 first) HWY_ATTR {
    const auto dithered = [=](Floats c, i32 at) HWY_ATTR { return (c + dither_offsets(words + at)) * 255.0f; };
    if (nearest)
      narrow_lanes(count / 4, src + first, dst + first,
                   [=](Floats c, i32 at) HWY_ATTR { return nearest_int(dithered(c, at)); });
    else
      narrow_lanes(count / 4, src + first, dst + first,
                   [=](Floats c, i32 at) HWY_ATTR { return fitting_int(clamped<ZR_Pixel8>(dithered(c, at)) + 0.5f); });
  });
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

inline void narrow_float_dithered(i32 n, const ZR_PixelFloat* src, ZR_Pixel8* dst, bool nearest, DitherRow& dither) {
  each_dithered_block(n, dither, [&](i32 count, const u32* words, i32 first) {
    f32 offsets[block_channels];
    for (i32 k = 0; k < count; k += 4) {  // drawn for alpha, red, blue, green
      offsets[k] = dither_offset(words[k]);
      offsets[k + 1] = dither_offset(words[k + 1]);
      offsets[k + 2] = dither_offset(words[k + 3]);
      offsets[k + 3] = dither_offset(words[k + 2]);
    }
    if (nearest)
      each_drawn(count, src + first, offsets, dst + first,
                 [](f32 c, f32 offset) { return narrow_float_to_8_nearest(c + offset); });
    else
      each_drawn(count, src + first, offsets, dst + first,
                 [](f32 c, f32 offset) { return narrow_float_colour<ZR_Pixel8>(c + offset); });
  });
}
#endif

inline bool takes_vector_rule(const ZR_PixelFloat* row) {
  return HB_G_CPU_DataP[2] != 0 && reinterpret_cast<std::uintptr_t>(row) % 16 == 0;
}

template <class To, class From>
void convert(i32 n, const From* src, To* dst, DitherRow* dither) {
  constexpr bool from8 = std::is_same_v<From, ZR_Pixel8>, from16 = std::is_same_v<From, ZR_Pixel16>;
  constexpr bool to8 = std::is_same_v<To, ZR_Pixel8>, to16 = std::is_same_v<To, ZR_Pixel16>;
  if constexpr (from8 && to16) {
    each_channel(n, src, dst, [](u8 v, i32) { return widen_8_to_16(v); });
  } else if constexpr (from8) {
    each_channel(n, src, dst, [](u8 v, i32) { return widen_8_to_float(v); });
  } else if constexpr (from16 && to8) {
    if (dither != nullptr)
      narrow_16_dithered(n, src, dst, *dither);
    else
      each_channel(n, src, dst, [](u16 v, i32) { return narrow_16_to_8(v); });
  } else if constexpr (from16) {
    each_channel(n, src, dst, [](u16 v, i32) { return widen_16_to_float(v); });
  } else if constexpr (to16) {
    narrow_scalar(n, src, dst);
  } else if (dither != nullptr) {
    narrow_float_dithered(n, src, dst, takes_vector_rule(src), *dither);  // by either rule alpha is clamped too
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

// Blocks are made in the nearest cache, and begin on lines of the destination.
template <class To, class From>
void convert_past_caches(i32 n, const From* src, To* dst) {
#if ZR_HAS_LANES
  constexpr std::size_t line = 64;
  constexpr i32 block = 128;
  const std::size_t ahead = (0 - reinterpret_cast<std::uintptr_t>(dst)) % line;
  if (ahead % sizeof(To) == 0) {
    const i32 first = std::min(n, static_cast<i32>(ahead / sizeof(To)));
    if (first > 0) convert(first, src, dst, nullptr);
    alignas(line) To made[block];
    for (i32 i = first; i < n; i += block) {
      const i32 count = std::min(n - i, block);
      convert(count, src + i, made, nullptr);
      stream_bytes(static_cast<std::size_t>(count) * sizeof(To), made, dst + i);
    }
    return;
  }
#endif
  convert(n, src, dst, nullptr);
}

template void convert_past_caches(i32, const ZR_Pixel8*, ZR_Pixel16*);
template void convert_past_caches(i32, const ZR_Pixel8*, ZR_PixelFloat*);
template void convert_past_caches(i32, const ZR_Pixel16*, ZR_Pixel8*);
template void convert_past_caches(i32, const ZR_Pixel16*, ZR_PixelFloat*);
template void convert_past_caches(i32, const ZR_PixelFloat*, ZR_Pixel8*);
template void convert_past_caches(i32, const ZR_PixelFloat*, ZR_Pixel16*);
template void convert(i32, const ZR_Pixel8*, ZR_Pixel16*, DitherRow*);
template void convert(i32, const ZR_Pixel8*, ZR_PixelFloat*, DitherRow*);
template void convert(i32, const ZR_Pixel16*, ZR_Pixel8*, DitherRow*);
template void convert(i32, const ZR_Pixel16*, ZR_PixelFloat*, DitherRow*);
template void convert(i32, const ZR_PixelFloat*, ZR_Pixel8*, DitherRow*);
template void convert(i32, const ZR_PixelFloat*, ZR_Pixel16*, DitherRow*);
template void narrow(i32, const ZR_PixelFloat*, ZR_Pixel8*);
template void narrow(i32, const ZR_PixelFloat*, ZR_Pixel16*);

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class To, class From>
void convert_row(i32 n, const From* src, To* dst, DitherRow* dither) {
  ZR_RETURN_BEST(convert(n, src, dst, dither));
  HWY_STATIC_DISPATCH(convert)(n, src, dst, dither);
}
template <class To, class From>
void convert_row(i32 n, const From* src, To* dst, bool dither) {
  if (!dither) return convert_row(n, src, dst, static_cast<DitherRow*>(nullptr));
  DitherRow words;
  convert_row(n, src, dst, &words);
}

template <class To, class From>
void stream_row(i32 n, const From* src, To* dst) {
  ZR_RETURN_BEST(convert_past_caches(n, src, dst));
  HWY_STATIC_DISPATCH(convert)(n, src, dst, nullptr);
}

void finish_streamed_rows() { hwy::FlushStream(); }

template <class To>
void narrow_row(i32 n, const ZR_PixelFloat* src, To* dst) {
  ZR_RETURN_BEST(narrow(n, src, dst));
  HWY_STATIC_DISPATCH(narrow)(n, src, dst);
}

template void narrow_row(i32, const ZR_PixelFloat*, ZR_Pixel8*);
template void narrow_row(i32, const ZR_PixelFloat*, ZR_Pixel16*);
template void stream_row(i32, const ZR_Pixel8*, ZR_Pixel16*);
template void stream_row(i32, const ZR_Pixel8*, ZR_PixelFloat*);
template void stream_row(i32, const ZR_Pixel16*, ZR_Pixel8*);
template void stream_row(i32, const ZR_Pixel16*, ZR_PixelFloat*);
template void stream_row(i32, const ZR_PixelFloat*, ZR_Pixel8*);
template void stream_row(i32, const ZR_PixelFloat*, ZR_Pixel16*);
template void convert_row(i32, const ZR_Pixel8*, ZR_Pixel16*, bool);
template void convert_row(i32, const ZR_Pixel8*, ZR_PixelFloat*, bool);
template void convert_row(i32, const ZR_Pixel16*, ZR_Pixel8*, bool);
template void convert_row(i32, const ZR_Pixel16*, ZR_PixelFloat*, bool);
template void convert_row(i32, const ZR_PixelFloat*, ZR_Pixel8*, bool);
template void convert_row(i32, const ZR_PixelFloat*, ZR_Pixel16*, bool);
template void convert_row(i32, const ZR_Pixel16*, ZR_Pixel8*, DitherRow*);
template void convert_row(i32, const ZR_PixelFloat*, ZR_Pixel8*, DitherRow*);

}  // namespace zr
#endif
