// Rows of pixels into columns on lanes: squares of eight, or four, in vectors of 32 bytes.
#include "filter/turn_pixels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "filter/lane_turn.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

#if HWY_MAX_BYTES >= 32
using Longs = hn::FixedTag<u64, 4>;
using LongVector = hn::Vec<Longs>;

template <class T>
struct Square;

template <>
struct Square<ZR_Pixel16> {
  static constexpr i64 side = 4;
  static HWY_INLINE void turn(const char* in, i64 in_step, char* out, i64 out_step) {
    const Longs d;
    LongVector row[4], pair[4];
    for (i64 i = 0; i < 4; ++i) row[i] = hn::LoadU(d, reinterpret_cast<const u64*>(in + i * in_step));
    for (i64 i = 0; i < 4; i += 2) {
      pair[i] = hn::InterleaveLower(d, row[i], row[i + 1]);
      pair[i + 1] = hn::InterleaveUpper(d, row[i], row[i + 1]);
    }
    for (i64 i = 0; i < 2; ++i) {
      hn::StoreU(hn::ConcatLowerLower(d, pair[2 + i], pair[i]), d, reinterpret_cast<u64*>(out + i * out_step));
      hn::StoreU(hn::ConcatUpperUpper(d, pair[2 + i], pair[i]), d, reinterpret_cast<u64*>(out + (2 + i) * out_step));
    }
  }
};

template <>
struct Square<ZR_Pixel8> {
  static constexpr i64 side = 8;
  static HWY_INLINE void turn(const char* in, i64 in_step, char* out, i64 out_step) {
    const hn::FixedTag<u32, 8> d32;
    const Longs d;
    LongVector pair[8], four[8];
    for (i64 i = 0; i < 8; i += 2) {
      const auto a = hn::LoadU(d32, reinterpret_cast<const u32*>(in + i * in_step));
      const auto b = hn::LoadU(d32, reinterpret_cast<const u32*>(in + (i + 1) * in_step));
      pair[i] = hn::BitCast(d, hn::InterleaveLower(d32, a, b));
      pair[i + 1] = hn::BitCast(d, hn::InterleaveUpper(d32, a, b));
    }
    // Columns 0, 1, 2 and 3 of four rows, each with the column four further on.
    for (i64 i = 0; i < 8; i += 4)
      for (i64 k = 0; k < 2; ++k) {
        four[i + 2 * k] = hn::InterleaveLower(d, pair[i + k], pair[i + 2 + k]);
        four[i + 2 * k + 1] = hn::InterleaveUpper(d, pair[i + k], pair[i + 2 + k]);
      }
    for (i64 i = 0; i < 4; ++i) {
      hn::StoreU(hn::ConcatLowerLower(d, four[4 + i], four[i]), d, reinterpret_cast<u64*>(out + i * out_step));
      hn::StoreU(hn::ConcatUpperUpper(d, four[4 + i], four[i]), d, reinterpret_cast<u64*>(out + (4 + i) * out_step));
    }
  }
};

template <class T>
void turn(const T* in, i64 in_step, i64 rows, i64 columns, T* out, i64 out_step) {
  constexpr i64 side = Square<T>::side, pixel = sizeof(T);
  const char* const from = reinterpret_cast<const char*>(in);
  char* const to = reinterpret_cast<char*>(out);
  const i64 whole_rows = rows / side * side, whole_columns = columns / side * side;
  for (i64 c = 0; c < whole_columns; c += side)
    for (i64 r = 0; r < whole_rows; r += side)
      Square<T>::turn(from + r * in_step + c * pixel, in_step, to + c * out_step + r * pixel, out_step);
  if (whole_columns < columns)
    turn_pixels(in + whole_columns, in_step, rows, columns - whole_columns,
                reinterpret_cast<T*>(to + whole_columns * out_step), out_step);
  if (whole_rows < rows)
    turn_pixels(reinterpret_cast<const T*>(from + whole_rows * in_step), in_step, rows - whole_rows, whole_columns,
                out + whole_rows, out_step);
}
template <class T>
TurnPixelsFunc<T>* turning() {
  return &turn<T>;
}
#else
template <class T>
TurnPixelsFunc<T>* turning() {
  return &turn_pixels<T>;
}
#endif
template TurnPixelsFunc<ZR_Pixel8>* turning<ZR_Pixel8>();
template TurnPixelsFunc<ZR_Pixel16>* turning<ZR_Pixel16>();

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class T>
TurnPixelsFunc<T>* pixel_turner() {
  ZR_RETURN_BEST(turning<T>());
  return &turn_pixels<T>;
}
template TurnPixelsFunc<ZR_Pixel8>* pixel_turner<ZR_Pixel8>();
template TurnPixelsFunc<ZR_Pixel16>* pixel_turner<ZR_Pixel16>();
// A pixel of floats is a vector anyway.
template <>
TurnPixelsFunc<ZR_PixelFloat>* pixel_turner<ZR_PixelFloat>() {
  return &turn_pixels<ZR_PixelFloat>;
}

}  // namespace zr
#endif
