// Row samplers of a layer that moves while the shutter is open: each pixel is the mean of many samples, colour
// weighted by alpha.
#pragma once

#include <HB/hb.h>
#include <ZR/errors.h>

#include <cstdlib>

#include "copy/transform_bounds.h"
#include "copy/transform_samplers.h"
#include "world/guard.h"

namespace zr {

// Alphas and colours times alphas, summed in the order of the samples.
template <class T>
class MotionSum {
  static constexpr bool is_float = std::is_same_v<T, ZR_PixelFloat>;
  using Sum = std::conditional_t<is_float, f32, u64>;

 public:
  void add(const T& sample) {
    const Sum a = sample.alpha;
    alpha_ += a;
    red_ += a * sample.red;
    green_ += a * sample.green;
    blue_ += a * sample.blue;
  }
  T mean(i32 samples) const {
    if (alpha_ == 0) return T{};
    const Sum n = static_cast<Sum>(samples);
    if (alpha_ == n * static_cast<Sum>(Depth<T>::white))
      return {channel(alpha_ / n), opaque(red_, n), opaque(green_, n), opaque(blue_, n)};
    return {channel(alpha_ / n), channel(red_ / alpha_), channel(green_ / alpha_), channel(blue_ / alpha_)};
  }

 private:
  static Channel<T> channel(Sum v) { return static_cast<Channel<T>>(v); }
  // Of products with white: the mean in single precision, then white taken out of it.
  static Channel<T> opaque(Sum sum, Sum n) {
    if constexpr (is_float) {
      return sum / n;
    } else {
      const i64 product = static_cast<i64>(static_cast<f32>(sum) / static_cast<f32>(n));
      if constexpr (std::is_same_v<T, ZR_Pixel8>)
        return channel(static_cast<Sum>(Depth<T>::fold(static_cast<u16>(product))));
      else
        return channel(static_cast<Sum>((product + 16383) >> 15));
    }
  }
  Sum alpha_ = 0, red_ = 0, green_ = 0, blue_ = 0;
};

// Arrays for the length of a call: in a block of the scratch record where they fit, else in memory of their own.
class Workspace {
 public:
  static constexpr std::size_t block8_bytes = 18432, block9_bytes = 26624;

  Workspace() = default;
  Workspace(const Workspace&) = delete;
  Workspace& operator=(const Workspace&) = delete;
  ~Workspace() {
    for (void* const block : own_) HB_FreePtr(block);
  }
  // Not initialised. Throws out of memory. Two arrays at most.
  template <class Element>
  Element* take(void* block, std::size_t block_bytes, std::size_t count) {
    const std::size_t bytes = count * sizeof(Element);
    if (block != nullptr && bytes <= block_bytes) return static_cast<Element*>(block);
    void*& own = own_[own_[0] != nullptr ? 1 : 0];
    own = HB_AllocatePtr(bytes, HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_BlendingScratch, 0, 0),
                         ZR_ModuleCode | ZR_Site_TransformWorld);
    if (own == nullptr) fail(ZR_Err_OutOfMemory);
    return static_cast<Element*>(own);
  }

 private:
  void* own_[2] = {};
};

// The samples of one pixel, evenly spaced from where the first matrix puts it to where the last one does. All
// of them together step over at most half of the number circle, so that between two inside samples every one
// is inside, also where the line wraps.
class SampleLine {
 public:
  SampleLine(i32 x0, i32 y0, i32 x1, i32 y1, i32 samples)
      : x0_(x0),
        y0_(y0),
        x1_(x1),
        y1_(y1),
        dx_(wrap_sub(x1, x0) / (samples - 1)),
        dy_(wrap_sub(y1, y0) / (samples - 1)) {}

  // Position of sample k counted from the first, and of the k-th before the last; they differ by what the
  // division dropped.
  GX_LPoint from_first(i32 k) const { return {wrap_add(x0_, wrap_mul(k, dx_)), wrap_add(y0_, wrap_mul(k, dy_))}; }
  GX_LPoint from_last(i32 k) const { return {wrap_sub(x1_, wrap_mul(k, dx_)), wrap_sub(y1_, wrap_mul(k, dy_))}; }
  // No sample sees the world, however wide its kernel.
  bool misses(i32 width, i32 height) const {
    constexpr i64 reach = 3 * i64{65536};
    return std::max(x0_, x1_) <= -reach || std::max(y0_, y1_) <= -reach ||
           std::min(x0_, x1_) >= i64{width} * 65536 + reach || std::min(y0_, y1_) >= i64{height} * 65536 + reach;
  }
  i32 dx() const { return dx_; }
  i32 dy() const { return dy_; }

