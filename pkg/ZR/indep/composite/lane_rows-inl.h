// Row functions around one mode, of lanes.
#if defined(ZR_COMPOSITE_LANE_ROWS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_COMPOSITE_LANE_ROWS_INL_H
#undef ZR_COMPOSITE_LANE_ROWS_INL_H
#else
#define ZR_COMPOSITE_LANE_ROWS_INL_H
#endif

#include "composite/mode_kinds-inl.h"
#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// Modes that run as single numbers: their rows are no function of each pixel alone.
template <class Mode>
inline constexpr bool has_lanes = Mode::kind != ModeKind::row_only&& Mode::kind != ModeKind::copy;

// Modes that work on a whole colour want its channels apart.
template <class Mode, class T>
using PackOf = std::conditional_t<Mode::kind == ModeKind::colour || Mode::kind == ModeKind::alpha_only ||
                                      std::is_same_v<Mode, KeyProtect> || std::is_same_v<Mode, BlueThreshold>,
                                  Apart, AlikePack<T>>;

// The pixels of one vector; false when a channel is illegal, and then nothing is written. mask may be null.
template <class Mode, class T>
HWY_INLINE bool blend_lanes(typename ModeMath<T>::Wide opacity, bool opaque, bool keep_alpha, const T* src,
                            const T* mask, T* dst) {
  using M = ModeMath<T>;
  using Wide = typename M::Wide;
  using Pack = PackOf<Mode, T>;
  Px<M> s = Pack::template load<M>(src);
  if (!legal(s)) return false;
  Wide cover = M::white;
  if (mask != nullptr) {
    cover = Pack::template load<M>(mask).alpha;
    if (!legal_alpha<M>(cover)) return false;
  }
  const auto covered = [&](Wide c) HWY_ATTR {
    if (mask != nullptr) return M::covered(c, opacity, cover);
    return opaque ? c : M::mul(c, opacity);
  };
  if constexpr (scales_source<Mode>) s = scaled<M>(s, covered);
  const Wide A = scales_source<Mode> ? s.alpha : covered(s.alpha);
  const auto clear = A == 0;
  if (passes_clear<Mode> && all(clear)) return true;
  const Px<M> d = Pack::template load<M>(dst);
  if (!legal(d)) return false;
  Px<M> out = blend_in_row<Mode>(s, A, d);
  if (keep_alpha) out.alpha = d.alpha;
  if constexpr (passes_clear<Mode>) out = pick(clear, d, out);
  Pack::template store<M>(out, dst);
  return true;
}

// One function for rows with and without mask.
template <class T, class Mode>
i32 lane_row(i32 n, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables, const T* src, const T* mask,
             T* dst) {
  using M = ModeMath<T>;
  const auto single =
      (mask != nullptr ? zr::single_rows<T, true>() : zr::single_rows<T, false>())[Mode::number - first_mode];
  if (mode->opacity > M::white || runs_into(src, dst, n) || (mask != nullptr && runs_into(mask, dst, n)))
    return single(n, mode, tables, src, mask, dst);
  const typename M::Wide opacity = mode->opacity;
  const bool opaque = mode->opacity == M::white;
  const bool keep_alpha = Mode::kind == ModeKind::over && Mode::row_class == RowClass::plain && mode->keep_alpha != 0;
  each_block<PackOf<Mode, T>>(n, src, mask, dst, [&](const T* s, const T* m, T* d, i32 count) HWY_ATTR {
    if (!blend_lanes<Mode>(opacity, opaque, keep_alpha, s, m, d)) single(count, mode, tables, s, m, d);
  });
  return 0;
}
template <class T, class Mode>
i32 unmasked_lane_row(i32 n, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables, const T* src,
                      const T* /*mask*/, T* dst) {
  return lane_row<T, Mode>(n, mode, tables, src, nullptr, dst);
}

template <class T, bool masked>
const InnerRows<T>& lane_rows() {
  static const InnerRows<T> rows = [] {
    InnerRows<T> functions = zr::single_rows<T, masked>();
    for_each_mode([&]<class Mode>() {
      if constexpr (has_lanes<Mode>)
        functions[Mode::number - first_mode] = masked ? &lane_row<T, Mode> : &unmasked_lane_row<T, Mode>;
    });
    return functions;
  }();
  return rows;
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
