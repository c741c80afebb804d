// Row samplers of a layer that stands still: a row of destination pixels fetched from the source, with the sum
// of its alphas. The ends of a row that lie outside are walked once; between them nothing is tested.
#pragma once

#include <ZR/world.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <optional>

#include "copy/matrix_steps.h"
#include "sample/moved_rows.h"
#include "sample/sample_functions.h"

namespace zr {

// One kind of sampling, chosen once for a call. Called once for each row.
template <class T>
class RowSampler {
 public:
  virtual ~RowSampler() = default;
  // Fills the row's pixels and sums their alphas into *sum. Returns 0 or the first error of a sampler.
  virtual i32 sample(T* row, RowSum<T>* sum) = 0;
  virtual void next_row() = 0;
};

// The first error stays.
inline void note(i32 result, i32* error) {
  if (result != 0 && *error == 0) *error = result;
}

// What samples vectors of nearest pixels of a world, or null.
template <class T>
const LaneNearest<T>* nearest_rows_of(const ZR_LayerDef& src) {
  const bool fits = std::abs(i64{src.row_bytes} * src.height) < std::numeric_limits<i32>::max();
  return fits ? lane_nearest_rows<T>() : nullptr;
}

// Nearest pixels.
template <class T>
class DraftRow final : public RowSampler<T> {
 public:
  DraftRow(const ZR_WorldX<T>& src, const ZR_SampPB& params, const SourceWalk& walk, i32 count)
      : src_(src), params_(params), walk_(walk), count_(count), lanes_(nearest_rows_of<T>(src)) {}

  i32 sample(T* row, RowSum<T>* sum) override {
    RowSum<T> total{};
    const auto add = [&](i32 first, i32 end) {
      for (i32 i = first; i < end; ++i) total += row[i].alpha;
    };
    if (!walk_.straight(count_)) {
      for (i32 i = 0; i < count_; ++i) row[i] = tested(i);
      add(0, count_);
    } else {
      const InsideRun run = nearest_run(walk_, count_, src_.width, src_.height);
      std::fill(row, row + run.first, T{});
      const bool copies = walk_.step_x == 0x10000 && walk_.step_y == 0;
      i32 first = run.first;
      if (lanes_ != nullptr && !copies && first < run.end) {
        const SampleRun inner = {run.end - first, x_at(first), y_at(first), walk_.step_x, walk_.step_y};
        first += lanes_->row(inner, params_, &total, row + first);
      }
      copy(first, run.end - first, row + first);
      std::fill(row + run.end, row + count_, T{});
      add(first, run.end);
    }
    *sum = total;
    return ZR_Err_None;
  }
  void next_row() override { walk_.next_row(); }

 private:
  // Of pixel i, with half a pixel added.
  i32 x_at(i32 i) const { return wrap_add(wrap_add(walk_.x, wrap_mul(i, walk_.step_x)), 32768); }
  i32 y_at(i32 i) const { return wrap_add(wrap_add(walk_.y, wrap_mul(i, walk_.step_y)), 32768); }
  T tested(i32 i) const {
    const i32 x = x_at(i) >> 16, y = y_at(i) >> 16;
    return x >= 0 && x < src_.width && y >= 0 && y < src_.height ? *src_.At(x, y) : T{};
  }
  void copy(i32 first, i32 n, T* out) const {
    i32 x = x_at(first), y = y_at(first);
    if (walk_.step_y == 0) {
      const T* const from = n > 0 ? src_.Row(y >> 16) : nullptr;
      if (walk_.step_x == 0x10000 && n > 0) {
        std::memcpy(out, from + (x >> 16), static_cast<std::size_t>(n) * sizeof(T));
        return;
      }
      for (i32 i = 0; i < n; ++i, x = wrap_add(x, walk_.step_x)) out[i] = from[x >> 16];
      return;
    }
    for (i32 i = 0; i < n; ++i, x = wrap_add(x, walk_.step_x), y = wrap_add(y, walk_.step_y))
      out[i] = *src_.At(x >> 16, y >> 16);
  }

  const ZR_WorldX<T>& src_;
  ZR_SampPB params_;
  SourceWalk walk_;
  i32 count_;
  const LaneNearest<T>* lanes_;  // may be null
};

// A box wider than a pixel on either axis is averaged rather than sampled at a point.
inline bool takes_area(const ZR_SampPB& params) { return params.x_radius > 32768 || params.y_radius > 32768; }

// The samplers of a quality, and what runs in place of them along rows.
template <class T>
struct RowFunctions : SampleFunctions<T> {
  LaneRowFunc<T>*inner, *inner_boxes;  // may be null

