// Channel values in files and in worlds: how each turns into the other.
//
// Integer files hold 0..255 or 0..65535, worlds 0..255, 0..32768 or floats. White meets white and the
// nearest value is taken, so that 0..32768 to a 16-bit file and back is the same value.
#pragma once

#include <ZR/depth.h>

namespace zr::tool {

// 0..32768 <-> 0..65535
constexpr u16 file16_from_world16(u16 v) {
  const u32 legal = v < 32768 ? v : 32768;
  return static_cast<u16>((legal * 65535u + 16384u) >> 15);
}
constexpr u16 world16_from_file16(u16 v) { return static_cast<u16>((v * 32768u + 32767u) / 65535u); }

// Of a float, clamped to 0..white, NaN to 0; a float world takes it as it is.
template <class Pixel>
constexpr Channel<Pixel> world_from_float(f32 v) {
  if constexpr (std::is_same_v<Pixel, ZR_PixelFloat>)
    return v;
  else
    return v == v ? narrow_float_colour<Pixel>(v) : Channel<Pixel>{0};
}

template <class Pixel>
constexpr Channel<Pixel> world_from_file(u8 v) {
  if constexpr (std::is_same_v<Pixel, ZR_Pixel8>)
    return v;
  else if constexpr (std::is_same_v<Pixel, ZR_Pixel16>)
    return widen_8_to_16(v);
  else
    return widen_8_to_float(v);
}
template <class Pixel>
constexpr Channel<Pixel> world_from_file(u16 v) {
  if constexpr (std::is_same_v<Pixel, ZR_Pixel8>)
    return static_cast<u8>((v * 255u + 32767u) / 65535u);
  else if constexpr (std::is_same_v<Pixel, ZR_Pixel16>)
    return world16_from_file16(v);
  else
    return static_cast<f32>(v) / 65535.0f;
}
template <class Pixel>
constexpr Channel<Pixel> world_from_file(f32 v) {
  return world_from_float<Pixel>(v);
}

constexpr f32 float_from_file(u8 v) { return static_cast<f32>(v) / 255.0f; }
constexpr f32 float_from_file(u16 v) { return static_cast<f32>(v) / 65535.0f; }
constexpr f32 float_from_file(f32 v) { return v; }

constexpr u8 file_from_world(u8 v) { return v; }
constexpr u16 file_from_world(u16 v) { return file16_from_world16(v); }
constexpr f32 file_from_world(f32 v) { return v; }

// Associated (premultiplied) colour to straight and back. Colour under alpha 0 has no straight form
// and is kept as it is on reading; on writing it becomes 0.
constexpr f32 straight_from_associated(f32 colour, f32 alpha) {
  return is_zero_or_denormal(alpha) ? colour : colour / alpha;
}
constexpr f32 associated_from_straight(f32 colour, f32 alpha) { return alpha == 0.0f ? 0.0f : colour * alpha; }

}  // namespace zr::tool
