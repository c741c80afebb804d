/* Function tables ("suites") that plug-ins look up by name and version, and the one through which they do.
 *
 * The tables are made at the end of ZR_Birth, after the acceleration modules rewrote slots: they hold what stood in
 * the slots then, and later overrides do not reach them. They stay where they are for the life of the process, but are
 * found from birth to death only. Functions keep the contracts of the headers that declare them; the types below give
 * each its place. Straight alpha alone: premultiplied forms are in the callback block. Usable from C. */
#ifndef ZR_SUITES_H
#define ZR_SUITES_H

#include <ZR/callback_block.h>
#include <ZR/copy_bits.h>
#include <ZR/filter.h>
#include <ZR/pixel_measures.h>
#include <ZR/sample.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef struct ZR_BasicSuite {
  /* Stores the table of a suite; of several with this first version the one whose second is highest. 515, and null, for
   * one that is not there; 516 for null arguments. Any thread. */
  i32 (*acquire)(const char* name, i32 version, const void** suite);
  /* To be called once for each acquire. 515 for one that is not there, 516 for one not acquired. */
  i32 (*release)(const char* name, i32 version);
} ZR_BasicSuite;
/* For the host to hand to its plug-ins. 516 for null. */
ZR_API i32 ZR_GetBasicSuite(const ZR_BasicSuite** out);

#define ZR_CPUDataSuite_Name "ZN CPU Data Suite"
/* Whether the processor has a floating point unit, MMX, SSE2, SSE3. Each returns 0. */
typedef struct ZR_CPUDataSuite1 {
  i32 (*has_fpu)(bool* out);
  i32 (*has_mmx)(bool* out);
  i32 (*has_sse2)(bool* out);
  i32 (*has_sse3)(bool* out);
} ZR_CPUDataSuite1;

#define ZR_ANSISuite_Name "ZR ANSI Suite"
typedef struct ZR_ANSISuite1 {
  f64 (*atan)(f64);
  f64 (*atan2)(f64, f64);
  f64 (*ceil)(f64);
  f64 (*cos)(f64);
  f64 (*exp)(f64);
  f64 (*fabs)(f64);
  f64 (*floor)(f64);
  f64 (*fmod)(f64, f64);
  f64 (*hypot)(f64, f64);
  f64 (*log)(f64);
  f64 (*log10)(f64);
  f64 (*pow)(f64, f64);
  f64 (*sin)(f64);
  f64 (*sqrt)(f64);
  f64 (*tan)(f64);
  int (*sprintf)(char*, const char*, ...);
  char* (*strcpy)(char*, const char*);
  f64 (*asin)(f64);
  f64 (*acos)(f64);
} ZR_ANSISuite1;

#define ZR_HandleSuite_Name "ZR Handle Suite" /* versions 2, 1 */
typedef struct ZR_HandleSuite2 {
  ZR_HandleNewFunc create;
  ZR_HandleLockFunc lock;
  ZR_HandleUnlockFunc unlock;
  ZR_HandleDisposeFunc dispose;
  ZR_HandleSizeFunc size;
  ZR_HandleResizeFunc resize;
} ZR_HandleSuite2;

#define ZR_ColorSuite_Name "ZR Color Suite"
#define ZR_Color16Suite_Name "ZR Color16 Suite"
#define ZR_ColorFloatSuite_Name "ZR ColorFloat Suite"
#define ZR_COLOR_SUITE(Suite, Pixel, Measure)                    \
  typedef struct Suite {                                         \
    i32 (*rgb_to_hls)(void* ref, const Pixel* in, i32 hls[3]);   \
    i32 (*hls_to_rgb)(void* ref, const i32 hls[3], Pixel* out);  \
    i32 (*rgb_to_yiq)(void* ref, const Pixel* in, i32 yiq[3]);   \
    i32 (*yiq_to_rgb)(void* ref, const i32 yiq[3], Pixel* out);  \
    i32 (*luminance)(void* ref, const Pixel* in, Measure* out);  \
    i32 (*hue)(void* ref, const Pixel* in, Measure* out);        \
    i32 (*lightness)(void* ref, const Pixel* in, Measure* out);  \
    i32 (*saturation)(void* ref, const Pixel* in, Measure* out); \
  } Suite;
