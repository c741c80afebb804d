// Rows of mask values, and of pixels under them: the fastest that this processor has. C is u8, u16 or f32, T the pixel
// of that depth. `dst` may be `under` (the values that it replaces); nothing else overlaps. They return 0.
#pragma once

#include "mask/mask_values.h"

namespace zr {

// A mode (ZR_UnoMode) without opacity.
template <class C>
i32 mask_mode_row(i32 n, i32 mode, const C* src, const C* under, C* dst);
// The same of a source of another depth (8 and 16 bits), converted first.
template <class S, class D>
i32 mixed_mode_row(i32 n, i32 mode, const S* src, const D* under, D* dst);
// under + smul(src, ceiling - under) where that is more.
template <class C>
void mask_rise_row(i32 n, Factor<C> ceiling, const C* src, const C* under, C* dst);
// mul(v, factor), and mul(inv(v), factor).
template <class C>
i32 mask_fade_row(i32 n, Factor<C> factor, C* row);
template <class C>
i32 mask_invert_row(i32 n, Factor<C> factor, C* row);
// Multiplies the alpha of pixels.
template <class T>
void merge_alpha_row(i32 n, const Channel<T>* mask, T* pixels);
// Values at another depth, as worlds convert their channels.
template <class To, class From>
void convert_mask_row(i32 n, const From* src, To* dst);

// All of them but the conversions, in one variant; noise stands for what mode -1 draws.
template <class C>
struct MaskRows {
  using T = MaskPixel<C>;
  void (*mode)(i32 n, i32 mode, const C* src, const C* under, C* dst);
  void (*dithered)(i32 n, const u16* noise, const C* src, const C* under, C* dst);
  void (*rise)(i32 n, Factor<C> ceiling, const C* src, const C* under, C* dst);
  void (*fade)(i32 n, Factor<C> factor, C* row);
  void (*invert)(i32 n, Factor<C> factor, C* row);
  void (*merge)(i32 n, const C* mask, T* pixels);
};
// By single values: what every other variant equals bit for bit.
template <class C>
const MaskRows<C>& single_mask_rows();
// On lanes, or null. Factors and ceilings are of 0..white, or the call goes to the single ones.
template <class C>
const MaskRows<C>* lane_mask_rows();

// Calls body.template operator()<mode>() for the mode, with all that have no number of their own as a screen.
template <class Body>
void on_mask_mode(i32 mode, Body&& body) {
  switch (mode) {
    case ZR_UnoMode_Erase: return body.template operator()<ZR_UnoMode_Erase>();
    case ZR_UnoMode_Intersect: return body.template operator()<ZR_UnoMode_Intersect>();
    case ZR_UnoMode_Lighten: return body.template operator()<ZR_UnoMode_Lighten>();
    case ZR_UnoMode_Darken: return body.template operator()<ZR_UnoMode_Darken>();
    case ZR_UnoMode_Difference: return body.template operator()<ZR_UnoMode_Difference>();
    case ZR_UnoMode_Add: return body.template operator()<ZR_UnoMode_Add>();
    default: return body.template operator()<ZR_UnoMode_Screen>();
  }
}

}  // namespace zr
