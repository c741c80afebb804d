// Rows for viewers by single numbers.
#include "copy/viewer_rows.h"

namespace zr {
namespace {

template <class T>
u8 shown(Wide<T> c) {
  if constexpr (std::is_same_v<T, ZR_Pixel8>)
    return static_cast<u8>(c);
  else if constexpr (std::is_same_v<T, ZR_Pixel16>)
    return narrow_16_to_8(static_cast<u16>(c));
  else
    return static_cast<u8>(
        std::clamp(truncate_i32(c * static_cast<f32>(Depth<ZR_Pixel8>::white) + Depth<T>::half), 0, 255));
}

template <class T, ViewerStyle style>
Wide<T> mixed(Wide<T> c, Wide<T> a, Wide<T> ground, Wide<T> strength) {
  using D = Depth<T>;
  const auto sum = [](Wide<T> base, Wide<T> more) {
    if constexpr (std::is_same_v<T, ZR_PixelFloat>)
      return base + more;
    else
      return wrap_add(base, more);
  };
  if constexpr (style == ViewerStyle::flat_black) return D::mul(c, a);
  if constexpr (style == ViewerStyle::tint) return sum(c, D::smul(D::mul(strength, D::inv(a)), ground - c));
  return sum(ground, D::smul(a, c - ground));
}

template <bool reverse>
ZR_Pixel8 ordered(u8 alpha, u8 red, u8 green, u8 blue) {
  if constexpr (reverse)
    return {blue, green, red, alpha};
  else
    return {alpha, red, green, blue};
}

template <class T, ViewerStyle style, bool reverse>
void row(i32 n, const ViewerGround& ground, const T* src, ZR_Pixel8* dst) {
  constexpr bool bare = style != ViewerStyle::tint;  // the background itself shows under alpha 0
  const T first = ground_colour<T>(ground.first), second = ground_colour<T>(ground.second);
  for (i32 i = 0; i < n; ++i) {
    const T p = src[i];
    const u8 kept = reverse ? dst[i].blue : dst[i].alpha;
    const bool odd = style == ViewerStyle::checker && !ground.shows_first(i);
    if (p.alpha >= Depth<T>::white) {
      const u8 alpha = reverse ? kept : static_cast<u8>(Depth<ZR_Pixel8>::white);
      dst[i] = ordered<reverse>(alpha, shown<T>(p.red), shown<T>(p.green), shown<T>(p.blue));
    } else if (bare && p.alpha == 0) {
      const ZR_Pixel8& b = odd ? ground.second : ground.first;
      dst[i] = ordered<reverse>(b.alpha, b.red, b.green, b.blue);
    } else {
      const T& b = odd ? second : first;
      const auto one = [&](Wide<T> c, Wide<T> g) { return shown<T>(mixed<T, style>(c, p.alpha, g, first.alpha)); };
      dst[i] = ordered<reverse>(kept, one(p.red, b.red), one(p.green, b.green), one(p.blue, b.blue));
    }
  }
}

}  // namespace

template <class T>
ViewerRow<T> single_viewer_row(ViewerStyle style, bool reverse) {
  using S = ViewerStyle;
  static constexpr ViewerRow<T> rows[][2] = {{&row<T, S::checker, false>, &row<T, S::checker, true>},
                                             {&row<T, S::tint, false>, &row<T, S::tint, true>},
                                             {&row<T, S::flat, false>, &row<T, S::flat, true>},
                                             {&row<T, S::flat_black, false>, &row<T, S::flat_black, true>}};
  return rows[static_cast<int>(style)][reverse];
}

template <class T>
ViewerRow<T> viewer_row(ViewerStyle style, bool reverse) {
  const ViewerRow<T> lanes = lane_viewer_row<T>(style, reverse);
  return lanes != nullptr ? lanes : single_viewer_row<T>(style, reverse);
}

template ViewerRow<ZR_Pixel8> single_viewer_row<ZR_Pixel8>(ViewerStyle, bool);
template ViewerRow<ZR_Pixel16> single_viewer_row<ZR_Pixel16>(ViewerStyle, bool);
template ViewerRow<ZR_PixelFloat> single_viewer_row<ZR_PixelFloat>(ViewerStyle, bool);
template ViewerRow<ZR_Pixel8> viewer_row<ZR_Pixel8>(ViewerStyle, bool);
template ViewerRow<ZR_Pixel16> viewer_row<ZR_Pixel16>(ViewerStyle, bool);
template ViewerRow<ZR_PixelFloat> viewer_row<ZR_PixelFloat>(ViewerStyle, bool);

}  // namespace zr
