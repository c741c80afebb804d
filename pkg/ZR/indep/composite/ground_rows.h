// Rows around the main function of a ground mode: the destination to its ground colour by its own alpha,
// back by its new alpha, and the union of both alphas in between.
//
// Fades and unfades take n pixels from src to dst, in place when src is null or dst; alpha is copied. They
// have no shortcut for a white or zero alpha: a pixel pays its rounding each way, and one that ends with
// alpha 0 gets the ground's own colour. The black pair is premul_row and unmul_row. All return 0.
#pragma once

#include <ZR/depth.h>

namespace zr {

template <class T>
i32 white_fade_row(i32 n, const T* src, T* dst);
template <class T>
i32 white_unfade_row(i32 n, const T* src, T* dst);
template <class T>
i32 grey_fade_row(i32 n, const T* src, T* dst);
template <class T>
i32 grey_unfade_row(i32 n, const T* src, T* dst);

// dst alpha = 1 - (1 - A)(1 - dst alpha); mask may be null. An 8-bit opacity of 0 leaves the row alone.
template <class T>
i32 union_alpha_row(i32 n, const T* src, Channel<T> opacity, const T* mask, T* dst);

}  // namespace zr
