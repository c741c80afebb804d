// A layer through its matrices: what kind of drawing it is, then the loop over the destination's rows.
#include "copy/transform_rows.h"

#include <ZR/errors.h>
#include <ZR/transfer_mode.h>

#include <algorithm>
#include <cstdint>
#include <optional>

#include "composite/scratch_state.h"
#include "copy/track_matte.h"
#include "copy/transform_bounds.h"
#include "copy/transform_motion.h"
#include "world/guard.h"

namespace zr {
namespace {

bool multiplies_alpha(i32 mode) { return mode == XferMultiplyAlpha || mode == XferMultiplyAlphaLuma; }
// A transparent source changes the destination too.
bool draws_transparent(i32 mode) { return mode == XferCopyFast || mode == XferAddPremul || multiplies_alpha(mode); }

// Rows between two polls, less one; a row polls where its number has none of these bits.
i32 progress_bits(i32 quality, i32 count, bool field) {
  const i32 bits = count > 1 ? 7 : quality != 0 ? 31 : 63;
  return field ? bits * 2 + 1 : bits;
}

bool lacks_pixels(const ZR_LayerDef& world) { return world.data == nullptr && world.width > 0 && world.height > 0; }
// Pixels of the mask are wanted, and there are none.
bool mask_lacks_pixels(const ZR_MaskWorld& mask, const GX_LRect& bounds) {
  const auto meets = [](i64 offset, i64 size, i32 low, i32 high) { return offset < high && offset + size > low; };
  return lacks_pixels(mask.world) && meets(mask.offset_x, mask.world.width, bounds.left, bounds.right) &&
         meets(mask.offset_y, mask.world.height, bounds.top, bounds.bottom);
}

// Whether rows of two worlds may be the same memory.
template <class T>
bool meet_in_memory(const ZR_LayerDef& a, const ZR_LayerDef& b) {
  const auto first = [](const ZR_LayerDef& w) { return reinterpret_cast<std::intptr_t>(w.data); };
  const auto last_row = [](const ZR_LayerDef& w) { return std::intptr_t{w.row_bytes} * (w.height - 1); };
  const auto low = [&](const ZR_LayerDef& w) { return first(w) + std::min<std::intptr_t>(last_row(w), 0); };
  const auto high = [&](const ZR_LayerDef& w) {
    return first(w) + std::max<std::intptr_t>(last_row(w), 0) + std::intptr_t{w.width} * i32{sizeof(T)};
  };
  return low(a) < high(b) && low(b) < high(a);
}

// The last step of a layer that only moves by whole pixels: a plain rectangle. The library's own scratch takes
// the ordinary road, so that a replacement of it takes effect; a caller's scratch goes on with the call.
template <class T>
i32 move_layer(const ZR_ProgressInfo* progress, i32 quality, i32 field, const ZR_WorldX<T>& src,
               const ZR_BlendingMode<T>& mode, const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask,
               void* const scratch[10], const ZR_TransformExtent& extent, ZR_WorldX<T>* dst) {
  const GX_LRect& bounds = extent.bounds;
  const i32 dx = extent.shift_x, dy = extent.shift_y;
  const GX_LRect rect = {wrap_sub(bounds.left, dx), wrap_sub(bounds.top, dy), wrap_sub(bounds.right, dx),
                         wrap_sub(bounds.bottom, dy)};
  // Opacity over white and back is exact in every depth.
  const ZR_CompositeModePlus plus(mode.mode, static_cast<f32>(mode.opacity) / static_cast<f32>(Depth<T>::white), tables,
                                  mode.keep_alpha != 0, mode.seed);
  ZR_LayerDef* const from = &const_cast<ZR_WorldX<T>&>(src);
  if (is_shared_scratch(scratch))
    return call_slot<ZR_Slot_transfer_rect>(progress, quality, u32{0}, field, &rect, from, &plus, tables, mask,
                                            bounds.left, bounds.top, dst);
  return call_slot<ZR_Slot_transfer_rect_plus>(progress, quality, u32{0}, field, &rect, from, &plus, tables, mask,
                                               const_cast<void**>(scratch), bounds.left, bounds.top, dst);
}

// Lays one sampled row over the destination, or leaves it where nothing would change.
template <class T>
i32 finish_row(const ZR_ProgressInfo* progress, i32 count, const ZR_BlendModeDescriptor<T>& plan, const T* row,
               RowSum<T> sum, const T* mask, Channel<T>* alpha_row, T* out) {
  constexpr Wide<T> white = Depth<T>::white;
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    if (sum.unsettled()) {
      sum = {};
      for (i32 i = 0; i < count; ++i) sum += row[i].alpha;
    }
  if (all_clear<T>(sum) && !draws_transparent(plan.mode.mode)) return ZR_Err_None;
  if (all_opaque<T>(sum, count) && plan.mode.mode == XferInFront && mask == nullptr && plan.mode.keep_alpha == 0 &&
      plan.mode.opacity == static_cast<Channel<T>>(white)) {
    std::memmove(out, row, static_cast<std::size_t>(count) * sizeof(T));
    return ZR_Err_None;
  }
  return ZR_BlendPipeline<T>(progress, count, &plan, row, mask, alpha_row, out);
}

// The rows of `band`, or with none the whole layer.
template <class T>
i32 draw_layer(const ZR_ProgressInfo* progress, i32 quality, i32 field, const ZR_WorldX<T>* src,
               const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask,
               const MatrixList& list, void* const scratch[10], const GX_LRect* rect, const RowBand* band,
               ZR_WorldX<T>* dst) {
  return guarded([&]() -> i32 {
    if (mask != nullptr && ZRp_WorldDepth(&mask->world) != Depth<T>::bits)
      return failed_verification(ZR_Site_TransformWorld,
                                 "ZR_TransformWorld requires mask and dst worlds to have same bit depth");
    const ZR_TransformExtent extent = transform_extent(quality, list, *src, mask, *rect, *dst);
    if (extent.kind == ZR_Transform_Nothing || (band != nullptr && extent.kind != ZR_Transform_Rows))
      return ZR_Err_None;
    if (extent.kind == ZR_Transform_Whole) {
      constexpr GX_LRect nothing = {0, 0, 0, 0};
      return multiplies_alpha(mode->mode) ? ZR_ClearAlphaExceptRect(progress, &nothing, dst) : ZR_Err_None;
    }
    if (extent.kind == ZR_Transform_Move)
      return move_layer<T>(progress, quality, field, *src, *mode, tables, mask, scratch, extent, dst);
    const GX_LRect& bounds = extent.bounds;
    const i32 count = list.count;
    Shutter shutter;
    make_shutter(list, &shutter);
    const PlacedScale scale = placed_scale(shutter.first.forward);

    ZR_BlendModeDescriptor<T> plan(*mode, mask != nullptr, tables);
    if (plan.main == nullptr) return ZR_Err_UnimplementedMode;
    const bool keeps_alpha = plan.may_keep_alpha != 0 && plan.mode.keep_alpha != 0;
    const bool prepares_mask = mask != nullptr && (mask->kind & mask_kinds) != 0;
    if (lacks_pixels(*src) || dst->data == nullptr || (mask != nullptr && mask_lacks_pixels(*mask, bounds)) ||
        scratch[2] == nullptr || (keeps_alpha && scratch[0] == nullptr) || (prepares_mask && scratch[1] == nullptr))
      return ZR_ReportBadCallbackParam(ZR_Site_TransformWorld);
    auto* const alpha_row = static_cast<Channel<T>*>(scratch[0]);
    auto* const mask_cells = static_cast<T*>(scratch[1]);
    auto* const row = static_cast<T*>(scratch[2]);

    const i32 width = bounds.right - bounds.left, rows = bounds.bottom - bounds.top;
    const SourceWalk walk = source_walk(shutter.first.inverse, bounds.left, bounds.top);
    ZR_SampPB params{};
    params.x_radius = scale.x_radius;
    params.y_radius = scale.y_radius;
    params.area = scale.area;
    params.src = const_cast<ZR_WorldX<T>*>(src);

    std::optional<DraftRow<T>> draft;
    std::optional<BestRow<T>> best;
    std::optional<DraftMotionRow<T>> draft_motion;
    std::optional<BestMotionRow<T>> best_motion;
    std::optional<AreaMotionRow<T>> area_motion;
    std::optional<ComplexMotionRow<T>> complex_motion;
    RowSampler<T>* sampler = nullptr;
    const bool is_draft = quality == 0;
    if (!shutter.moves) {
      if (is_draft)
        sampler = &draft.emplace(*src, params, walk, width);
      else
        sampler = &best.emplace(sample_functions<T>(quality), params, walk, width, !meet_in_memory<T>(*src, *dst));
    } else {
      const i32 samples = count > 2 ? count : is_draft ? 9 : 17;
      params.motion_steps = samples - 1;
      const MotionWalk motion = {walk, source_walk(shutter.last.inverse, bounds.left, bounds.top), samples};
      const RowFunctions<T> functions(sample_functions<T>(quality));
      if (is_draft)
        sampler = &draft_motion.emplace(*src, params, motion, width);
      else if (count > 2 && is_complex_motion(list, shutter))
        sampler = &complex_motion.emplace(functions, params, list, bounds, scratch);
      else if (AreaMotionRow<T>::suits(functions, params, motion))
        sampler = &area_motion.emplace(functions, params, motion, width, scratch);
      else
        sampler = &best_motion.emplace(functions, params, motion, width, scratch);
    }

    // Around the layer the source counts as clear, and these modes clear under a clear source.
    if (multiplies_alpha(mode->mode) && band == nullptr) {
      const i32 error = ZR_ClearAlphaExceptRect(progress, &bounds, dst);
      if (error != 0) return error;
    }
    const i32 skipped_parity = field == 1 ? 1 : field == 2 ? 0 : 2;
    const i32 quiet_bits = progress_bits(quality, count, skipped_parity != 2);
    // The seed of a row depends on the row alone, so that fields dissolve as the frame does.
    u32 seed = static_cast<u32>(mode->seed), seed_step = static_cast<u32>(bounds.top) * row_seed_step;
    const i32 first = band != nullptr ? std::max(band->first, bounds.top) - bounds.top : 0;
    const i32 end = band != nullptr ? std::min(band->end, bounds.bottom) - bounds.top : rows;
    for (i32 i = 0; i < end; ++i) {
      const i32 y = bounds.top + i;
      if (i >= first && (y & 1) != skipped_parity) {
        plan.mode.seed = static_cast<i32>(seed);
        const T* const mask_pixels = mask != nullptr ? mask_row<T>(*mask, bounds.left, y, width, mask_cells) : nullptr;
        RowSum<T> sum{};
        i32 error = sampler->sample(row, &sum);
        if (error == 0)
          error = finish_row<T>(progress, width, plan, row, sum, mask_pixels, alpha_row, dst->At(bounds.left, y));
        if (error != 0) return error;
      }
      sampler->next_row();
      if (i >= first && (i & quiet_bits) == 0) {
        const i32 stop = poll(progress, i, rows);
        if (stop != 0) return stop;
      }
      seed += seed_step;
      seed_step += row_seed_step;
    }
    return ZR_Err_None;
  });
}

}  // namespace

template <class T>
i32 transform_rows(const ZR_ProgressInfo* progress, i32 quality, i32 field, const ZR_WorldX<T>* src,
                   const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask,
                   const GX_Matrix3* matrices, i32 count, bool src2dst, void* const scratch[10], const GX_LRect* rect,
                   ZR_WorldX<T>* dst) {
  return draw_layer<T>(progress, quality, field, src, mode, tables, mask, {matrices, count, src2dst}, scratch, rect,
                       nullptr, dst);
}

template <class T>
i32 transform_band(const ZR_ProgressInfo* progress, i32 quality, i32 field, const ZR_WorldX<T>* src,
                   const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask,
                   const GX_Matrix3* matrices, i32 count, bool src2dst, void* const scratch[10], const GX_LRect* rect,
                   RowBand band, ZR_WorldX<T>* dst) {
  return draw_layer<T>(progress, quality, field, src, mode, tables, mask, {matrices, count, src2dst}, scratch, rect,
                       &band, dst);
}

template TransformRowsFunc<ZR_Pixel8> transform_rows<ZR_Pixel8>;
template TransformRowsFunc<ZR_Pixel16> transform_rows<ZR_Pixel16>;
template TransformRowsFunc<ZR_PixelFloat> transform_rows<ZR_PixelFloat>;
template TransformBandFunc<ZR_Pixel8> transform_band<ZR_Pixel8>;
template TransformBandFunc<ZR_Pixel16> transform_band<ZR_Pixel16>;
template TransformBandFunc<ZR_PixelFloat> transform_band<ZR_PixelFloat>;

}  // namespace zr
