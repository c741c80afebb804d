// Bilinear samples at four positions at once, 8 bits, without a branch on what the pixels hold.
#include "sample/ZR_SubpixelSample_StraightT.h"

namespace {

using zr::BilinearWeights;
using zr::Lanes;

// weights_of(i): those of position i.
template <class WeightsOf>
i32 four(const i32* xy, const ZR_SampPB* params, ZR_Pixel8* dst, WeightsOf&& weights_of) {
  for (i32 i = 0; i < 4; ++i) {
    const zr::Position at(xy[2 * i], xy[2 * i + 1]);
    const zr::NoClip::Block<ZR_Pixel8, 2> block(*params->src, at.x, at.y);
    const BilinearWeights<f32> w = weights_of(i, at);
    const Lanes<f32> c[4] = {zr::channels<f32>(block.rows[0][0]), zr::channels<f32>(block.rows[0][1]),
                             zr::channels<f32>(block.rows[1][0]), zr::channels<f32>(block.rows[1][1])};
    const f32 a[4] = {w.w00 * c[0].alpha(), w.w10 * c[1].alpha(), w.w01 * c[2].alpha(), w.w11 * c[3].alpha()};
    // Under a sum of 0 the quotient is no number, which narrows to 0.
    dst[i] = zr::Bilinear<ZR_Pixel8>::normalised(a, c, (a[0] + a[1]) + (a[2] + a[3]));
  }
  return ZR_Err_None;
}

}  // namespace

extern "C" {

i32 ZR_SubpixelSampleNoClip_Straight_4(const ZR_ProgressInfo*, const i32 xy[8], const ZR_SampPB* params,
                                       ZR_Pixel8 dst[4]) {
  return four(xy, params, dst, [](i32, const zr::Position& at) { return BilinearWeights<f32>(at); });
}

i32 ZR_SubpixelSampleTranslateNoClip_Straight_4(const ZR_ProgressInfo*, const i32 xy[8], const f64 w[16],
                                                const ZR_SampPB* params, ZR_Pixel8 dst[4]) {
  return four(xy, params, dst, [w](i32 i, const zr::Position&) { return BilinearWeights<f32>(w + 4 * i); });
}

}  // extern "C"
