// Zeroes the alpha of everything but a rectangle.
#include <ZR/errors.h>
#include <ZR/world.h>

#include <algorithm>

#include "world/alpha_rows.h"
#include "world/guard.h"

namespace {

template <class T>
void clear_alpha(i32 left, i32 right, T* row) {
  if (right > left) zr::fill_alpha_row<T>(row + left, right - left, 0);
}

}  // namespace

i32 ZR_ClearAlphaExceptRect(const ZR_ProgressInfo* /*progress*/, const GX_LRect* rect, ZR_LayerDef* world) {
  return zr::guarded([&]() -> i32 {
    if (rect == nullptr || world == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_ClearAlpha);
    return zr::on_depth(ZRp_WorldDepth(world), zr::unknown_depth_text, [&]<class T>() -> i32 {
      const i32 width = world->width, height = world->height;
      if (width < 1 || height < 1) return ZR_Err_None;
      GX_LRect kept = {std::max(rect->left, 0), std::max(rect->top, 0), std::min(rect->right, width),
                       std::min(rect->bottom, height)};
      if (kept.right <= kept.left || kept.bottom <= kept.top) kept = {0, 0, 0, 0};
      if (kept.left == 0 && kept.top == 0 && kept.right == width && kept.bottom == height) return ZR_Err_None;
      if (world->data == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_ClearAlpha);

      const ZR_WorldX<T> typed(world, false);
      for (i32 y = 0; y < kept.top; ++y) clear_alpha(0, width, typed.Row(y));
      for (i32 y = kept.top; y < kept.bottom; ++y) {
        clear_alpha(0, kept.left, typed.Row(y));
        clear_alpha(kept.right, width, typed.Row(y));
      }
      for (i32 y = kept.bottom; y < height; ++y) clear_alpha(0, width, typed.Row(y));
      return ZR_Err_None;
    });
  });
}
