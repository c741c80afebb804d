// Rows on and off a matte, by single numbers.
#include "filter/matte_rows.h"

#include <ZR/depth.h>

namespace zr {
namespace {

using D = Depth<ZR_Pixel8>;

template <AlphaPlace place>
u8 alpha_of(const ZR_Pixel8& p) {
  return place == AlphaPlace::first ? p.alpha : p.blue;
}
// change(colour, matte's colour) for the three colours.
template <AlphaPlace place, class Change>
ZR_Pixel8 changed(const ZR_Pixel8& p, const ZR_Pixel8& matte, Change change) {
  const auto one = [&](u8 c, u8 m) { return static_cast<u8>(change(c, m)); };
  if constexpr (place == AlphaPlace::first)
    return {p.alpha, one(p.red, matte.red), one(p.green, matte.green), one(p.blue, matte.blue)};
  else
    return {one(p.alpha, matte.alpha), one(p.red, matte.red), one(p.green, matte.green), p.blue};
}

template <AlphaPlace place>
i32 onto_black(i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  const ZR_Pixel8* const in = src != nullptr ? src : dst;
  for (i32 i = 0; i < n; ++i)
    dst[i] = changed<place>(in[i], {}, [a = alpha_of<place>(in[i])](i32 c, i32) { return D::mul(c, a); });
  return 0;
}

template <AlphaPlace place>
i32 off_black(i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  const ZR_Pixel8* const in = src != nullptr ? src : dst;
  for (i32 i = 0; i < n; ++i) {
    const u8 a = alpha_of<place>(in[i]);
    dst[i] = a == 0 ? ZR_Pixel8{} : changed<place>(in[i], {}, [a](i32 c, i32) { return D::div(c, a); });
  }
  return 0;
}

template <AlphaPlace place, bool add>
void move_matte(i32 n, const ZR_Pixel8& matte, ZR_Pixel8* row) {
  for (i32 i = 0; i < n; ++i) {
    const i32 through = D::inv(alpha_of<place>(row[i]));
    row[i] = changed<place>(row[i], matte,
                            [through](i32 c, i32 m) { return add ? c + D::mul(m, through) : c - D::mul(m, through); });
  }
}

template <AlphaPlace place>
constexpr MatteRows rows = {&onto_black<place>, &off_black<place>, &move_matte<place, true>, &move_matte<place, false>};

}  // namespace

const MatteRows& single_matte_rows(AlphaPlace place) {
  return place == AlphaPlace::first ? rows<AlphaPlace::first> : rows<AlphaPlace::last>;
}

const MatteRows& matte_rows(AlphaPlace place) {
  const MatteRows* const lanes = lane_matte_rows(place);
  return lanes != nullptr ? *lanes : single_matte_rows(place);
}

}  // namespace zr
