// Bodies of the ground rows on lanes.
#include "composite/lane_ground_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "composite/lane_ground_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "composite/mode_kinds-inl.h"
#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class T, ModeKind ground, bool back>
i32 ground_row(i32 n, const T* src, T* dst) {
  using M = ModeMath<T>;
  using Pack = AlikePack<T>;
  using Wide = typename M::Wide;
  const GroundRows<T>& rows = single_ground_rows<T>();
  const auto single = ground == ModeKind::white_ground ? (back ? rows.white_unfade : rows.white_fade)
                                                       : (back ? rows.grey_unfade : rows.grey_fade);
  // Floats go through a subtraction and back, which rounds.
  const auto idle = [](const Px<M>& p) HWY_ATTR { return std::is_same_v<Wide, Ints> && all(p.alpha == M::white); };
  return change_row<Pack, T, M>(n, src, dst, single, idle, [](const Px<M>& p) HWY_ATTR {
    const auto over = divisor_of<M>(p.alpha);
    const auto one = [&](Wide c) HWY_ATTR {
      if constexpr (back)
        return M::stored(unfaded<M, ground>(c, over));
      else
        return faded<M, ground>(c, p.alpha);
    };
    return Px<M>{p.alpha, one(p.red), one(p.green), one(p.blue)};
  });
}

template <class T>
i32 union_row(i32 n, const T* src, Channel<T> opacity, const T* mask, T* dst) {
  using M = ModeMath<T>;
  using Pack = AlikePack<T>;
  using Wide = typename M::Wide;
  const auto single = single_ground_rows<T>().union_alpha;
  if (opacity > M::white || runs_into(src, dst, n) || (mask != nullptr && runs_into(mask, dst, n)))
    return single(n, src, opacity, mask, dst);
  if (std::is_same_v<T, ZR_Pixel8> && opacity == 0) return 0;
  const bool opaque = opacity == M::white;
  const Wide factor = opacity;
  each_block<Pack>(n, src, mask, dst, [&](const T* s, const T* m, T* d, i32 count) HWY_ATTR {
    const Px<M> onto = Pack::template load<M>(d);
    Wide A = Pack::template load<M>(s).alpha, cover = M::white;
    if (m != nullptr) cover = Pack::template load<M>(m).alpha;
    if (!legal(onto) || !legal_alpha<M>(A) || !legal_alpha<M>(cover)) {
      single(count, s, opacity, m, d);
      return;
    }
    if (std::is_same_v<Wide, Ints> && all(onto.alpha == M::white)) return;
    if (!opaque) A = M::mul(A, factor);
    if (m != nullptr) A = M::mul(cover, A);
    Pack::template store<M>(with_alpha<M>(onto, M::inv(M::mul(M::inv(onto.alpha), M::inv(A)))), d);
  });
  return 0;
}

template <class T>
const GroundRows<T>* ground_rows() {
  static constexpr GroundRows<T> rows = {
      &ground_row<T, ModeKind::white_ground, false>, &ground_row<T, ModeKind::white_ground, true>,
      &ground_row<T, ModeKind::grey_ground, false>, &ground_row<T, ModeKind::grey_ground, true>, &union_row<T>};
  return &rows;
}
ZR_ROWS_OF_DEPTHS(const GroundRows, ground_rows)

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_ROWS(const GroundRows, ground_rows)
#endif
