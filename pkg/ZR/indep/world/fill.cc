// ZR_Fill and its siblings: the three share one road for all colour and world depths.
#include <ZR/depth.h>
#include <ZR/errors.h>
#include <ZR/world.h>

#include <algorithm>
#include <cstring>
#include <utility>

#include "world/guard.h"
#include "world/pixel_rows.h"
#include "world/row_bands.h"

namespace zr {
namespace {

// One side of the rectangle: in order, and each end clamped to the world on its own.
std::pair<i32, i32> ordered_and_clamped(i32 a, i32 b, i32 limit) {
  const auto clamped = [limit](i32 v) { return v < 0 ? 0 : std::min(v, limit); };
  return {clamped(std::min(a, b)), clamped(std::max(a, b))};
}

template <class T>
bool is_all_zero_bits(const T& pixel) {
  constexpr T zero = {};
  return std::memcmp(&pixel, &zero, sizeof(T)) == 0;  // so not -0
}

template <class T>
void fill_rows(const ZR_WorldX<T>& world, const T& pixel, const GX_LRect* rect) {
  std::pair<i32, i32> across = {0, world.width}, down = {0, world.height};
  if (rect != nullptr) {
    across = ordered_and_clamped(rect->left, rect->right, world.width);
    down = ordered_and_clamped(rect->top, rect->bottom, world.height);
  }
  const i32 columns = across.second - across.first;
  if (columns <= 0) return;
  const bool clears = is_all_zero_bits(pixel);
  each_row(down.first, down.second, columns, sizeof(T), [&](i32 y) {
    T* const row = world.At(across.first, y);
    if (clears)
      clear_row(row, columns);
    else
      fill_row(row, columns, pixel);
  });
}

template <class Colour>
i32 fill(const char* unknown_depth, const Colour* colour, const GX_LRect* rect, ZR_LayerDef* layer) {
  return guarded([&] {
    if (layer == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_Fill);
    return on_depth(ZRp_WorldDepth(layer), unknown_depth, [&]<class T> {
      const T pixel = colour != nullptr ? convert_colour<T>(*colour) : T{};
      const ZR_WorldX<T> world(layer, true);
      if (world.data == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_Fill);
      fill_rows(world, pixel, rect);
      return static_cast<i32>(ZR_Err_None);
    });
  });
}

}  // namespace
}  // namespace zr

extern "C" {

i32 ZR_Fill(void* /*ref*/, const ZR_Pixel8* colour, const GX_LRect* rect, ZR_LayerDef* world) {
  return zr::fill("Unknown world bitdepth in ZR_Fill", colour, rect, world);
}
i32 ZR_Fill16(void* /*ref*/, const ZR_Pixel16* colour, const GX_LRect* rect, ZR_LayerDef* world) {
  return zr::fill("Unknown world bitdepth in ZR_Fill16", colour, rect, world);
}
i32 ZR_FillFloat(void* /*ref*/, const ZR_PixelFloat* colour, const GX_LRect* rect, ZR_LayerDef* world) {
  return zr::fill("Unknown world bitdepth in ZR_FillFloat", colour, rect, world);
}

}  // extern "C"
