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
ZR_ROWS_OF_DEPTHS(const PremulRows, premul_rows)

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_ROWS(const PremulRows, premul_rows)
#endif
