// HLS, YIQ and measures of single pixels: one body for three depths. All of it is single precision, without
// contraction, except where a result is rounded.
#include <ZR/pixel_measures.h>

#include <GX/gx.h>
#include <ZR/depth.h>

#include <algorithm>
#include <type_traits>

namespace zr {
namespace {

template <class T>
constexpr bool is_float = std::is_same_v<T, ZR_PixelFloat>;

struct Colour {
  f32 red, green, blue;
  f32 most() const { return std::max(red, std::max(green, blue)); }
  f32 least() const { return std::min(red, std::min(green, blue)); }
};

// Channels in 0..1.
template <class T>
Colour unit_colour(const T& p) {
  const auto one = [](auto c) {
    if constexpr (std::is_same_v<T, ZR_Pixel8>)
      return widen_8_to_float(c);
    else if constexpr (std::is_same_v<T, ZR_Pixel16>)
      return widen_16_to_float(c);
    else
      return c;
  };
  return {one(p.red), one(p.green), one(p.blue)};
}

// Rounded away from zero where it lies half way; the sum is taken in double precision.
i32 to_fixed(f32 v) {
  const f64 scaled = static_cast<f64>(v) * 65536.0;
  return truncate_i32(scaled + (v < 0 ? -0.5 : 0.5));
}
constexpr f32 from_fixed = 1.5258789e-5f;
static_assert(from_fixed == 1.0f / 65536.0f);

// 0 to just below 360; the least and the most are given, and differ.
f32 hue_degrees(const Colour& c, f32 most, f32 least) {
  const f32 range = most - least;
  f32 sixths;
  if (c.red == most)
    sixths = (c.green - c.blue) / range;
  else if (c.green == most)
    sixths = (c.blue - c.red) / range + 2.0f;
  else
    sixths = (c.red - c.green) / range + 4.0f;
  const f32 degrees = sixths * 60.0f;
  return degrees < 0 ? degrees + 360.0f : degrees;
}

// ------------------------------------------------------------------------------ HLS

template <class T>
void rgb_to_hls(const T& p, i32 hls[3]) {
  const Colour c = unit_colour(p);
  const f32 most = c.most(), least = c.least(), light = 0.5f * (most + least);
  f32 hue = 0, saturation = 0;
  if (most != least) {
    saturation = light <= 0.5f ? (most - least) / (most + least) : (most - least) / (2.0f - most - least);
    hue = hue_degrees(c, most, least);
  }
  hls[0] = to_fixed(hue);
  hls[1] = to_fixed(light);
  hls[2] = to_fixed(saturation);
}

f32 hls_value(f32 low, f32 high, f32 degrees) {
  if (degrees > 360.0f)
    degrees -= 360.0f;
  else if (degrees < 0)
    degrees += 360.0f;
  if (degrees < 60.0f) return low + (high - low) * degrees / 60.0f;
  if (degrees < 180.0f) return high;
  if (degrees < 240.0f) return low + (high - low) * (240.0f - degrees) / 60.0f;
  return low;
}

template <class T>
void hls_to_rgb(const i32 hls[3], T& out) {
  const f32 light = static_cast<f32>(hls[1]) * from_fixed, saturation = static_cast<f32>(hls[2]) * from_fixed;
  const f32 high = hls[1] > 32768 ? light + saturation - light * saturation : light * (1.0f + saturation);
  const f32 low = 2.0f * light - high;
  Colour c = {light, light, light};
  if (hls[2] != 0) {
    const f32 hue = static_cast<f32>(hls[0]) * from_fixed;
    c = {hls_value(low, high, hue + 120.0f), hls_value(low, high, hue), hls_value(low, high, hue - 120.0f)};
  }
  const auto stored = [](f32 v) {
    if constexpr (is_float<T>)
      return v;
    else
      return static_cast<Channel<T>>(GX_RoundDouble(static_cast<f64>(v) * Depth<T>::white));
  };
  out.red = stored(c.red);
  out.green = stored(c.green);
  out.blue = stored(c.blue);
}

// ------------------------------------------------------------------------------ YIQ

template <class T>
void rgb_to_yiq(const T& p, i32 yiq[3]) {
  constexpr f32 weights[3][3] = {
      {0.2989f, 0.5866f, 0.1144f}, {0.5959f, -0.2741f, -0.3218f}, {0.2113f, -0.5227f, 0.3113f}};
  const Colour c = unit_colour(p);
  for (i32 i = 0; i < 3; ++i)
    yiq[i] = wrap_add(wrap_add(to_fixed(c.red * weights[i][0]), to_fixed(c.green * weights[i][1])),
                      to_fixed(c.blue * weights[i][2]));
}

template <class T>
void yiq_to_rgb(const i32 yiq[3], T& out) {
  static constexpr f32 white = static_cast<f32>(Depth<T>::white), scale = white / 65536.0f;
  const f32 y = static_cast<f32>(yiq[0]) * scale, i = static_cast<f32>(yiq[1]) * scale,
            q = static_cast<f32>(yiq[2]) * scale;
  const auto stored = [](f32 v) {
    if constexpr (is_float<T>)
      return v;
    else
      return static_cast<Channel<T>>(truncate_i32(std::clamp(v, 0.0f, white) + 0.5f));
  };
  out.red = stored(y + 0.9562f * i + 0.621f * q);
  out.green = stored(y - 0.2717f * i - 0.6485f * q);
  out.blue = stored(y - 1.1053f * i + 1.702f * q);
}

// ------------------------------------------------------------------------------ measures

template <class T>
using Measure = std::conditional_t<is_float<T>, f32, i32>;

template <class T>
struct Range {
  Measure<T> most, least;
  explicit Range(const T& p)
      : most(std::max(p.red, std::max(p.green, p.blue))), least(std::min(p.red, std::min(p.green, p.blue))) {}
};

template <class T>
void luminance(const T& p, Measure<T>& out) {
  if constexpr (is_float<T>)
    out = Depth<T>::luma(p.red, p.green, p.blue);
  else
    out = 30 * p.red + 59 * p.green + 11 * p.blue;
}

template <class T>
void hue(const T& p, Measure<T>& out) {
  const Colour c = unit_colour(p);
  const f32 most = c.most(), least = c.least(), degrees = most == least ? 0 : hue_degrees(c, most, least);
  if constexpr (is_float<T>)
    out = degrees / 360.0f;
  else
    out = GX_RoundDouble(static_cast<f64>(degrees) * 255.0 / 360.0) & 255;
}

template <class T>
void lightness(const T& p, Measure<T>& out) {
  const Range<T> range(p);
  if constexpr (is_float<T>)
    out = 0.5f * (range.most + range.least);
  else
    out = (range.most + range.least) >> 1;
}

template <class T>
void saturation(const T& p, Measure<T>& out) {
  constexpr Measure<T> white = Depth<T>::white, half = Depth<T>::half;
  const auto [most, least] = Range<T>(p);
  if constexpr (is_float<T>) {
    out = (0.5f * (most + least) < half ? most + least : 2.0f * white - least - most) * (most - least);
  } else {
    const i32 room = ((most + least) >> 1) < half ? most + least : 2 * white - least - most;
    out = (most - least) * room / white;
    if constexpr (std::is_same_v<T, ZR_Pixel8>) out &= 255;
  }
}

// ------------------------------------------------------------------------------ at the border

template <class In, class Out>
i32 measured(void (*body)(const In&, Out&), const In* in, Out* out) {
  if (in != nullptr && out != nullptr) body(*in, *out);
  return ZR_Err_None;
}
template <class T>
i32 into_words(void (*body)(const T&, i32[3]), const T* in, i32* words) {
  if (in != nullptr && words != nullptr) body(*in, words);
  return ZR_Err_None;
}
template <class T>
i32 from_words(void (*body)(const i32[3], T&), const i32* words, T* out) {
  if (words != nullptr && out != nullptr) body(words, *out);
  return ZR_Err_None;
}

// The colours of a premultiplied pixel, straight.
const ZR_Pixel8* straight(const ZR_Pixel8* in, ZR_Pixel8* kept) {
  if (in == nullptr) return nullptr;
  const auto one = [in](u8 c) { return unmultiply<ZR_Pixel8>(c, in->alpha); };
  *kept = {in->alpha, one(in->red), one(in->green), one(in->blue)};
  return kept;
}
// Multiplied by the alpha that the caller left in the pixel.
i32 premultiplied(ZR_Pixel8* out) {
  if (out == nullptr) return ZR_Err_None;
  const auto one = [out](u8 c) { return premultiply<ZR_Pixel8>(c, out->alpha); };
  *out = {out->alpha, one(out->red), one(out->green), one(out->blue)};
  return ZR_Err_None;
}

}  // namespace
}  // namespace zr

