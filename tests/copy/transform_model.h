// A layer drawn through matrices, one pixel at a time and one sample at a time, with the library's own point
// samplers and row blending: everything between them is told anew.
#pragma once

#include <GX/gx.h>
#include <ZR/composite.h>
#include <ZR/transfer_mode.h>

#include <cmath>
#include <optional>
#include <vector>

#include "sample/sample_functions.h"
#include "support/mask_model.h"
#include "support/worlds.h"

struct TransformCall {
  i32 quality = 1, field = 0;
  ZR_CompositeModePlus mode{XferInFront, 1.0f, nullptr, false, 0};
  const ZR_LinearBlendingTables* tables = nullptr;
  const ZR_MaskWorld* mask = nullptr;
  std::vector<GX_Matrix3> matrices;
  bool src2dst = true;
  GX_LRect rect{0, 0, 1000, 1000};

  i32 run(ZR_LayerDef* src, ZR_LayerDef* dst, const ZR_ProgressInfo* progress = nullptr,
          void** scratch = nullptr) const {
    const i32 count = static_cast<i32>(matrices.size());
    if (scratch != nullptr)
      return ZR_TransformWorldPlus(progress, quality, 0, field, src, &mode, tables, mask, matrices.data(), count,
                                   src2dst, scratch, &rect, dst);
    return ZR_TransformWorld(progress, quality, 0, field, src, &mode, tables, mask, matrices.data(), count, src2dst,
                             &rect, dst);
  }
};

inline i32 fixed_point(f64 v) { return zr::truncate_i32(65536 * v + (v < 0 ? -0.5 : 0.5)); }
inline f64 limited(f64 v) { return std::fmin(std::fmax(v, -32767), 32766); }

// One matrix, both ways.
struct PlacedLayer {
  GX_Matrix3 to_dst, to_src;
  f64 width_of(i32 column) const {
    const auto& m = to_dst.m;
    return std::sqrt(m[0][column] * m[0][column] + m[1][column] * m[1][column] + m[2][column] * m[2][column]);
  }
  i32 radius(i32 column) const { return fixed_point(std::min(0.5 / width_of(column), 127.0)); }
  bool shrinks() const { return radius(0) > 32768 || radius(1) > 32768; }
  bool collapsed() const { return 65536 * width_of(0) + 0.5 < 1 || 65536 * width_of(1) + 0.5 < 1; }
  GX_FloatPoint origin() const { return {to_dst.m[0][2] / to_dst.m[2][2], to_dst.m[1][2] / to_dst.m[2][2]}; }
  // Source position of a pixel, reached from the top left corner of the bounds in whole steps.
  GX_LPoint at(const GX_LRect& bounds, i32 x, i32 y) const {
    GX_FloatPoint start{bounds.left + 0.5, bounds.top + 0.5};
    GX_TransformFloatPoints(&to_src, &start, 1);
    const u32 dx = static_cast<u32>(x - bounds.left), dy = static_cast<u32>(y - bounds.top);
    const auto walk = [&](i32 row, f64 from) {
      return static_cast<i32>(static_cast<u32>(fixed_point(limited(from - 0.5))) +
                              dx * static_cast<u32>(fixed_point(to_src.m[row][0])) +
                              dy * static_cast<u32>(fixed_point(to_src.m[row][1])));
    };
    return {walk(0, start.x), walk(1, start.y)};
  }
};

template <class T>
class TransformModel {
 public:
  TransformModel(const TransformCall& call, TestWorld<T>& src, TestWorld<T>& dst)
      : call_(call), src_(src), dst_(dst), samplers_(zr::sample_functions<T>(call.quality)) {}

