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

// Pixel by pixel in reading order: where a mean falls between two values the roundings of the sum decide.
template <class T>
Lanes<f64> sum_of_box(const ZR_LayerDef& src, const BoxAxis& across, const BoxAxis& down) {
  Lanes<f64> sum = Lanes<f64>::all(0.0);
  const auto row = [&](i32 y, u32 height) {
    const auto pixels = [&](i32 first, i32 end, u32 width) {
      const f64 area = static_cast<f64>(static_cast<u64>(width) * height) * 0x1p-32;
      const T* const p = pixel_at<T>(src, 0, y);
      for (i32 x = first; x < end; ++x) sum = sum + area * weighted(p[x]);
    };
    across.walk([&](i32 x, u32 width) { pixels(x, x + 1, width); },
                [&](i32 first, i32 end) { pixels(first, end, 0x10000u); });
  };
  down.walk(row, [&](i32 first, i32 end) {
    for (i32 y = first; y < end; ++y) row(y, 0x10000u);
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

PixelRange boxes_inside(const SampleRun& run, const ZR_SampPB& params) {
  const ZR_LayerDef& src = *params.src;
  // No box reads the pixel behind it where all of them end with a whole one.
  const bool whole = ((run.step_x | (wrap_add(run.x, params.x_radius) ^ 32768)) & 0xffff) == 0;
  const i64 end = (std::min(src.width, 32767) - i64{1}) * 65536 + (whole ? 65536 : 0);
  // Turned rows: two pixels to the right of a box are read, and one below.
  const i64 turned_right = (std::min(src.width, 32767) - i64{2}) * 65536;
  const i64 turned_bottom = (std::min(src.height, 32767) - i64{1}) * 65536;
  const auto inside = [&](i32 i) {
    const i64 x = run.x + static_cast<i64>(i) * run.step_x + 32768;
    if (run.step_y == 0) return x >= params.x_radius && x + params.x_radius <= end;
    const i64 y = run.y + static_cast<i64>(i) * run.step_y + 32768;
    return x >= params.x_radius && x + params.x_radius <= turned_right && y >= params.y_radius &&
           y + params.y_radius <= turned_bottom;
  };
  PixelRange range = {0, run.count};
  if (src.data == nullptr || params.x_radius <= half_a_pixel || params.y_radius <= half_a_pixel) return {0, 0};
  while (range.first < range.end && !inside(range.first)) ++range.first;
  while (range.end > range.first && !inside(range.end - 1)) --range.end;
  return range;
}

template <class T, i32 quality>
i32 area_sample(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params, T* dst) {
  const bool thin = params->x_radius <= half_a_pixel || params->y_radius <= half_a_pixel;
  SampleFunc<T>* const point_sampler = thin ? sample_functions<T>(quality).clipping : nullptr;
  if (thin && point_sampler == nullptr) return ZR_Err_Internal;
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
