// The mix of two worlds by a ratio, straight and premultiplied.
#include <ZR/errors.h>
#include <ZR/world.h>

#include <algorithm>
#include <cstring>
#include <type_traits>

#include "world/guard.h"

namespace zr {
namespace {

constexpr i32 one = 0x10000;           // ratios are 16.16
constexpr f32 of_one = 1.5258789e-5f;  // 1 / one

// The integer in which alpha times ratio and sums with it are told. At 16 bits a product with a colour needs
// 64 bits; at 8 bits all sums stay below 2^32. Floats truncate their products to 32-bit integers.
template <class T>
using Weight = std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, i32,
                                  std::conditional_t<std::is_same_v<T, ZR_Pixel16>, u64, u32>>;

template <class T>
Weight<T> weigh(Channel<T> alpha, i32 ratio) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return truncate_i32(alpha * static_cast<f32>(ratio));
  else
    return static_cast<Weight<T>>(alpha) * static_cast<Weight<T>>(ratio);
}

// Two straight pixels; a colour that has no weight leaves the other as it is, the second where neither has.
template <class T>
struct Straight {
  static T mix(const T& first, const T& second, i32 w1, i32 w2) {
    const Weight<T> a1 = weigh<T>(first.alpha, w1), a2 = weigh<T>(second.alpha, w2);
    T out;
    if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
      // Two alphas far above white may wrap here.
      const f32 total = static_cast<f32>(wrap_add(a1, a2));
      const f32 f1 = static_cast<f32>(a1), f2 = static_cast<f32>(a2);
      const auto colour = [&](f32 c1, f32 c2) { return a1 == 0 ? c2 : a2 == 0 ? c1 : (c1 * f1 + c2 * f2) / total; };
      out = {of_one * total, colour(first.red, second.red), colour(first.green, second.green),
             colour(first.blue, second.blue)};
    } else {
      const Weight<T> total = a1 + a2;
      const auto colour = [&](Weight<T> c1, Weight<T> c2) {
        const Weight<T> c = a1 == 0 ? c2 : a2 == 0 ? c1 : (c1 * a1 + c2 * a2 + (total >> 1)) / total;
        return static_cast<Channel<T>>(c);
      };
      out = {static_cast<Channel<T>>((total + one / 2) >> 16), colour(first.red, second.red),
             colour(first.green, second.green), colour(first.blue, second.blue)};
    }
    return out;
  }
};

template <class T>
struct Premul {
  static T mix(const T& first, const T& second, i32 w1, i32 w2) {
    const auto channel = [&](Channel<T> c1, Channel<T> c2) -> Channel<T> {
      if constexpr (std::is_same_v<T, ZR_PixelFloat>)
        return (c1 * static_cast<f32>(w1) + c2 * static_cast<f32>(w2)) * of_one;
      else
        return static_cast<Channel<T>>((c1 * static_cast<u32>(w1) + c2 * static_cast<u32>(w2) + one / 2) >> 16);
    };
    return {channel(first.alpha, second.alpha), channel(first.red, second.red), channel(first.green, second.green),
            channel(first.blue, second.blue)};
  }
};

template <template <class> class Form>
i32 blend(ZR_LayerDef* first, ZR_LayerDef* second, i32 ratio, ZR_LayerDef* dst) {
  return guarded([&]() -> i32 {
    if (first == nullptr || second == nullptr || dst == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_BlendData);
    const i32 depth = ZRp_WorldDepth(dst);
    if (ZRp_WorldDepth(first) != depth || ZRp_WorldDepth(second) != depth)
      return failed_verification(ZR_Site_Blend, "ZR_BlendPremul requires src1, src2 and dst worlds to be same depth");
    return on_depth(depth, unknown_depth_text, [&]<class T>() -> i32 {
      if (first->width != dst->width || second->width != dst->width || first->height != dst->height ||
          second->height != dst->height)
        return failed_verification(ZR_Site_Blend, "ZR_Blend requires width and height of all worlds to be the same");
      if (first->data == nullptr || second->data == nullptr || dst->data == nullptr)
        return ZR_ReportBadCallbackParam(ZR_Site_BlendData);

      const ZR_WorldX<T> world1(first, false), world2(second, false), out(dst, false);
      const i32 w2 = std::clamp(ratio, 0, one), w1 = one - w2, width = std::max(dst->width, 0);
      for (i32 y = 0; y < dst->height; ++y) {
        const T *const row1 = world1.Row(y), *const row2 = world2.Row(y);
        T* const row = out.Row(y);
        if (w2 == 0 || w1 == 0)
          std::memmove(row, w2 == 0 ? row1 : row2, static_cast<size_t>(width) * sizeof(T));
        else
          for (i32 x = 0; x < width; ++x) row[x] = Form<T>::mix(row1[x], row2[x], w1, w2);
      }
      return ZR_Err_None;
    });
  });
}

}  // namespace
}  // namespace zr

i32 ZR_Blend(const ZR_ProgressInfo* /*progress*/, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio, ZR_LayerDef* dst) {
  return zr::blend<zr::Straight>(src1, src2, ratio, dst);
}

i32 ZR_Blend_Straight(const ZR_ProgressInfo* /*progress*/, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio,
                      ZR_LayerDef* dst) {
  return zr::blend<zr::Straight>(src1, src2, ratio, dst);
}

i32 ZR_Blend_Premul(const ZR_ProgressInfo* /*progress*/, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio,
                    ZR_LayerDef* dst) {
  return zr::blend<zr::Premul>(src1, src2, ratio, dst);
}
