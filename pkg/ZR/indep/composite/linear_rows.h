// Rows into linear light and back.
#pragma once

#include "composite/linear_light.h"

namespace zr {

// n pixels; the rows do not overlap. The rule of a pixel is to_linear and from_linear.
template <class T>
void to_linear_row(i32 n, const T* src, Linear<T>* dst, const ZR_LinearBlendingTables& tables);
template <class T>
void from_linear_row(i32 n, const Linear<T>* src, T* dst, const ZR_LinearBlendingTables& tables);

}  // namespace zr
