// Rows of n pixels of which only the alpha is written.
#pragma once

#include <ZR/depth.h>

namespace zr {

template <class T>
void fill_alpha_row(T* row, i64 n, Channel<T> alpha);

// White minus alpha; at 16 bits it wraps.
template <class T>
void invert_alpha_row(T* row, i64 n);

// What a pixel is worth as a cell of a mask.
enum class MaskValue { alpha, inverted, luma, luma_inverted };  // luma: alpha times luma

// The alpha of `out` from the pixels of `src`. An out-of-range 16-bit value wraps in the store.
template <class T>
void mask_value_row(MaskValue value, i64 n, const T* src, T* out);
// The same by single numbers.
template <class T>
void single_mask_values(MaskValue value, i64 n, const T* src, T* out);

}  // namespace zr
