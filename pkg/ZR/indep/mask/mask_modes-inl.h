// What each mode makes of a value of a mask and the value under it; compiled for single values and for lanes.
//
// M computes on values of one depth: mul, inv, difference, least, greatest, and `added`, which stops at white.
#include "simd/formulas.h"

ZR_BEGIN_FORMULAS

template <i32 mode, class M>
ZR_PURE typename M::Value combined(typename M::Value s, typename M::Value d) {
  if constexpr (mode == ZR_UnoMode_Erase) return M::mul(M::inv(s), d);
  if constexpr (mode == ZR_UnoMode_Intersect) return M::mul(s, d);
  if constexpr (mode == ZR_UnoMode_Lighten) return M::greatest(s, d);
  if constexpr (mode == ZR_UnoMode_Darken) return M::least(s, d);
  if constexpr (mode == ZR_UnoMode_Difference) return M::difference(s, d);
  if constexpr (mode == ZR_UnoMode_Add) return M::added(s, d);
  if constexpr (mode == ZR_UnoMode_Screen) return M::inv(M::mul(M::inv(s), M::inv(d)));
}

// Noise of the depth takes the place of the product's rounding.
template <class M>
ZR_PURE typename M::Value dithered(typename M::Value s, typename M::Value d, typename M::Value noise) {
  return M::inv(M::noisy_mul(M::inv(s), M::inv(d), noise));
}

ZR_END_FORMULAS
