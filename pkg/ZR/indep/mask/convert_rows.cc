// Rows of mask values between depths: plain loops in the shape that compilers vectorise, compiled once for each
// instruction set.
#include "mask/convert_rows.h"

#include "mask/mask_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "mask/convert_rows.cc"
#include <hwy/foreach_target.h>
#include <hwy/highway.h>

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class To, class From>
void convert(i32 n, const From* __restrict src, To* __restrict dst) {
  for (i32 i = 0; i < n; ++i) {
    if constexpr (std::is_same_v<From, u8> && std::is_same_v<To, u16>)
      dst[i] = widen_8_to_16(src[i]);
    else if constexpr (std::is_same_v<From, u8>)
      dst[i] = widen_8_to_float(src[i]);
    else if constexpr (std::is_same_v<To, u8>)
      dst[i] = narrow_16_to_8(src[i]);
    else
      dst[i] = widen_16_to_float(src[i]);
  }
}
template void convert(i32, const u8*, u16*);
template void convert(i32, const u8*, f32*);
template void convert(i32, const u16*, u8*);
template void convert(i32, const u16*, f32*);

// A divisor that the compiler knows, or any other.
template <i32 known, class To>
void divide_by(i32 n, i32 divisor, const u16* src, To* dst) {
  const i32 by = known != 0 ? known : divisor, half = by >> 1;
  for (i32 i = 0; i < n; ++i) dst[i] = static_cast<To>((src[i] + half) / by);
}

template <class To>
void divide(i32 n, i32 divisor, const u16* src, To* dst) {
  if constexpr (std::is_same_v<To, f32>) {
    const f32 factor = 1.0f / static_cast<f32>(divisor);
    for (i32 i = 0; i < n; ++i) dst[i] = static_cast<f32>(src[i]) * factor;
  } else {
    switch (divisor) {
      case 1: return divide_by<1>(n, divisor, src, dst);
      case 4: return divide_by<4>(n, divisor, src, dst);
      case 8: return divide_by<8>(n, divisor, src, dst);
      case 16: return divide_by<16>(n, divisor, src, dst);
      default: return divide_by<0>(n, divisor, src, dst);
    }
  }
}
template void divide(i32, i32, const u16*, u8*);
template void divide(i32, i32, const u16*, u16*);
template void divide(i32, i32, const u16*, f32*);

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class To, class From>
void convert_mask_row(i32 n, const From* src, To* dst) {
  ZR_RETURN_BEST(convert(n, src, dst));
  HWY_STATIC_DISPATCH(convert)(n, src, dst);
}
template void convert_mask_row(i32, const u8*, u16*);
template void convert_mask_row(i32, const u8*, f32*);
template void convert_mask_row(i32, const u16*, u8*);
template void convert_mask_row(i32, const u16*, f32*);

template <class To>
i32 divide_mask_row(i32 n, i32 divisor, const u16* src, To* dst) {
  const auto divided = [&] {
    ZR_RETURN_BEST(divide(n, divisor, src, dst));
    HWY_STATIC_DISPATCH(divide)(n, divisor, src, dst);
  };
  divided();
  return ZR_Err_None;
}
template i32 divide_mask_row(i32, i32, const u16*, u8*);
template i32 divide_mask_row(i32, i32, const u16*, u16*);
template i32 divide_mask_row(i32, i32, const u16*, f32*);

}  // namespace zr
#endif
