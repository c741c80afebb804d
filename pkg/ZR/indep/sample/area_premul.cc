// Area samples of premultiplied 8-bit pixels, in unsigned 32-bit integers that wrap.
#include "sample/ZR_AreaSample_StraightT.h"
#include "world/slot_table.h"

namespace {

// Sums of channels in 1/256.
struct Sums {
  u32 alpha = 0, red = 0, green = 0, blue = 0;

  // weight16: 16.16 of a pixel.
  void add(const ZR_Pixel8& p, i64 weight16) {
    const auto part = [weight16](u8 c) { return static_cast<u32>((c * weight16) >> 8); };
    alpha += part(p.alpha), red += part(p.red), green += part(p.green), blue += part(p.blue);
  }
};

void add_box(const ZR_LayerDef& src, const zr::BoxAxis& across, const zr::BoxAxis& down, Sums& sums) {
  const auto row = [&](i32 y, u32 height) {
    const auto pixels = [&](i32 first, i32 end, u32 width) {
      const i64 weight16 = static_cast<i64>((static_cast<u64>(width) * height) >> 16);
      for (const ZR_Pixel8* p = zr::pixel_at<ZR_Pixel8>(src, first, y); first < end; ++first) sums.add(*p++, weight16);
    };
    across.walk([&](i32 x, u32 width) { pixels(x, x + 1, width); },
                [&](i32 first, i32 end) { pixels(first, end, 0x10000u); });
  };
  down.walk(row, [&](i32 first, i32 end) {
    for (i32 y = first; y < end; ++y) row(y, 0x10000u);
  });
}

}  // namespace

extern "C" i32 ZR_AreaSample_Premul(const ZR_ProgressInfo* progress, i32 x, i32 y, const ZR_SampPB* params,
                                    ZR_Pixel8* dst) {
  auto* const point_sampler = zr::slot<ZR_Slot_bilinear_premul8>();
  if (point_sampler == nullptr) return ZR_Err_Internal;
  Sums sums;
  zr::walk_box(
      x, y, *params,
      [&](i32 sample_x, i32 sample_y, i64 width, i64 height) {
        ZR_Pixel8 p{};
        point_sampler(progress, sample_x, sample_y, params, &p);
        sums.add(p, width * height / 65536);
      },
      [&](const zr::BoxAxis& across, const zr::BoxAxis& down) { add_box(*params->src, across, down, sums); });

  const u32 divisor = static_cast<u32>(params->area >> 8) + (static_cast<u32>(params->area >> 7) & 1u);
  *dst = {};
  if (divisor == 0) return ZR_Err_None;
  const auto mean = [divisor](u32 sum) { return static_cast<u8>(std::min((sum + divisor / 2) / divisor, 255u)); };
  if (mean(sums.alpha) != 0) *dst = {mean(sums.alpha), mean(sums.red), mean(sums.green), mean(sums.blue)};
  return ZR_Err_None;
}
