// Cubic convolution over 4 x 4 pixels, in three depths.
#include "sample/ZR_SubpixelSample_StraightT.h"

namespace {

using zr::Clip;
using zr::Depth;
using zr::Lanes;
using zr::NoClip;
using zr::Position;

// ---------------------------------------------------------------------------------------- weights

// Of the four pixels of an axis, from the one before the position's own. The kernel has one piece within one
// pixel of the position and one beyond; factors are double, weights single.
struct CubicWeights {
  f32 w[4];

  explicit CubicWeights(u32 fraction) {
    const f64 f = static_cast<f64>(fraction) * 0x1p-16;
    const zr::f64x2 n{f, 1.0 - f}, t{1.0 + f, 2.0 - f};  // exact, in single precision too
    const zr::f64x2 near = (1.25 * n - 2.25) * n * n + 1.0;
    const zr::f64x2 far = ((-0.75 * t + 3.75) * t - 6.0) * t + 3.0;
    w[0] = static_cast<f32>(far[0]), w[1] = static_cast<f32>(near[0]);
    w[2] = static_cast<f32>(near[1]), w[3] = static_cast<f32>(far[1]);
  }
};

// ----------------------------------------------------------------------------- channel arithmetic

// Four pixels into one: where their alphas differ colour is weighted by alpha and divided by its sum. A
// sum of 0 leaves nothing.
Lanes<f32> convolve(const f32 (&w)[4], const Lanes<f32> (&c)[4]) {
  const f32 a0 = c[0].alpha();
  if (a0 == c[1].alpha() && a0 == c[2].alpha() && a0 == c[3].alpha()) {
    Lanes<f32> sum = zr::in_order(w, c);
    sum.set_alpha(a0);
    return sum;
  }
  const f32 b[4] = {w[0] * a0, w[1] * c[1].alpha(), w[2] * c[2].alpha(), w[3] * c[3].alpha()};
  const f32 alpha = ((b[0] + b[1]) + b[2]) + b[3];
  if (alpha == 0.0f) return Lanes<f32>::all(0.0f);
  Lanes<f32> sum = (1.0f / alpha) * zr::in_order(b, c);
  sum.set_alpha(alpha);
  return sum;
}

// Alpha is limited at every depth; colour only where the depth has room for no more than white.
template <class T>
T limited(Lanes<f32> c) {
  constexpr f32 white = static_cast<f32>(Depth<T>::white);
  if constexpr (!std::is_same_v<T, ZR_PixelFloat>) c = (1.0f / white) * c;
  f32 alpha = c.alpha();
  alpha = alpha > 1.0f ? 1.0f : alpha < 1e-16f ? 0.0f : alpha;
  c.set_alpha(alpha);
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    return std::bit_cast<T>(c.v);
  } else {
    const Lanes<f32> scaled = white * c;
    const zr::f32x4 floor = zr::where(scaled.v > zr::f32x4{}, scaled.v);
    const zr::f32x4 rounded = floor + Lanes<f32>::all(0.5f).v;
    // What lies above white is cut before a half is added: white and a half would still truncate to white.
    const zr::i32x4 whole = zr::truncate_limited<T>(rounded);
    if constexpr (std::is_same_v<T, ZR_Pixel8>)
      return zr::low_bytes(whole);
    else
      return zr::low_words(whole);
  }
}

template <class T>
T mix(const T* const (&rows)[4], const CubicWeights& across, const CubicWeights& down) {
  Lanes<f32> row[4];
  for (int j = 0; j < 4; ++j) {
    const T* const p = rows[j];
    const Lanes<f32> c[4] = {zr::channels<f32>(p[0]), zr::channels<f32>(p[1]), zr::channels<f32>(p[2]),
                             zr::channels<f32>(p[3])};
    row[j] = convolve(across.w, c);
  }
  return limited<T>(convolve(down.w, row));
}

// ------------------------------------------------------------------------------------------ walks

template <class Fetch, class T>
i32 bicubic(i32 x, i32 y, const ZR_SampPB* params, T* dst) {
  const Position at(x, y);
  const typename Fetch::template Block<T, 4> block(*params->src, at.x - 1, at.y - 1);
  *dst = mix(block.rows, CubicWeights(at.fraction_x), CubicWeights(at.fraction_y));
  return ZR_Err_None;
}

