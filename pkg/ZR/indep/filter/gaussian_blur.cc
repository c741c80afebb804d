// The Gaussian blur: the kernel of a radius, and strips of lines under it.
#include <ZR/filter.h>

#include <cmath>

#include "filter/bell_rows.h"
#include "filter/blur_limits.h"
#include "filter/line_job.h"

namespace zr {
namespace {

// Whole-numbered taps of one side, the middle first, and a 0 behind them.
class Bell {
 public:
  explicit Bell(f32 radius) : reach_(static_cast<i32>(std::ceil(radius))) {
    const u64 bytes = (static_cast<u64>(reach_) + 2) * sizeof(i32);
    weights_ = static_cast<i32*>(HB_AllocatePtr(bytes, HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_GaussianWeights, 0, 0),
                                                ZR_ModuleCode | ZR_Site_Blur));
    if (weights_ == nullptr) fail(ZR_Err_OutOfMemory);
    weights_[0] = full_ = 255;
    for (i32 i = 1; i <= reach_; ++i) {
      weights_[i] = truncate_i32(ZRp_GaussianValue(i / (1.0 + radius)) * 255);
      full_ += 2 * weights_[i];
    }
    weights_[reach_ + 1] = 0;
  }
  ~Bell() { HB_FreePtr(weights_); }
  Bell(const Bell&) = delete;
  Bell& operator=(const Bell&) = delete;

  i32 reach() const { return reach_; }
  const i32* weights() const { return weights_; }
  i32 full() const { return full_; }
  i32 sum(const TapRange& taps) const {
    i32 sum = 0;
    for (i32 i = taps.first; i < taps.end; ++i) sum += weights_[i];
    return sum;
  }

 private:
  i32 reach_, full_ = 0;
  i32* weights_ = nullptr;
};

template <class T>
const BellRows<T>& rows_for() {
  const BellRows<T>* const lanes = lane_bell_rows<T>();
  return lanes != nullptr ? *lanes : single_bell_rows<T>();
}

// Along one strip, in parts.
template <class T>
class BellPass {
 public:
  BellPass(const LineJob<T>& job, const Bell& bell, const Strip<T>& in, i32 pixels)
      : bell_(bell),
        in_(in),
        renormalise_((job.call.flags & ZR_BlurFlag_Renormalise) != 0),
        run_one_(job.call.straight_out ? rows_for<T>().straight : rows_for<T>().premultiplied) {
    run_ = {};
    run_.pixels = pixels;
    run_.step = in.step;
    run_.reach = bell.reach();
    run_.weights = bell.weights();
    run_.alpha_is_filtered = (job.call.flags & ZR_BlurFlag_Alpha) != 0;
  }
  void make(i64 low, i64 high, T* out, i64 out_step) {
    while (low < high) {
      place(low);
      // Inside the line all positions have the same taps.
      const i64 end = run_.is_whole() ? std::min(high, in_.high - bell_.reach()) : low + 1;
      run_.count = end - low;
      run_.out = out;
      run_.out_step = out_step;
      run_one_(run_);
      out += (end - low) * out_step;
      low = end;
    }
  }

 private:
  void place(i64 p) {
    const auto taps = [&](i64 first, i64 end) {
      const i64 from = std::clamp<i64>(first, 1, bell_.reach() + 1);
      return TapRange{static_cast<i32>(from), static_cast<i32>(std::clamp<i64>(end, from, bell_.reach() + 1))};
    };
    run_.middle = in_.at(p);
    run_.has_middle = in_.has(p);
    run_.ahead = taps(in_.low - p, in_.high - p);
    run_.behind = taps(p - in_.high + 1, p - in_.low + 1);
    run_.divisor = bell_.full();
    if (renormalise_)
      run_.divisor = (run_.has_middle ? bell_.weights()[0] : 0) + bell_.sum(run_.ahead) + bell_.sum(run_.behind);
  }

  const Bell& bell_;
  Strip<T> in_;
  bool renormalise_;
  void (*run_one_)(const BellRun<T>&);
  BellRun<T> run_;
};

template <class T>
void gaussian_blur(const LineJob<T>& job, const Bell& bell) {
  // Pixels of floats fill vectors with their neighbours in the row as well as with those below.
  const bool by_rows = sizeof(T) == 16 && job.rows_in_place() && lane_bell_rows<T>() != nullptr;
  const i32 width = by_rows ? 1 : job.strip_lines();
  // The whole source line, or of a copy what the destination needs.
  const i64 low = std::clamp<i64>(job.dst_low - bell.reach(), 0, job.src.length);
  const i64 high = std::clamp<i64>(job.dst_high + bell.reach(), low, job.src.length);
  const u64 row_bytes = static_cast<u64>(width) * sizeof(T);
  const ThreadScratch scratch(by_rows ? 0 : (chunk_positions + static_cast<u64>(high - low)) * row_bytes);
  for_strips(job, width, scratch, [&](char* memory, i64 line, i32 lines) {
    const i64 src_line = line + job.line_shift;
    if (by_rows) {
      const Strip<T> row = {job.src.at(0, src_line), 1, 0, job.src.length};
      return BellPass<T>(job, bell, row, 1).make(job.dst_low, job.dst_high, job.dst.at(0, line), 1);
    }
    T* const chunk = reinterpret_cast<T*>(memory);
    Strip<T> strip;
    if (job.reads_in_place(lines))
      strip = {job.src.at(0, src_line), job.src.along / static_cast<i64>(sizeof(T)), 0, job.src.length};
    else
      strip = copied_strip(job, src_line, lines, width, low, high, chunk + chunk_positions * width);
    BellPass<T> pass(job, bell, strip, padded_lines(lines));
    write_strip(job, line, lines, width, chunk,
                [&](i64 from, i64 end, T* out, i64 step) { pass.make(from, end, out, step); });
  });
}

}  // namespace
}  // namespace zr

void ZR_GaussianBlur1D(const ZR_ProgressInfo* progress, const ZR_World* src, f32 radius, u32 flags, bool src_vertical,
                       bool src_premultiplied, bool dst_vertical, bool dst_premultiplied, bool force_copy,
                       ZR_World* dst) {
  using namespace zr;
  const i32 depth = blur_depth(src, dst);
  if (!(radius >= 0 && radius <= (depth == 8 ? bell_radius_limit_8 : bell_radius_limit)))
    fail(failed_verification(ZR_Site_Blur, "a Gaussian blur's radius is out of range"));
  const bool colour = (flags & ZR_BlurFlag_AllChannels & ~u32{ZR_BlurFlag_Alpha}) != 0;
  const BlurCall call = {progress, flags, !src_premultiplied && colour, force_copy, !dst_premultiplied};
  const Bell bell(radius);
  const i32 error = on_depth(depth, unknown_depth_text, [&]<class T>() -> i32 {
    gaussian_blur(LineJob<T>(call, *src, src_vertical, *dst, dst_vertical), bell);
    return ZR_Err_None;
  });
  if (error != 0) fail(error);
}
