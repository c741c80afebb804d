// Rows of premultiply and unmultiply against black: the default routines of slots 35, 36, 72, 73, 106, 107,
// which are also the fade and unfade of black ground.
#pragma once

#include <ZR/zr.h>

namespace zr {

// n pixels from src to dst; src null or equal to dst works in place, other overlap is not allowed. Alpha is
// copied. T is ZR_Pixel8, ZR_Pixel16 or ZR_PixelFloat. Returns 0.
template <class T>
i32 premul_row(i32 n, const T* src, T* dst);
// The 8-bit form reads the divide table, so it needs the library born.
template <class T>
i32 unmul_row(i32 n, const T* src, T* dst);

}  // namespace zr
