// Rows premultiplied against a matte colour, and back.
#pragma once

#include <ZR/zr.h>

namespace zr {

// n pixels of src to dst, which may be the same row. Only the colour of the matte counts.
template <class T, bool forward>
void matte_row(i32 n, const T& matte, const T* src, T* dst);
// The same by single numbers.
template <class T, bool forward>
void single_matte_row(i32 n, const T& matte, const T* src, T* dst);

}  // namespace zr
