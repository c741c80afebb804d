// Row functions around one mode, of lanes.
#if defined(ZR_COMPOSITE_LANE_ROWS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_COMPOSITE_LANE_ROWS_INL_H
#undef ZR_COMPOSITE_LANE_ROWS_INL_H
#else
#define ZR_COMPOSITE_LANE_ROWS_INL_H
#endif

#include "composite/lane_dissolve-inl.h"
#include "composite/lane_ground_rows.h"
#include "composite/lane_matte_mix-inl.h"
#include "composite/mode_kinds-inl.h"
#include "simd/lane_row-inl.h"
#include "world/lane_premul_rows.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// Modes of which a row is a function of each pixel alone.
template <class Mode>
inline constexpr bool has_lanes = Mode::kind != ModeKind::row_only&& Mode::kind != ModeKind::copy;

// What a mode computes with, and how its pixels lie: modes that work on a whole colour want its channels apart, and
// lumas want 32 bits. Where formulas are long the alpha's place among the colours costs more than telling them apart.
template <class Mode, class T>
struct Lanes {
  static constexpr bool whole_colour = Mode::kind == ModeKind::colour || Mode::kind == ModeKind::alpha_only;
  static constexpr bool narrow = std::is_same_v<T, ZR_Pixel8> && !whole_colour;
  static constexpr bool apart = whole_colour || std::is_same_v<Mode, KeyProtect> ||
                                std::is_same_v<Mode, BlueThreshold> || Mode::kind == ModeKind::grey_ground;
  using Math = ModeMath<std::conditional_t<narrow, NarrowPixel8, T>>;
  using Pack = std::conditional_t<narrow, Narrow, std::conditional_t<apart, ApartPack<T>, AlikePack<T>>>;
};

// The source of one vector of pixels, and what covers it.
template <class M>
struct Source {
  typename M::Wide opacity;
  bool opaque;  // opacity is white
  bool masked = false;
  Px<M> pixel{};
  typename M::Wide cover{};

  // False when a channel is illegal. mask may be null.
  template <class Pack, class T>
  HWY_INLINE bool load(const T* src, const T* mask) {
    pixel = Pack::template load<M>(src);
    if (!legal(pixel)) return false;
    masked = mask != nullptr;
    if (!masked) return true;
    cover = Pack::template load<M>(mask).alpha;
    return legal_alpha<M>(cover);
  }
  HWY_INLINE auto covered(typename M::Wide c) const {
    if (masked) return M::covered(c, opacity, cover);
    return opaque ? c : M::mul(c, opacity);
  }
};

// A count that fills whole vectors.
template <i32 count, class T>
HWY_INLINE void copy_pixels(const T* src, T* dst) {
  const Tag<u8> d;
  const auto* from = reinterpret_cast<const u8*>(src);
  auto* to = reinterpret_cast<u8*>(dst);
  for (std::size_t i = 0; i < count * sizeof(T); i += hn::Lanes(d)) hn::StoreU(hn::LoadU(d, from + i), d, to + i);
}

// The pixels of one vector; false when a channel is illegal, and then nothing is written. mask may be null.
template <class Mode, class T>
HWY_INLINE bool blend_lanes(Source<typename Lanes<Mode, T>::Math> source, bool keep_alpha, const T* src, const T* mask,
                            T* dst) {
  using M = typename Lanes<Mode, T>::Math;
  using Pack = typename Lanes<Mode, T>::Pack;
  using Wide = typename M::Wide;
  if (!source.template load<Pack>(src, mask)) return false;
  const auto covered = [&](Wide c) ZR_FORMULA { return source.covered(c); };
  const Px<M> s = scales_source<Mode> ? scaled<M>(source.pixel, covered) : source.pixel;
  const Wide A = scales_source<Mode> ? s.alpha : covered(s.alpha);
  const auto clear = A == 0;
  if (passes_clear<Mode> && all(clear)) return true;
  if (std::is_same_v<Mode, InFront> && all(A == M::white)) {  // what lies below is not looked at
    copy_pixels<Pack::pixels>(src, dst);
    return true;
  }
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
  using M = typename Lanes<Mode, T>::Math;
  const auto single =
      (mask != nullptr ? zr::single_rows<T, true>() : zr::single_rows<T, false>())[Mode::number - first_mode];
  if (mode->opacity > M::white || runs_into(src, dst, n) || (mask != nullptr && runs_into(mask, dst, n)))
    return single(n, mode, tables, src, mask, dst);
  const Source<M> source = {mode->opacity, mode->opacity == M::white};
  const bool keep_alpha = (Mode::kind == ModeKind::copy || Mode::kind == ModeKind::over) &&
                          Mode::row_class == RowClass::plain && mode->keep_alpha != 0;
  each_block<typename Lanes<Mode, T>::Pack>(n, src, mask, dst, [&](const T* s, const T* m, T* d, i32 count) ZR_FORMULA {
    if (!blend_lanes<Mode>(source, keep_alpha, s, m, d)) single(count, mode, tables, s, m, d);
  });
  return 0;
}
template <class T, class Mode>
i32 unmasked_lane_row(i32 n, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables, const T* src,
                      const T* /*mask*/, T* dst) {
  return lane_row<T, Mode>(n, mode, tables, src, nullptr, dst);
}

