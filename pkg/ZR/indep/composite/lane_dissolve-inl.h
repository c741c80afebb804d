// Dissolving on lanes.
#if defined(ZR_COMPOSITE_LANE_DISSOLVE_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_COMPOSITE_LANE_DISSOLVE_INL_H
#undef ZR_COMPOSITE_LANE_DISSOLVE_INL_H
#else
#define ZR_COMPOSITE_LANE_DISSOLVE_INL_H
#endif

#include "composite/lane_lots-inl.h"
#include "composite/mode_kinds-inl.h"
#include "composite/row_overlap.h"
#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// Whether a pixel under the partial alpha A wins its lot.
template <class T>
HWY_INLINE auto dissolves(Ints lot, Number<T> A) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return to_float(lot) * 0x1p-15f < A;
  else if constexpr (std::is_same_v<T, ZR_Pixel8>)
    return masked(lot, 255) <= A;
  else
    return lot < A;
}

template <class N>
HWY_INLINE u32 bits_of_lanes(Bools<N> b) {
  u8 bytes[8] = {};
  hn::StoreMaskBits(Tag<N>(), b.mask, bytes);
  return static_cast<u32>(bytes[0]) | static_cast<u32>(bytes[1]) << 8;
}

// No channel need be legal: products are those of single numbers at any value.
template <class T>
i32 dissolve_row(i32 n, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables, const T* src,
                 const T* mask, T* dst) {
  using M = ModeMath<T>;
  using Wide = typename M::Wide;
  static_assert(lane_count() <= 16);
  if (runs_into(src, dst, n) || (mask != nullptr && runs_into(mask, dst, n)))
    return (mask != nullptr ? single_rows<T, true>() : single_rows<T, false>())[XferDissolve - first_mode](
        n, mode, tables, src, mask, dst);
  const Wide opacity = mode->opacity;
  const bool keep_alpha = mode->keep_alpha != 0;
  Lots lots(mode->seed);
  each_block<Apart>(n, src, mask, dst, [&](const T* from, const T* cover, T* to, i32 count) ZR_FORMULA {
    const Px<M> s = Apart::load<M>(from);
    const Wide A =
        cover != nullptr ? M::covered(s.alpha, opacity, Apart::load<M>(cover).alpha) : M::mul(s.alpha, opacity);
    const auto whole = A >= M::white, partial = A > 0 && A < M::white;
    auto wins = whole;
    if (none(partial))
      lots.skip(count);
    else
      wins = whole || (partial && dissolves<T>(lots.drawn(bits_of_lanes(partial), count), A));
    if (none(wins)) return;
    if (!keep_alpha && all(wins)) {
      Apart::store<M>(with_alpha<M>(s, M::white), to);
      return;
    }
    const Px<M> d = Apart::load<M>(to);
    Apart::store<M>(pick(wins, with_alpha<M>(s, keep_alpha ? d.alpha : M::white), d), to);
  });
  return 0;
}
template <class T>
i32 unmasked_dissolve_row(i32 n, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables, const T* src,
                          const T* /*mask*/, T* dst) {
  return dissolve_row<T>(n, mode, tables, src, nullptr, dst);
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
