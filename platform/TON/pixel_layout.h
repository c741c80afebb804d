// Pixel layouts of worlds, as the engine tells them apart.
#pragma once

#include <ZR/depth.h>
#include <ZR/prisma.h>

namespace zr::prisma {

enum class Layout { rgb8, rgb16, rgb_float, cmyk8, cmyk16 };
inline constexpr int layout_count = 5;

struct LayoutInfo {
  u32 code;
  u32 pixel_bytes;
  bool cmyk;
};
inline constexpr LayoutInfo layouts[layout_count] = {{PRISMA_Layout_RGB8, 4, false},
                                                     {PRISMA_Layout_RGB16, 8, false},
                                                     {PRISMA_Layout_RGBFloat, 16, false},
                                                     {PRISMA_Layout_CMYK8, 4, true},
                                                     {PRISMA_Layout_CMYK16, 8, true}};
constexpr const LayoutInfo& info(Layout layout) { return layouts[static_cast<int>(layout)]; }

// Channels as floats of 0..1, for the pixel types of worlds. Illegal 16-bit values count as white.
constexpr f32 unit(u8 v) { return static_cast<f32>(v) / 255.0f; }
constexpr f32 unit(u16 v) { return static_cast<f32>(v < 32768 ? v : 32768) * 0x1p-15f; }
constexpr f32 unit(f32 v) { return v; }
// NaN becomes 0.
constexpr f32 clamp_unit(f32 v) {
  v = v > 0.0f ? v : 0.0f;
  return v < 1.0f ? v : 1.0f;
}
template <class Channel>
inline constexpr f32 white_code = sizeof(Channel) == 1 ? 255.0f : 32768.0f;
// Back, rounded to nearest; the argument is clamped.
template <class Channel>
constexpr Channel from_unit(f32 v) {
  if constexpr (std::is_same_v<Channel, f32>)
    return v;
  else
    return static_cast<Channel>(static_cast<i32>(clamp_unit(v) * white_code<Channel> + 0.5f));
}

}  // namespace zr::prisma
