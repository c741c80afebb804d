// The mix of two worlds by a ratio, straight and premultiplied.
#include <ZR/errors.h>
#include <ZR/world.h>

#include <algorithm>
#include <cstring>

#include "composite/blend_rows.h"
#include "world/guard.h"

namespace zr {
namespace {

template <bool premul>
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
      const i32 w2 = std::clamp(ratio, 0, ratio_one), w1 = ratio_one - w2, width = std::max(dst->width, 0);
      for (i32 y = 0; y < dst->height; ++y) {
        const T *const row1 = world1.Row(y), *const row2 = world2.Row(y);
        T* const row = out.Row(y);
        if (w2 == 0 || w1 == 0)
          std::memmove(row, w2 == 0 ? row1 : row2, static_cast<size_t>(width) * sizeof(T));
        else
          blend_row<T, premul>(width, row1, row2, w2, row);
      }
      return ZR_Err_None;
    });
  });
}

}  // namespace
}  // namespace zr

i32 ZR_Blend(const ZR_ProgressInfo* /*progress*/, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio, ZR_LayerDef* dst) {
  return zr::blend<false>(src1, src2, ratio, dst);
}

i32 ZR_Blend_Straight(const ZR_ProgressInfo* /*progress*/, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio,
                      ZR_LayerDef* dst) {
  return zr::blend<false>(src1, src2, ratio, dst);
}

i32 ZR_Blend_Premul(const ZR_ProgressInfo* /*progress*/, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio,
                    ZR_LayerDef* dst) {
  return zr::blend<true>(src1, src2, ratio, dst);
}
