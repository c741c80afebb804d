// Combining mask buffers: a part of one into another, or of two into a third.
#include <algorithm>
#include <cmath>

#include "world/row_bands.h"
#include "mask/mask_rows.h"
#include "world/slot_table.h"

namespace zr {
namespace {

// Smaller jobs are not worth another thread.
constexpr i64 large_job = 76800;

// What is combined: `width` x `height` values from src_x, src_y on, at dst_x, dst_y of the target.
struct Part {
  i32 src_x = 0, src_y = 0, dst_x = 0, dst_y = 0, width = 0, height = 0;
};

// One side of the rectangle first..end, which starts at `place` of the target, cut to both. False: nothing is left.
bool cut(i32 first, i32 end, i32 place, i32 src_limit, i32 dst_limit, i32* src_at, i32* dst_at, i32* count) {
  const i64 shift = i64{place} - first;
  const i64 from = std::max({i64{first}, i64{0}, -shift});
  const i64 to = std::min({i64{end}, i64{src_limit}, dst_limit - shift});
  if (from >= to) return false;
  *src_at = static_cast<i32>(from);
  *dst_at = static_cast<i32>(from + shift);
  *count = static_cast<i32>(to - from);
  return true;
}

struct Call {
  const ZR_ProgressInfo* progress;
  const ZR_UnoBuffer *src, *under;
  i32 mode;
  f32 opacity, ceiling;
  Part part;
  ZR_UnoBuffer* dst;

  bool clears_outside() const { return mode == ZR_UnoMode_Intersect || mode == ZR_UnoMode_Darken; }
};

// Opacity and ceiling at the source's depth.
template <class S>
struct Scale {
  explicit Scale(const Call& call) {
    constexpr f32 white = static_cast<f32>(MaskDepth<S>::white);
    if constexpr (std::is_same_v<S, f32>) {
      opacity = call.opacity;
      ceiling = call.ceiling;
    } else {
      opacity = truncate_i32(call.opacity * white + 0.5f);
      ceiling = truncate_i32(std::ceil(call.ceiling * white));
    }
  }
  bool is_plain() const { return opacity == MaskDepth<S>::white && ceiling == MaskDepth<S>::white; }
  Factor<S> opacity, ceiling;
};

template <class S, class D>
UnoModeRowFunc<S, D>* mode_row() {
  if constexpr (std::is_same_v<S, u8> && std::is_same_v<D, u8>) return slot<ZR_Slot_uno_row56>();
  if constexpr (std::is_same_v<S, u16> && std::is_same_v<D, u8>) return slot<ZR_Slot_uno_row62>();
  if constexpr (std::is_same_v<S, u16> && std::is_same_v<D, u16>) return slot<ZR_Slot_uno_row81>();
  if constexpr (std::is_same_v<S, u8> && std::is_same_v<D, u16>) return slot<ZR_Slot_uno_row82>();
  if constexpr (std::is_same_v<S, f32>) return &mask_mode_row<f32>;
}

// A value of a source, brought to the target's depth.
template <class D, class S>
Factor<D> at_depth(Factor<S> v) {
  if constexpr (std::is_same_v<S, D>) {
    return v;
  } else {
    D converted;
    const S held = static_cast<S>(std::clamp(v, Factor<S>{0}, MaskDepth<S>::white));
    convert_mask_row(1, &held, &converted);
    return converted;
  }
}

// Values of the source are faded on a copy, which then takes the place of the source.
template <class S, class D>
void scaled_row(i32 n, i32 mode, const Scale<S>& scale, const S* src, const D* under, D* dst) {
  const Factor<D> ceiling = at_depth<D, S>(scale.ceiling);
  S faded[mask_block];
  D converted[mask_block];
  for (i32 i = 0; i < n; i += mask_block) {
    const i32 count = std::min(n - i, mask_block);
    std::memcpy(faded, src + i, static_cast<std::size_t>(count) * sizeof(S));
    mask_fade_row(count, scale.opacity, faded);
    const D* values;
    if constexpr (std::is_same_v<S, D>) {
      values = faded;
    } else {
      convert_mask_row(count, faded, converted);
      values = converted;
    }
    if (mode == ZR_UnoMode_DitheredScreen)
      mask_rise_row(count, ceiling, values, under + i, dst + i);
    else
      mask_mode_row(count, mode, values, under + i, dst + i);
  }
}

template <class S, class D>
i32 combine(const Call& call) {
  const MaskView<S> src(*call.src);
  const MaskView<D> under(*call.under), dst(*call.dst);
  const Part& part = call.part;
  const Scale<S> scale(call);
  UnoModeRowFunc<S, D>* const row = mode_row<S, D>();
  if (row == nullptr) return failed_verification(ZR_Site_EmptySlot, "no routine for the rows of mask buffers");
  const bool is_plain = scale.is_plain(), clears = call.clears_outside();
  if (clears) clear_values(dst.values, i64{part.dst_y} * dst.width);
  const auto iterate = i64{part.width} * part.height >= large_job ? &ZR_IterateGeneric : &ZR_IterateGeneric_Static;
  const i32 error = for_rows(
      call.progress, part.height, i64{part.width} * static_cast<i64>(sizeof(D)),
      [&](i32 y) {
        const i32 dst_y = part.dst_y + y;
        const S* const from = src.at(part.src_x, part.src_y + y);
        const D* const below = under.at(part.dst_x, dst_y);
        D* const to = dst.at(part.dst_x, dst_y);
        if (is_plain)
          row(part.width, call.mode, from, below, to);
        else
          scaled_row(part.width, call.mode, scale, from, below, to);
        if (clears) {
          clear_values(dst.at(0, dst_y), part.dst_x);
          clear_values(to + part.width, i64{dst.width} - part.dst_x - part.width);
        }
      },
      iterate);
  if (error != 0) return error;
  const i64 end = part.dst_y + part.height;
  if (clears) clear_values(dst.at(0, end), (dst.height - end) * dst.width);
  return ZR_Err_None;
}

i32 depths_do_not_combine() {
  return failed_verification(ZR_Site_MaskAccumulate, "mask buffers of these depths do not combine");
}

// Buffers are alive; rect and point may be null.
i32 combine_part(Call call, const GX_LRect* rect, const GX_LPoint* point) {
  const ZR_UnoBuffer &src = *call.src, &under = *call.under, &dst = *call.dst;
  const GX_LRect area = rect != nullptr ? *rect : GX_LRect{0, 0, src.width, src.height};
  const GX_LPoint place = point != nullptr ? *point : GX_LPoint{area.left, area.top};
  Part& part = call.part;
  const bool some = cut(area.left, area.right, place.x, src.width, std::min(under.width, dst.width), &part.src_x,
                        &part.dst_x, &part.width) &&
                    cut(area.top, area.bottom, place.y, src.height, std::min(under.height, dst.height), &part.src_y,
                        &part.dst_y, &part.height);
  const auto known = [](i32 depth) { return depth == 8 || depth == 16; };
  if (!(known(src.depth) && known(dst.depth)) && !(src.depth == 32 && dst.depth == 32)) return depths_do_not_combine();
  if (!some) return ZR_Err_None;
  if (src.depth == 32) return combine<f32, f32>(call);
  if (src.depth == 8) return dst.depth == 8 ? combine<u8, u8>(call) : combine<u8, u16>(call);
  return dst.depth == 8 ? combine<u16, u8>(call) : combine<u16, u16>(call);
}

}  // namespace
}  // namespace zr

