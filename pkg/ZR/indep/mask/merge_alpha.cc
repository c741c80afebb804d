// Masks and the alpha of worlds.
#include <ZR/mask_alpha.h>
#include <ZR/world.h>

#include <algorithm>

#include "world/row_bands.h"
#include "mask/mask_rows.h"

namespace zr {
namespace {

// One side of the mask in an area that starts at `start` of the world; the mask starts at `place` there and holds
// low..high-1. Empty where high <= low.
struct Side {
  i64 low, high;
  Side(i32 start, i32 end, i32 place, i32 size)
      : low(std::max(i64{start} - place, i64{0})), high(std::min(i64{end} - place, i64{size})) {}
  void clip(i32 first, i32 end) {
    low = std::max(low, i64{first});
    high = std::min(high, i64{end});
  }
  bool is_empty() const { return high <= low; }
};

template <class T>
void clear_alpha(T* pixels, i64 n) {
  for (i64 i = 0; i < n; ++i) pixels[i].alpha = 0;
}

template <class T, class C>
void merge_row(i32 n, const C* mask, T* pixels) {
  if constexpr (std::is_same_v<C, Channel<T>>) {
    merge_alpha_row(n, mask, pixels);
  } else {
    Channel<T> converted[mask_block];
    for (i32 i = 0; i < n; i += mask_block) {
      const i32 count = std::min(n - i, mask_block);
      convert_mask_row(count, mask + i, converted);
      merge_alpha_row(count, converted, pixels + i);
    }
  }
}

struct Merge {
  const ZR_ProgressInfo* progress;
  i32 x, y;
  GX_LRect area;
  Side across, down;
};

template <class T, class C>
i32 merge_rows(const Merge& merge, const ZR_UnoBuffer& mask, const ZR_WorldX<T>& world) {
  const MaskView<C> values(mask);
  const GX_LRect& area = merge.area;
  const i32 width = area.right - area.left, inside = static_cast<i32>(merge.across.high - merge.across.low);
  const i32 before = static_cast<i32>(merge.x + merge.across.low - area.left), after = before + inside;
  return for_rows(merge.progress, area.bottom - area.top, i64{width} * static_cast<i64>(sizeof(T)), [&](i32 row) {
    T* const pixels = world.At(area.left, area.top + row);
    const i64 mask_y = i64{area.top} + row - merge.y;
    if (mask_y < merge.down.low || mask_y >= merge.down.high) {
      clear_alpha(pixels, width);
      return;
    }
    clear_alpha(pixels, before);
    merge_row(inside, values.at(merge.across.low, mask_y), pixels + before);
    clear_alpha(pixels + after, width - after);
  });
}

i32 unexpected_depth() {
  return failed_verification(ZR_Site_MaskMerge, "Unexpected bitdepth in ZRp_MergeMaskAlphaScanIter()");
}

template <class T>
i32 merge_into(const Merge& merge, const ZR_UnoBuffer& mask, const ZR_WorldX<T>& world) {
  if (mask.depth == 8) return merge_rows<T, u8>(merge, mask, world);
  if (mask.depth == 16) return merge_rows<T, u16>(merge, mask, world);
  return unexpected_depth();
}

i32 merge_by_type(const Merge& merge, const ZR_UnoBuffer& mask, const ZR_World& world) {
  if (const auto* const w8 = dynamic_cast<const ZR_WorldX<ZR_Pixel8>*>(&world)) return merge_into(merge, mask, *w8);
  if (const auto* const w16 = dynamic_cast<const ZR_WorldX<ZR_Pixel16>*>(&world)) return merge_into(merge, mask, *w16);
  if (const auto* const wf = dynamic_cast<const ZR_WorldX<ZR_PixelFloat>*>(&world)) return merge_into(merge, mask, *wf);
  return unexpected_depth();
}

// ------------------------------------------------------------------------------ toward a value

template <class T>
void blend_alpha(Channel<T> opacity, Channel<T> target, Channel<T> mask, Channel<T>* alpha) {
  using D = Depth<T>;
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    *alpha = *alpha + (target - *alpha) * D::mul(mask, opacity);
  } else {
    const i32 a = *alpha, difference = target - a;
    // One less below 0, so that falling values round as rising ones do at 8 bits.
    const i32 x = wrap_sub(wrap_mul(difference, D::mul(mask, opacity)), difference < 0);
    i32 step;
    if constexpr (std::is_same_v<T, ZR_Pixel8>)
      step = D::fold(x);
    else
      step = wrap_add(x, 16383) >> 15;
    *alpha = static_cast<Channel<T>>(a + step);
  }
}

}  // namespace
}  // namespace zr

void ZR_MergeMaskAlpha(const ZR_ProgressInfo* progress, i32 x, i32 y, const GX_LRect* clip, const ZR_UnoBuffer* mask,
                       const GX_LRect* area, ZR_World* world) {
  using namespace zr;
  if (!is_alive(mask)) fail(damaged_mask(ZR_Site_MaskMerge));
  if (world == nullptr || world->data == nullptr) fail(unexpected_depth());
  GX_LRect part = {0, 0, world->width, world->height};
  if (area != nullptr)
    part = {std::max(area->left, 0), std::max(area->top, 0), std::min(area->right, part.right),
            std::min(area->bottom, part.bottom)};
  if (part.left >= part.right || part.top >= part.bottom) return;
  Merge merge = {
      progress, x, y, part, Side(part.left, part.right, x, mask->width), Side(part.top, part.bottom, y, mask->height)};
  if (clip != nullptr) {
    merge.across.clip(clip->left, clip->right);
    merge.down.clip(clip->top, clip->bottom);
  }
  if (merge.across.is_empty() || merge.down.is_empty()) {
    world->Fill(ZR_Pixel16{0, 0, 0, 0}, &part);
    return;
  }
  if (const i32 error = merge_by_type(merge, *mask, *world); error != 0) fail(error);
}

template <class T, class C>
void ZR_BlendSingleChannel(i32 n, C opacity, C target, const C* mask, T* pixels) {
  for (i32 i = 0; i < n; ++i) zr::blend_alpha<T>(opacity, target, mask[i], &pixels[i].alpha);
}
template ZR_API void ZR_BlendSingleChannel(i32, u8, u8, const u8*, ZR_Pixel8*);
template ZR_API void ZR_BlendSingleChannel(i32, u16, u16, const u16*, ZR_Pixel16*);
template ZR_API void ZR_BlendSingleChannel(i32, f32, f32, const f32*, ZR_PixelFloat*);
