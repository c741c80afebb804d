/* Samplers: one pixel, or a run of them, read at fractional positions of a world.
 *
 * Positions  signed 16.16; pixel (n, m) lies exactly at (n << 16, m << 16): centres are on integers.
 * Outside    everything outside a world is transparent black; edges are not repeated.
 * Alpha      pixels are straight, and colour is weighted by alpha, so that a cut-out has no dark fringe.
 * Results    every sampler returns 0. `progress` is not read. dst is one pixel of the sampler's depth,
 *            or as many as are asked for, and is not a pixel of the sampled world.
 * NoClip     the caller promises that every neighbour lies inside the world; nothing is tested.
 * Threads    samplers have no state; any number of threads may sample one world.
 */
#ifndef ZR_SAMPLE_H
#define ZR_SAMPLE_H

#include <ZR/types.h>

#ifdef __cplusplus
extern "C" {
#endif

/* What is sampled, and for area samples over which box. Clear the whole record before filling it. */
typedef struct ZR_SampPB {
  i32 x_radius, y_radius; /* 16.16, half the box of an area sample */
  i32 area;               /* 16.16, 4 * x_radius * y_radius; the divisor of ZR_AreaSample_Premul */
  ZR_LayerDef* src;
  i32 motion_steps; /* motion samples less one; no sampler reads it */
  i32 reserved[9];  /* zero */
} ZR_SampPB;
ZR_ASSERT_LAYOUT(offsetof(ZR_SampPB, area) == 8 && offsetof(ZR_SampPB, src) == 16);
ZR_ASSERT_LAYOUT(offsetof(ZR_SampPB, motion_steps) == 24 && sizeof(ZR_SampPB) == 64);

typedef i32 (*ZR_SampleFunc8)(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel8* dst);
typedef i32 (*ZR_SamplePlusFunc8)(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, u8* all_in,
                                  ZR_Pixel8* dst);
typedef i32 (*ZR_SampleTranslateFunc8)(const ZR_ProgressInfo* progress, i32 x, i32 y, const f64 w[4],
                                       const ZR_SampPB* params, ZR_Pixel8* dst);
typedef i32 (*ZR_SampleSpanFunc8)(const ZR_ProgressInfo* progress, i32 count, i32 x, i32 y, const ZR_SampPB* params,
                                  u32* sum_alpha, ZR_Pixel8* dst);
typedef i32 (*ZR_SampleFunc16)(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel16* dst);
typedef i32 (*ZR_SamplePlusFunc16)(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, u8* all_in,
                                   ZR_Pixel16* dst);
typedef i32 (*ZR_SampleTranslateFunc16)(const ZR_ProgressInfo* progress, i32 x, i32 y, const f64 w[4],
                                        const ZR_SampPB* params, ZR_Pixel16* dst);
typedef i32 (*ZR_SampleSpanFunc16)(const ZR_ProgressInfo* progress, i32 count, i32 x, i32 y, const ZR_SampPB* params,
                                   u32* sum_alpha, ZR_Pixel16* dst);
typedef i32 (*ZR_SampleFuncFloat)(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                  ZR_PixelFloat* dst);
typedef i32 (*ZR_SamplePlusFuncFloat)(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                      u8* all_in, ZR_PixelFloat* dst);
typedef i32 (*ZR_SampleTranslateFuncFloat)(const ZR_ProgressInfo* progress, i32 x, i32 y, const f64 w[4],
                                           const ZR_SampPB* params, ZR_PixelFloat* dst);
typedef i32 (*ZR_SampleSpanFuncFloat)(const ZR_ProgressInfo* progress, i32 count, i32 x, i32 y, const ZR_SampPB* params,
                                      f32* sum_alpha, ZR_PixelFloat* dst);

/* The nearest pixel; halves go right and down. */
ZR_API i32 ZR_NNSample(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel8* dst);
ZR_API i32 ZR_NNSample16(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel16* dst);
ZR_API i32 ZR_NNSampleFloat(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, ZR_PixelFloat* dst);

/* Bilinear with clipping. */
ZR_API i32 ZR_SubpixelSample_Straight(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                      ZR_Pixel8* dst);
ZR_API i32 ZR_SubpixelSample_Straight16(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                        ZR_Pixel16* dst);
ZR_API i32 ZR_SubpixelBilinearFloat(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                    ZR_PixelFloat* dst);

/* The same, and whether all four neighbours lay inside. At whole positions the two integer depths say 0. */
ZR_API i32 ZR_SubpixelSamplePlus_Straight(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                          u8* all_in, ZR_Pixel8* dst);
ZR_API i32 ZR_SubpixelSamplePlus_Straight16(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                            u8* all_in, ZR_Pixel16* dst);
ZR_API i32 ZR_SubpixelSpanSampleAllInBilinearFloat(const ZR_ProgressInfo* progress, i32 x, i32 y,
                                                   const ZR_SampPB* params, u8* all_in, ZR_PixelFloat* dst);

/* Bilinear without bounds tests. */
ZR_API i32 ZR_SubpixelSampleNoClip_Straight(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                            ZR_Pixel8* dst);
ZR_API i32 ZR_SubpixelSampleNoClip_Straight16(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                              ZR_Pixel16* dst);
ZR_API i32 ZR_SubpixelNoClipBilinearFloat(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                          ZR_PixelFloat* dst);

/* The same with the caller's weights (ZR_SubpixelSampleComputeWeight), for one phase over many pixels. */
ZR_API i32 ZR_SubpixelSampleTranslateNoClip_Straight(const ZR_ProgressInfo* progress, i32 x, i32 y, const f64 w[4],
                                                     const ZR_SampPB* params, ZR_Pixel8* dst);
ZR_API i32 ZR_SubpixelSampleTranslateNoClip_Straight16(const ZR_ProgressInfo* progress, i32 x, i32 y, const f64 w[4],
                                                       const ZR_SampPB* params, ZR_Pixel16* dst);
ZR_API i32 ZR_SubpixelSampleTranslateNoClipBilinearFloat(const ZR_ProgressInfo* progress, i32 x, i32 y, const f64 w[4],
                                                         const ZR_SampPB* params, ZR_PixelFloat* dst);

/* count pixels, the source stepping one pixel to the right for each; alphas are added into *sum_alpha. */
ZR_API i32 ZR_SubpixelSpanSampleTranslateNoClip_Straight(const ZR_ProgressInfo* progress, i32 count, i32 x, i32 y,
                                                         const ZR_SampPB* params, u32* sum_alpha, ZR_Pixel8* dst);
ZR_API i32 ZR_SubpixelSpanSampleTranslateNoClip_Straight16(const ZR_ProgressInfo* progress, i32 count, i32 x, i32 y,
                                                           const ZR_SampPB* params, u32* sum_alpha, ZR_Pixel16* dst);
ZR_API i32 ZR_SubpixelSpanSampleBilinearFloat(const ZR_ProgressInfo* progress, i32 count, i32 x, i32 y,
                                              const ZR_SampPB* params, f32* sum_alpha, ZR_PixelFloat* dst);

/* Four independent positions at once, (x, y) pairs whose whole parts fit 16 bits; 8-bit, no bounds tests.
 * Every alpha is rounded, also where all four neighbours agree. */
ZR_API i32 ZR_SubpixelSampleNoClip_Straight_4(const ZR_ProgressInfo* progress, const i32 xy[8], const ZR_SampPB* params,
                                              ZR_Pixel8 dst[4]);
ZR_API i32 ZR_SubpixelSampleTranslateNoClip_Straight_4(const ZR_ProgressInfo* progress, const i32 xy[8],
                                                       const f64 w[16], const ZR_SampPB* params, ZR_Pixel8 dst[4]);
/* Bilinear with clipping of premultiplied pixels, in integers. */
ZR_API i32 ZR_SubpixelSample_Premul(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                    ZR_Pixel8* dst);
/* Weights of the upper left, upper right, lower left, lower right neighbour for a fraction (n / 65536). */
ZR_API i32 ZR_SubpixelSampleComputeWeight(u16 fx, u16 fy, f64 w[4]);

/* Cubic convolution with parameter -0.75 over 4 x 4 pixels (Keys, 1981), with clipping. */
ZR_API i32 ZR_SubpixelBicubic8(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel8* dst);
ZR_API i32 ZR_SubpixelBicubic16(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                ZR_Pixel16* dst);
ZR_API i32 ZR_SubpixelBicubicFloat(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                   ZR_PixelFloat* dst);

/* The same, and whether the neighbourhood and one more pixel left and above lay inside. */
ZR_API i32 ZR_SubpixelSpanSampleAllInBicubic8(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                              u8* all_in, ZR_Pixel8* dst);
ZR_API i32 ZR_SubpixelSpanSampleAllInBicubic16(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                               u8* all_in, ZR_Pixel16* dst);
ZR_API i32 ZR_SubpixelSpanSampleAllInBicubicFloat(const ZR_ProgressInfo* progress, i32 x, i32 y,
                                                  const ZR_SampPB* params, u8* all_in, ZR_PixelFloat* dst);

/* Without bounds tests. */
ZR_API i32 ZR_SubpixelNoClipBicubic8(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                     ZR_Pixel8* dst);
ZR_API i32 ZR_SubpixelNoClipBicubic16(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                      ZR_Pixel16* dst);
ZR_API i32 ZR_SubpixelNoClipBicubicFloat(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                         ZR_PixelFloat* dst);

/* Four neighbours by the caller's weights. In the integer depths alpha is limited to 1, not to white; in
 * float this is the bilinear sampler. */
ZR_API i32 ZR_SubpixelSampleTranslateNoClipBicubic8(const ZR_ProgressInfo* progress, i32 x, i32 y, const f64 w[4],
                                                    const ZR_SampPB* params, ZR_Pixel8* dst);
ZR_API i32 ZR_SubpixelSampleTranslateNoClipBicubic16(const ZR_ProgressInfo* progress, i32 x, i32 y, const f64 w[4],
                                                     const ZR_SampPB* params, ZR_Pixel16* dst);
ZR_API i32 ZR_SubpixelSampleTranslateNoClipBicubicFloat(const ZR_ProgressInfo* progress, i32 x, i32 y, const f64 w[4],
                                                        const ZR_SampPB* params, ZR_PixelFloat* dst);

/* A run of pixels. */
ZR_API i32 ZR_SubpixelSpanSampleBicubic8(const ZR_ProgressInfo* progress, i32 count, i32 x, i32 y,
                                         const ZR_SampPB* params, u32* sum_alpha, ZR_Pixel8* dst);
ZR_API i32 ZR_SubpixelSpanSampleBicubic16(const ZR_ProgressInfo* progress, i32 count, i32 x, i32 y,
                                          const ZR_SampPB* params, u32* sum_alpha, ZR_Pixel16* dst);
ZR_API i32 ZR_SubpixelSpanSampleBicubicFloat(const ZR_ProgressInfo* progress, i32 count, i32 x, i32 y,
                                             const ZR_SampPB* params, f32* sum_alpha, ZR_PixelFloat* dst);

/* The mean of the box of 2 * x_radius by 2 * y_radius around a position. These jump through their slots. */
ZR_API i32 ZR_AreaSample_Straight(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                  ZR_Pixel8* dst);
ZR_API i32 ZR_AreaSample_Straight16(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                    ZR_Pixel16* dst);
/* Premultiplied, in integers. */
ZR_API i32 ZR_AreaSample_Premul(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel8* dst);

/* Sample quality: 0 draft, 1 bilinear, 2 and 3 bicubic. The pixels that a sample reaches beyond its own. */
ZR_API i32 ZR_GetSampleQualityPixelSupport(i32 quality);

typedef void (*ZR_AnySampleFunc)(void);
/* The samplers of one depth and quality: cast an entry to its type of that depth before calling it. */
typedef struct ZR_SampleFunctionSet {
  ZR_AnySampleFunc inside_flag; /* ZR_SamplePlusFunc */
  ZR_AnySampleFunc clipping;    /* ZR_SampleFunc */
  ZR_AnySampleFunc area;        /* ZR_SampleFunc */
  ZR_AnySampleFunc no_clipping; /* ZR_SampleFunc */
  ZR_AnySampleFunc translate;   /* ZR_SampleTranslateFunc */
  ZR_AnySampleFunc span;        /* ZR_SampleSpanFunc */
} ZR_SampleFunctionSet;
ZR_ASSERT_LAYOUT(sizeof(ZR_SampleFunctionSet) == 6 * sizeof(void*));
/* Qualities 2 and 3 give bicubic, all others bilinear. Bilinear entries of the integer depths are what the
 * slots hold now, so a replacement takes effect with the next set. */
ZR_API void ZR_GetSampleFunctionSet8(i32 quality, ZR_SampleFunctionSet* out);
ZR_API void ZR_GetSampleFunctionSet16(i32 quality, ZR_SampleFunctionSet* out);
ZR_API void ZR_GetSampleFunctionSetFloat(i32 quality, ZR_SampleFunctionSet* out);

#ifdef __cplusplus
}
#endif

#endif