ZR_COLOR_SUITE(ZR_ColorSuite1, ZR_Pixel8, i32)
ZR_COLOR_SUITE(ZR_Color16Suite1, ZR_Pixel16, i32)
ZR_COLOR_SUITE(ZR_ColorFloatSuite1, ZR_PixelFloat, f32)
#undef ZR_COLOR_SUITE

#define ZR_BatchSamplingSuite_Name "ZR Batch Sampling Suite"
/* All null: the name is found, the service has ended. */
typedef struct ZR_BatchSamplingSuite1 {
  void* none[4];
} ZR_BatchSamplingSuite1;

#define ZR_Sampling8Suite_Name "ZR Sampling8 Suite"
#define ZR_Sampling16Suite_Name "ZR Sampling16 Suite"
#define ZR_SamplingFloatSuite_Name "ZR SamplingFloat Suite"
#define ZR_SAMPLING_SUITE(Suite, Pixel)                                                         \
  typedef struct Suite {                                                                        \
    i32 (*nearest)(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params, Pixel* dst);  \
    i32 (*bilinear)(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params, Pixel* dst); \
    i32 (*area)(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params, Pixel* dst);     \
  } Suite;
ZR_SAMPLING_SUITE(ZR_Sampling8Suite1, ZR_Pixel8)
ZR_SAMPLING_SUITE(ZR_Sampling16Suite1, ZR_Pixel16)
ZR_SAMPLING_SUITE(ZR_SamplingFloatSuite1, ZR_PixelFloat)
#undef ZR_SAMPLING_SUITE

#define ZR_WorldSuite_Name "ZR World Suite"
typedef struct ZR_WorldSuite1 {
  /* flags: 1 zeroed, 2 of 16 bits (else 8). */
  i32 (*new_world)(void* ref, i32 width, i32 height, i32 flags, ZR_LayerDef* out);
  i32 (*dispose_world)(void* ref, ZR_LayerDef* world);
} ZR_WorldSuite1;
/* Four characters, the lowest byte first. */
typedef enum ZR_PixelFormat {
  ZR_PixelFormat_ARGB8 = 0x62677261,    /* "argb" */
  ZR_PixelFormat_ARGB16 = 0x36316e7a,   /* "zn16" */
  ZR_PixelFormat_ARGBFloat = 0x32336e7a /* "zn32" */
} ZR_PixelFormat;
typedef struct ZR_WorldSuite2 { /* versions 2, 2 */
  /* As ZR_NewEffectWorld; 3 for another format, reported. */
  i32 (*new_world)(void* ref, i32 width, i32 height, bool clear, u32 format, ZR_LayerDef* out);
  i32 (*dispose_world)(void* ref, ZR_LayerDef* world);
  /* 3 for a null argument or a world of another depth, reported. */
  i32 (*get_pixel_format)(ZR_LayerDef* world, u32* format);
} ZR_WorldSuite2;

#define ZR_Iterate8Suite_Name "ZR Iterate8 Suite"
#define ZR_Iterate16Suite_Name "ZR iterate16 Suite"
#define ZR_IterateFloatSuite_Name "ZR iterateFloat Suite"
typedef i32 (*ZR_IterateRoutine)(ZR_InData*, i32 progress_base, i32 progress_final, ZR_LayerDef* src,
                                 const GX_LRect* area, void* refcon, ZR_PixelFunc pixel, ZR_LayerDef* dst);
typedef i32 (*ZR_IterateOriginRoutine)(ZR_InData*, i32 progress_base, i32 progress_final, ZR_LayerDef* src,
                                       const GX_LRect* area, const GX_LPoint* origin, void* refcon, ZR_PixelFunc pixel,
                                       ZR_LayerDef* dst);
