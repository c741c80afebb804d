// Tracing the outlines of an alpha channel: rows are cut into spans, and the corners of spans that touch are joined.
#include <SEQ/seq.h>
#include <ZR/depth.h>
#include <ZR/drawing.h>

#include <algorithm>
#include <limits>

#include "filter/raster_lock.h"
#include "world/guard.h"

namespace zr {
namespace {

// A corner of a span. Every corner lies on one vertical edge, that of its span, and on one join to another corner in
// the gap above or below its row; so the outlines are the rings that edges and joins make in turn.
struct Corner {
  i32 x, y;
  i32 join;  // index of the other end
  i32 seen;
};
static_assert(sizeof(Corner) == 16);

// Places of a span's corners in the list, from four times the number of the span on.
enum Place : i32 { top_left, top_right, bottom_right, bottom_left, span_corners };
i32 other_end_of_edge(i32 corner) { return corner ^ 3; }  // a left one of a left one
static_assert((top_left ^ 3) == bottom_left && (top_right ^ 3) == bottom_right);

// The lists while they are made; those not released are freed.
class Lists {
 public:
  Lists(SEQ_List** corners, SEQ_List** points, SEQ_List** starts) {
    make(sizeof(Corner), corners, 0);
    make(sizeof(ZR_WireframePoint), points, 1);
    make(sizeof(i32), starts, 2);
  }
  ~Lists() {
    for (SEQ_List* const list : lists_) SEQ_Dispose(list);
  }
  Lists(const Lists&) = delete;
  Lists& operator=(const Lists&) = delete;
  void release(i32 index) { lists_[index] = nullptr; }
  i32 error() const { return error_; }

