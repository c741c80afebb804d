// The choice of a depth's row functions, in the part of its file that is compiled once.
#pragma once

#include "composite/mode_row.h"
#include "simd/variant.h"

namespace zr {

template <class T>
ZR_InnerBlendingFunc<T> row_or_null(const InnerRows<T>* rows, i32 index) {
  return rows != nullptr ? (*rows)[static_cast<std::size_t>(index)] : nullptr;
}

}  // namespace zr

#define ZR_CHOOSE_INNER_ROWS(T)                            \
  namespace zr {                                           \
  static const InnerRows<T>* best_whole_rows() {           \
    ZR_RETURN_BEST(lane_whole_rows<T>());                  \
    return nullptr;                                        \
  }                                                        \
  template <>                                              \
  ZR_InnerBlendingFunc<T> whole_ground_row<T>(i32 index) { \
    return row_or_null(best_whole_rows(), index);          \
  }                                                        \
  template <>                                              \
  const InnerRows<T>& inner_rows<T, false>() {             \
    ZR_RETURN_BEST(lane_rows<T, false>());                 \
    return single_rows<T, false>();                        \
  }                                                        \
  template <>                                              \
  const InnerRows<T>& inner_rows<T, true>() {              \
    ZR_RETURN_BEST(lane_rows<T, true>());                  \
    return single_rows<T, true>();                         \
  }                                                        \
  }
