// The box blur: pass ranges, and strips of lines through one or more passes.
#include <cmath>
#include <limits>

#include "filter/blur_limits.h"
#include "filter/box_rows.h"
#include "filter/line_job.h"

namespace zr {
namespace {

struct Range {
  i64 low, high;
  i64 length() const { return std::max<i64>(high - low, 0); }
};

struct Box {
  i64 reach;      // ceil of the radius
  f32 shortfall;  // of the two outermost pixels, in pixels

  explicit Box(f32 radius) : reach(static_cast<i64>(std::ceil(radius))), shortfall(static_cast<f32>(reach) - radius) {}
};

// Counted memory that goes with its holder.
class Ranges {
 public:
  explicit Ranges(u64 count)
      : first_(static_cast<Range*>(HB_AllocatePtr(count * sizeof(Range),
                                                  HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_BlurMemory, 0, 0),
                                                  ZR_ModuleCode | ZR_Site_Blur))) {
    if (first_ == nullptr) fail(ZR_Err_OutOfMemory);
  }
  ~Ranges() { HB_FreePtr(first_); }
  Ranges(const Ranges&) = delete;
  Ranges& operator=(const Ranges&) = delete;
  Range& operator[](u64 i) const { return first_[i]; }

 private:
  Range* first_;
};

// Entry k is what pass k produces and pass k + 1 reads; entry 0 is the source or a copy, the last the destination.
template <class T>
void find_ranges(const LineJob<T>& job, const Box& box, u32 iterations, bool in_place, const Ranges& ranges) {
  const i64 n = iterations, d0 = job.dst_low, d1 = job.dst_high, end = job.src.length;
  ranges[0] = {0, end};
  if (!in_place) ranges[0] = {std::max<i64>(d0 - n * box.reach, 0), std::min(d1 + n * box.reach, end)};
  for (u32 k = 1; k < iterations; ++k) {
    const i64 rest = (n - k) * box.reach;
    ranges[k] = {std::max(d0 - rest, ranges[k - 1].low - box.reach),
                 std::min(ranges[k - 1].high + box.reach, d1 + rest)};
  }
  ranges[iterations] = {d0, d1};
}

// What divides the window around a position.
template <class T>
void weigh(const Box& box, bool renormalise, const Strip<T>& in, i64 position, BoxWeights<T>* weights) {
  const i64 first = position - box.reach, last = position + box.reach;
  const i64 inside = std::max<i64>(std::min(last + 1, in.high) - std::max(first, in.low), 0);
  const i32 edges = in.has(first) + in.has(last);
  if constexpr (std::is_same_v<T, ZR_Pixel8>) {
    const i32 shortfall = static_cast<i32>(box.shortfall * 1024);
    const i64 whole = (box.reach << 11) - 2 * shortfall + 1024;
    const i64 divisor = renormalise ? inside * 1024 - edges * shortfall : whole;
    weights->shortfall = shortfall;
    weights->divisor = static_cast<i32>(divisor);
  } else {
    const f32 edge = edges == 0 ? 0 : edges == 1 ? box.shortfall : box.shortfall + box.shortfall;
    weights->shortfall = box.shortfall;
    weights->divisor =
        renormalise ? static_cast<f32>(inside) - edge : static_cast<f32>(2 * box.reach + 1) - 2 * box.shortfall;
  }
}

// One pass along a strip, which may be made in parts.
template <class T>
class BoxPass {
 public:
  BoxPass(const Box& box, bool renormalise, bool straight, const BoxRows<T>& rows, const Strip<T>& in, i32 pixels,
          i64 start, void* sums)
      : box_(box), renormalise_(renormalise), in_(in), run_one_(straight ? rows.straight : rows.premultiplied) {
    run_ = {};
    run_.pixels = pixels;
    run_.sums = sums;
    std::memset(sums, 0, static_cast<std::size_t>(pixels) * 4 * sizeof(f64));
    const i64 low = std::max(start - box.reach - 1, in.low), high = std::min(start + box.reach, in.high);
    if (low < high) rows.add(pixels, high - low, in.at(low), in.step, sums);
  }
  void make(i64 low, i64 high, T* out, i64 out_step) {
    while (low < high) {
      const i64 end = alike_until(low, high);
      run_.count = end - low;
      place(low - box_.reach - 1, &run_.leaving, &run_.leaving_step);
      run_.leaves = in_.has(low - box_.reach - 1);
      run_.enters = in_.has(low + box_.reach);
      place(low - box_.reach, &run_.first, &run_.first_step);
      place(low + box_.reach, &run_.entering, &run_.entering_step);
      run_.out = out;
      run_.out_step = out_step;
      weigh(box_, renormalise_, in_, low, &run_.weights);
      run_one_(run_);
      out += (end - low) * out_step;
      low = end;
    }
  }

