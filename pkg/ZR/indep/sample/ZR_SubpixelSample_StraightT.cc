// Exports of the bilinear samplers of straight pixels.
#include "sample/ZR_SubpixelSample_StraightT.h"

using zr::BilinearWeights;

// The three depths have one body under names of two styles.
#define ZR_BILINEAR(Pixel, Real, Clipping, Plus, NoClip, Translate, Span)                                            \
  i32 Clipping(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params, Pixel* dst) {                          \
    return zr::bilinear(x, y, params, dst);                                                                          \
  }                                                                                                                  \
  i32 Plus(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params, u8* all_in, Pixel* dst) {                  \
    return zr::bilinear_all_in(x, y, params, all_in, dst);                                                           \
  }                                                                                                                  \
  i32 NoClip(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params, Pixel* dst) {                            \
    return zr::bilinear_no_clip(x, y, BilinearWeights<Real>(zr::Position(x, y)), params, dst);                       \
  }                                                                                                                  \
  i32 Translate(const ZR_ProgressInfo*, i32 x, i32 y, const f64 w[4], const ZR_SampPB* params, Pixel* dst) {         \
    return zr::bilinear_no_clip(x, y, BilinearWeights<Real>(w), params, dst);                                        \
  }                                                                                                                  \
  i32 Span(const ZR_ProgressInfo*, i32 count, i32 x, i32 y, const ZR_SampPB* params, zr::AlphaSum<Pixel>* sum_alpha, \
           Pixel* dst) {                                                                                             \
    return zr::bilinear_span(count, x, y, params, sum_alpha, dst);                                                   \
  }

extern "C" {

ZR_BILINEAR(ZR_Pixel8, f32, ZR_SubpixelSample_Straight, ZR_SubpixelSamplePlus_Straight,
            ZR_SubpixelSampleNoClip_Straight, ZR_SubpixelSampleTranslateNoClip_Straight,
            ZR_SubpixelSpanSampleTranslateNoClip_Straight)
ZR_BILINEAR(ZR_Pixel16, f64, ZR_SubpixelSample_Straight16, ZR_SubpixelSamplePlus_Straight16,
            ZR_SubpixelSampleNoClip_Straight16, ZR_SubpixelSampleTranslateNoClip_Straight16,
            ZR_SubpixelSpanSampleTranslateNoClip_Straight16)
ZR_BILINEAR(ZR_PixelFloat, f32, ZR_SubpixelBilinearFloat, ZR_SubpixelSpanSampleAllInBilinearFloat,
            ZR_SubpixelNoClipBilinearFloat, ZR_SubpixelSampleTranslateNoClipBilinearFloat,
            ZR_SubpixelSpanSampleBilinearFloat)

i32 ZR_SubpixelSampleComputeWeight(u16 fx, u16 fy, f64 w[4]) {
  const BilinearWeights<f64> weights(fx, fy);
  w[0] = weights.w00, w[1] = weights.w10, w[2] = weights.w01, w[3] = weights.w11;
  return ZR_Err_None;
}

}  // extern "C"
#undef ZR_BILINEAR
