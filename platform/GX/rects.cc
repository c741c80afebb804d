// Rectangles with 32-bit coordinates.
#include <GX/gx.h>

#include <algorithm>
#include <limits>

namespace {

i32 saturate(i64 value) {
  return static_cast<i32>(std::clamp<i64>(value, std::numeric_limits<i32>::min(), std::numeric_limits<i32>::max()));
}

}  // namespace

bool GX_EmptyLRect(const GX_LRect* rect) { return rect->right <= rect->left || rect->bottom <= rect->top; }

bool GX_SectLRect(const GX_LRect* a, const GX_LRect* b, GX_LRect* out) {
  const GX_LRect common{std::max(a->left, b->left), std::max(a->top, b->top), std::min(a->right, b->right),
                        std::min(a->bottom, b->bottom)};
  const bool empty = GX_EmptyLRect(&common);
  *out = empty ? GX_LRect{0, 0, 0, 0} : common;
  return !empty;
}

void GX_UnionLRect(const GX_LRect* a, const GX_LRect* b, GX_LRect* out) {
  if (GX_EmptyLRect(a))
    *out = GX_EmptyLRect(b) ? GX_LRect{0, 0, 0, 0} : *b;
  else if (GX_EmptyLRect(b))
    *out = *a;
  else
    *out = {std::min(a->left, b->left), std::min(a->top, b->top), std::max(a->right, b->right),
            std::max(a->bottom, b->bottom)};
}

void GX_InsetLRect(GX_LRect* rect, i32 dx, i32 dy) {
  *rect = {saturate(i64{rect->left} + dx), saturate(i64{rect->top} + dy), saturate(i64{rect->right} - dx),
           saturate(i64{rect->bottom} - dy)};
}
