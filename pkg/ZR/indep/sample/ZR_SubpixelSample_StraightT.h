// Bilinear samples of straight pixels: the channel arithmetic of each depth, and the walks over it that are
// told once for all depths. Neighbours come from Clip or NoClip, weights from BilinearWeights.
#pragma once

#include "sample/ZR_Samp.h"
#include "sample/lane_rows.h"
#include "sample/lanes.h"
#include "world/slot_table.h"

namespace zr {

// Four lanes or four numbers weighted and added in pairs.
template <class Real, class Value>
inline Value in_pairs(const Real (&w)[4], const Value (&v)[4]) {
  return (w[0] * v[0] + w[1] * v[1]) + (w[2] * v[2] + w[3] * v[3]);
}
// The same from left to right.
template <class Real, class Value>
inline Value in_order(const Real (&w)[4], const Value (&v)[4]) {
  return ((w[0] * v[0] + w[1] * v[1]) + w[2] * v[2]) + w[3] * v[3];
}

// ---------------------------------------------------------------------------- channel arithmetic

// The integer depths: Real is single for 8 bits and double for 16.
template <class Pixel, class Real_, class Word_>
struct IntegerBilinear {
  using Real = Real_;
  using Word = Word_;  // a whole pixel
  static constexpr bool copies_whole_positions = true;

  static Pixel mix(const Pixel* const (&rows)[2], const BilinearWeights<Real>& weights) {
    const Word p[4] = {word(rows[0][0]), word(rows[0][1]), word(rows[1][0]), word(rows[1][1])};
    const Word difference = (p[0] ^ p[1]) | (p[0] ^ p[2]) | (p[0] ^ p[3]);
    if (difference == 0) return rows[0][0];
    const Real w[4] = {weights.w00, weights.w10, weights.w01, weights.w11};
    const Lanes<Real> c[4] = {channels<Real>(pixel(p[0])), channels<Real>(pixel(p[1])), channels<Real>(pixel(p[2])),
                              channels<Real>(pixel(p[3]))};
    constexpr Word alpha_bits = std::numeric_limits<Channel<Pixel>>::max();
    if ((difference & alpha_bits) == 0) {
      if ((p[0] & alpha_bits) == 0) return Pixel{};
      const Pixel mixed = narrow(in_pairs(w, c) + Lanes<Real>::all(Real{0.5}));
      return pixel((word(mixed) & static_cast<Word>(~alpha_bits)) | (p[0] & alpha_bits));  // alpha is not rounded
    }
    const Real a[4] = {w[0] * c[0].alpha(), w[1] * c[1].alpha(), w[2] * c[2].alpha(), w[3] * c[3].alpha()};
    const Real alpha = (a[0] + a[1]) + (a[2] + a[3]);
    if (alpha < Real{0.5}) return Pixel{};
    return normalised(a, c, alpha);
  }

  // Alpha as it is, colour over alpha, both rounded.
  static Pixel normalised(const Real (&a)[4], const Lanes<Real> (&c)[4], Real alpha) {
    Lanes<Real> mixed = (Real{1} / alpha) * in_pairs(a, c);
    mixed.set_alpha(alpha);
    return narrow(mixed + Lanes<Real>::all(Real{0.5}));
  }

