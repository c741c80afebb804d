// The library's constants that birth sets.
#include "world/constants_state.h"

#include <algorithm>
#include <array>
#include <iterator>

extern "C" {
constinit const u8* ZRp_G_fcm_table = nullptr;
constinit const u8* ZRp_G_fcd_table = nullptr;
constinit f32 ZR_G_FloatRamp[256] = {};

alignas(16) constinit u32 ZR_G_viLoWordMask[4] = {};
alignas(16) constinit u32 ZR_G_viLoByteMask32[4] = {};
alignas(16) constinit u32 ZR_G_vi128_32[4] = {};
alignas(16) constinit u32 ZR_G_AlphaMask32[4] = {};
alignas(16) constinit u32 ZR_G_BGRMask32[4] = {};
alignas(16) constinit f32 ZR_G_vfHalf[4] = {};
alignas(16) constinit f32 ZR_G_vf255[4] = {};
alignas(16) constinit f64 ZR_G_vdHalf[2] = {};
alignas(16) constinit f64 ZR_G_vd32768[2] = {};
}

namespace zr {

void set_vector_constants() {
  std::ranges::fill(ZR_G_viLoWordMask, 0xffffu);
  std::ranges::fill(ZR_G_viLoByteMask32, 0xffu);
  std::ranges::fill(ZR_G_vi128_32, 128u);
  for (u32 lane = 0; lane < 4; ++lane) {
    ZR_G_AlphaMask32[lane] = lane == 0 ? ~0u : 0u;
    ZR_G_BGRMask32[lane] = lane == 0 ? 0u : ~0u;
  }
  std::ranges::fill(ZR_G_vfHalf, Depth<ZR_PixelFloat>::half);
  std::ranges::fill(ZR_G_vf255, static_cast<f32>(Depth<ZR_Pixel8>::white));
  std::ranges::fill(ZR_G_vdHalf, 0.5);
  std::ranges::fill(ZR_G_vd32768, static_cast<f64>(Depth<ZR_Pixel16>::white));
}

void fill_float_ramp() {
  for (i32 i = 0; i < 256; ++i) ZR_G_FloatRamp[i] = static_cast<f32>(i);
}

}  // namespace zr

template <class T>
const u32* VecPixel<T>::GetMask32() {
  constexpr u32 words = sizeof(T) / sizeof(u32);  // of one pixel
  alignas(16) static constexpr auto table = [] {
    std::array<u32, (pixels + 1) * 4> masks{};
    for (u32 k = 0; k <= pixels; ++k)
      for (u32 word = 0; word < k * words; ++word) masks[k * 4 + word] = ~0u;
    return masks;
  }();
  return table.data();
}

template struct VecPixel<ZR_Pixel8>;
template struct VecPixel<ZR_Pixel16>;
template struct VecPixel<ZR_PixelFloat>;
