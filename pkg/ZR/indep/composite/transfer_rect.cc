// Compositing a rectangle of one world onto another: depth, scratch, clipping, and the loop over rows.
#include "composite/transfer_rect.h"

#include <ZR/composite.h>
#include <ZR/errors.h>
#include <ZR/transfer_mode.h>

#include <algorithm>

#include "copy/track_matte.h"
#include "world/guard.h"

namespace zr {
namespace {

// A rectangle in 64 bits: no corner that a caller can name overflows when it is moved.
struct Area {
  i64 left, top, right, bottom;

  bool empty() const { return right <= left || bottom <= top; }
  // Of an area inside a world, where they fit.
  GX_LRect corners() const {
    return {static_cast<i32>(left), static_cast<i32>(top), static_cast<i32>(right), static_cast<i32>(bottom)};
  }
  void move(i64 dx, i64 dy) { left += dx, right += dx, top += dy, bottom += dy; }
  // Cuts to width x height pixels at (x, y).
  void clip(i64 x, i64 y, i64 width, i64 height) {
    left = std::max(left, x), right = std::min(right, x + width);
    top = std::max(top, y), bottom = std::min(bottom, y + height);
  }
};

// The destination pixels to composite. Even mask kinds restrict them to the mask's area.
Area clipped_area(const GX_LRect& rect, const ZR_LayerDef& src, const ZR_MaskWorld* mask, i64 dx, i64 dy,
                  const ZR_LayerDef& dst) {
  Area area = {rect.left, rect.top, rect.right, rect.bottom};
  area.clip(0, 0, src.width, src.height);
  area.move(dx, dy);
  area.clip(0, 0, dst.width, dst.height);
  if (mask != nullptr && (mask->kind & mask_inverted) == 0)
    area.clip(mask->offset_x, mask->offset_y, mask->world.width, mask->world.height);
  return area;
}

bool mask_lacks_pixels(const ZR_MaskWorld& mask, Area area) {
  area.clip(mask.offset_x, mask.offset_y, mask.world.width, mask.world.height);
  return mask.world.data == nullptr && !area.empty();
}

bool multiplies_alpha(i32 mode) { return mode == XferMultiplyAlpha || mode == XferMultiplyAlphaLuma; }

}  // namespace

template <class T>
i32 transfer_rows(const ZR_ProgressInfo* progress, i32 /*quality*/, i32 field, const GX_LRect* rect,
                  const ZR_WorldX<T>* src, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables,
                  const ZR_MaskWorld* mask, void* const scratch[10], i32 dest_x, i32 dest_y, ZR_WorldX<T>* dst) {
  return guarded([&]() -> i32 {
    if (mask != nullptr && ZRp_WorldDepth(&mask->world) != Depth<T>::bits)
      return failed_verification(ZR_Site_TransferRect,
                                 "ZR_TransferRect requires mask and dst worlds to have same bit depth");
    const i64 dx = static_cast<i64>(dest_x) - rect->left, dy = static_cast<i64>(dest_y) - rect->top;
    const Area area = clipped_area(*rect, *src, mask, dx, dy, *dst);
    if (area.empty()) return ZR_Err_None;
    const GX_LRect to = area.corners();
    const i32 width = to.right - to.left, rows = to.bottom - to.top;

    ZR_BlendModeDescriptor<T> plan(*mode, mask != nullptr, tables);
    if (plan.main == nullptr) return ZR_Err_UnimplementedMode;
    const bool keeps_alpha = plan.may_keep_alpha != 0 && plan.mode.keep_alpha != 0;
    const bool prepares_mask = mask != nullptr && (mask->kind & mask_kinds) != 0;
    if (src->data == nullptr || dst->data == nullptr || (mask != nullptr && mask_lacks_pixels(*mask, area)) ||
        scratch == nullptr || (keeps_alpha && scratch[0] == nullptr) || (prepares_mask && scratch[1] == nullptr))
      return ZR_ReportBadCallbackParam(ZR_Site_TransferRect);
    auto* const alpha_row = static_cast<Channel<T>*>(scratch[0]);
    auto* const mask_cells = static_cast<T*>(scratch[1]);

    // Where the source does not reach it counts as clear, and these modes clear under a clear source.
    if (multiplies_alpha(mode->mode)) {
      const i32 error = ZR_ClearAlphaExceptRect(progress, &to, dst);
      if (error != 0) return error;
    }

    const i32 skipped_parity = field == 1 ? 1 : field == 2 ? 0 : 2;
    // The seed of a row depends on the row alone, so that fields and single rows dissolve as the frame does.
    u32 seed = static_cast<u32>(mode->seed) + static_cast<u32>(to.left);
    u32 seed_step = static_cast<u32>(to.top) * row_seed_step;
    for (i32 y = to.top; y < to.bottom; ++y) {
      const T* const mask_pixels = mask != nullptr ? mask_row<T>(*mask, to.left, y, width, mask_cells) : nullptr;
      if ((y & 1) != skipped_parity) {
        plan.mode.seed = static_cast<i32>(seed);
        const T* const from = src->At(static_cast<i32>(to.left - dx), static_cast<i32>(y - dy));
        const i32 error =
            ZR_BlendPipeline<T>(progress, width, &plan, from, mask_pixels, alpha_row, dst->At(to.left, y));
        if (error != 0) return error;
      }
      if ((y & 127) == 0) {
        const i32 stop = poll(progress, y - to.top, rows);
        if (stop != 0) return stop;
      }
      seed += seed_step;
      seed_step += row_seed_step;
    }
    return ZR_Err_None;
  });
}

namespace {

i32 transfer_rect(const ZR_ProgressInfo* progress, i32 quality, i32 field, const GX_LRect* rect, ZR_LayerDef* src,
                  const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask,
                  void* const* scratch, i32 dest_x, i32 dest_y, ZR_LayerDef* dst, const char* depths_differ) {
  return guarded([&]() -> i32 {
    if (rect == nullptr || src == nullptr || mode == nullptr || dst == nullptr)
      return ZR_ReportBadCallbackParam(ZR_Site_TransferRect);
    const i32 depth = ZRp_WorldDepth(dst);
    if (ZRp_WorldDepth(src) != depth) return failed_verification(ZR_Site_TransferRect, depths_differ);
    return on_depth(depth, unknown_depth_text, [&]<class T>() -> i32 {
      const ZR_BlendingMode<T> typed_mode(*mode);
      void* shared[10];
      if (scratch == nullptr) {
        // No row is wider than the source, however wide the rectangle.
        const i64 asked = static_cast<i64>(rect->right) - rect->left;
        const i32 width = static_cast<i32>(std::clamp<i64>(asked, 0, std::max(src->width, 0)));
        const i32 error = ZRp_ReallocScratch(width, static_cast<i32>(sizeof(Channel<T>)), false, shared);
        if (error != 0) return error;
      }
      const ZR_WorldX<T> from(src, false);
      ZR_WorldX<T> to(dst, false);
      void* const* const record = scratch != nullptr ? scratch : shared;
      return call_slot<DepthSlots<T>::transfer_rows>(progress, quality, field, rect, &from, &typed_mode, tables, mask,
                                                     record, dest_x, dest_y, &to);
    });
  });
}

}  // namespace

i32 transfer_rect_plus_body(const ZR_ProgressInfo* progress, i32 quality, u32 /*flags*/, i32 field,
                            const GX_LRect* rect, ZR_LayerDef* src, const ZR_CompositeModePlus* mode,
                            const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask, void* scratch[10],
                            i32 dest_x, i32 dest_y, ZR_LayerDef* dst) {
  return transfer_rect(progress, quality, field, rect, src, mode, tables, mask, scratch, dest_x, dest_y, dst,
                       "ZR_TransferRectPlus requires src and dst worlds to have same bit depth");
}

template TransferRowsFunc<ZR_Pixel8> transfer_rows<ZR_Pixel8>;
template TransferRowsFunc<ZR_Pixel16> transfer_rows<ZR_Pixel16>;
template TransferRowsFunc<ZR_PixelFloat> transfer_rows<ZR_PixelFloat>;

}  // namespace zr

