// Rows on and off a matte, on lanes.
#include "filter/matte_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "filter/lane_matte_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

struct MatteMath : Primitive<ZR_Pixel8> {
  using Wide = Ints;
};
using MattePx = Px<MatteMath>;

template <AlphaPlace place>
HWY_INLINE Ints alpha_of(const MattePx& p) {
  return place == AlphaPlace::first ? p.alpha : p.blue;
}
template <AlphaPlace place, class Change>
HWY_INLINE MattePx changed(const MattePx& p, const MattePx& matte, Change change) {
  if constexpr (place == AlphaPlace::first)
    return {p.alpha, change(p.red, matte.red), change(p.green, matte.green), change(p.blue, matte.blue)};
  else
    return {change(p.alpha, matte.alpha), change(p.red, matte.red), change(p.green, matte.green), p.blue};
}

template <AlphaPlace place>
i32 onto_black(i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  return change_row<Apart, ZR_Pixel8, MatteMath>(
      n, src, dst, single_matte_rows(place).onto_black,
      [](const MattePx& p) HWY_ATTR { return all(alpha_of<place>(p) == MatteMath::white); },
      [](const MattePx& p) HWY_ATTR {
        const Ints a = alpha_of<place>(p);
        return changed<place>(p, p, [a](Ints c, Ints) HWY_ATTR { return MatteMath::mul(c, a); });
      });
}

template <AlphaPlace place>
i32 off_black(i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  return change_row<Apart, ZR_Pixel8, MatteMath>(
      n, src, dst, single_matte_rows(place).off_black,
      [](const MattePx& p) HWY_ATTR { return all(alpha_of<place>(p) == MatteMath::white); },
      [](const MattePx& p) HWY_ATTR {
        const Ints a = alpha_of<place>(p);
        const Bools<i32> clear = a == 0;
        if (all(clear)) return MattePx{0, 0, 0, 0};
        return changed<place>(p, p, [&](Ints c, Ints) HWY_ATTR { return pick(clear, 0, MatteMath::div(c, a)); });
      });
}

template <AlphaPlace place, bool add>
void move_matte(i32 n, const ZR_Pixel8& colour, ZR_Pixel8* row) {
  const MattePx matte = {colour.alpha, colour.red, colour.green, colour.blue};
  each_block<Apart, ZR_Pixel8>(n, row, nullptr, row,
                               [&](const ZR_Pixel8* s, const ZR_Pixel8*, ZR_Pixel8* d, i32) HWY_ATTR {
                                 const MattePx p = load<MatteMath>(s);
                                 const Ints through = MatteMath::inv(alpha_of<place>(p));
                                 if (all(through == 0)) return;
                                 store(changed<place>(p, matte,
                                                      [&](Ints c, Ints m) HWY_ATTR {
                                                        const Ints shown = MatteMath::mul(m, through);
                                                        return add ? c + shown : c - shown;
                                                      }),
                                       d);
                               });
}

const MatteRows* matte_rows_of(AlphaPlace place) {
  constexpr AlphaPlace first = AlphaPlace::first, last = AlphaPlace::last;
  static constexpr MatteRows rows[] = {
      {&onto_black<first>, &off_black<first>, &move_matte<first, true>, &move_matte<first, false>},
      {&onto_black<last>, &off_black<last>, &move_matte<last, true>, &move_matte<last, false>}};
  return &rows[static_cast<int>(place)];
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

const MatteRows* lane_matte_rows([[maybe_unused]] AlphaPlace place) {
  ZR_RETURN_BEST(matte_rows_of(place));
  return nullptr;
}

}  // namespace zr
#endif
