// The bell curve: its values, and tables of it.
#include <ZR/errors.h>
#include <ZR/filter.h>

#include <algorithm>
#include <cmath>

#include "filter/blur_limits.h"
#include "world/guard.h"

f64 ZRp_GaussianValue(f64 r) {
  if (r > 1.0) return 0.0;
  // 1.102 takes the curve down to almost 0 at 1.
  return 1.0 - (1.0 - std::exp(-2.378 * r * r)) * 1.102;
}

i32 ZR_GaussianKernel(void*, f64 radius, u8 kernel_flags, f64 multiplier, u32* diameter, i32* kernel) {
  const bool in_range = radius >= 0 && radius <= zr::bell_radius_limit;  // not so for NaN
  if (diameter == nullptr || kernel == nullptr || !in_range) return ZR_ReportBadCallbackParam(ZR_Site_GaussianKernel);
  const i64 reach = static_cast<i64>(std::ceil(radius)), columns = 2 * reach + 1;
  const i64 first_row = (kernel_flags & ZR_KernelFlag_OneRow) != 0 ? 0 : -reach;
  const f64 end = radius + 1;
  f64 sum = 0;
  i32* middle = kernel + reach;
  for (i64 v = first_row; v <= -first_row; ++v, middle += columns) {
    for (i64 u = 0; u <= reach; ++u) {
      f64 value = ZRp_GaussianValue(std::sqrt(static_cast<f64>(u * u + v * v)) / end) * 255;
      if (multiplier != 1.0) value *= multiplier;
      sum += value;
      if (u != 0) sum += value;
      middle[u] = middle[-u] = std::max(zr::truncate_i32(std::clamp(value + 0.5, 0.0, 255.0)), 0);
    }
  }
  const i64 cells = columns * (1 - 2 * first_row);
  if ((kernel_flags & ZR_KernelFlag_Normalised) != 0) {
    const f64 factor = static_cast<f64>(255 * cells) / sum;
    for (i64 i = 0; i < cells; ++i) kernel[i] = zr::truncate_i32(kernel[i] * factor);
  }
  *diameter = static_cast<u32>(columns);
  return ZR_Err_None;
}

i32 ZR_FastBlur_Straight(const ZR_ProgressInfo*, ZR_LayerDef*, f64, ZR_LayerDef*) { return ZR_Err_UnimplementedMode; }
i32 ZR_FastBlur_Premul(const ZR_ProgressInfo*, ZR_LayerDef*, f64, ZR_LayerDef*) { return ZR_Err_UnimplementedMode; }
