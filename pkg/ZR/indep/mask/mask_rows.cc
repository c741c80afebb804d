// Rows of mask values by single values, and the choice between them and lanes.
#include "mask/mask_rows.h"

#include <algorithm>
#include <type_traits>

#include "mask/mask_modes-inl.h"
#include "mask/mask_noise_state.h"

namespace zr {
namespace {

// Values beyond white compute in the channel's own bits, so that lanes of that width do the same.
template <class C>
struct MaskMath {
  using D = MaskDepth<C>;
  using Value = C;
  static constexpr C mul(C a, C b) { return static_cast<C>(D::mul(a, b)); }
  static constexpr C inv(C a) { return static_cast<C>(D::inv(a)); }
  static constexpr C least(C a, C b) { return b < a ? b : a; }
  static constexpr C greatest(C a, C b) { return a < b ? b : a; }
  static constexpr C difference(C a, C b) {
    if constexpr (std::is_same_v<C, f32>)
      return __builtin_fabsf(a - b);
    else
      return a < b ? static_cast<C>(b - a) : static_cast<C>(a - b);
  }
  static constexpr C added(C a, C b) {
    const Factor<C> sum = static_cast<Factor<C>>(a) + static_cast<Factor<C>>(b);
    return static_cast<C>(D::white < sum ? D::white : sum);
  }
  static constexpr C noisy_mul(C a, C b, C noise) {
    if constexpr (std::is_same_v<C, u8>) {
      const u32 t = u32{a} * b + noise;
      return static_cast<u8>((t + (t >> 8)) >> 8);
    } else {
      return static_cast<C>((u32{a} * b + noise) >> 15);
    }
  }
};

template <class C>
void mode_values(i32 n, i32 mode, const C* src, const C* under, C* dst) {
  on_mask_mode(mode, [&]<i32 m>() {
    for (i32 i = 0; i < n; ++i) dst[i] = combined<m, MaskMath<C>>(src[i], under[i]);
  });
}

template <class C>
void dithered_values(i32 n, const u16* noise, const C* src, const C* under, C* dst) {
  if constexpr (!std::is_same_v<C, f32>)
    for (i32 i = 0; i < n; ++i) dst[i] = dithered<MaskMath<C>>(src[i], under[i], static_cast<C>(noise[i]));
}

// Ceilings and factors beyond the depth's values are legal here, and their sums wrap like their products.
i32 wide_fold(i32 t) { return wrap_add(wrap_add(t, wrap_add(t, 128) >> 8), 128) >> 8; }
template <class C>
C wide_mul(Factor<C> v, Factor<C> factor) {
  if constexpr (std::is_same_v<C, u8>)
    return static_cast<u8>(wide_fold(wrap_mul(v, factor)));
  else
    return static_cast<C>(MaskDepth<C>::mul(v, factor));
}

template <class C>
void rise_values(i32 n, Factor<C> ceiling, const C* src, const C* under, C* dst) {
  for (i32 i = 0; i < n; ++i) {
    const Factor<C> d = under[i];
    if (!(d < ceiling)) {
      dst[i] = under[i];
    } else if constexpr (std::is_same_v<C, f32>) {
      dst[i] = d + src[i] * (ceiling - d);
    } else {
      const i32 product = wrap_mul(src[i], wrap_sub(ceiling, d));
      dst[i] = static_cast<C>(d + (std::is_same_v<C, u8> ? wide_fold(product) : product >> 15));
    }
  }
}

template <class C>
void fade_values(i32 n, Factor<C> factor, C* row) {
  for (i32 i = 0; i < n; ++i) row[i] = wide_mul<C>(row[i], factor);
}

template <class C>
void invert_values(i32 n, Factor<C> factor, C* row) {
  for (i32 i = 0; i < n; ++i) row[i] = wide_mul<C>(MaskMath<C>::inv(row[i]), factor);
}

template <class C>
void merge_values(i32 n, const C* mask, MaskPixel<C>* pixels) {
  for (i32 i = 0; i < n; ++i) pixels[i].alpha = MaskMath<C>::mul(pixels[i].alpha, mask[i]);
}

template <class C>
const MaskRows<C>& best_rows() {
  const MaskRows<C>* const lanes = lane_mask_rows<C>();
  return lanes != nullptr ? *lanes : single_mask_rows<C>();
}
template <class C>
const MaskRows<C>& rows_for(Factor<C> factor) {
  return factor >= 0 && factor <= MaskDepth<C>::white ? best_rows<C>() : single_mask_rows<C>();
}

template <class C>
void draw_and_screen(i32 n, const C* src, const C* under, C* dst) {
  constexpr u16 noise_bits = std::is_same_v<C, u8> ? 0xff : 0x7fff;
  MaskNoise noise;
  u16 drawn[mask_block];
  for (i32 i = 0; i < n; i += mask_block) {
    const i32 count = std::min(n - i, mask_block);
    noise.draw(count, noise_bits, drawn);
    best_rows<C>().dithered(count, drawn, src + i, under + i, dst + i);
  }
}

}  // namespace

template <class C>
const MaskRows<C>& single_mask_rows() {
  static constexpr MaskRows<C> rows = {&mode_values<C>, &dithered_values<C>, &rise_values<C>,
                                       &fade_values<C>, &invert_values<C>,   &merge_values<C>};
  return rows;
}

template <class C>
i32 mask_mode_row(i32 n, i32 mode, const C* src, const C* under, C* dst) {
  // Floats are not rounded to steps that noise could hide.
  if (mode == ZR_UnoMode_DitheredScreen && !std::is_same_v<C, f32>)
    draw_and_screen(n, src, under, dst);
  else
    best_rows<C>().mode(n, mode, src, under, dst);
  return ZR_Err_None;
}

template <class S, class D>
i32 mixed_mode_row(i32 n, i32 mode, const S* src, const D* under, D* dst) {
  D converted[mask_block];
  for (i32 i = 0; i < n; i += mask_block) {
    const i32 count = std::min(n - i, mask_block);
    convert_mask_row(count, src + i, converted);
    mask_mode_row(count, mode, converted, under + i, dst + i);
  }
  return ZR_Err_None;
}
template i32 mixed_mode_row(i32, i32, const u8*, const u16*, u16*);
template i32 mixed_mode_row(i32, i32, const u16*, const u8*, u8*);

template <class C>
void mask_rise_row(i32 n, Factor<C> ceiling, const C* src, const C* under, C* dst) {
  rows_for<C>(ceiling).rise(n, ceiling, src, under, dst);
}

template <class C>
i32 mask_fade_row(i32 n, Factor<C> factor, C* row) {
  rows_for<C>(factor).fade(n, factor, row);
  return ZR_Err_None;
}

template <class C>
i32 mask_invert_row(i32 n, Factor<C> factor, C* row) {
  rows_for<C>(factor).invert(n, factor, row);
  return ZR_Err_None;
}

template <class T>
void merge_alpha_row(i32 n, const Channel<T>* mask, T* pixels) {
  best_rows<Channel<T>>().merge(n, mask, pixels);
}

#define ZR_MASK_ROWS(C)                                                \
  template const MaskRows<C>& single_mask_rows();                      \
  template i32 mask_mode_row(i32, i32, const C*, const C*, C*);        \
  template void mask_rise_row(i32, Factor<C>, const C*, const C*, C*); \
  template i32 mask_fade_row(i32, Factor<C>, C*);                      \
  template i32 mask_invert_row(i32, Factor<C>, C*);                    \
  template void merge_alpha_row(i32, const C*, MaskPixel<C>*);
ZR_MASK_ROWS(u8)
ZR_MASK_ROWS(u16)
ZR_MASK_ROWS(f32)
#undef ZR_MASK_ROWS

}  // namespace zr
