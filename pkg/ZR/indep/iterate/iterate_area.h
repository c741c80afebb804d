// What all pixel iterators share: the part of the destination to walk, and the host's progress.
#pragma once

#include <ZR/depth.h>
#include <ZR/zr.h>

#include <algorithm>

namespace zr {

// In 64 bits: a source may be placed anywhere.
struct WalkArea {
  i64 left, top, right, bottom;

  i64 columns() const { return std::max<i64>(right - left, 0); }
  i64 rows() const { return std::max<i64>(bottom - top, 0); }
  void cut(i64 to_left, i64 to_top, i64 to_right, i64 to_bottom) {
    left = std::max(left, to_left);
    top = std::max(top, to_top);
    right = std::min(right, to_right);
    bottom = std::min(bottom, to_bottom);
  }
};

// True when an area lies so far off a world of this size that nothing is walked, and the host told nothing.
inline bool lies_behind(const GX_LRect& area, i64 width, i64 height) { return area.left > width || area.top > height; }
inline bool lies_off(const GX_LRect& area, const ZR_LayerDef& dst) {
  return area.right < 1 || area.bottom < 1 || lies_behind(area, dst.width, dst.height);
}

inline WalkArea area_of(const GX_LRect* area, const ZR_LayerDef& dst) {
  WalkArea walk = {0, 0, dst.width, dst.height};
  if (area != nullptr) walk.cut(area->left, area->top, area->right, area->bottom);
  return walk;
}

// The host's progress behind every row of a walk.
class RowProgress {
 public:
  RowProgress(const ZR_InData* in_data, i32 base, i32 final)
      : in_data_(final != 0 && in_data != nullptr && in_data->progress != nullptr ? in_data : nullptr),
        base_(base),
        final_(final) {}
  // True when the walk is to stop.
  bool row_done(i64 row) {
    if (in_data_ == nullptr) return false;
    const i32 done = wrap_add(wrap_add(base_, 1), static_cast<i32>(row));
    result_ = in_data_->progress(in_data_->effect_ref, done, final_);
    return result_ == ZR_Err_UserAbort;
  }
  // The host's last answer, else 0.
  i32 result() const { return result_; }

 private:
  const ZR_InData* in_data_;
  i32 base_, final_;
  i32 result_ = 0;
};

}  // namespace zr
