// Premultiply and unmultiply rows on lanes.
#include "world/lane_premul_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "world/lane_premul_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class T>
struct PixelMath : Primitive<T> {
  using Wide = Number<T>;
};

template <class T, bool back>
i32 row(i32 n, const T* src, T* dst) {
  using M = PixelMath<T>;
  using Wide = Number<T>;
  const PremulRows<T>& rows = single_premul_rows<T>();
  const auto idle = [](const Px<M>& p) HWY_ATTR { return all(p.alpha == M::white); };
  return change_row<AlikePack<T>, T, M>(
      n, src, dst, back ? rows.unmul : rows.premul, idle, [](const Px<M>& p) HWY_ATTR {
        const auto one = [&](Wide c) HWY_ATTR { return back ? M::div(c, p.alpha) : M::mul(c, p.alpha); };
        return Px<M>{p.alpha, one(p.red), one(p.green), one(p.blue)};
      });
}

template <class T>
const PremulRows<T>* premul_rows() {
  static constexpr PremulRows<T> rows = {&row<T, false>, &row<T, true>};
  return &rows;
}
template const PremulRows<ZR_Pixel8>* premul_rows<ZR_Pixel8>();
template const PremulRows<ZR_Pixel16>* premul_rows<ZR_Pixel16>();
template const PremulRows<ZR_PixelFloat>* premul_rows<ZR_PixelFloat>();

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class T>
const PremulRows<T>* lane_premul_rows() {
  ZR_RETURN_BEST(premul_rows<T>());
  return nullptr;
}
template const PremulRows<ZR_Pixel8>* lane_premul_rows<ZR_Pixel8>();
template const PremulRows<ZR_Pixel16>* lane_premul_rows<ZR_Pixel16>();
template const PremulRows<ZR_PixelFloat>* lane_premul_rows<ZR_PixelFloat>();

}  // namespace zr
#endif
