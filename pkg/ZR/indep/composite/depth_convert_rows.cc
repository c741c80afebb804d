// Rows between depths where floats are linear and integers stored, on lanes where the processor has them.
#include "composite/depth_convert_rows.h"

#include "composite/linear_light.h"
#include "world/depth_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "composite/depth_convert_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "composite/linear_lanes-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

constexpr f32 of_16_bits = 3.0517578e-5f;

HWY_INLINE Floats float_alpha(Ints a, ZR_Pixel8) { return to_float(a) * 0.003921569f; }
HWY_INLINE Floats float_alpha(Ints a, ZR_Pixel16) { return to_float(a) * of_16_bits; }

template <class From>
void depth_convert(i32 n, const From* src, ZR_PixelFloat* dst, const ZR_LinearBlendingTables& tables) {
  using M = PixelMath<From>;
  using Out = PixelMath<ZR_PixelFloat>;
  in_vectors(n, src, dst, [&](const From* from, ZR_PixelFloat* to) HWY_ATTR {
    const Px<M> p = load<M>(from);
    const auto one = [&](Ints v) HWY_ATTR {
      if constexpr (std::is_same_v<From, ZR_Pixel8>)
        return to_float(masked(entry_pair(tables.to_linear, v), 65535)) * of_16_bits;
      else
        return to_float(to_linear_16(v, tables.to_linear)) * of_16_bits;
    };
    store<Out>(Px<Out>{float_alpha(p.alpha, From{}), one(p.red), one(p.green), one(p.blue)}, to);
  });
}

template <class To>
void depth_convert(i32 n, const ZR_PixelFloat* src, To* dst, const ZR_LinearBlendingTables& tables) {
  using M = PixelMath<ZR_PixelFloat>;
  using Out = PixelMath<To>;
  constexpr f32 white = static_cast<f32>(Out::white), white_16 = 32768.0f;
  in_vectors(n, src, dst, [&](const ZR_PixelFloat* from, To* to) HWY_ATTR {
    const Px<M> p = load<M>(from);
    const auto one = [&](Floats c) HWY_ATTR {
      const Floats scaled = c * white_16;
      const Floats clamped = pick(scaled > 0.0f, Floats(hn::Min(scaled.v, Floats(white_16).v)), 0.0f);  // NaN is 0
      const Ints stored = from_linear_16(fitting_int(clamped + 0.5f), tables.from_linear);
      if constexpr (std::is_same_v<To, ZR_Pixel8>)
        return narrow_16_to_8(stored);
      else
        return stored;
    };
    const Ints alpha = to_int(p.alpha * white + 0.5f);  // stored in its low bits
    store<Out>(Px<Out>{alpha, one(p.red), one(p.green), one(p.blue)}, to);
  });
}

template void depth_convert(i32, const ZR_Pixel8*, ZR_PixelFloat*, const ZR_LinearBlendingTables&);
template void depth_convert(i32, const ZR_Pixel16*, ZR_PixelFloat*, const ZR_LinearBlendingTables&);
template void depth_convert(i32, const ZR_PixelFloat*, ZR_Pixel8*, const ZR_LinearBlendingTables&);
template void depth_convert(i32, const ZR_PixelFloat*, ZR_Pixel16*, const ZR_LinearBlendingTables&);

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {
namespace {

template <class To, class From>
Channel<To> single_colour(Channel<From> c, const ZR_LinearBlendingTables& tables) {
  if constexpr (std::is_same_v<From, ZR_Pixel8>) {
    return widen_16_to_float(tables.to_linear[c]);
  } else if constexpr (std::is_same_v<From, ZR_Pixel16>) {
    return widen_16_to_float(to_linear_16(c, tables));
  } else {
    const u16 stored = from_linear_16(narrow_float_colour<ZR_Pixel16>(c), tables);
    if constexpr (std::is_same_v<To, ZR_Pixel8>)
      return narrow_16_to_8(stored);
    else
      return stored;
  }
}

template <class To, class From>
Channel<To> single_alpha(Channel<From> a) {
  if constexpr (std::is_same_v<From, ZR_Pixel8>)
    return widen_8_to_float(a);
  else if constexpr (std::is_same_v<From, ZR_Pixel16>)
    return widen_16_to_float(a);
  else
    return narrow_float_alpha<To>(a);
}

}  // namespace

template <class To, class From>
void depth_convert_row(i32 n, const From* src, To* dst, const ZR_LinearBlendingTables& tables) {
  if constexpr (!std::is_same_v<To, ZR_PixelFloat> && !std::is_same_v<From, ZR_PixelFloat>) {
    convert_row(n, src, dst, false);
  } else {
    ZR_RETURN_BEST(depth_convert(n, src, dst, tables));
    for (i32 i = 0; i < n; ++i) {
      const From p = src[i];
      dst[i] = {single_alpha<To, From>(p.alpha), single_colour<To, From>(p.red, tables),
                single_colour<To, From>(p.green, tables), single_colour<To, From>(p.blue, tables)};
    }
  }
}

template void depth_convert_row(i32, const ZR_Pixel8*, ZR_Pixel16*, const ZR_LinearBlendingTables&);
template void depth_convert_row(i32, const ZR_Pixel8*, ZR_PixelFloat*, const ZR_LinearBlendingTables&);
template void depth_convert_row(i32, const ZR_Pixel16*, ZR_Pixel8*, const ZR_LinearBlendingTables&);
template void depth_convert_row(i32, const ZR_Pixel16*, ZR_PixelFloat*, const ZR_LinearBlendingTables&);
template void depth_convert_row(i32, const ZR_PixelFloat*, ZR_Pixel8*, const ZR_LinearBlendingTables&);
template void depth_convert_row(i32, const ZR_PixelFloat*, ZR_Pixel16*, const ZR_LinearBlendingTables&);

}  // namespace zr
#endif
