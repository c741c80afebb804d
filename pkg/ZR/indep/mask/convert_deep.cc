// Deep mask buffers brought down to other depths by a divisor.
#include <algorithm>

#include "world/row_bands.h"
#include "mask/convert_rows.h"
#include "mask/mask_values.h"
#include "world/slot_table.h"

i32 ZR_ConvertDeepUnoBuffer(const ZR_ProgressInfo* progress, const ZR_UnoBuffer* src, const GX_LRect* rect, i32 divisor,
                            ZR_UnoBuffer* dst) {
  return zr::guarded([&] {
    if (!zr::is_alive(src)) return zr::damaged_mask(ZR_Site_MaskConvert);
    if (!zr::is_alive(dst)) return zr::damaged_mask(ZR_Site_MaskConvertInto);
    if (src->depth != 16) return static_cast<i32>(ZR_Err_None);
    if (divisor == 0) return zr::failed_verification(ZR_Site_MaskConvert, "a mask buffer is divided by 0");
    return zr::on_mask_depth(*dst, ZR_Site_MaskConvertInto, [&]<class C>() -> i32 {
      GX_LRect part = {0, 0, std::min(src->width, dst->width), std::min(src->height, dst->height)};
      if (rect != nullptr)
        part = {std::max(rect->left, 0), std::max(rect->top, 0), std::min(rect->right, part.right),
                std::min(rect->bottom, part.bottom)};
      if (part.left >= part.right || part.top >= part.bottom) return ZR_Err_None;
      i32 (*row)(i32, i32, const u16*, C*) = &zr::divide_mask_row<C>;
      if constexpr (std::is_same_v<C, u8>) row = zr::slot<ZR_Slot_uno_row114>();
      if (row == nullptr) return zr::failed_verification(ZR_Site_EmptySlot, "no routine for the rows of a mask buffer");
      const zr::MaskView<u16> from(*src);
      const zr::MaskView<C> to(*dst);
      const i32 width = part.right - part.left;
      return zr::for_rows(progress, part.bottom - part.top, i64{width} * 2, [&](i32 y) {
        row(width, divisor, from.at(part.left, part.top + y), to.at(part.left, part.top + y));
      });
    });
  });
}