 private:
  void make(size_t record_bytes, SEQ_List** out, i32 index) {
    constexpr i32 growth = 256;
    if (error_ == 0) error_ = SEQ_New(0, static_cast<i32>(record_bytes), 0, growth, out);
    if (error_ == 0) lists_[index] = *out;
  }
  SEQ_List* lists_[3] = {};
  i32 error_ = 0;
};

void append(SEQ_List* list, const void* record) {
  if (const i32 error = SEQ_Insert(list, -1, record); error != 0) fail(error);
}

// ------------------------------------------------------------------------------ spans

template <class T>
bool is_inside(const T& p, bool any_alpha) {
  return any_alpha ? p.alpha > 0 : p.alpha >= Depth<T>::half;
}

// Appends the corners of every span of a row, from column `left` to `right`, that reaches from y to y + 1.
template <class T>
void cut_row(const T* row, i32 left, i32 right, i32 y, bool any_alpha, SEQ_List* corners) {
  for (i32 x = left; x < right;) {
    while (x < right && !is_inside(row[x], any_alpha)) ++x;
    if (x == right) return;
    const i32 from = x;
    while (x < right && is_inside(row[x], any_alpha)) ++x;
    for (const Corner& corner : {Corner{from, y, 0, 0}, {x, y, 0, 0}, {x, y + 1, 0, 0}, {from, y + 1, 0, 0}})
      append(corners, &corner);
  }
}

// The spans of one row, as a range of the list.
struct Spans {
  i32 first, last;  // the second is one beyond
};

void join(Corner* corners, i32 one, i32 other) {
  corners[one].join = other;
  corners[other].join = one;
}

// Joins the lower corners of one row with the upper ones of the next. Spans that overlap go on into one another; what
// has nothing below or above it is closed, and so are gaps that end.
void join_rows(Corner* corners, Spans above, Spans below) {
  i32 a = above.first, b = below.first;
  const auto corner = [](i32 span, Place place) { return span * span_corners + place; };
  const auto left_of = [&](i32 span) { return corners[span * span_corners].x; };
  const auto right_of = [&](i32 span) { return corners[span * span_corners + top_right].x; };
  while (a < above.last || b < below.last) {
    if (b == below.last || (a < above.last && right_of(a) <= left_of(b))) {
      join(corners, corner(a, bottom_left), corner(a, bottom_right));
      ++a;
    } else if (a == above.last || right_of(b) <= left_of(a)) {
      join(corners, corner(b, top_left), corner(b, top_right));
      ++b;
    } else {
      join(corners, corner(a, bottom_left), corner(b, top_left));
      for (;;) {
        if (a + 1 < above.last && left_of(a + 1) < right_of(b)) {
          join(corners, corner(a, bottom_right), corner(a + 1, bottom_left));
          ++a;
        } else if (b + 1 < below.last && left_of(b + 1) < right_of(a)) {
          join(corners, corner(b, top_right), corner(b + 1, top_left));
          ++b;
        } else {
          break;
        }
      }
      join(corners, corner(a++, bottom_right), corner(b++, top_right));
    }
  }
}

// ------------------------------------------------------------------------------ outlines

bool on_one_line(const Corner& a, const Corner& b, const Corner& c) {
  return i64{b.x - a.x} * (c.y - b.y) == i64{b.y - a.y} * (c.x - b.x);
}

void append_point(SEQ_List* points, const Corner& corner) {
  const ZR_WireframePoint point = {static_cast<i16>(corner.x), static_cast<i16>(corner.y)};
  append(points, &point);
}

// The ring of corner `first`, the earliest of the list that lies on it: one of the ring's topmost, where the outline
// turns. Corners at which it does not turn are left out.
void append_ring(Corner* corners, i32 first, SEQ_List* points) {
  const Corner* kept = &corners[first];
  const Corner* candidate = nullptr;
  append_point(points, *kept);
  const auto visit = [&](const Corner& next) {
    if (candidate != nullptr && !on_one_line(*kept, *candidate, next)) {
      append_point(points, *candidate);
      kept = candidate;
    }
    candidate = &next;
  };
  i32 at = first;
  do {
    const i32 end = other_end_of_edge(at);
    corners[at].seen = corners[end].seen = 1;
    if (at != first) visit(corners[at]);
    visit(corners[end]);
    at = corners[end].join;
  } while (at != first);
  visit(corners[first]);
}

Corner* locked(SEQ_List* corners) { return static_cast<Corner*>(SEQ_GetAddress(corners, 0)); }

template <class T>
void cut_rows(const ZR_WorldX<T>& world, const GX_LRect& area, i32 step, bool any_alpha, SEQ_List* corners) {
  Spans above = {0, 0};
  const auto close = [&](Spans below) {
    if (Corner* const list = locked(corners)) {
      join_rows(list, above, below);
      SEQ_Unlock(corners);
    }
    above = below;
  };
  for (i32 y = area.top; y < area.bottom;) {
    cut_row(world.Row(y), area.left, area.right, y, any_alpha, corners);
    close({above.last, SEQ_GetCount(corners) / span_corners});
    const i32 left = area.bottom - 1 - y;  // rows below this one; the last of them is cut, whatever the step
    y += left == 0 ? 1 : std::min(step, left);
  }
  close({above.last, above.last});
}

template <class T>
i32 trace(const ZR_WorldX<T>& world, const GX_LRect& area, i32 step, u32 flags, i32 kind, ZR_Wireframe* out) {
  SEQ_List *corners = nullptr, *points = nullptr, *starts = nullptr;
  Lists lists(&corners, &points, &starts);
  if (lists.error() != 0) return lists.error();
  cut_rows(world, area, step, (flags & ZR_Wireframe_AnyAlpha) != 0, corners);
  Corner* const list = locked(corners);
  for (i32 i = 0; i < SEQ_GetCount(corners); ++i) {
    if (list[i].seen != 0) continue;
    const i32 start = SEQ_GetCount(points);
    append(starts, &start);
    append_ring(list, i, points);
  }
  lists.release(1);
  lists.release(2);
  *out = {kind, SEQ_GetCount(points), points, starts, nullptr, nullptr};
  return ZR_Err_None;
}

}  // namespace
}  // namespace zr

extern "C" i32 ZR_GenerateWireframe(void*, ZR_LayerDef* world, const GX_LRect* rect, i32 step, u32 flags, i32 kind,
                                    ZR_Wireframe* out) {
  return zr::guarded([&]() -> i32 {
    if (out == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_Wireframe);
    *out = {};
    constexpr i32 farthest = std::numeric_limits<i16>::max();
    if (world == nullptr || world->data == nullptr || world->width > farthest || world->height > farthest)
      return ZR_ReportBadCallbackParam(ZR_Site_Wireframe);
    GX_LRect area = {0, 0, world->width, world->height};
    if (rect != nullptr)
      area = {std::max(rect->left, 0), std::max(rect->top, 0), std::min(rect->right, world->width),
              std::min(rect->bottom, world->height)};
    if (area.right <= area.left) area.bottom = area.top;  // nothing to look at
    return zr::on_depth(ZRp_WorldDepth(world), zr::unknown_depth_text, [&]<class T>() -> i32 {
      const bool framed = world->raster != nullptr;
      const zr::RasterLock lock(framed ? world->raster : nullptr);
      if (framed && lock.error() != 0) return lock.error();
      return zr::trace(ZR_WorldX<T>(world, false), area, std::max(step, 1), flags, kind, out);
    });
  });
}
