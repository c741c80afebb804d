// The nearest pixel, in three depths.
#include "sample/ZR_Samp.h"

namespace {

template <class T>
i32 nearest(i32 x, i32 y, const ZR_SampPB* params, T* dst) {
  const i32 column = zr::wrap_add(x, 32768) >> 16, row = zr::wrap_add(y, 32768) >> 16;
  const ZR_LayerDef& src = *params->src;
  *dst = zr::inside(src, column, row) ? *zr::pixel_at<T>(src, column, row) : T{};
  return ZR_Err_None;
}

}  // namespace

extern "C" {

i32 ZR_NNSample(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel8* dst) {
  return nearest(x, y, params, dst);
}
i32 ZR_NNSample16(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel16* dst) {
  return nearest(x, y, params, dst);
}
i32 ZR_NNSampleFloat(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params, ZR_PixelFloat* dst) {
  return nearest(x, y, params, dst);
}

}  // extern "C"
