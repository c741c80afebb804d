// Constants of vector row code: 16 bytes each, zero until ZR_Birth, read-only afterwards.
#pragma once

#include <ZR/zr.h>

extern "C" {
ZR_API extern u32 ZR_G_viLoWordMask[4];    // the low 16 bits of each 32-bit lane
ZR_API extern u32 ZR_G_viLoByteMask32[4];  // the low 8 bits of each 32-bit lane
ZR_API extern u32 ZR_G_vi128_32[4];        // 128 in each lane: the rounding term of an 8-bit product
ZR_API extern u32 ZR_G_AlphaMask32[4];     // lane select over four 32-bit lanes: alpha, the first one
ZR_API extern u32 ZR_G_BGRMask32[4];       // the three others
ZR_API extern f32 ZR_G_vfHalf[4];          // 0.5
ZR_API extern f32 ZR_G_vf255[4];           // 255.0
ZR_API extern f64 ZR_G_vdHalf[2];          // 0.5
ZR_API extern f64 ZR_G_vd32768[2];         // 32768.0
}

// T is ZR_Pixel8, ZR_Pixel16 or ZR_PixelFloat.
template <class T>
struct ZR_API VecPixel {
  static constexpr i32 pixels = static_cast<i32>(16 / sizeof(T));  // in one block of 16 bytes
  // pixels + 1 masks of four words each: mask k keeps the first k pixels of a block, for the end of a
  // row. Constant, so also there before ZR_Birth.
  static const u32* GetMask32();
};

extern template struct VecPixel<ZR_Pixel8>;
extern template struct VecPixel<ZR_Pixel16>;
extern template struct VecPixel<ZR_PixelFloat>;