// Copies of whole pixels need no lanes.
template <class T, bool masked>
i32 copy_row(i32 n, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables, const T* src, const T* mask,
             T* dst) {
  const T* const cover = masked ? mask : nullptr;
  if (cover == nullptr && mode->keep_alpha == 0 && mode->opacity == Depth<T>::white)
    return single_rows<T, false>()[Copy::number - first_mode](n, mode, tables, src, nullptr, dst);
  return lane_row<T, Copy>(n, mode, tables, src, cover, dst);
}

template <class T, bool masked>
const InnerRows<T>& lane_rows() {
  static const InnerRows<T> rows = [] {
    InnerRows<T> functions = zr::single_rows<T, masked>();
    for_each_mode([&]<class Mode>() {
      if constexpr (has_lanes<Mode>)
        functions[Mode::number - first_mode] = masked ? &lane_row<T, Mode> : &unmasked_lane_row<T, Mode>;
    });
    functions[Copy::number - first_mode] = functions[CopyFast::number - first_mode] = &copy_row<T, masked>;
    functions[MatteMix::number - first_mode] = &matte_mix_row<T>;
    functions[Dissolve::number - first_mode] = masked ? &dissolve_row<T> : &unmasked_dissolve_row<T>;
    return functions;
  }();
  return rows;
}

// ------------------------------------------------------------------------------ ground modes in one pass

template <class Mode>
inline constexpr bool on_ground = Mode::row_class == RowClass::black_ground ||
                                  Mode::row_class == RowClass::white_ground || Mode::row_class == RowClass::grey_ground;

// The four passes of a row, of single numbers.
template <class T, class Mode>
i32 single_whole_row(i32 n, const ZR_BlendingMode<T>* mode, const T* src, const T* mask, T* dst) {
  const GroundRows<T>& rows = single_ground_rows<T>();
  const PremulRows<T>& black = single_premul_rows<T>();
  constexpr bool is_black = Mode::kind == ModeKind::black_ground, is_white = Mode::kind == ModeKind::white_ground;
  const auto main = (mask != nullptr ? single_rows<T, true>() : single_rows<T, false>())[Mode::number - first_mode];
  (is_black ? black.premul : is_white ? rows.white_fade : rows.grey_fade)(n, nullptr, dst);
  main(n, mode, nullptr, src, mask, dst);
  rows.union_alpha(n, src, mode->opacity, mask, dst);
  return (is_black ? black.unmul : is_white ? rows.white_unfade : rows.grey_unfade)(n, nullptr, dst);
}