typedef struct ZR_Iterate8Suite1 {
  ZR_IterateRoutine iterate;
  ZR_IterateOriginRoutine iterate_origin;
  i32 (*iterate_lut)(ZR_InData*, i32 progress_base, i32 progress_final, ZR_LayerDef* src, const GX_LRect* area,
                     const u8* alpha, const u8* red, const u8* green, const u8* blue, ZR_LayerDef* dst);
  ZR_IterateOriginRoutine iterate_origin_no_clip;
  i32 (*iterate_generic)(i32 iterations, void* refcon, ZR_GenericFunc function);
} ZR_Iterate8Suite1;
typedef struct ZR_IterateDeepSuite1 { /* the 16-bit and the float one */
  ZR_IterateRoutine iterate;
  ZR_IterateOriginRoutine iterate_origin;
  ZR_IterateOriginRoutine iterate_origin_no_clip;
} ZR_IterateDeepSuite1;

#define ZR_WorldTransformSuite_Name "ZR World Transform Suite"
typedef i32 (*ZR_CopyBitsRoutine)(const ZR_ProgressInfo*, ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect,
                                  const GX_LRect* dst_rect);
typedef struct ZR_WorldTransformSuite1 {
  i32 (*composite_rect)(const ZR_ProgressInfo*, const GX_LRect* rect, u8 opacity, ZR_LayerDef* src, i32 dest_x,
                        i32 dest_y, i32 field, u32 flags, ZR_LayerDef* dst);
  i32 (*blend)(const ZR_ProgressInfo*, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio, ZR_LayerDef* dst);
  i32 (*convolve)(const ZR_ProgressInfo*, ZR_LayerDef* src, const GX_LRect* rect, u32 flags, i32 size, const i32* alpha,
                  const i32* red, const i32* green, const i32* blue, ZR_LayerDef* dst);
  ZR_CopyBitsRoutine copy;    /* draft */
  ZR_CopyBitsRoutine copy_hq; /* best */
  i32 (*transfer_rect)(const ZR_ProgressInfo*, i32 quality, u32 flags, i32 field, const GX_LRect* rect,
                       ZR_LayerDef* src, const ZR_CompositeMode* mode, const ZR_MaskWorld* mask, i32 dest_x, i32 dest_y,
                       ZR_LayerDef* dst);
  i32 (*transform_world)(const ZR_ProgressInfo*, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                         const ZR_CompositeMode* mode, const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count,
                         bool src2dst, const GX_LRect* dst_rect, ZR_LayerDef* dst);
} ZR_WorldTransformSuite1;

#define ZR_FillMatteSuite_Name "ZR Fill Matte Suite" /* versions 2, 2 */
typedef struct ZR_FillMatteSuite2 {
  i32 (*fill)(void* ref, const ZR_Pixel8* colour, const GX_LRect* rect, ZR_LayerDef* world);
  i32 (*fill16)(void* ref, const ZR_Pixel16* colour, const GX_LRect* rect, ZR_LayerDef* world);
  i32 (*fill_float)(void* ref, const ZR_PixelFloat* colour, const GX_LRect* rect, ZR_LayerDef* world);
  i32 (*premultiply)(const ZR_ProgressInfo*, i32 forward, ZR_LayerDef* dst);
  i32 (*premultiply_color)(const ZR_ProgressInfo*, ZR_LayerDef* src, const ZR_Pixel8* colour, i32 forward,
                           ZR_LayerDef* dst);
  i32 (*premultiply_color16)(const ZR_ProgressInfo*, ZR_LayerDef* src, const ZR_Pixel16* colour, i32 forward,
                             ZR_LayerDef* dst);
  i32 (*premultiply_color_float)(const ZR_ProgressInfo*, ZR_LayerDef* src, const ZR_PixelFloat* colour, i32 forward,
                                 ZR_LayerDef* dst);
} ZR_FillMatteSuite2;

#define ZR_PixelDataSuite_Name "ZR Pixel Data Suite"
typedef struct ZR_PixelDataSuite1 {
  i32 (*get_pixel_data8)(ZR_LayerDef* world, void* pixels, void** out);
  i32 (*get_pixel_data16)(ZR_LayerDef* world, void* pixels, void** out);
  i32 (*get_pixel_data_float)(ZR_LayerDef* world, void* pixels, void** out);
} ZR_PixelDataSuite1;

#ifdef __cplusplus
}
#endif

#endif
