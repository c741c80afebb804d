// One composite or one layer transform on all threads of the Hostkit: what may be cut into bands, and how a band
// is asked for so that its bytes are those of the whole.
#include <ZR/composite.h>
#include <ZR/hostkit.h>
#include <ZR/transfer_mode.h>

#include <algorithm>
#include <limits>

#include "bands.h"
#include "divided_calls_state.h"
#include "divided_worlds.h"

namespace zr {
namespace {

// What makes waking a thread worth while.
constexpr i32 least_composite_pixels = 32768, least_sampled_pixels = 8192, most_counted_samples = 16;

// Worlds of one depth that are in order.
bool well_formed(const ZR_LayerDef& src, const ZR_MaskWorld* mask, const ZR_LayerDef& dst) {
  const auto good = [&](const ZR_LayerDef& world) { return in_order(world) && pixel_bytes(world) == pixel_bytes(dst); };
  return good(src) && good(dst) && (mask == nullptr || good(mask->world));
}

bool known_mode(i32 mode) { return mode >= XferCopyFast && mode <= XferKeyProtect && mode != -1; }
bool clears_around(i32 mode) { return mode == XferMultiplyAlpha || mode == XferMultiplyAlphaLuma; }

// No row writes what another one reads or writes, so that their order does not tell.
bool rows_are_apart(const ZR_LayerDef& src, const ZR_MaskWorld* mask, const ZR_LayerDef& dst) {
  return owns_rows(dst) && !share_memory(src, dst) && (mask == nullptr || !share_memory(mask->world, dst));
}

// Draws `bands` by body(band, scratch).
template <class Body>
i32 on_threads(const Bands& bands, ScratchRecords& records, i32 width, const ZR_ProgressInfo* progress,
               const ZR_CompositeModePlus& mode, const GX_LRect& bounds, ZR_LayerDef* dst, const Body& body) {
  struct Shared {
    ScratchLease scratch;
    const Body& body;
  } shared{{records, std::min(threads_from_here(), bands.count()), width}, body};
  // Once, and before anything is drawn: each band by itself would take the others for its surroundings.
  if (clears_around(mode.xfer))
    if (const i32 error = ZR_ClearAlphaExceptRect(nullptr, &bounds, dst); error != 0) return error;
  return draw_bands(bands, progress, &shared, [](void* refcon, i32 worker, Rows band) {
    auto& here = *static_cast<Shared*>(refcon);
    return here.body(band, here.scratch[worker]);
  });
}

struct Composite {
  const ZR_ProgressInfo* progress;
  i32 quality;
  u32 flags;
  i32 field;
  const GX_LRect* rect;
  ZR_LayerDef* src;
  const ZR_CompositeModePlus* mode;
  const ZR_LinearBlendingTables* tables;
  const ZR_MaskWorld* mask;
  i32 dest_x, dest_y;
  ZR_LayerDef* dst;

  i32 by_library() const {
    return ZR_TransferRect(progress, quality, flags, field, rect, src, mode, tables, mask, dest_x, dest_y, dst);
  }
  i32 run() const {
    ScratchRecords* const records = G_scratch_records.load(std::memory_order_acquire);
    if (records == nullptr || !holds(ZR_Slot_transfer_rect, &ZR_TransferRect_S) || rect == nullptr || src == nullptr ||
        mode == nullptr || dst == nullptr || !well_formed(*src, mask, *dst))
      return by_library();
    GX_LRect bounds;
    if (const i32 error = ZR_GetTransferBounds(rect, src, mask, dest_x, dest_y, dst, &bounds); error != 0) return error;
    const i32 width = static_cast<i32>(std::clamp<i64>(i64{rect->right} - rect->left, 1, src->width));
    const Bands bands(bounds, threads_from_here(), least_composite_pixels);
    if (bands.count() == 1 || !may_be_cut()) {
      ScratchLease scratch(*records, 1, width);
      return ZR_TransferRectPlus(progress, quality, flags, field, rect, src, mode, tables, mask, scratch[0], dest_x,
                                 dest_y, dst);
    }
    return on_threads(bands, *records, width, progress, *mode, bounds, dst, [&](Rows band, void** scratch) {
      return clears_around(mode->xfer) ? draw_alone(band, scratch) : draw(band, bounds.top, scratch);
    });
  }

