// Rows for viewers on lanes.
#include "copy/viewer_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "copy/lane_viewer_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "simd/lane_depth-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class T>
struct ViewerMath : Primitive<T> {
  using Wide = Number<T>;
};
using Shown = Px<ViewerMath<ZR_Pixel8>>;
constexpr i32 shown_white = ViewerMath<ZR_Pixel8>::white;

HWY_INLINE Ints shown(Ints c, ZR_Pixel8) { return c; }
HWY_INLINE Ints shown(Ints c, ZR_Pixel16) { return shifted_right<15>(c * shown_white + ViewerMath<ZR_Pixel16>::half); }
HWY_INLINE Ints shown(Floats c, ZR_PixelFloat) {
  return held(to_int(c * static_cast<f32>(shown_white) + 0.5f), 0, shown_white);
}

HWY_INLINE Bools<i32> as_ints(Bools<i32> b) { return b; }
HWY_INLINE Bools<i32> as_ints(Bools<f32> b) { return {hn::RebindMask(Tag<i32>(), b.mask)}; }

template <class T>
HWY_INLINE Px<ViewerMath<T>> everywhere(const T& p) {
  using Wide = Number<T>;
  const auto one = [](auto c) HWY_ATTR { return Wide(static_cast<typename Wide::Number>(c)); };
  return {one(p.alpha), one(p.red), one(p.green), one(p.blue)};
}

template <class T, ViewerStyle style>
HWY_INLINE Number<T> mixed(Number<T> c, Number<T> a, Number<T> ground, Number<T> strength) {
  using M = ViewerMath<T>;
  if constexpr (style == ViewerStyle::flat_black) return M::mul(c, a);
  if constexpr (style == ViewerStyle::tint) return c + M::smul(M::mul(strength, M::inv(a)), ground - c);
  return ground + M::smul(a, c - ground);
}

// The background of one style and order.
template <class T, ViewerStyle style>
struct Ground {
  using Pixels = Px<ViewerMath<T>>;
  explicit HWY_INLINE Ground(const ViewerGround& of)
      : first(everywhere(ground_colour<T>(of.first))),
        second(everywhere(ground_colour<T>(of.second))),
        bare_first(everywhere(of.first)),
        bare_second(everywhere(of.second)) {}
  Pixels first, second;
  Shown bare_first, bare_second;
};

// As many pixels as there are lanes, the first of them the i-th of its row.
template <class T, ViewerStyle style, bool reverse>
HWY_INLINE void show(const Px<ViewerMath<T>>& p, const ViewerGround& of, const Ground<T, style>& ground, i32 i,
                     ZR_Pixel8* dst) {
  using M = ViewerMath<T>;
  const Bools<i32> opaque = as_ints(p.alpha >= M::white);
  const Shown before = load<ViewerMath<ZR_Pixel8>>(dst);
  const Ints kept = reverse ? before.blue : before.alpha;
  Shown out = {reverse ? kept : Ints(shown_white), shown(p.red, T{}), shown(p.green, T{}), shown(p.blue, T{})};
  if (!all(opaque)) {
    constexpr bool shows_bare = style != ViewerStyle::tint;
    const Bools<i32> clear = as_ints(p.alpha == Number<T>(0));
    Bools<i32> odd = clear;
    if constexpr (style == ViewerStyle::checker) {
      const Ints x = hn::Iota(Tag<i32>(), static_cast<i32>(of.check_x + static_cast<u32>(i)));
      odd = masked(hn::Xor(x.v, Ints(static_cast<i32>(of.check_y)).v), 8) == 0;
    }
    const auto bare = [&]() HWY_ATTR {
      return style == ViewerStyle::checker ? pick(odd, ground.bare_second, ground.bare_first) : ground.bare_first;
    };
    Shown mix;
    if (shows_bare && all(clear)) {
      mix = bare();
    } else {
      Px<M> b = ground.first;
      if constexpr (style == ViewerStyle::checker)
        b = pick(Bools<typename Number<T>::Number>{hn::RebindMask(Tag<typename Number<T>::Number>(), odd.mask)},
                 ground.second, b);
      const auto one = [&](Number<T> c, Number<T> g)
                           HWY_ATTR { return shown(mixed<T, style>(c, p.alpha, g, ground.first.alpha), T{}); };
      mix = {kept, one(p.red, b.red), one(p.green, b.green), one(p.blue, b.blue)};
      if (shows_bare && !none(clear)) mix = pick(clear, bare(), mix);
    }
    out = pick(opaque, out, mix);
  }
  store(reverse ? Shown{out.blue, out.green, out.red, out.alpha} : out, dst);
}

template <class T, ViewerStyle style, bool reverse>
void row(i32 n, const ViewerGround& of, const T* src, ZR_Pixel8* dst) {
  constexpr i32 lanes = lane_count();
  const Ground<T, style> ground(of);
  const auto block = [&](const T* s, i32 i, i32 count, ZR_Pixel8* d) HWY_ATTR {
    const Px<ViewerMath<T>> p = load<ViewerMath<T>>(s);
    if (legal(p)) {
      show<T, style, reverse>(p, of, ground, i, d);
    } else {
      ViewerGround here = of;
      here.check_x += static_cast<u32>(i);
      single_viewer_row<T>(style, reverse)(count, here, s, d);
    }
  };
  i32 i = 0;
  for (; i <= n - lanes; i += lanes) block(src + i, i, lanes, dst + i);
  if (const auto rest = static_cast<size_t>(n > i ? n - i : 0); rest > 0) {
    T from[lanes] = {};
    ZR_Pixel8 to[lanes] = {};
    std::memcpy(from, src + i, rest * sizeof(T));
    std::memcpy(to, dst + i, rest * sizeof(ZR_Pixel8));
    block(from, i, n - i, to);
    std::memcpy(dst + i, to, rest * sizeof(ZR_Pixel8));
  }
}

template <class T>
ViewerRow<T> viewer_row_of_lanes(ViewerStyle style, bool reverse) {
  using S = ViewerStyle;
  static constexpr ViewerRow<T> rows[][2] = {{&row<T, S::checker, false>, &row<T, S::checker, true>},
                                             {&row<T, S::tint, false>, &row<T, S::tint, true>},
                                             {&row<T, S::flat, false>, &row<T, S::flat, true>},
                                             {&row<T, S::flat_black, false>, &row<T, S::flat_black, true>}};
  return rows[static_cast<int>(style)][reverse];
}
template ViewerRow<ZR_Pixel8> viewer_row_of_lanes<ZR_Pixel8>(ViewerStyle, bool);
template ViewerRow<ZR_Pixel16> viewer_row_of_lanes<ZR_Pixel16>(ViewerStyle, bool);
template ViewerRow<ZR_PixelFloat> viewer_row_of_lanes<ZR_PixelFloat>(ViewerStyle, bool);

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class T>
ViewerRow<T> lane_viewer_row([[maybe_unused]] ViewerStyle style, [[maybe_unused]] bool reverse) {
  ZR_RETURN_BEST(viewer_row_of_lanes<T>(style, reverse));
  return nullptr;
}
template ViewerRow<ZR_Pixel8> lane_viewer_row<ZR_Pixel8>(ViewerStyle, bool);
template ViewerRow<ZR_Pixel16> lane_viewer_row<ZR_Pixel16>(ViewerStyle, bool);
template ViewerRow<ZR_PixelFloat> lane_viewer_row<ZR_PixelFloat>(ViewerStyle, bool);

}  // namespace zr
#endif
