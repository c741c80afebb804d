// Whether rows can be worked on in pieces.
#pragma once

#include <ZR/zr.h>

#include <functional>

namespace zr {

// No pixel of one row is another pixel of the other.
template <class T>
bool rows_apart(i32 n, const T* a, const T* b) {
  return a == b || std::less_equal<>()(a + n, b) || std::less_equal<>()(b + n, a);
}

}  // namespace zr
