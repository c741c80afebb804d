// Premultiply and unmultiply rows of lanes: the fastest that this processor has, or null.
#pragma once

#include <ZR/zr.h>

namespace zr {

template <class T>
struct PremulRows {
  i32 (*premul)(i32, const T*, T*);
  i32 (*unmul)(i32, const T*, T*);
};
template <class T>
const PremulRows<T>* lane_premul_rows();
// The bodies of single numbers.
template <class T>
const PremulRows<T>& single_premul_rows();

}  // namespace zr
