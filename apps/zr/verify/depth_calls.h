// Functions of the C interface that exist once for each depth, by pixel type.
#pragma once

#include <ZR/zr.h>

#include <type_traits>

namespace zr::tool {

template <class T, class Eight, class Sixteen, class Real>
constexpr auto pick(Eight eight, Sixteen sixteen, Real real) {
  if constexpr (std::is_same_v<T, ZR_Pixel8>)
    return eight;
  else if constexpr (std::is_same_v<T, ZR_Pixel16>)
    return sixteen;
  else
    return real;
}
template <class T, class Eight, class Sixteen>
constexpr auto pick(Eight eight, Sixteen sixteen) {
  if constexpr (std::is_same_v<T, ZR_Pixel8>)
    return eight;
  else
    return sixteen;
}

}  // namespace zr::tool
