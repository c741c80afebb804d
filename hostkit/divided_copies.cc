// One scaled copy or one blend on all threads of the Hostkit. Rows of a draft copy are asked for by number. A sampled
// copy and a blend run on records of the band's rows: the copy's rectangle then reaches out of it above and below, and
// what is cut off above is walked over, so that every row samples where that of the whole does.
#include <ZR/copy_bits.h>
#include <ZR/hostkit.h>

#include <algorithm>
#include <limits>

#include "bands.h"
#include "divided_worlds.h"

namespace zr {
namespace {

// What makes waking a thread worth while.
constexpr i32 least_copied_pixels = 32768, least_sampled_pixels = 8192;

// Draws `bands` by body(band).
template <class Body>
i32 on_threads(const Bands& bands, const ZR_ProgressInfo* progress, const Body& body) {
  return draw_bands(bands, progress, const_cast<Body*>(&body),
                    [](void* refcon, i32, Rows band) { return (*static_cast<const Body*>(refcon))(band); });
}

GX_LRect rect_or_all(const GX_LRect* rect, const ZR_LayerDef& world) {
  return rect != nullptr ? *rect : GX_LRect{0, 0, world.width, world.height};
}

GX_LRect inside(const GX_LRect& rect, const ZR_LayerDef& world) {
  return {std::max(rect.left, 0), std::max(rect.top, 0), std::min(rect.right, world.width),
          std::min(rect.bottom, world.height)};
}

bool is_empty(const GX_LRect& rect) { return rect.left >= rect.right || rect.top >= rect.bottom; }

// Extents wrap in 32 bits, as the copies take them.
bool same_size(const GX_LRect& a, const GX_LRect& b) {
  const auto extent = [](i32 begin, i32 end) { return static_cast<u32>(end) - static_cast<u32>(begin); };
  return extent(a.left, a.right) == extent(b.left, b.right) && extent(a.top, a.bottom) == extent(b.top, b.bottom);
}

using CopyRoutine = decltype(ZR_CopyBits_Draft);

enum class CopyKind { draft, straight, premul };

struct Copy {
  CopyKind kind;
  const ZR_ProgressInfo* progress;
  ZR_LayerDef *src, *dst;
  const GX_LRect *src_rect, *dst_rect;

  i32 run() const {
    if (!holds(routine().slot, routine().own) || src == nullptr || dst == nullptr || !in_order(*src) || !in_order(*dst))
      return by_library();
    const GX_LRect from = rect_or_all(src_rect, *src), to = rect_or_all(dst_rect, *dst), bounds = inside(to, *dst);
    if (is_empty(inside(from, *src)) || is_empty(bounds) || !owns_rows(*dst) || share_memory(*src, *dst))
      return by_library();
    // One of high quality that scales nothing is a draft copy, but for the premultiplied one.
    const bool sampled = kind == CopyKind::premul || (kind == CopyKind::straight && !same_size(from, to));
    const Bands bands(bounds, threads_from_here(), sampled ? least_sampled_pixels : least_copied_pixels);
    if (bands.count() == 1 || (sampled && !may_be_sampled_in_bands(from, to, bands.rows()))) return by_library();
    if (!sampled) return on_threads(bands, nullptr, [&](Rows band) { return draft_rows(bounds, band); });
    const ZR_ProgressInfo abort = {progress != nullptr ? progress->refcon : nullptr,
                                   progress != nullptr ? progress->abort : nullptr, nullptr};
    return on_threads(bands, &abort, [&](Rows band) { return sample_rows(to, band); });
  }

 private:
  struct Routine {
    ZR_SlotIndex slot;
    CopyRoutine *own, *library;
  };
  const Routine& routine() const {
    static constexpr Routine routines[] = {
        {ZR_Slot_copy_bits_draft, &ZR_CopyBits_Draft_Static, &ZR_CopyBits_Draft},
        {ZR_Slot_copy_bits_hq_straight, &ZR_CopyBits_HQ_Straight_Static, &ZR_CopyBits_HQ_Straight},
        {ZR_Slot_copy_bits_hq_premul, &ZR_CopyBits_HQ_Premul_Static, &ZR_CopyBits_HQ_Premul}};
    return routines[static_cast<int>(kind)];
  }
  i32 by_library() const { return routine().library(progress, src, dst, src_rect, dst_rect); }