 private:
  i32 x0_, y0_, x1_, y1_, dx_, dy_;
};

// Both ends of the shutter, walked together.
struct MotionWalk {
  SourceWalk first, last;
  i32 samples;  // at least 2

  // `offset` is added to both ends.
  SampleLine line(i32 i, i32 offset) const {
    const auto at = [&](i32 start, i32 step) { return wrap_add(wrap_add(start, offset), wrap_mul(i, step)); };
    return {at(first.x, first.step_x), at(first.y, first.step_y), at(last.x, last.step_x), at(last.y, last.step_y),
            samples};
  }
  void next_row() {
    first.next_row();
    last.next_row();
  }
  // Every pixel of a row sees its samples at the same phases.
  bool keeps_phases() const {
    const auto unit = [](const SourceWalk& walk) { return walk.step_x == 0x10000 && walk.step_y == 0; };
    return unit(first) && unit(last);
  }
};

// Nearest pixels along a straight line.
template <class T>
class DraftMotionRow final : public RowSampler<T> {
 public:
  DraftMotionRow(const ZR_WorldX<T>& src, const MotionWalk& walk, i32 count) : src_(src), walk_(walk), count_(count) {}

  i32 sample(T* row, RowSum<T>* sum) override {
    RowSum<T> total = 0;
    for (i32 i = 0; i < count_; ++i) {
      row[i] = pixel(walk_.line(i, 32768));
      total += row[i].alpha;
    }
    *sum = total;
    return ZR_Err_None;
  }
  void next_row() override { walk_.next_row(); }

 private:
  bool inside(GX_LPoint at) const {
    const i32 x = at.x >> 16, y = at.y >> 16;
    return x >= 0 && x < src_.width && y >= 0 && y < src_.height;
  }
  const T& at(GX_LPoint p) const { return *src_.At(p.x >> 16, p.y >> 16); }
  T pixel(const SampleLine& line) const {
    const i32 n = walk_.samples;
    i32 first = 0, end = n;  // what is not walked yet
    while (first < end && !inside(line.from_first(first))) ++first;
    if (first == end) return T{};
    MotionSum<T> sum;
    sum.add(at(line.from_first(first++)));
    while (end > first && !inside(line.from_last(n - end))) --end;
    const bool has_last = end > first;
    const i32 inner_end = has_last ? end - 1 : end;
    GX_LPoint p = line.from_first(first);
    for (i32 k = first; k < inner_end; ++k, p = {wrap_add(p.x, line.dx()), wrap_add(p.y, line.dy())}) sum.add(at(p));
    if (has_last) sum.add(at(line.from_last(n - end)));
    return sum.mean(n);
  }

  const ZR_WorldX<T>& src_;
  MotionWalk walk_;
  i32 count_;
};

// Bilinear, bicubic or area samples along a straight line.
template <class T>
class BestMotionRow final : public RowSampler<T> {
 public:
  BestMotionRow(const SampleFunctions<T>& samplers, const ZR_SampPB& params, const MotionWalk& walk, i32 count,
                void* const scratch[10])
      : samplers_(samplers), params_(params), walk_(walk), count_(count) {
    const std::size_t samples = static_cast<std::size_t>(walk.samples);
    held_ = workspace_.take<T>(scratch[8], Workspace::block8_bytes, samples);
    if (walk.keeps_phases()) weights_ = workspace_.take<f64[4]>(scratch[9], Workspace::block9_bytes, samples);
  }

  i32 sample(T* row, RowSum<T>* sum) override {
    error_ = ZR_Err_None;
    if (weights_ != nullptr) compute_weights();
    const bool area = takes_area(params_);
    RowSum<T> total = 0;
    for (i32 i = 0; i < count_; ++i) {
      const SampleLine line = walk_.line(i, 0);
      row[i] = area ? box_pixel(line) : pixel(line);
      total += row[i].alpha;
    }
    *sum = total;
    return error_;
  }
  void next_row() override { walk_.next_row(); }

