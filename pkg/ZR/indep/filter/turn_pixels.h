// Rows of pixels into columns and back.
#pragma once

#include <ZR/depth.h>

#include <cstring>

namespace zr {

namespace turning {

using Words [[gnu::vector_size(16)]] = u32;
using LongWords [[gnu::vector_size(16)]] = u64;

template <class V>
V load(const char* p) {
  V v;
  std::memcpy(&v, p, sizeof v);
  return v;
}
template <class V>
void store(const V& v, char* p) {
  std::memcpy(p, &v, sizeof v);
}

// Squares of as many pixels as fill a vector.
template <std::size_t pixel_bytes>
void square(const char* in, i64 in_step, char* out, i64 out_step) {
  if constexpr (pixel_bytes == 4) {
    const auto a = load<Words>(in), b = load<Words>(in + in_step), c = load<Words>(in + 2 * in_step),
               d = load<Words>(in + 3 * in_step);
    const Words ab = __builtin_shufflevector(a, b, 0, 4, 1, 5), cd = __builtin_shufflevector(c, d, 0, 4, 1, 5);
    const Words ab2 = __builtin_shufflevector(a, b, 2, 6, 3, 7), cd2 = __builtin_shufflevector(c, d, 2, 6, 3, 7);
    store<Words>(__builtin_shufflevector(ab, cd, 0, 1, 4, 5), out);
    store<Words>(__builtin_shufflevector(ab, cd, 2, 3, 6, 7), out + out_step);
    store<Words>(__builtin_shufflevector(ab2, cd2, 0, 1, 4, 5), out + 2 * out_step);
    store<Words>(__builtin_shufflevector(ab2, cd2, 2, 3, 6, 7), out + 3 * out_step);
  } else if constexpr (pixel_bytes == 8) {
    const auto a = load<LongWords>(in), b = load<LongWords>(in + in_step);
    store<LongWords>(__builtin_shufflevector(a, b, 0, 2), out);
    store<LongWords>(__builtin_shufflevector(a, b, 1, 3), out + out_step);
  } else {
    store(load<LongWords>(in), out);
  }
}

}  // namespace turning

// out[c][r] = in[r][c] for `rows` rows of `columns` pixels; steps are bytes from one row of each side to its next.
template <class T>
void turn_pixels(const T* in, i64 in_step, i64 rows, i64 columns, T* out, i64 out_step) {
  constexpr i64 side = 16 / sizeof(T);
  const char* const from = reinterpret_cast<const char*>(in);
  char* const to = reinterpret_cast<char*>(out);
  constexpr i64 pixel = sizeof(T);
  const i64 whole_rows = rows / side * side, whole_columns = columns / side * side;
  const auto one = [&](i64 r, i64 c) {
    std::memcpy(to + c * out_step + r * pixel, from + r * in_step + c * pixel, sizeof(T));
  };
  const auto square = [&](i64 r, i64 c) {
    turning::square<sizeof(T)>(from + r * in_step + c * pixel, in_step, to + c * out_step + r * pixel, out_step);
  };
  for (i64 c = 0; c < whole_columns; c += side)
    for (i64 r = 0; r < whole_rows; r += side) square(r, c);
  for (i64 c = whole_columns; c < columns; ++c)
    for (i64 r = 0; r < rows; ++r) one(r, c);
  for (i64 c = 0; c < whole_columns; ++c)
    for (i64 r = whole_rows; r < rows; ++r) one(r, c);
}

// The same, the fastest that this processor has.
template <class T>
using TurnPixelsFunc = void(const T* in, i64 in_step, i64 rows, i64 columns, T* out, i64 out_step);
template <class T>
TurnPixelsFunc<T>* pixel_turner();

}  // namespace zr