 private:
  // Up to where the pixels at the window's ends stay inside or outside of the line as they are at `low`, and the
  // divisor stays.
  i64 alike_until(i64 low, i64 high) const {
    for (const i64 shift : {-box_.reach - 1, -box_.reach, box_.reach})
      for (const i64 border : {in_.low, in_.high})
        if (border - shift > low) high = std::min(high, border - shift);
    if (renormalise_ && in_.has(low - box_.reach) != in_.has(low + box_.reach)) return low + 1;
    return high;
  }
  void place(i64 position, const T** pixels, i64* step) const {
    alignas(64) static constexpr T outside[most_strip_lines] = {};
    *pixels = in_.has(position) ? in_.at(position) : outside;
    *step = in_.has(position) ? in_.step : 0;
  }

  Box box_;
  bool renormalise_;
  Strip<T> in_;
  void (*run_one_)(const BoxRun<T>&);
  BoxRun<T> run_;
};

template <class T>
const BoxRows<T>& rows_for(u32 flags) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    if ((flags & ZR_BlurFlag_AllChannels) == ZR_BlurFlag_Alpha) return box_rows_of_float_alpha();
  const BoxRows<T>* const lanes = lane_box_rows<T>();
  return lanes != nullptr ? *lanes : single_box_rows<T>();
}

template <class T>
void box_blur(const LineJob<T>& job, const Box& box, u32 iterations) {
  const bool renormalise = (job.call.flags & ZR_BlurFlag_Renormalise) != 0;
  const i32 width = job.strip_lines();
  const bool direct = !job.call.premultiply && !job.call.copy_source;
  const Ranges ranges(u64{iterations} + 1);
  find_ranges(job, box, iterations, direct, ranges);
  i64 longest = ranges[0].length();
  for (u32 k = 1; k < iterations; ++k) longest = std::max(longest, ranges[k].length());
  if constexpr (std::is_same_v<T, ZR_Pixel8>) {
    const i64 held = std::min(2 * box.reach + 1, longest);
    if (held * (255 * 1024) + box.reach * 1024 + 512 > std::numeric_limits<i32>::max())
      fail(failed_verification(ZR_Site_Blur, "a box blur's sums do not fit 32 bits"));
  }
  const BoxRows<T>& rows = rows_for<T>(job.call.flags);

  const u64 row_bytes = static_cast<u64>(width) * sizeof(T);
  const u64 sum_bytes = static_cast<u64>(width) * 4 * sizeof(f64), chunk_bytes = row_bytes * chunk_positions;
  const u64 buffer_bytes = static_cast<u64>(longest) * row_bytes;
  const ThreadScratch scratch(sum_bytes + chunk_bytes + (iterations > 1 ? 2 : 1) * buffer_bytes);
  for_strips(job, width, scratch, [&](char* memory, i64 line, i32 lines) {
    char* const sums = memory;
    T* const chunk = reinterpret_cast<T*>(memory + sum_bytes);
    T* const first_buffer = chunk + chunk_positions * width;
    T* const buffers[2] = {first_buffer, first_buffer + longest * width};
    const i64 src_line = line + job.line_shift;
    const i32 padded = padded_lines(lines);
    Strip<T> strip;
    if (job.reads_in_place(lines))
      strip = {job.src.at(0, src_line), job.src.along / static_cast<i64>(sizeof(T)), 0, job.src.length};
    else
      strip = copied_strip(job, src_line, lines, width, ranges[0].low, ranges[0].high, buffers[0]);
    for (u32 k = 1; k < iterations; ++k) {
      const Range made = ranges[k];
      T* const out = buffers[k % 2];
      if (made.length() > 0)
        BoxPass<T>(box, renormalise, false, rows, strip, padded, made.low, sums).make(made.low, made.high, out, width);
      strip = {out - made.low * width, width, made.low, std::max(made.low, made.high)};
    }
    BoxPass<T> last(box, renormalise, job.call.straight_out, rows, strip, padded, job.dst_low, sums);
    write_strip(job, line, lines, width, chunk,
                [&](i64 low, i64 high, T* out, i64 step) { last.make(low, high, out, step); });
  });
}

}  // namespace
}  // namespace zr

void ZR_BoxBlur1D(const ZR_ProgressInfo* progress, const ZR_World* src, f32 radius, u32 iterations, u32 flags,
                  bool src_vertical, bool src_premultiplied, bool dst_vertical, bool dst_premultiplied, bool force_copy,
                  ZR_World* dst) {
  using namespace zr;
  const i32 depth = blur_depth(src, dst);
  if (!(radius >= 0 && radius <= box_radius_limit))
    fail(failed_verification(ZR_Site_Blur, "a box blur's radius is out of range"));
  if (iterations == 0) fail(failed_verification(ZR_Site_Blur, "a box blur of no iterations"));
  const bool colour = (flags & ZR_BlurFlag_AllChannels & ~u32{ZR_BlurFlag_Alpha}) != 0;
  const BlurCall call = {progress, flags, !src_premultiplied && colour, force_copy, !dst_premultiplied};
  const i32 error = on_depth(depth, unknown_depth_text, [&]<class T>() -> i32 {
    box_blur(LineJob<T>(call, *src, src_vertical, *dst, dst_vertical), Box(radius), iterations);
    return ZR_Err_None;
  });
  if (error != 0) fail(error);
}