 private:
  void compute_weights() {
    const SampleLine line = walk_.line(0, 0);
    for (i32 k = 0; k < walk_.samples; ++k) {
      const GX_LPoint p = line.from_first(k);
      note(call_slot<ZR_Slot_sample_compute_weight>(static_cast<u16>(p.x), static_cast<u16>(p.y), weights_[k]),
           &error_);
    }
  }
  T box_pixel(const SampleLine& line) {
    MotionSum<T> sum;
    for (i32 k = 0; k < walk_.samples; ++k) {
      const GX_LPoint p = line.from_first(k);
      T sample{};
      note(samplers_.area(nullptr, p.x, p.y, &params_, &sample), &error_);
      sum.add(sample);
    }
    return sum.mean(walk_.samples);
  }
  bool all_in(GX_LPoint p, T* out) {
    u8 inside = 0;
    note(samplers_.inside_flag(nullptr, p.x, p.y, &params_, &inside, out), &error_);
    return inside != 0;
  }
  T pixel(const SampleLine& line) {
    const i32 n = walk_.samples;
    if (line.misses(params_.src->width, params_.src->height)) return T{};
    MotionSum<T> sum;
    i32 first = 0, end = n;
    for (bool in = false; first < end && !in; ++first) {
      T sample{};
      in = all_in(line.from_first(first), &sample);
      sum.add(sample);
    }
    // The samples at the far end wait for their turn in the sum.
    for (bool in = false; end > first && !in; --end) in = all_in(line.from_last(n - end), &held_[n - end]);
    GX_LPoint p = line.from_first(first);
    const auto inner = [&](auto&& sampler) {
      for (i32 k = first; k < end; ++k, p = {wrap_add(p.x, line.dx()), wrap_add(p.y, line.dy())}) {
        T sample{};
        note(sampler(k, &sample), &error_);
        sum.add(sample);
      }
    };
    if (weights_ != nullptr)
      inner([&](i32 k, T* out) { return samplers_.translate(nullptr, p.x, p.y, weights_[k], &params_, out); });
    else
      inner([&](i32, T* out) { return samplers_.no_clipping(nullptr, p.x, p.y, &params_, out); });
    for (i32 k = n - end; k-- > 0;) sum.add(held_[k]);
    return sum.mean(n);
  }

  SampleFunctions<T> samplers_;
  ZR_SampPB params_;
  MotionWalk walk_;
  i32 count_;
  i32 error_ = ZR_Err_None;
  Workspace workspace_;
  T* held_ = nullptr;
  f64 (*weights_)[4] = nullptr;
};

// One sample through each matrix. A row is fetched through one matrix after the other, so that every pixel
// gets its samples in order and each fetch runs as it does for a layer that stands still.
template <class T>
class ComplexMotionRow final : public RowSampler<T> {
 public:
  ComplexMotionRow(const SampleFunctions<T>& samplers, const ZR_SampPB& params, const MatrixList& list,
                   const GX_LRect& bounds, void* const scratch[10])
      : samplers_(samplers), count_(bounds.right - bounds.left), matrices_(list.count) {
    sums_ = workspace_.take<MotionSum<T>>(scratch[8], Workspace::block8_bytes, static_cast<std::size_t>(count_));
    placed_ = workspace_.take<Placed>(scratch[9], Workspace::block9_bytes, static_cast<std::size_t>(matrices_));
    for (i32 k = 0; k < matrices_; ++k) {
      Placed& placed = placed_[k];
      placed.params = params;
      Placement placement;
      placed.regular = make_placement(list.matrices[k], list.src2dst, &placement);
      if (!placed.regular) continue;
      const PlacedScale scale = placed_scale(placement.forward);
      placed.params.x_radius = scale.x_radius;
      placed.params.y_radius = scale.y_radius;
      placed.params.area = scale.area;
      placed.walk = source_walk(placement.inverse, bounds.left, bounds.top);
    }
  }

  i32 sample(T* row, RowSum<T>* sum) override {
    i32 error = ZR_Err_None;
    std::fill_n(sums_, count_, MotionSum<T>{});
    for (i32 k = 0; k < matrices_; ++k) {
      const Placed& placed = placed_[k];
      if (!placed.regular) continue;  // a transparent sample adds nothing
      RowSum<T> alphas = 0;
      note(sample_best_row<T>(samplers_, placed.params, placed.walk, count_, row, &alphas), &error);
      if constexpr (!std::is_same_v<T, ZR_PixelFloat>)
        if (alphas == 0) continue;
      for (i32 i = 0; i < count_; ++i) sums_[i].add(row[i]);
    }
    RowSum<T> total = 0;
    for (i32 i = 0; i < count_; ++i) {
      row[i] = sums_[i].mean(matrices_);
      total += row[i].alpha;
    }
    *sum = total;
    return error;
  }
  void next_row() override {
    for (i32 k = 0; k < matrices_; ++k)
      if (placed_[k].regular) placed_[k].walk.next_row();
  }

 private:
  struct Placed {
    ZR_SampPB params;
    SourceWalk walk;
    bool regular;
  };
  RowFunctions<T> samplers_;
  i32 count_, matrices_;
  Workspace workspace_;
  MotionSum<T>* sums_ = nullptr;
  Placed* placed_ = nullptr;
};

}  // namespace zr
