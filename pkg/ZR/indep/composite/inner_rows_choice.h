// The choice of a depth's row functions, in the part of its file that is compiled once.
#pragma once

#include "composite/mode_row.h"
#include "simd/variant.h"

#define ZR_CHOOSE_INNER_ROWS(T)                \
  namespace zr {                               \
  template <>                                  \
  const InnerRows<T>& inner_rows<T, false>() { \
    ZR_RETURN_BEST(lane_rows<T, false>());     \
    return single_rows<T, false>();            \
  }                                            \
  template <>                                  \
  const InnerRows<T>& inner_rows<T, true>() {  \
    ZR_RETURN_BEST(lane_rows<T, true>());      \
    return single_rows<T, true>();             \
  }                                            \
  }