extern "C" {

i32 ZR_RGBtoHLS_Straight(void*, const ZR_Pixel8* in, i32 hls[3]) { return zr::into_words(zr::rgb_to_hls, in, hls); }
i32 ZR_RGBtoHLS_Straight16(void*, const ZR_Pixel16* in, i32 hls[3]) { return zr::into_words(zr::rgb_to_hls, in, hls); }
i32 ZR_RGBtoHLS_StraightFloat(void*, const ZR_PixelFloat* in, i32 hls[3]) {
  return zr::into_words(zr::rgb_to_hls, in, hls);
}
i32 ZR_RGBtoHLS_Premul(void* ref, const ZR_Pixel8* in, i32 hls[3]) {
  ZR_Pixel8 kept;
  return ZR_RGBtoHLS_Straight(ref, zr::straight(in, &kept), hls);
}

i32 ZR_HLStoRGB_Straight(void*, const i32 hls[3], ZR_Pixel8* out) { return zr::from_words(zr::hls_to_rgb, hls, out); }
i32 ZR_HLStoRGB_Straight16(void*, const i32 hls[3], ZR_Pixel16* out) {
  return zr::from_words(zr::hls_to_rgb, hls, out);
}
i32 ZR_HLStoRGB_StraightFloat(void*, const i32 hls[3], ZR_PixelFloat* out) {
  return zr::from_words(zr::hls_to_rgb, hls, out);
}
i32 ZR_HLStoRGB_Premul(void* ref, const i32 hls[3], ZR_Pixel8* out) {
  if (hls == nullptr) return ZR_Err_None;
  ZR_HLStoRGB_Straight(ref, hls, out);
  return zr::premultiplied(out);
}

i32 ZR_RGBtoYIQ_Straight(void*, const ZR_Pixel8* in, i32 yiq[3]) { return zr::into_words(zr::rgb_to_yiq, in, yiq); }
i32 ZR_RGBtoYIQ_Straight16(void*, const ZR_Pixel16* in, i32 yiq[3]) { return zr::into_words(zr::rgb_to_yiq, in, yiq); }
i32 ZR_RGBtoYIQ_StraightFloat(void*, const ZR_PixelFloat* in, i32 yiq[3]) {
  return zr::into_words(zr::rgb_to_yiq, in, yiq);
}
i32 ZR_RGBtoYIQ_Premul(void* ref, const ZR_Pixel8* in, i32 yiq[3]) {
  ZR_Pixel8 kept;
  return ZR_RGBtoYIQ_Straight(ref, zr::straight(in, &kept), yiq);
}

i32 ZR_YIQtoRGB_Straight(void*, const i32 yiq[3], ZR_Pixel8* out) { return zr::from_words(zr::yiq_to_rgb, yiq, out); }
i32 ZR_YIQtoRGB_Straight16(void*, const i32 yiq[3], ZR_Pixel16* out) {
  return zr::from_words(zr::yiq_to_rgb, yiq, out);
}
i32 ZR_YIQtoRGB_StraightFloat(void*, const i32 yiq[3], ZR_PixelFloat* out) {
  return zr::from_words(zr::yiq_to_rgb, yiq, out);
}
i32 ZR_YIQtoRGB_Premul(void* ref, const i32 yiq[3], ZR_Pixel8* out) {
  if (yiq == nullptr) return ZR_Err_None;
  ZR_YIQtoRGB_Straight(ref, yiq, out);
  return zr::premultiplied(out);
}

// The four measures, in the four forms each.
#define ZR_MEASURE(Name, body)                                                                                        \
  i32 ZR_##Name##_Straight(void*, const ZR_Pixel8* in, i32* out) { return zr::measured(zr::body, in, out); }          \
  i32 ZR_##Name##_Straight16(void*, const ZR_Pixel16* in, i32* out) { return zr::measured(zr::body, in, out); }       \
  i32 ZR_##Name##_StraightFloat(void*, const ZR_PixelFloat* in, f32* out) { return zr::measured(zr::body, in, out); } \
  i32 ZR_##Name##_Premul(void* ref, const ZR_Pixel8* in, i32* out) {                                                  \
    ZR_Pixel8 kept;                                                                                                   \
    return ZR_##Name##_Straight(ref, zr::straight(in, &kept), out);                                                   \
  }
ZR_MEASURE(Luminance, luminance)
ZR_MEASURE(Hue, hue)
ZR_MEASURE(Lightness, lightness)
ZR_MEASURE(Saturation, saturation)
#undef ZR_MEASURE

}  // extern "C"
