// Row samplers of a layer that moves while the shutter is open: each pixel is the mean of many samples, colour
// weighted by alpha.
#pragma once

#include <HB/hb.h>
#include <ZR/errors.h>

#include <cstdlib>

#include "copy/transform_bounds.h"
#include "copy/transform_samplers.h"
#include "sample/motion_line.h"
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
  // A row of `count` pixels for lanes, from pixel i on.
  MotionRun run(i32 i, i32 count, i32 offset, const f64 (*weights)[4]) const {
    const auto part = [&](const SourceWalk& walk) {
      return SampleRun{count - i, wrap_add(wrap_add(walk.x, offset), wrap_mul(i, walk.step_x)),
                       wrap_add(wrap_add(walk.y, offset), wrap_mul(i, walk.step_y)), walk.step_x, walk.step_y};
    };
    return {part(first), part(last), samples, weights};
  }
  // Its pixels of which all samples lie in a rectangle of the source.
  PixelRange inside(i32 count, i32 offset, const GX_LRect& rect) const {
    const MotionRun all = run(0, count, offset, nullptr);
    const PixelRange a = run_within(all.first, rect), b = run_within(all.last, rect);
    const i32 begin = std::max(a.first, b.first), end = std::min(a.end, b.end);
    return begin < end ? PixelRange{begin, end} : PixelRange{0, 0};
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
  DraftMotionRow(const ZR_WorldX<T>& src, const ZR_SampPB& params, const MotionWalk& walk, i32 count)
      : src_(src), params_(params), walk_(walk), count_(count), lanes_(nearest_rows_of<T>(src)) {}

  i32 sample(T* row, RowSum<T>* sum) override {
    RowSum<T> total{};
    const auto each = [&](i32 first, i32 end) {
      for (i32 i = first; i < end; ++i) {
        row[i] = pixel(walk_.line(i, 32768));
        total += row[i].alpha;
      }
    };
    i32 done = 0;
    if (lanes_ != nullptr && walk_.samples <= most_lane_samples) {
      const GX_LRect all = {0, 0, std::min(src_.width, 32768), std::min(src_.height, 32768)};
      const PixelRange inner = walk_.inside(count_, 32768, all);
      each(0, inner.first);
      done = inner.first;
      if (inner.first < inner.end)
        done += lanes_->motion(walk_.run(inner.first, inner.end, 32768, nullptr), params_, &total, row + inner.first);
    }
    each(done, count_);
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
  ZR_SampPB params_;
  MotionWalk walk_;
  i32 count_;
  const LaneNearest<T>* lanes_;  // may be null
};

// Bilinear, bicubic or area samples along a straight line.
template <class T>
class BestMotionRow final : public RowSampler<T> {
 public:
  BestMotionRow(const SampleFunctions<T>& samplers, const ZR_SampPB& params, const MotionWalk& walk, i32 count,
                void* const scratch[10])
      : samplers_(samplers), params_(params), walk_(walk), count_(count) {
    if (walk.samples <= most_lane_samples) lanes_ = motion_rows(samplers);
    const std::size_t samples = static_cast<std::size_t>(walk.samples);
    held_ = workspace_.take<T>(scratch[8], Workspace::block8_bytes, samples);
    if (walk.keeps_phases()) weights_ = workspace_.take<f64[4]>(scratch[9], Workspace::block9_bytes, samples);
  }

  i32 sample(T* row, RowSum<T>* sum) override {
    error_ = ZR_Err_None;
    if (weights_ != nullptr) compute_weights();
    const bool area = takes_area(params_);
    RowSum<T> total{};
    const auto each = [&](i32 first, i32 end) {
      for (i32 i = first; i < end; ++i) {
        const SampleLine line = walk_.line(i, 0);
        row[i] = area ? box_pixel(line) : pixel(line);
        total += row[i].alpha;
      }
    };
    i32 done = 0;
    LaneMotionFunc<T>* const lanes = area ? nullptr : weights_ != nullptr ? lanes_.weighted : lanes_.each;
    if (lanes != nullptr) {
      const PixelRange inner = walk_.inside(count_, 0, lanes_.inside(*params_.src));
      each(0, inner.first);
      done = inner.first;
      if (inner.first < inner.end)
        done += lanes(walk_.run(inner.first, inner.end, 0, weights_), params_, &total, row + inner.first);
    }
    each(done, count_);
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
  MotionRows<T> lanes_;
  ZR_SampPB params_;
  MotionWalk walk_;
  i32 count_;
  i32 error_ = ZR_Err_None;
  Workspace workspace_;
  T* held_ = nullptr;
  f64 (*weights_)[4] = nullptr;
};

// Sums over rows of samples of the same pixels, and their means.
template <class T>
class RowSums {
 public:
  // In the scratch block or memory of the workspace. Throws out of memory.
  RowSums(i32 count, i32 samples, void* block, Workspace* workspace) : count_(count), samples_(samples) {
    if (samples <= most_lane_samples) lanes_ = lane_motion_sums<T>();
    bytes_ = lanes_ != nullptr ? lanes_->bytes(count) : static_cast<std::size_t>(count) * sizeof(MotionSum<T>);
    sums_ = workspace->take<char>(block, Workspace::block8_bytes, bytes_);
  }
  void clear() { std::memset(sums_, 0, bytes_); }
  // `alphas` is their sum.
  void add(const T* row, RowSum<T> alphas) {
    if constexpr (!std::is_same_v<T, ZR_PixelFloat>)
      if (all_clear<T>(alphas)) return;
    if (lanes_ != nullptr)
      lanes_->add(count_, row, sums_);
    else
      for (i32 i = 0; i < count_; ++i) single_sums()[i].add(row[i]);
  }
  void mean(T* row, RowSum<T>* sum) const {
    RowSum<T> total{};
    if (lanes_ != nullptr) {
      lanes_->mean(count_, samples_, sums_, &total, row);
    } else {
      for (i32 i = 0; i < count_; ++i) {
        row[i] = single_sums()[i].mean(samples_);
        total += row[i].alpha;
      }
    }
    *sum = total;
  }

 private:
  MotionSum<T>* single_sums() const { return reinterpret_cast<MotionSum<T>*>(sums_); }

  i32 count_, samples_;
  const LaneMotionSums<T>* lanes_ = nullptr;  // may be null
  char* sums_ = nullptr;                      // theirs, or those of single pixels
  std::size_t bytes_ = 0;
};

// Box means along a straight line, of a layer that keeps its size and lies straight: sample k of all pixels of a row
// is a row of boxes as of a layer that stands still.
template <class T>
class AreaMotionRow final : public RowSampler<T> {
 public:
  static bool suits(const RowFunctions<T>& samplers, const ZR_SampPB& params, const MotionWalk& walk) {
    const bool level = walk.first.step_y == 0 && walk.last.step_y == 0;
    return takes_area(params) && samplers.inner_boxes != nullptr && level && walk.first.step_x == walk.last.step_x;
  }
  AreaMotionRow(const RowFunctions<T>& samplers, const ZR_SampPB& params, const MotionWalk& walk, i32 count,
                void* const scratch[10])
      : samplers_(samplers),
        params_(params),
        walk_(walk),
        count_(count),
        sums_(count, walk.samples, scratch[8], &workspace_) {}

  i32 sample(T* row, RowSum<T>* sum) override {
    i32 error = ZR_Err_None;
    const SampleLine line = walk_.line(0, 0);
    sums_.clear();
    for (i32 k = 0; k < walk_.samples; ++k) {
      const GX_LPoint first = line.from_first(k);
      SourceWalk placed = walk_.first;
      placed.x = first.x, placed.y = first.y;
      RowSum<T> alphas{};
      note(sample_best_row<T>(samplers_, params_, placed, count_, nullptr, row, &alphas), &error);
      sums_.add(row, alphas);
    }
    sums_.mean(row, sum);
    return error;
  }
  void next_row() override { walk_.next_row(); }

 private:
  RowFunctions<T> samplers_;
  ZR_SampPB params_;
  MotionWalk walk_;
  i32 count_;
  Workspace workspace_;
  RowSums<T> sums_;
};

// One sample through each matrix. A row is fetched through one matrix after the other, so that every pixel
// gets its samples in order and each fetch runs as it does for a layer that stands still.
template <class T>
class ComplexMotionRow final : public RowSampler<T> {
 public:
  ComplexMotionRow(const SampleFunctions<T>& samplers, const ZR_SampPB& params, const MatrixList& list,
                   const GX_LRect& bounds, void* const scratch[10])
      : samplers_(samplers),
        count_(bounds.right - bounds.left),
        matrices_(list.count),
        sums_(count_, matrices_, scratch[8], &workspace_) {
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
    sums_.clear();
    for (i32 k = 0; k < matrices_; ++k) {
      const Placed& placed = placed_[k];
      if (!placed.regular) continue;  // a transparent sample adds nothing
      RowSum<T> alphas{};
      note(sample_best_row<T>(samplers_, placed.params, placed.walk, count_, nullptr, row, &alphas), &error);
      sums_.add(row, alphas);
    }
    sums_.mean(row, sum);
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
  RowSums<T> sums_;
  Placed* placed_ = nullptr;
};

}  // namespace zr