  static Word word(const Pixel& p) { return std::bit_cast<Word>(p); }
  static Pixel pixel(Word p) { return std::bit_cast<Pixel>(p); }
  static Pixel narrow(Lanes<Real> c) {
    if constexpr (std::is_same_v<Pixel, ZR_Pixel8>)
      return low_bytes(truncate_limited<ZR_Pixel8>(c.v));
    else
      return truncate_low_bits(c);
  }
};

// Single precision from left to right, alpha limited to `1`: the float depth, and with another store the
// four-neighbour form of the bicubic family. Returns lanes on the depth's scale.
template <class Pixel>
inline Lanes<f32> mix_in_order(const Pixel* const (&rows)[2], const BilinearWeights<f32>& weights) {
  const f32 w[4] = {weights.w00, weights.w10, weights.w01, weights.w11};
  const Lanes<f32> c[4] = {channels<f32>(rows[0][0]), channels<f32>(rows[0][1]), channels<f32>(rows[1][0]),
                           channels<f32>(rows[1][1])};
  const f32 a0 = c[0].alpha();
  if (a0 == c[1].alpha() && a0 == c[2].alpha() && a0 == c[3].alpha()) {
    Lanes<f32> mixed = in_order(w, c);
    mixed.set_alpha(a0);
    return mixed;
  }
  const f32 a[4] = {w[0] * a0, w[1] * c[1].alpha(), w[2] * c[2].alpha(), w[3] * c[3].alpha()};
  const f32 sum = ((a[0] + a[1]) + a[2]) + a[3];
  if (sum == 0.0f) return Lanes<f32>::all(0.0f);
  const f32 alpha = sum > 1.0f ? 1.0f : sum;
  Lanes<f32> mixed = (1.0f / alpha) * in_order(a, c);
  mixed.set_alpha(alpha);
  return mixed;
}

template <class Pixel>
struct Bilinear;
template <>
struct Bilinear<ZR_Pixel8> : IntegerBilinear<ZR_Pixel8, f32, u32> {};
template <>
struct Bilinear<ZR_Pixel16> : IntegerBilinear<ZR_Pixel16, f64, u64> {};
template <>
struct Bilinear<ZR_PixelFloat> {
  using Real = f32;
  // Neither whole positions nor equal neighbours are taken over: overbright alpha is limited everywhere.
  static constexpr bool copies_whole_positions = false;
  static ZR_PixelFloat mix(const ZR_PixelFloat* const (&rows)[2], const BilinearWeights<f32>& weights) {
    return std::bit_cast<ZR_PixelFloat>(mix_in_order(rows, weights).v);
  }
};

// ---------------------------------------------------------------------------------------- walks

template <class T>
inline i32 bilinear(i32 x, i32 y, const ZR_SampPB* params, T* dst) {
  const Position at(x, y);
  const ZR_LayerDef& src = *params->src;
  if (Bilinear<T>::copies_whole_positions && at.whole()) {
    *dst = inside(src, at.x, at.y) ? *pixel_at<T>(src, at.x, at.y) : T{};
    return ZR_Err_None;
  }
  const Clip::Block<T, 2> block(src, at.x, at.y);
  *dst = Bilinear<T>::mix(block.rows, BilinearWeights<typename Bilinear<T>::Real>(at));
  return ZR_Err_None;
}

// Integer depths say 0 at whole positions, wherever they lie; float says 1 inside.
template <class T>
inline i32 bilinear_all_in(i32 x, i32 y, const ZR_SampPB* params, u8* all_in, T* dst) {
  const Position at(x, y);
  const ZR_LayerDef& src = *params->src;
  const bool reads_four = !(Bilinear<T>::copies_whole_positions && at.whole());
  *all_in = reads_four && at.x >= 0 && at.y >= 0 && at.x + 1 < src.width && at.y + 1 < src.height;
  return bilinear(x, y, params, dst);
}

template <class T>
inline i32 bilinear_no_clip(i32 x, i32 y, const BilinearWeights<typename Bilinear<T>::Real>& weights,
                            const ZR_SampPB* params, T* dst) {
  const Position at(x, y);
  const ZR_LayerDef& src = *params->src;
  if (Bilinear<T>::copies_whole_positions && at.whole()) {
    *dst = *pixel_at<T>(src, at.x, at.y);
    return ZR_Err_None;
  }
  const NoClip::Block<T, 2> block(src, at.x, at.y);
  *dst = Bilinear<T>::mix(block.rows, weights);
  return ZR_Err_None;
}

template <class T>
inline i32 bilinear_span(i32 count, i32 x, i32 y, const ZR_SampPB* params, AlphaSum<T>* sum_alpha, T* dst) {
  if (count < 1) return ZR_Err_None;
  const LaneRows<T>* const lanes = lane_bilinear_rows<T>();
  const i32 done = lanes != nullptr ? lanes->span({count, x, y, 0x10000, 0}, *params, sum_alpha, dst) : 0;
  const Position at(x, y);
  const BilinearWeights<typename Bilinear<T>::Real> weights(at);
  NoClip::Block<T, 2> block(*params->src, at.x + done, at.y);
  AlphaSum<T> sum = *sum_alpha;
  for (i32 i = done; i < count; ++i, block.slide()) {
    const T mixed = Bilinear<T>::mix(block.rows, weights);
    dst[i] = mixed;
    sum += mixed.alpha;
  }
  *sum_alpha = sum;
  return ZR_Err_None;
}

}  // namespace zr
