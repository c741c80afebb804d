// Rows into linear light and back, on lanes where the processor has them.
#include "composite/linear_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "composite/linear_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "composite/linear_lanes-inl.h"
#include "simd/power-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class T>
void to_row(i32 n, const T* src, ZR_Pixel16* dst, const ZR_LinearBlendingTables& tables) {
  using M = PixelMath<T>;
  using Out = PixelMath<ZR_Pixel16>;
  in_vectors(n, src, dst, [&](const T* from, ZR_Pixel16* to) HWY_ATTR {
    const Px<M> p = load<M>(from);
    if constexpr (std::is_same_v<T, ZR_Pixel8>) {
      const auto one = [&](Ints v) HWY_ATTR { return masked(entry_pair(tables.to_linear, v), 65535); };
      store<Out>(Px<Out>{widen_8_to_16(p.alpha), one(p.red), one(p.green), one(p.blue)}, to);
    } else {
      const auto one = [&](Ints v) HWY_ATTR { return to_linear_16(v, tables.to_linear); };
      store<Out>(Px<Out>{p.alpha, one(p.red), one(p.green), one(p.blue)}, to);
    }
  });
}

template <class T>
void from_row(i32 n, const ZR_Pixel16* src, T* dst, const ZR_LinearBlendingTables& tables) {
  using M = PixelMath<ZR_Pixel16>;
  using Out = PixelMath<T>;
  in_vectors(n, src, dst, [&](const ZR_Pixel16* from, T* to) HWY_ATTR {
    const Px<M> p = load<M>(from);
    const auto at_depth = [](Ints v) HWY_ATTR {
      if constexpr (std::is_same_v<T, ZR_Pixel8>)
        return narrow_16_to_8(v);
      else
        return v;
    };
    const auto one = [&](Ints v) HWY_ATTR { return at_depth(from_linear_16(v, tables.from_linear)); };
    store<Out>(Px<Out>{at_depth(p.alpha), one(p.red), one(p.green), one(p.blue)}, to);
  });
}

inline void power_row(i32 n, const ZR_PixelFloat* src, ZR_PixelFloat* dst, f32 exponent) {
  using M = PixelMath<ZR_PixelFloat>;
  const PowerExponent y(exponent);
  in_vectors(n, src, dst, [&](const ZR_PixelFloat* from, ZR_PixelFloat* to) HWY_ATTR {
    const Px<M> p = load<M>(from);
    store<M>(Px<M>{p.alpha, signed_power(p.red, y), signed_power(p.green, y), signed_power(p.blue, y)}, to);
  });
}

template void to_row(i32, const ZR_Pixel8*, ZR_Pixel16*, const ZR_LinearBlendingTables&);
template void to_row(i32, const ZR_Pixel16*, ZR_Pixel16*, const ZR_LinearBlendingTables&);
template void from_row(i32, const ZR_Pixel16*, ZR_Pixel8*, const ZR_LinearBlendingTables&);
template void from_row(i32, const ZR_Pixel16*, ZR_Pixel16*, const ZR_LinearBlendingTables&);

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

namespace {

// False where the row is not one for lanes.
bool power_row(i32 n, const ZR_PixelFloat* src, ZR_PixelFloat* dst, f32 exponent) {
  const auto lanes = [&]() -> void (*)(i32, const ZR_PixelFloat*, ZR_PixelFloat*, f32) {
    ZR_RETURN_BEST(power_row);
    return nullptr;
  }();
  if (lanes == nullptr || !has_power(exponent)) return false;
  lanes(n, src, dst, exponent);
  return true;
}

}  // namespace

template <class T>
void to_linear_row(i32 n, const T* src, Linear<T>* dst, const ZR_LinearBlendingTables& tables) {
  if constexpr (!std::is_same_v<T, ZR_PixelFloat>) {
    ZR_RETURN_BEST(to_row(n, src, dst, tables));
  } else {
    if (power_row(n, src, dst, tables.to_linear_gamma)) return;
  }
  for (i32 i = 0; i < n; ++i) dst[i] = to_linear(src[i], tables);
}
template <class T>
void from_linear_row(i32 n, const Linear<T>* src, T* dst, const ZR_LinearBlendingTables& tables) {
  if constexpr (!std::is_same_v<T, ZR_PixelFloat>) {
    ZR_RETURN_BEST(from_row(n, src, dst, tables));
  } else {
    if (power_row(n, src, dst, tables.from_linear_gamma)) return;
  }
  for (i32 i = 0; i < n; ++i) dst[i] = from_linear<T>(src[i], tables);
}
#define ZR_INSTANTIATE(T)                                                                    \
  template void to_linear_row<T>(i32, const T*, Linear<T>*, const ZR_LinearBlendingTables&); \
  template void from_linear_row<T>(i32, const Linear<T>*, T*, const ZR_LinearBlendingTables&);
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE

}  // namespace zr
#endif