// One pixel stricter on the left and above than the kernel needs.
template <class T>
i32 bicubic_all_in(i32 x, i32 y, const ZR_SampPB* params, u8* all_in, T* dst) {
  const Position at(x, y);
  bicubic<Clip>(x, y, params, dst);
  *all_in = at.x > 1 && at.x + 2 < params->src->width && at.y > 1 && at.y + 2 < params->src->height;
  return ZR_Err_None;
}

template <class T>
i32 bicubic_span(i32 count, i32 x, i32 y, const ZR_SampPB* params, zr::AlphaSum<T>* sum_alpha, T* dst) {
  if (count < 1) return ZR_Err_None;
  const zr::LaneRows<T>* const lanes = zr::lane_bicubic_rows<T>();
  const i32 done = lanes != nullptr ? lanes->span({count, x, y, 0x10000, 0}, *params, sum_alpha, dst) : 0;
  const Position at(x, y);
  const CubicWeights across(at.fraction_x), down(at.fraction_y);
  NoClip::Block<T, 4> block(*params->src, at.x - 1 + done, at.y - 1);
  zr::AlphaSum<T> sum = *sum_alpha;
  for (i32 i = done; i < count; ++i, block.slide()) {
    const T mixed = mix(block.rows, across, down);
    dst[i] = mixed;
    sum += mixed.alpha;
  }
  *sum_alpha = sum;
  return ZR_Err_None;
}

// Four neighbours by the caller's weights. Alpha is limited to 1 on every scale, so at the integer depths
// colour is not divided and alpha comes out as 0 or 1; that is this entry's contract.
template <class T>
i32 four_neighbours(i32 x, i32 y, const f64* w, const ZR_SampPB* params, T* dst) {
  const Position at(x, y);
  const NoClip::Block<T, 2> block(*params->src, at.x, at.y);
  const Lanes<f32> mixed = zr::mix_in_order(block.rows, zr::BilinearWeights<f32>(w));
  *dst = zr::truncate_low_bits<T>(mixed + Lanes<f32>::all(0.5f));
  return ZR_Err_None;
}

}  // namespace

#define ZR_BICUBIC(Pixel, suffix)                                                                                    \
  i32 ZR_SubpixelBicubic##suffix(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params, Pixel* dst) {        \
    return bicubic<Clip>(x, y, params, dst);                                                                         \
  }                                                                                                                  \
  i32 ZR_SubpixelSpanSampleAllInBicubic##suffix(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params,       \
                                                u8* all_in, Pixel* dst) {                                            \
    return bicubic_all_in(x, y, params, all_in, dst);                                                                \
  }                                                                                                                  \
  i32 ZR_SubpixelNoClipBicubic##suffix(const ZR_ProgressInfo*, i32 x, i32 y, const ZR_SampPB* params, Pixel* dst) {  \
    return bicubic<NoClip>(x, y, params, dst);                                                                       \
  }                                                                                                                  \
  i32 ZR_SubpixelSpanSampleBicubic##suffix(const ZR_ProgressInfo*, i32 count, i32 x, i32 y, const ZR_SampPB* params, \
                                           zr::AlphaSum<Pixel>* sum_alpha, Pixel* dst) {                             \
    return bicubic_span(count, x, y, params, sum_alpha, dst);                                                        \
  }

extern "C" {

ZR_BICUBIC(ZR_Pixel8, 8)
ZR_BICUBIC(ZR_Pixel16, 16)
ZR_BICUBIC(ZR_PixelFloat, Float)

i32 ZR_SubpixelSampleTranslateNoClipBicubic8(const ZR_ProgressInfo*, i32 x, i32 y, const f64 w[4],
                                             const ZR_SampPB* params, ZR_Pixel8* dst) {
  return four_neighbours(x, y, w, params, dst);
}
i32 ZR_SubpixelSampleTranslateNoClipBicubic16(const ZR_ProgressInfo*, i32 x, i32 y, const f64 w[4],
                                              const ZR_SampPB* params, ZR_Pixel16* dst) {
  return four_neighbours(x, y, w, params, dst);
}
i32 ZR_SubpixelSampleTranslateNoClipBicubicFloat(const ZR_ProgressInfo* progress, i32 x, i32 y, const f64 w[4],
                                                 const ZR_SampPB* params, ZR_PixelFloat* dst) {
  return ZR_SubpixelSampleTranslateNoClipBilinearFloat(progress, x, y, w, params, dst);
}

}  // extern "C"
#undef ZR_BICUBIC