 private:
  bool may_be_cut() const {
    const bool mask_can_move = mask == nullptr || mask->offset_y >= std::numeric_limits<i32>::min() + dst->height;
    return known_mode(mode->xfer) && mask_can_move && rows_are_apart(*src, mask, *dst);
  }
  GX_LRect rect_of(Rows band) const {
    const i64 dy = i64{dest_y} - rect->top;
    return {rect->left, static_cast<i32>(band.first - dy), rect->right, static_cast<i32>(band.end - dy)};
  }
  i32 draw(Rows band, i32 top, void** scratch) const {
    const GX_LRect part = rect_of(band);
    ZR_CompositeModePlus seeded = *mode;
    seeded.rand_seed = seed_from_row(mode->rand_seed, top, band.first);
    return ZR_TransferRectPlus(nullptr, quality, flags, field, &part, src, &seeded, tables, mask, scratch, dest_x,
                               band.first, dst);
  }
  // On a record of the band's rows, as everything else in it is cleared. It begins on an even row, for the fields.
  i32 draw_alone(Rows band, void** scratch) const {
    const GX_LRect part = rect_of(band);
    const i32 base = band.first & ~1;
    ZR_LayerDef rows = only_rows(*dst, {base, band.end});
    ZR_MaskWorld moved;
    if (mask != nullptr) {
      moved = *mask;
      moved.offset_y -= base;
    }
    return ZR_TransferRectPlus(nullptr, quality, flags, field, &part, src, mode, tables,
                               mask != nullptr ? &moved : nullptr, scratch, dest_x, band.first - base, &rows);
  }
};

struct Transform {
  const ZR_ProgressInfo* progress;
  i32 quality;
  u32 flags;
  i32 field;
  ZR_LayerDef* src;
  const ZR_CompositeModePlus* mode;
  const ZR_LinearBlendingTables* tables;
  const ZR_MaskWorld* mask;
  const GX_Matrix3* matrices;
  i32 count;
  bool src2dst;
  const GX_LRect* dst_rect;
  ZR_LayerDef* dst;

  i32 by_library() const {
    return ZR_TransformWorld(progress, quality, flags, field, src, mode, tables, mask, matrices, count, src2dst,
                             dst_rect, dst);
  }
  i32 run() const {
    ScratchRecords* const records = G_scratch_records.load(std::memory_order_acquire);
    if (records == nullptr || !holds(ZR_Slot_transform_world, &ZR_TransformWorld_S) || src == nullptr ||
        mode == nullptr || matrices == nullptr || count < 1 || dst_rect == nullptr || dst == nullptr ||
        !well_formed(*src, mask, *dst))
      return by_library();
    ZR_TransformExtent extent;
    if (const i32 error = ZR_GetTransformExtent(quality, src, mask, matrices, count, src2dst, dst_rect, dst, &extent);
        error != 0)
      return error;
    if (extent.kind == ZR_Transform_Move) {
      if (!holds(ZR_Slot_transfer_rect, &ZR_TransferRect_S)) return by_library();
      const GX_LRect& to = extent.bounds;
      const GX_LRect rect = {to.left - extent.shift_x, to.top - extent.shift_y, to.right - extent.shift_x,
                             to.bottom - extent.shift_y};
      return Composite{progress, quality, 0, field, &rect, src, mode, tables, mask, to.left, to.top, dst}.run();
    }
    const i32 samples = std::min(count == 2 ? most_counted_samples : count, most_counted_samples);
    const Bands bands(extent.bounds, threads_from_here(), least_sampled_pixels / samples);
    if (extent.kind != ZR_Transform_Rows || bands.count() == 1 || !known_mode(mode->xfer) ||
        !rows_are_apart(*src, mask, *dst)) {
      ScratchLease scratch(*records, 1, dst->width);
      return ZR_TransformWorldPlus(progress, quality, flags, field, src, mode, tables, mask, matrices, count, src2dst,
                                   scratch[0], dst_rect, dst);
    }
    return on_threads(bands, *records, dst->width, progress, *mode, extent.bounds, dst, [&](Rows band, void** scratch) {
      return ZR_TransformWorldRows(nullptr, quality, flags, field, src, mode, tables, mask, matrices, count, src2dst,
                                   scratch, dst_rect, band.first, band.end, dst);
    });
  }
};

}  // namespace
}  // namespace zr

i32 ZRHost_TransferRect(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, const GX_LRect* rect,
                        ZR_LayerDef* src, const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                        const ZR_MaskWorld* mask, i32 dest_x, i32 dest_y, ZR_LayerDef* dst) {
  return zr::run_divided(
      zr::Composite{progress, quality, flags, field, rect, src, mode, tables, mask, dest_x, dest_y, dst});
}

i32 ZRHost_TransformWorld(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                          const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                          const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                          const GX_LRect* dst_rect, ZR_LayerDef* dst) {
  return zr::run_divided(
      zr::Transform{progress, quality, flags, field, src, mode, tables, mask, matrices, count, src2dst, dst_rect, dst});
}