  explicit RowFunctions(const SampleFunctions<T>& set)
      : SampleFunctions<T>(set), inner(no_clip_row(set)), inner_boxes(box_row(set)) {}
};

// One row by the samplers of a quality. `moved` may be null.
template <class T>
i32 sample_best_row(const RowFunctions<T>& samplers, const ZR_SampPB& params, const SourceWalk& walk, i32 count,
                    MovedRows* moved, T* row, RowSum<T>* sum) {
  i32 error = ZR_Err_None;
  RowSum<T> total{};
  const auto x_at = [&](i32 i) { return wrap_add(walk.x, wrap_mul(i, walk.step_x)); };
  const auto y_at = [&](i32 i) { return wrap_add(walk.y, wrap_mul(i, walk.step_y)); };
  const auto each = [&](SampleFunc<T>* sampler, i32 first, i32 end) {
    i32 x = x_at(first), y = y_at(first);
    for (i32 i = first; i < end; ++i, x = wrap_add(x, walk.step_x), y = wrap_add(y, walk.step_y)) {
      note(sampler(nullptr, x, y, &params, &row[i]), &error);
      total += row[i].alpha;
    }
  };
  const auto run = [&](i32 first, i32 end) {
    return SampleRun{end - first, x_at(first), y_at(first), walk.step_x, walk.step_y};
  };
  if (takes_area(params)) {
    PixelRange boxes = {0, 0};
    if (samplers.inner_boxes != nullptr && walk.straight(count)) boxes = boxes_inside(run(0, count), params);
    each(samplers.area, 0, boxes.first);
    if (boxes.first < boxes.end)
      boxes.first += samplers.inner_boxes(run(boxes.first, boxes.end), params, &total, row + boxes.first);
    each(samplers.area, boxes.first, count);
  } else if (!walk.straight(count)) {
    each(samplers.clipping, 0, count);
  } else {
    const auto all_in = [&](i32 i) {
      u8 inside = 0;
      note(samplers.inside_flag(nullptr, x_at(i), y_at(i), &params, &inside, &row[i]), &error);
      total += row[i].alpha;
      return inside != 0;
    };
    i32 first = 0, end = count;
    while (first < end && !all_in(first++)) continue;
    while (end > first && !all_in(--end)) continue;
    const i32 inner_first = first, inner_end = end;
    if (first < end && walk.step_x == 0x10000 && walk.step_y == 0) {
      if constexpr (std::is_same_v<T, ZR_Pixel8>)
        if (moved != nullptr && moved->suits(end - first)) {
          moved->row(run(first, end), params, &total, row + first);
          first = end;
        }
      AlphaSum<T> span_sum = 0;  // the run lies inside the range of positions: 2^16 pixels at most
      note(samplers.span(nullptr, end - first, x_at(first), walk.y, &params, &span_sum, row + first), &error);
      total += span_sum;
    } else {
      if (samplers.inner != nullptr && first < end)
        first += samplers.inner(run(first, end), params, &total, row + first);
      each(samplers.no_clipping, first, end);
      if constexpr (std::is_same_v<T, ZR_PixelFloat>)
        if (total.unsettled()) {
          total = {};
          for (i32 i = 0; i < inner_first; ++i) total += row[i].alpha;
          for (i32 i = count; i-- > inner_end;) total += row[i].alpha;
          for (i32 i = inner_first; i < inner_end; ++i) total += row[i].alpha;
        }
    }
  }
  *sum = total;
  return error;
}

// Bilinear or bicubic pixels, or box means where the layer shrinks.
template <class T>
class BestRow final : public RowSampler<T> {
 public:
  // `still`: whether the source stays as it is from row to row.
  BestRow(const SampleFunctions<T>& samplers, const ZR_SampPB& params, const SourceWalk& walk, i32 count, bool still)
      : samplers_(samplers), params_(params), walk_(walk), count_(count) {
    if constexpr (std::is_same_v<T, ZR_Pixel8>) {
      const bool moves = walk.step_x == 0x10000 && walk.step_y == 0 && walk.row_x == 0 && walk.row_y == 0x10000;
      const LaneMoved* const lanes = lane_moved();
      LaneSpanFunc<T>* const exact = bilinear_span_row(samplers);
      if (still && moves && lanes != nullptr && exact != nullptr) moved_.emplace(*lanes, exact);
    }
  }

  i32 sample(T* row, RowSum<T>* sum) override {
    return sample_best_row<T>(samplers_, params_, walk_, count_, moved_ ? &*moved_ : nullptr, row, sum);
  }
  void next_row() override { walk_.next_row(); }

 private:
  RowFunctions<T> samplers_;
  ZR_SampPB params_;
  SourceWalk walk_;
  i32 count_;
  std::optional<MovedRows> moved_;
};

}  // namespace zr
