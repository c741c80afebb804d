/* Single pixels between RGB and HLS or YIQ, and measures of single pixels.
 *
 * Words    HLS and YIQ are three signed 16.16 words, in the order H, L, S or Y, I, Q. H is in degrees, 0 to just
 *          below 360; L and S are 0..1 of the colour model, which is not what the measures below give.
 * Pixels   straight alpha, except for the _Premul forms. Nothing is clamped on the way in; illegal channels give some
 *          defined number. The forms that write a pixel write its colours only.
 * Premul   8-bit premultiplied pixels. Those that read a pixel unmultiply its colours by its own alpha. Those that
 *          write one multiply by the alpha that stands in the pixel the caller passes in: set it before the call.
 * Aliasing in and out may not overlap. Threads: any. Failure: none, the result is always 0; where a pointer is null
 *          nothing is read or written. `ref` is not read. The _Premul forms need the library born. */
#ifndef ZR_PIXEL_MEASURES_H
#define ZR_PIXEL_MEASURES_H

#include <ZR/types.h>

#ifdef __cplusplus
extern "C" {
#endif

ZR_API i32 ZR_RGBtoHLS_Straight(void* ref, const ZR_Pixel8* in, i32 hls[3]);
ZR_API i32 ZR_RGBtoHLS_Straight16(void* ref, const ZR_Pixel16* in, i32 hls[3]);
ZR_API i32 ZR_RGBtoHLS_StraightFloat(void* ref, const ZR_PixelFloat* in, i32 hls[3]);
ZR_API i32 ZR_RGBtoHLS_Premul(void* ref, const ZR_Pixel8* in, i32 hls[3]);

/* Rounded to nearest; integer colours keep the low 8 or 16 bits of what words out of range give. */
ZR_API i32 ZR_HLStoRGB_Straight(void* ref, const i32 hls[3], ZR_Pixel8* out);
ZR_API i32 ZR_HLStoRGB_Straight16(void* ref, const i32 hls[3], ZR_Pixel16* out);
ZR_API i32 ZR_HLStoRGB_StraightFloat(void* ref, const i32 hls[3], ZR_PixelFloat* out);
ZR_API i32 ZR_HLStoRGB_Premul(void* ref, const i32 hls[3], ZR_Pixel8* out);

/* Each of the three products of a sum is rounded to 16.16 by itself. */
ZR_API i32 ZR_RGBtoYIQ_Straight(void* ref, const ZR_Pixel8* in, i32 yiq[3]);
ZR_API i32 ZR_RGBtoYIQ_Straight16(void* ref, const ZR_Pixel16* in, i32 yiq[3]);
ZR_API i32 ZR_RGBtoYIQ_StraightFloat(void* ref, const ZR_PixelFloat* in, i32 yiq[3]);
ZR_API i32 ZR_RGBtoYIQ_Premul(void* ref, const ZR_Pixel8* in, i32 yiq[3]);

/* Integer colours are clamped to 0..white, float ones are not. */
ZR_API i32 ZR_YIQtoRGB_Straight(void* ref, const i32 yiq[3], ZR_Pixel8* out);
ZR_API i32 ZR_YIQtoRGB_Straight16(void* ref, const i32 yiq[3], ZR_Pixel16* out);
ZR_API i32 ZR_YIQtoRGB_StraightFloat(void* ref, const i32 yiq[3], ZR_PixelFloat* out);
ZR_API i32 ZR_YIQtoRGB_Premul(void* ref, const i32 yiq[3], ZR_Pixel8* out);

/* 30 r + 59 g + 11 b of the stored values: 0..25500, at 16 bits 0..3276800. Float: 0.299, 0.587, 0.114. */
ZR_API i32 ZR_Luminance_Straight(void* ref, const ZR_Pixel8* in, i32* out);
ZR_API i32 ZR_Luminance_Straight16(void* ref, const ZR_Pixel16* in, i32* out);
ZR_API i32 ZR_Luminance_StraightFloat(void* ref, const ZR_PixelFloat* in, f32* out);
ZR_API i32 ZR_Luminance_Premul(void* ref, const ZR_Pixel8* in, i32* out);

/* A full turn is 255, a byte at 16 bits too; float: 1. Greys give 0. */
ZR_API i32 ZR_Hue_Straight(void* ref, const ZR_Pixel8* in, i32* out);
ZR_API i32 ZR_Hue_Straight16(void* ref, const ZR_Pixel16* in, i32* out);
ZR_API i32 ZR_Hue_StraightFloat(void* ref, const ZR_PixelFloat* in, f32* out);
ZR_API i32 ZR_Hue_Premul(void* ref, const ZR_Pixel8* in, i32* out);

/* The mean of the largest and the smallest colour, 0..white, rounded down. */
ZR_API i32 ZR_Lightness_Straight(void* ref, const ZR_Pixel8* in, i32* out);
ZR_API i32 ZR_Lightness_Straight16(void* ref, const ZR_Pixel16* in, i32* out);
ZR_API i32 ZR_Lightness_StraightFloat(void* ref, const ZR_PixelFloat* in, f32* out);
ZR_API i32 ZR_Lightness_Premul(void* ref, const ZR_Pixel8* in, i32* out);

/* The range of the colours times their sum (in the dark) or what is left of twice white (in the light); 0..white. */
ZR_API i32 ZR_Saturation_Straight(void* ref, const ZR_Pixel8* in, i32* out);
ZR_API i32 ZR_Saturation_Straight16(void* ref, const ZR_Pixel16* in, i32* out);
ZR_API i32 ZR_Saturation_StraightFloat(void* ref, const ZR_PixelFloat* in, f32* out);
ZR_API i32 ZR_Saturation_Premul(void* ref, const ZR_Pixel8* in, i32* out);

#ifdef __cplusplus
}
#endif

#endif
