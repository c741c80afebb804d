// One channel out of a row of pixels, and back into one.
#pragma once

#include <ZR/depth.h>

// n first channels (alpha) of src, packed.
template <class T>
void ZR_Deinterleave1(i32 n, const T* src, zr::Channel<T>* channel) {
  for (i32 x = 0; x < n; ++x) channel[x] = src[x].alpha;
}
template <class T>
void ZR_Interleave1to4(i32 n, const zr::Channel<T>* channel, T* dst) {
  for (i32 x = 0; x < n; ++x) dst[x].alpha = channel[x];
}