i32 ZR_TransferRect_S(const ZR_ProgressInfo* progress, i32 quality, u32 /*flags*/, i32 field, const GX_LRect* rect,
                      ZR_LayerDef* src, const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                      const ZR_MaskWorld* mask, i32 dest_x, i32 dest_y, ZR_LayerDef* dst) {
  return zr::transfer_rect(progress, quality, field, rect, src, mode, tables, mask, nullptr, dest_x, dest_y, dst,
                           "ZR_TransferRect requires src and dst worlds to have same bit depth");
}

i32 ZR_GetTransferBounds(const GX_LRect* rect, const ZR_LayerDef* src, const ZR_MaskWorld* mask, i32 dest_x, i32 dest_y,
                         const ZR_LayerDef* dst, GX_LRect* bounds) {
  return zr::guarded([&]() -> i32 {
    if (rect == nullptr || src == nullptr || dst == nullptr || bounds == nullptr)
      return ZR_ReportBadCallbackParam(ZR_Site_TransferRect);
    const i64 dx = static_cast<i64>(dest_x) - rect->left, dy = static_cast<i64>(dest_y) - rect->top;
    const zr::Area area = zr::clipped_area(*rect, *src, mask, dx, dy, *dst);
    *bounds = area.empty() ? GX_LRect{0, 0, 0, 0} : area.corners();
    return ZR_Err_None;
  });
}
