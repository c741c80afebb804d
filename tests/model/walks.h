// Which pixels an iteration visits, in which order, with which addresses, and what progress is told.
#pragma once

#include "model/rects.h"

namespace model {

// One call of the pixel function. `in` is null where the function is handed transparent black.
struct Visit {
  i32 x, y;
  const void* in;
  const void* out;
  bool black;
  bool operator==(const Visit&) const = default;
};
struct Walk {
  std::vector<Visit> visits;
  std::vector<std::pair<i32, i32>> told;  // (count, total) of each progress call
  i32 result = 0;
  bool operator==(const Walk&) const = default;
};

// What the callbacks answer: the n-th pixel (from 0) and the n-th progress call return a code.
struct Answers {
  i64 pixel_at = -1;
  i32 pixel_code = 0;
  i64 progress_at = -1;
  i32 progress_code = 0;
};

inline bool tell(Walk& walk, const Answers& answers, i32 count, i32 total) {
  if (total == 0) return true;
  const bool answer = static_cast<i64>(walk.told.size()) == answers.progress_at;
  walk.told.emplace_back(count, total);
  walk.result = answer ? answers.progress_code : 0;
  return walk.result != ZR_Err_UserAbort;
}

inline u8* address(const ZR_LayerDef& w, i32 x, i32 y, size_t pixel_bytes) {
  return static_cast<u8*>(w.data) + ptrdiff_t{y} * w.row_bytes + ptrdiff_t{x} * static_cast<ptrdiff_t>(pixel_bytes);
}
// False: nothing to do. `origin` moves the source; null with no source cut at all.
inline bool clip_walk(const ZR_LayerDef* src, const GX_LRect* area, const GX_LPoint* origin, const ZR_LayerDef& dst,
                      bool cut_by_source, GX_LRect& r) {
  const i32 ox = origin != nullptr ? origin->x : 0, oy = origin != nullptr ? origin->y : 0;
  r = bounds(dst);
  if (area != nullptr) {
    if (area->right < 1 || area->left > dst.width || area->bottom < 1 || area->top > dst.height) return false;
    if (src != nullptr && cut_by_source && (area->left > src->width + ox || area->top > src->height + oy)) return false;
    r = common(r, *area);
  }
  if (src != nullptr && cut_by_source) r = common(r, moved(bounds(*src), ox, oy));
  return true;
}

inline Walk iterate(i32 base, i32 final, const ZR_LayerDef* src, const GX_LRect* area, const ZR_LayerDef& dst,
                    size_t pixel_bytes, const Answers& answers) {
  Walk walk;
  GX_LRect r;
  if (!clip_walk(src, area, nullptr, dst, true, r)) return walk;
  for (i32 y = r.top; y < r.bottom; ++y) {
    for (i32 x = r.left; x < r.right; ++x) {
      const bool answer = static_cast<i64>(walk.visits.size()) == answers.pixel_at;
      walk.visits.push_back(
          {x, y, address(src != nullptr ? *src : dst, x, y, pixel_bytes), address(dst, x, y, pixel_bytes), false});
      if (answer && answers.pixel_code != 0) return walk.result = answers.pixel_code, walk;
    }
    if (!tell(walk, answers, base + 1 + (y - r.top), final)) return walk;
  }
  return walk;
}

// With no source only half of the columns are visited, and each row starts earlier by the half left out.
inline Walk iterate_origin(bool clip, i32 base, i32 final, const ZR_LayerDef* src, const GX_LRect* area,
                           const GX_LPoint& origin, const ZR_LayerDef& dst, size_t pixel_bytes,
                           const Answers& answers) {
  Walk walk;
  GX_LRect r;
  if (!clip_walk(src, area, &origin, dst, clip, r) || empty(r)) return walk;
  const ptrdiff_t size = static_cast<ptrdiff_t>(pixel_bytes);
  u8* out = address(dst, r.left, r.top, pixel_bytes);
  for (i32 y = r.top; y < r.bottom; ++y) {
    if (src != nullptr) out = address(dst, r.left, y, pixel_bytes);
    for (i32 x = r.left; x < r.right; x += src != nullptr ? 1 : 2) {
      const bool answer = static_cast<i64>(walk.visits.size()) == answers.pixel_at;
      const i32 sx = x - origin.x, sy = y - origin.y;
      const bool covered = src != nullptr && inside(bounds(*src), sx, sy);
      walk.visits.push_back(
          {x, y, covered ? address(*src, sx, sy, pixel_bytes) : nullptr, out, src != nullptr && !covered});
      out += size;
      if (answer && answers.pixel_code != 0) return walk.result = answers.pixel_code, walk;
    }
    out += dst.row_bytes - size * (r.right - r.left);
    if (!tell(walk, answers, base + 1 + (y - r.top), final)) return walk;
  }
  return walk;
}

inline Walk iterate_lut(i32 base, i32 final, const ZR_LayerDef* src, const GX_LRect* area, const u8* const lut[4],
                        const ZR_LayerDef& dst, const Answers& answers) {
  Walk walk;
  GX_LRect r;
  if (!clip_walk(src, area, nullptr, dst, true, r) || empty(r)) return walk;
  for (i32 y = r.top; y < r.bottom; ++y) {
    for (i32 x = r.left; x < r.right; ++x) {
      const ZR_Pixel8 p = at<Eight>(src != nullptr ? *src : dst, x, y);
      const auto look = [lut](int channel, u8 v) { return lut[channel] != nullptr ? lut[channel][v] : v; };
      at<Eight>(dst, x, y) = {look(0, p.alpha), look(1, p.red), look(2, p.green), look(3, p.blue)};
    }
    if (!tell(walk, answers, base + 1 + (y - r.top), final)) return walk;
  }
  return walk;
}

}  // namespace model