  void draw() {
    for (const GX_Matrix3& matrix : call_.matrices) placed_.push_back(place(matrix));
    const GX_Matrix3 &first = call_.matrices.front(), &last = call_.matrices.back();
    const bool moves = !GX_EqualMatrixWithinEpsilon(&first, &last, 1e-12);
    if (!placed_.front() || (moves && !placed_.back())) return;
    for (const auto& placed : placed_)
      if (placed) extend_bounds(*placed);
    if (GX_EmptyLRect(&bounds_)) return;

    const i32 xfer = call_.mode.xfer;
    const bool clears = xfer == 17 || xfer == 18;
    const PlacedLayer& front = *placed_.front();
    const i32 tx = fixed_point(front.to_dst.m[0][2]), ty = fixed_point(front.to_dst.m[1][2]);
    if (front.collapsed()) {
      for (i32 y = 0; clears && y < dst_.height(); ++y)
        for (i32 x = 0; x < dst_.width(); ++x) dst_.at(x, y).alpha = 0;
      return;
    }
    if (!moves && GX_GetMatrixType(&front.to_dst) < 2 && (call_.quality == 0 || ((tx | ty) & 0xffff) == 0)) {
      const i32 ox = (tx + 32768) >> 16, oy = (ty + 32768) >> 16;
      const GX_LRect from = {bounds_.left - ox, bounds_.top - oy, bounds_.right - ox, bounds_.bottom - oy};
      EXPECT_EQ(ZR_TransferRect(nullptr, 0, 0, call_.field, &from, src_, &call_.mode, call_.tables, call_.mask,
                                bounds_.left, bounds_.top, dst_),
                0);
      return;
    }
    const size_t count = placed_.size();
    samples_ = !moves ? 1 : count > 2 ? static_cast<i32>(count) : call_.quality == 0 ? 9 : 17;
    complex_ = moves && count > 2 && call_.quality != 0 && turns_or_is_uneven();
    for (i32 y = 0; clears && y < dst_.height(); ++y)
      for (i32 x = 0; x < dst_.width(); ++x)
        if (x < bounds_.left || x >= bounds_.right || y < bounds_.top || y >= bounds_.bottom) dst_.at(x, y).alpha = 0;
    u32 seed = static_cast<u32>(call_.mode.rand_seed);
    for (i32 y = bounds_.top; y < bounds_.bottom; ++y) {
      if (!(call_.field == 1 && y % 2 == 1) && !(call_.field == 2 && y % 2 == 0)) draw_row(y, seed);
      seed += 12281u * static_cast<u32>(bounds_.top) + 12281u * static_cast<u32>(y - bounds_.top);
    }
  }

 private:
  std::optional<PlacedLayer> place(const GX_Matrix3& matrix) const {
    GX_Matrix3 inverse;
    if (GX_InverseMatrixQuiet(&matrix, &inverse) != 0) return std::nullopt;
    return call_.src2dst ? PlacedLayer{matrix, inverse} : PlacedLayer{inverse, matrix};
  }

  void extend_bounds(const PlacedLayer& placed) {
    const auto image = [](const GX_Matrix3& matrix, const GX_LRect& r) {
      GX_FloatRect box{f64(r.left), f64(r.top), f64(r.right), f64(r.bottom)};
      GX_TransformFloatRect(&matrix, &box, &box);
      const auto round = [](f64 v) { return static_cast<i32>(std::lround(limited(v))); };
      return GX_LRect{round(box.left) - 1, round(box.top) - 1, round(box.right) + 1, round(box.bottom) + 1};
    };
    GX_LRect area = {0, 0, dst_.width(), dst_.height()};
    const GX_LRect around_source = {-1, -1, src_.width() + 1, src_.height() + 1};
    bool any = GX_SectLRect(&area, &call_.rect, &area);
    if (call_.mask != nullptr && call_.mask->kind % 2 == 0) {
      const ZR_MaskWorld& mask = *call_.mask;
      const GX_LRect matte = {mask.offset_x, mask.offset_y, mask.offset_x + mask.world.width,
                              mask.offset_y + mask.world.height};
      any = GX_SectLRect(&area, &matte, &area) && any;
    }
    GX_LRect seen = image(placed.to_src, area);
    any = any && GX_SectLRect(&seen, &around_source, &seen);
    GX_LRect more = image(placed.to_dst, seen);
    if (any && GX_SectLRect(&more, &area, &more)) GX_UnionLRect(&bounds_, &more, &bounds_);
  }

