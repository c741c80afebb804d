// Loops over the pixels of one row that stay at one depth.
#pragma once

#include <ZR/depth.h>

#include <cstddef>
#include <cstring>

namespace zr {

// Stores `pixel` n times. Runs of 64 bytes are one copy of fixed size, which compiles to wide stores.
template <class T>
void fill_row(T* row, std::ptrdiff_t n, const T& pixel) {
  constexpr std::ptrdiff_t block = 64 / sizeof(T);
  T pattern[block];
  for (T& each : pattern) each = pixel;
  std::ptrdiff_t i = 0;
  for (; i <= n - block; i += block) std::memcpy(row + i, pattern, sizeof pattern);
  if (n > i) std::memcpy(row + i, pattern, static_cast<std::size_t>(n - i) * sizeof(T));
}

template <class T>
void clear_row(T* row, std::ptrdiff_t n) {
  if (n > 0) std::memset(static_cast<void*>(row), 0, static_cast<std::size_t>(n) * sizeof(T));
}

}  // namespace zr