  bool may_be_sampled_in_bands(const GX_LRect& from, const GX_LRect& to, i32 rows) const {
    // Neither what the library refuses, nor a rectangle that cannot be moved up.
    if (pixel_bytes(*src) != pixel_bytes(*dst) || to.top < std::numeric_limits<i32>::min() + dst->height) return false;
    if (kind == CopyKind::straight) return true;
    // The premultiplied copy counts its rows in 16 bits, and moves whole worlds of one size.
    return rows <= std::numeric_limits<i16>::max() && !same_size(from, to);
  }
  // The outer bands take what is beside the bounds too: far rectangles wrap, and land anywhere.
  i32 draft_rows(const GX_LRect& bounds, Rows band) const {
    return ZR_CopyBits_DraftRows(src, dst, src_rect, dst_rect, band.first == bounds.top ? 0 : band.first,
                                 band.end == bounds.bottom ? dst->height : band.end);
  }
  i32 sample_rows(const GX_LRect& to, Rows band) const {
    ZR_LayerDef rows = only_rows(*dst, band);
    const GX_LRect moved = {to.left, to.top - band.first, to.right, to.bottom - band.first};
    return routine().own(nullptr, src, &rows, src_rect, &moved);
  }
};

struct Mix {
  decltype(ZR_Blend)* routine;
  const ZR_ProgressInfo* progress;
  ZR_LayerDef *src1, *src2;
  i32 ratio;
  ZR_LayerDef* dst;

  i32 run() const {
    const auto by_library = [this] { return routine(progress, src1, src2, ratio, dst); };
    if (src1 == nullptr || src2 == nullptr || dst == nullptr || !in_order(*dst) || !owns_rows(*dst) || !suits(*src1) ||
        !suits(*src2))
      return by_library();
    const Bands bands({0, 0, dst->width, dst->height}, threads_from_here(), least_copied_pixels);
    if (bands.count() == 1) return by_library();
    return on_threads(bands, nullptr, [this](Rows band) {
      ZR_LayerDef one = only_rows(*src1, band), other = only_rows(*src2, band), out = only_rows(*dst, band);
      return routine(nullptr, &one, &other, ratio, &out);
    });
  }

 private:
  // Of the destination's shape, and either the destination itself or away from it.
  bool suits(const ZR_LayerDef& src) const {
    return in_order(src) && pixel_bytes(src) == pixel_bytes(*dst) && src.width == dst->width &&
           src.height == dst->height &&
           ((src.data == dst->data && src.row_bytes == dst->row_bytes) || !share_memory(src, *dst));
  }
};

}  // namespace
}  // namespace zr

i32 ZRHost_CopyBits_Draft(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect,
                          const GX_LRect* dst_rect) {
  return zr::run_divided(zr::Copy{zr::CopyKind::draft, progress, src, dst, src_rect, dst_rect});
}

i32 ZRHost_CopyBits_HQ_Straight(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                                const GX_LRect* src_rect, const GX_LRect* dst_rect) {
  return zr::run_divided(zr::Copy{zr::CopyKind::straight, progress, src, dst, src_rect, dst_rect});
}

i32 ZRHost_CopyBits_HQ_Premul(const ZR_ProgressInfo* progress, ZR_LayerDef* src, ZR_LayerDef* dst,
                              const GX_LRect* src_rect, const GX_LRect* dst_rect) {
  return zr::run_divided(zr::Copy{zr::CopyKind::premul, progress, src, dst, src_rect, dst_rect});
}

i32 ZRHost_Blend(const ZR_ProgressInfo* progress, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio, ZR_LayerDef* dst) {
  return zr::run_divided(zr::Mix{&ZR_Blend, progress, src1, src2, ratio, dst});
}

i32 ZRHost_Blend_Premul(const ZR_ProgressInfo* progress, ZR_LayerDef* src1, ZR_LayerDef* src2, i32 ratio,
                        ZR_LayerDef* dst) {
  return zr::run_divided(zr::Mix{&ZR_Blend_Premul, progress, src1, src2, ratio, dst});
}