  bool turns_or_is_uneven() const {
    const auto direction = [](const PlacedLayer& p, i32 row) {
      const auto& m = p.to_src.m;
      return m[row][0] / std::sqrt(m[0][0] * m[0][0] + m[1][0] * m[1][0] + m[2][0] * m[2][0]);
    };
    for (i32 row = 0; row < 3; ++row)
      if (std::fabs(direction(*placed_.front(), row) - direction(*placed_.back(), row)) > 1.000088900582341e-12)
        return true;
    std::vector<GX_FloatPoint> o;
    for (const auto& placed : placed_) o.push_back(placed ? placed->origin() : GX_FloatPoint{1e9, 1e9});
    for (size_t i = 2; i < o.size(); ++i)
      if (std::fabs(o[i].x - o[i - 1].x - (o[1].x - o[0].x)) >= 0.9 ||
          std::fabs(o[i].y - o[i - 1].y - (o[1].y - o[0].y)) >= 0.9)
        return true;
    const size_t middle = (o.size() % 2 == 0 ? o.size() - 1 : o.size()) / 2;
    const auto far = [&](size_t a, size_t b) {
      return std::sqrt(std::pow(o[b].x - o[a].x, 2) + std::pow(o[b].y - o[a].y, 2));
    };
    return std::fabs(far(0, middle) - far(middle, o.size() - 1)) >= 1.5;
  }

  T nearest(GX_LPoint p) const { return inside(p) ? src_.at(p.x >> 16, p.y >> 16) : T{}; }
  T best(const PlacedLayer& placed, GX_LPoint p) const {
    ZR_SampPB params{};
    params.src = src_.layer();
    params.x_radius = placed.radius(0);
    params.y_radius = placed.radius(1);
    T out{};
    (placed.shrinks() ? samplers_.area : samplers_.clipping)(nullptr, p.x, p.y, &params, &out);
    return out;
  }
  // The sample's whole neighbourhood lies inside, or, in draft, the pixel does.
  bool inside(GX_LPoint p) const {
    const i32 x = p.x >> 16, y = p.y >> 16;
    if (call_.quality == 0) return x >= 0 && x < src_.width() && y >= 0 && y < src_.height();
    ZR_SampPB params{};
    params.src = src_.layer();
    T out{};
    u8 all_in = 0;
    samplers_.inside_flag(nullptr, p.x, p.y, &params, &all_in, &out);
    return all_in != 0;
  }

  T pixel(i32 x, i32 y) const {
    const PlacedLayer& front = *placed_.front();
    GX_LPoint p0 = front.at(bounds_, x, y);
    if (samples_ == 1) return call_.quality == 0 ? nearest({p0.x + 32768, p0.y + 32768}) : best(front, p0);
    std::vector<T> taken;
    if (complex_) {
      for (const auto& placed : placed_) taken.push_back(placed ? best(*placed, placed->at(bounds_, x, y)) : T{});
      return mean(taken);
    }
    const PlacedLayer& back = *placed_.back();
    GX_LPoint p1 = back.at(bounds_, x, y);
    const bool draft = call_.quality == 0;
    if (draft) p0.x += 32768, p0.y += 32768, p1.x += 32768, p1.y += 32768;
    const i32 dx = (p1.x - p0.x) / (samples_ - 1), dy = (p1.y - p0.y) / (samples_ - 1);
    const auto ahead = [&](i32 k) { return GX_LPoint{p0.x + k * dx, p0.y + k * dy}; };
    const auto back_from_end = [&](i32 k) {
      return GX_LPoint{p1.x - (samples_ - 1 - k) * dx, p1.y - (samples_ - 1 - k) * dy};
    };
    i32 entry = 0, exit = samples_;  // samples from `exit` on are counted back from the end
    while (entry < samples_ && !inside(ahead(entry))) ++entry;
    if (entry < samples_ && (draft || !front.shrinks())) {
      exit = samples_ - 1;
      while (exit > entry && !inside(back_from_end(exit))) --exit;
      if (exit == entry) exit = entry + 1;
    }
    const auto unit = [](const PlacedLayer& p) {
      return fixed_point(p.to_src.m[0][0]) == 65536 && fixed_point(p.to_src.m[1][0]) == 0;
    };
    for (i32 k = 0; k < samples_; ++k) {
      const GX_LPoint p = k < exit ? ahead(k) : back_from_end(k);
      if (draft) {
        taken.push_back(nearest(p));
      } else if (k > entry && k < exit && !front.shrinks() && unit(front) && unit(back)) {
        f64 weights[4];
        ZR_SubpixelSampleComputeWeight(static_cast<u16>(p.x), static_cast<u16>(p.y), weights);
        ZR_SampPB params{};
        params.src = src_.layer();
        T out{};
        samplers_.translate(nullptr, p.x, p.y, weights, &params, &out);
        taken.push_back(out);
      } else {
        taken.push_back(best(front, p));
      }
    }
    return mean(taken);
  }