// What the passes around the main function come to under a white alpha: nothing of integers and on a black ground.
// Other floats round on the way to the ground and back, those of a grey ground only below it, on the way back.
template <ModeKind ground, class N>
HWY_INLINE Lane<N> faded_by_white(Lane<N> c) {
  if constexpr (std::is_same_v<N, f32> && ground == ModeKind::white_ground)
    return 1.0f - (1.0f - c);
  else
    return c;
}
template <ModeKind ground, class N>
HWY_INLINE Lane<N> unfaded_by_white(Lane<N> c) {
  if constexpr (std::is_same_v<N, f32> && ground == ModeKind::grey_ground)
    return (c - 0.5f) + 0.5f;
  else
    return faded_by_white<ground>(c);
}
// Whether they come to no more than that.
template <ModeKind ground, class M>
HWY_INLINE bool passes_are_short(const Px<M>& d, typename M::Wide R) {
  if (!all(d.alpha == M::white)) return false;
  if constexpr (std::is_same_v<typename M::Wide, Floats>) {
    if (!all(R == M::white)) return false;
    if constexpr (ground == ModeKind::grey_ground) {
      const Floats sum = magnitude_of(d.red) + magnitude_of(d.green) + magnitude_of(d.blue);
      return all(sum < 0x1p23f);  // above, less a half rounds; no number is left out beside a NaN
    }
  }
  return true;
}

// All passes over the pixels of one vector; false when a channel is illegal, and then nothing is written. What a
// pass leaves is legal.
template <class Mode, class T>
HWY_INLINE bool blend_whole(Source<typename Lanes<Mode, T>::Math> source, const T* src, const T* mask, T* dst) {
  using M = typename Lanes<Mode, T>::Math;
  using Pack = typename Lanes<Mode, T>::Pack;
  using Wide = typename M::Wide;
  constexpr ModeKind ground = Mode::kind;
  constexpr bool passes_change_nothing = !std::is_same_v<T, ZR_PixelFloat> || ground == ModeKind::black_ground;
  if (!source.template load<Pack>(src, mask)) return false;
  const Px<M> d = Pack::template load<M>(dst);
  if (!legal(d)) return false;
  const Px<M>& s = source.pixel;
  const Wide A = source.covered(s.alpha), D = d.alpha;
  const auto clear = A == 0;
  const auto main = [&](const Px<M>& onto) ZR_FORMULA { return pick(clear, onto, blend_in_row<Mode>(s, A, onto)); };
  const auto each = [](const Px<M>& p, auto change) ZR_FORMULA {
    return Px<M>{p.alpha, change(p.red), change(p.green), change(p.blue)};
  };
  // The union weighs the mask behind the opacity at every depth.
  const Wide weight = source.opaque ? s.alpha : M::mul(s.alpha, source.opacity);
  const Wide R = M::inv(M::mul(M::inv(D), M::inv(source.masked ? M::mul(source.cover, weight) : weight)));
  if (passes_are_short<ground>(d, R)) {
    if (passes_change_nothing && all(clear)) return true;
    const Px<M> out = main(each(d, [](Wide c) ZR_FORMULA { return faded_by_white<ground>(c); }));
    Pack::template store<M>(each(out, [](Wide c) ZR_FORMULA { return unfaded_by_white<ground>(c); }), dst);
    return true;
  }
  const Px<M> blended = main(each(d, [&](Wide c) ZR_FORMULA { return faded<M, ground>(c, D); }));
  const auto over = divisor_of<M>(R);
  const Px<M> out = each(blended, [&](Wide c) ZR_FORMULA { return M::stored(unfaded<M, ground>(c, over)); });
  Pack::template store<M>(with_alpha<M>(out, R), dst);
  return true;
}

template <class T, class Mode>
i32 whole_row(i32 n, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables*, const T* src, const T* mask,
              T* dst) {
  using M = typename Lanes<Mode, T>::Math;
  if (mode->opacity > M::white) return single_whole_row<T, Mode>(n, mode, src, mask, dst);
  const Source<M> source = {mode->opacity, mode->opacity == M::white};
  each_block<typename Lanes<Mode, T>::Pack>(n, src, mask, dst, [&](const T* s, const T* m, T* d, i32 count) ZR_FORMULA {
    if (!blend_whole<Mode>(source, s, m, d)) single_whole_row<T, Mode>(count, mode, s, m, d);
  });
  return 0;
}

template <class T>
const InnerRows<T>* lane_whole_rows() {
  static constexpr InnerRows<T> rows = [] {
    InnerRows<T> functions{};
    for_each_mode([&]<class Mode>() {
      if constexpr (on_ground<Mode>) functions[Mode::number - first_mode] = &whole_row<T, Mode>;
    });
    return functions;
  }();
  return &rows;
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
