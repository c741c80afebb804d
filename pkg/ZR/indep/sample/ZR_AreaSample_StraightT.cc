// Area samples of straight pixels, in three depths: colour is weighted by alpha and by area, in double
// precision.
#include "sample/ZR_AreaSample_StraightT.h"

#include <ZR/summed_area.h>

#include "sample/lanes.h"
#include "sample/sample_functions.h"

namespace zr {
namespace {

// Alpha in lane 0, alpha times colour in the others.
template <class T>
Lanes<f64> weighted(const T& p) {
  Lanes<f64> c = channels<f64>(p);
  const f64 alpha = c.alpha();
  c.set_alpha(1.0);
  return alpha * c;
}

// The sum of n pixels beside each other. Integer sums are exact, so their order does not matter.
template <class T>
Lanes<f64> sum_of(const T* p, i32 n) {
  Lanes<f64> sum = Lanes<f64>::all(0.0);
  for (i32 i = 0; i < n; ++i) sum = sum + weighted(p[i]);
  return sum;
}
template <>
Lanes<f64> sum_of(const ZR_Pixel8* p, i32 n) {
  u32 sum[4] = {};  // n is below 32768, a product at most 255 * 255
  for (i32 i = 0; i < n; ++i) {
    const u32 alpha = p[i].alpha;
    sum[0] += alpha, sum[1] += alpha * p[i].red, sum[2] += alpha * p[i].green, sum[3] += alpha * p[i].blue;
  }
  return {f64x2{static_cast<f64>(sum[0]), static_cast<f64>(sum[1])},
          f64x2{static_cast<f64>(sum[2]), static_cast<f64>(sum[3])}};
}

template <class T>
Lanes<f64> sum_of_box(const ZR_LayerDef& src, const BoxAxis& across, const BoxAxis& down) {
  Lanes<f64> sum = Lanes<f64>::all(0.0);
  const auto row = [&](i32 y, f64 height) {  // extents in pixels
    across.walk(
        [&](i32 x, u32 width) {
          sum = sum + (height * (static_cast<f64>(width) * 0x1p-16)) * weighted(*pixel_at<T>(src, x, y));
        },
        [&](i32 first, i32 end) {
          if (first < end) sum = sum + height * sum_of(pixel_at<T>(src, first, y), end - first);
        });
  };
  down.walk([&](i32 y, u32 height) { row(y, static_cast<f64>(height) * 0x1p-16); },
            [&](i32 first, i32 end) {
              for (i32 y = first; y < end; ++y) row(y, 1.0);
            });
  return sum;
}

// The sums over the box's area: alpha outside of the world has counted as 0.
template <class T>
T mean_of(const Lanes<f64>& sum, const ZR_SampPB& params) {
  constexpr f64 white = Depth<T>::white;
  constexpr bool is_float = std::is_same_v<T, ZR_PixelFloat>;
  const f64 total = sum.alpha();
  if (total == 0.0) return T{};
  const f64 mean = total * 0.25 / ((params.x_radius / 65536.0) * (params.y_radius / 65536.0));
  const f64 alpha = mean > white ? white : mean;
  if (alpha == 0.0) return T{};
  const f64 inverse = 1.0 / total;
  const auto store = [](f64 v) {
    if constexpr (is_float) {
      return static_cast<f32>(v);
    } else {
      const i32 whole = truncate_i32(v + 0.5);
      return static_cast<Channel<T>>(whole > Depth<T>::white ? Depth<T>::white : whole);
    }
  };
  return {store(alpha), store(sum.low[1] * inverse), store(sum.high[0] * inverse), store(sum.high[1] * inverse)};
}

}  // namespace

template <class T, i32 quality>
i32 area_sample(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, T* dst) {
  SampleFunc<T>* const point_sampler = sample_functions<T>(quality).clipping;
  if (point_sampler == nullptr) return ZR_Err_Internal;
  Lanes<f64> sum = Lanes<f64>::all(0.0);
  walk_box(
      x, y, *params,
      [&](i32 sample_x, i32 sample_y, i64 width, i64 height) {
        T p{};
        point_sampler(progress, sample_x, sample_y, params, &p);
        sum = sum + (static_cast<f64>(width) * static_cast<f64>(height) * 0x1p-32) * weighted(p);
      },
      [&](const BoxAxis& across, const BoxAxis& down) { sum = sum_of_box<T>(*params->src, across, down); });
  *dst = mean_of<T>(sum, *params);
  return ZR_Err_None;
}

}  // namespace zr

template <class T, i32 quality>
i32 ZR_AreaSample_CPlusPlus(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, T* dst) {
  return zr::area_sample<T, quality>(progress, x, y, params, dst);
}

#define ZR_INSTANTIATE(T, q)                                                                  \
  template i32 zr::area_sample<T, q>(const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, T*); \
  template ZR_API i32 ZR_AreaSample_CPlusPlus<T, q>(const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, T*);
ZR_INSTANTIATE(ZR_Pixel8, 1)
ZR_INSTANTIATE(ZR_Pixel8, 2)
ZR_INSTANTIATE(ZR_Pixel16, 1)
ZR_INSTANTIATE(ZR_Pixel16, 2)
ZR_INSTANTIATE(ZR_PixelFloat, 1)
ZR_INSTANTIATE(ZR_PixelFloat, 2)
#undef ZR_INSTANTIATE
