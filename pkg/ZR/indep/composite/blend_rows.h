// Rows mixed by a ratio.
#pragma once

#include <ZR/zr.h>

namespace zr {

constexpr i32 ratio_one = 0x10000;           // ratios are 16.16
constexpr f32 of_ratio_one = 1.5258789e-5f;  // 1 / ratio_one

// n pixels of dst, `second_part` / ratio_one (above 0, below ratio_one) of second and the rest of first, straight or
// premultiplied. dst may be either row.
template <class T, bool premul>
void blend_row(i32 n, const T* first, const T* second, i32 second_part, T* dst);

}  // namespace zr
