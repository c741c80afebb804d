// Bodies of the ground rows, for three depths.
#include "composite/ground_rows.h"

#include "composite/lane_ground_rows.h"
#include "composite/mode_kinds-inl.h"

namespace zr {
namespace {

template <class T, class Change>
i32 each_pixel(i32 n, const T* src, T* dst, Change&& change) {
  const T* from = src != nullptr ? src : dst;
  for (i32 i = 0; i < n; ++i) {
    const T p = from[i];
    const Wide<T> a = p.alpha;
    dst[i] = {p.alpha, static_cast<Channel<T>>(change(p.red, a)), static_cast<Channel<T>>(change(p.green, a)),
              static_cast<Channel<T>>(change(p.blue, a))};
  }
  return 0;
}

template <class T, ModeKind ground>
i32 fade_row(i32 n, const T* src, T* dst) {
  return each_pixel(n, src, dst, [](Wide<T> c, Wide<T> a) { return faded<ModeMath<T>, ground>(c, a); });
}
template <class T, ModeKind ground>
i32 unfade_row(i32 n, const T* src, T* dst) {
  using M = ModeMath<T>;
  return each_pixel(n, src, dst, [](Wide<T> c, Wide<T> a) { return unfaded<M, ground>(c, divisor_of<M>(a)); });
}

template <class T>
i32 union_row(i32 n, const T* src, Channel<T> opacity, const T* mask, T* dst) {
  using M = ModeMath<T>;
  if (std::is_same_v<T, ZR_Pixel8> && opacity == 0) return 0;
  for (i32 i = 0; i < n; ++i) {
    Wide<T> A = M::mul(src[i].alpha, opacity);
    if (mask != nullptr) A = M::mul(mask[i].alpha, A);  // at every depth in this order
    dst[i].alpha = static_cast<Channel<T>>(M::inv(M::mul(M::inv(dst[i].alpha), M::inv(A))));
  }
  return 0;
}

template <class T>
const GroundRows<T>& best_rows() {
  const GroundRows<T>* const lanes = lane_ground_rows<T>();
  return lanes != nullptr ? *lanes : single_ground_rows<T>();
}

}  // namespace

template <class T>
const GroundRows<T>& single_ground_rows() {
  static constexpr GroundRows<T> rows = {&fade_row<T, ModeKind::white_ground>, &unfade_row<T, ModeKind::white_ground>,
                                         &fade_row<T, ModeKind::grey_ground>, &unfade_row<T, ModeKind::grey_ground>,
                                         &union_row<T>};
  return rows;
}

template <class T>
i32 white_fade_row(i32 n, const T* src, T* dst) {
  return best_rows<T>().white_fade(n, src, dst);
}
template <class T>
i32 white_unfade_row(i32 n, const T* src, T* dst) {
  return best_rows<T>().white_unfade(n, src, dst);
}
template <class T>
i32 grey_fade_row(i32 n, const T* src, T* dst) {
  return best_rows<T>().grey_fade(n, src, dst);
}
template <class T>
i32 grey_unfade_row(i32 n, const T* src, T* dst) {
  return best_rows<T>().grey_unfade(n, src, dst);
}
template <class T>
i32 union_alpha_row(i32 n, const T* src, Channel<T> opacity, const T* mask, T* dst) {
  return best_rows<T>().union_alpha(n, src, opacity, mask, dst);
}

#define ZR_INSTANTIATE(T)                                \
  template const GroundRows<T>& single_ground_rows<T>(); \
  template i32 white_fade_row<T>(i32, const T*, T*);     \
  template i32 white_unfade_row<T>(i32, const T*, T*);   \
  template i32 grey_fade_row<T>(i32, const T*, T*);      \
  template i32 grey_unfade_row<T>(i32, const T*, T*);    \
  template i32 union_alpha_row<T>(i32, const T*, Channel<T>, const T*, T*);
ZR_INSTANTIATE(ZR_Pixel8)
ZR_INSTANTIATE(ZR_Pixel16)
ZR_INSTANTIATE(ZR_PixelFloat)
#undef ZR_INSTANTIATE

}  // namespace zr