i32 ZR_AccumulateUnoBuffers(const ZR_ProgressInfo* progress, const ZR_UnoBuffer* src, i32 mode, f32 opacity,
                            f32 ceiling, const GX_LRect* rect, const GX_LPoint* point, ZR_UnoBuffer* dst) {
  return zr::guarded([&] {
    if (!zr::is_alive(src)) return zr::damaged_mask(ZR_Site_MaskAccumulate);
    if (!zr::is_alive(dst)) return zr::damaged_mask(ZR_Site_MaskAccumulateInto);
    return zr::combine_part({progress, src, dst, mode, opacity, ceiling, {}, dst}, rect, point);
  });
}

i32 ZR_AccumulateUnoBuffers(const ZR_ProgressInfo* progress, const ZR_UnoBuffer* src, i32 mode, const GX_LRect* rect,
                            const GX_LPoint* point, ZR_UnoBuffer* dst) {
  return ZR_AccumulateUnoBuffers(progress, src, mode, 1.0f, 1.0f, rect, point, dst);
}

i32 ZR_AccumulateUnoBuffers(const ZR_ProgressInfo* progress, const ZR_UnoBuffer* src, i32 mode, const GX_LRect* rect,
                            ZR_UnoBuffer* dst) {
  return ZR_AccumulateUnoBuffers(progress, src, mode, 1.0f, 1.0f, rect, nullptr, dst);
}

i32 ZR_TransferUnoBuffers(const ZR_ProgressInfo* progress, const ZR_UnoBuffer* src1, const ZR_UnoBuffer* src2, i32 mode,
                          const GX_LRect* rect, const GX_LPoint* point, ZR_UnoBuffer* dst) {
  return zr::guarded([&] {
    for (const ZR_UnoBuffer* const buffer : {src1, src2, static_cast<const ZR_UnoBuffer*>(dst)})
      if (!zr::is_alive(buffer)) return zr::damaged_mask(ZR_Site_MaskTransfer);
    if (src1->depth != src2->depth || src1->depth != dst->depth)
      return zr::failed_verification(ZR_Site_MaskTransfer, "ZR_TransferUnoBuffers requires mask buffers of one depth");
    return zr::combine_part({progress, src1, src2, mode, 1.0f, 1.0f, {}, dst}, rect, point);
  });
}