  static T mean(const std::vector<T>& samples) {
    constexpr bool is_float = std::is_same_v<T, ZR_PixelFloat>;
    using Sum = std::conditional_t<is_float, f32, u64>;
    const Sum n = static_cast<Sum>(samples.size()), white = static_cast<Sum>(zr::Depth<T>::white);
    Sum alpha = 0;
    for (const T& s : samples) alpha += s.alpha;
    if (alpha == 0) return T{};
    const auto channel = [&](auto member) {
      Sum sum = 0;
      for (const T& s : samples) sum += static_cast<Sum>(s.alpha) * static_cast<Sum>(s.*member);
      if constexpr (is_float) {
        return alpha == n ? sum / n : sum / alpha;
      } else {
        if (alpha != n * white) return static_cast<zr::Channel<T>>(sum / alpha);
        const u64 t = static_cast<u64>(static_cast<f32>(sum) / static_cast<f32>(n));
        const u64 divided = white == 255 ? (t + ((t + 128) >> 8) + 128) >> 8 : (t + 16383) >> 15;
        return static_cast<zr::Channel<T>>(divided);
      }
    };
    return {static_cast<zr::Channel<T>>(alpha / n), channel(&T::red), channel(&T::green), channel(&T::blue)};
  }

  void draw_row(i32 y, u32 seed) {
    std::vector<T> from, cells, to;
    bool any = false, opaque = true;
    for (i32 x = bounds_.left; x < bounds_.right; ++x) {
      from.push_back(pixel(x, y));
      any = any || from.back().alpha != 0;
      opaque = opaque && from.back().alpha == static_cast<zr::Channel<T>>(zr::Depth<T>::white);
      to.push_back(dst_.at(x, y));
      if (call_.mask != nullptr) cells.push_back({mask_at(x, y), 0, 0, 0});
    }
    const i32 xfer = call_.mode.xfer;
    if (!any && xfer != -3 && xfer != 17 && xfer != 18 && xfer != 21) return;
    if (opaque && xfer == 2 && call_.mask == nullptr && !call_.mode.keep_alpha && call_.mode.opacity == 1.0f) {
      to = from;
    } else {
      ZR_BlendModeDescriptor<T> plan(ZR_BlendingMode<T>(call_.mode), call_.mask != nullptr, call_.tables);
      plan.mode.seed = static_cast<i32>(seed);
      std::vector<zr::Channel<T>> scratch(to.size());
      ZR_BlendPipeline<T>(nullptr, static_cast<i32>(to.size()), &plan, from.data(),
                          call_.mask != nullptr ? cells.data() : nullptr, scratch.data(), to.data());
    }
    for (size_t i = 0; i < to.size(); ++i) dst_.at(bounds_.left + static_cast<i32>(i), y) = to[i];
  }
  zr::Channel<T> mask_at(i32 x, i32 y) const {
    const ZR_MaskWorld& mask = *call_.mask;
    const i32 mx = x - mask.offset_x, my = y - mask.offset_y;
    const auto white = static_cast<zr::Channel<T>>(zr::Depth<T>::white);
    if (my < 0 || my >= mask.world.height) return white;
    if (mx < 0 || mx >= mask.world.width) return mask.kind % 2 == 1 ? white : zr::Channel<T>{0};
    const char* const row = static_cast<const char*>(mask.world.data) + my * mask.world.row_bytes;
    return mask_value(reinterpret_cast<const T*>(row)[mx], mask.kind);
  }

  const TransformCall& call_;
  TestWorld<T>&src_, &dst_;
  zr::SampleFunctions<T> samplers_;
  std::vector<std::optional<PlacedLayer>> placed_;
  GX_LRect bounds_{0, 0, 0, 0};
  i32 samples_ = 1;
  bool complex_ = false;
};
