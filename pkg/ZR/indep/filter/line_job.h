// What filters along lines share: which source line belongs to a destination line, strips of neighbouring lines side
// by side in memory, scratch for each thread, and the way through the generic iterator.
//
// A strip holds the pixels of some neighbouring lines at one position next to each other, so that a filter works
// on whole vectors of lines whichever way they run. Columns of a world are such a strip as they lie; rows, and
// what has to be premultiplied, are copied into one.
#pragma once

#include <ZR/blur.h>
#include <ZR/errors.h>

#include <algorithm>
#include <atomic>
#include <cstring>

#include "filter/turn_pixels.h"
#include "world/guard.h"
#include "world/premul_rows.h"

namespace zr {

// Vectors of every depth hold up to this many pixels: strips are filtered in whole groups of them.
inline constexpr i32 strip_group = 8;
inline constexpr i32 most_strip_lines = 64;

template <class T>
struct Strip {
  const T* at0 = nullptr;  // the pixel of the first line at position 0, which need not exist
  i64 step = 0;            // pixels from one position to the next
  i64 low = 0, high = 0;   // positions low..high-1 exist

  const T* at(i64 position) const { return at0 + position * step; }
  bool has(i64 position) const { return low <= position && position < high; }
};

// One world as a filter sees it: lines that run one way.
template <class T>
struct Lines {
  T* data;
  i64 along, across;  // bytes from one position, and from one line, to the next
  i64 length, count;
  i64 origin_along, origin_across;
  bool vertical;

  Lines(const ZR_World& world, bool runs_down)
      : data(static_cast<T*>(world.data)),
        along(runs_down ? world.row_bytes : static_cast<i64>(sizeof(T))),
        across(runs_down ? static_cast<i64>(sizeof(T)) : world.row_bytes),
        length(runs_down ? world.height : world.width),
        count(runs_down ? world.width : world.height),
        origin_along(runs_down ? world.origin.y : world.origin.x),
        origin_across(runs_down ? world.origin.x : world.origin.y),
        vertical(runs_down) {}
  bool whole_pixels() const { return along % static_cast<i64>(sizeof(T)) == 0; }
  T* at(i64 position, i64 line) const {
    return reinterpret_cast<T*>(reinterpret_cast<char*>(data) + position * along + line * across);
  }
};

struct BlurCall {
  const ZR_ProgressInfo* progress;
  u32 flags;
  bool premultiply;   // the source, while it is copied
  bool copy_source;   // even where it could be read in place
  bool straight_out;  // the destination
};

// Positions count in the source line; `dst_low` is that of the first destination pixel.
template <class T>
struct LineJob {
  BlurCall call;
  Lines<T> src, dst;
  i64 dst_low, dst_high;  // positions of the destination
  i64 line_shift;         // source line of a destination line
  TurnPixelsFunc<T>* turn = pixel_turner<T>();

  LineJob(const BlurCall& blur, const ZR_World& from, bool src_vertical, const ZR_World& to, bool dst_vertical)
      : call(blur), src(from, src_vertical), dst(to, dst_vertical) {
    dst_low = dst.origin_along - src.origin_along;
    dst_high = dst_low + dst.length;
    line_shift = dst.origin_across - src.origin_across;
  }
  // Lines of a strip. Strips of columns are wide, to make use of memory pages; rows have to pass a corner turn.
  i32 strip_lines() const {
    if (src.vertical && dst.vertical) return sizeof(T) == 16 ? most_strip_lines / 2 : most_strip_lines;
    return std::max(64 / static_cast<i32>(sizeof(T)), strip_group);
  }
  // Whether strips of so many lines are read where they lie.
  bool reads_in_place(i32 lines) const { return src.vertical && lines % strip_group == 0 && reads_as_it_is(); }
  bool writes_in_place(i32 lines) const { return dst.vertical && lines % strip_group == 0 && writes_all(); }
  // Whether rows can be filtered one by one where they lie.
  bool rows_in_place() const {
    return !src.vertical && !dst.vertical && src.data != dst.data && reads_as_it_is() && writes_all();
  }

 private:
  bool reads_as_it_is() const { return !call.premultiply && !call.copy_source && src.whole_pixels(); }
  bool writes_all() const {
    return (call.flags & ZR_BlurFlag_AllChannels) == ZR_BlurFlag_AllChannels && dst.whole_pixels();
  }
};

inline i32 padded_lines(i32 lines) { return (lines + strip_group - 1) / strip_group * strip_group; }

// -------------------------------------------------------------------------------- to and from strips

// The source between two positions, premultiplied where the call asks for it. Lines that fill up a group are zero.
template <class T>
Strip<T> copied_strip(const LineJob<T>& job, i64 src_line, i32 lines, i32 width, i64 low, i64 high, T* memory) {
  const i32 padded = padded_lines(lines);
  if (low >= high) return {memory, width, 0, 0};
  if (padded != lines)
    for (i64 p = low; p < high; ++p)
      std::memset(memory + (p - low) * width + lines, 0, static_cast<std::size_t>(padded - lines) * sizeof(T));
  if (job.src.vertical) {
    for (i64 p = low; p < high; ++p) {
      const T* const row = job.src.at(p, src_line);
      T* const out = memory + (p - low) * width;
      if (job.call.premultiply)
        premul_row<T>(lines, row, out);
      else
        std::memcpy(out, row, static_cast<std::size_t>(lines) * sizeof(T));
    }
  } else {
    job.turn(job.src.at(low, src_line), job.src.across, lines, high - low, memory, width * static_cast<i64>(sizeof(T)));
    if (job.call.premultiply) {
      constexpr i64 at_once = 1 << 16;
      const i64 pixels = (high - low) * width;
      for (i64 i = 0; i < pixels; i += at_once)
        premul_row<T>(static_cast<i32>(std::min(at_once, pixels - i)), nullptr, memory + i);
    }
  }
  return {memory - low * width, width, low, high};
}

// Finished pixels of some positions from a strip into the destination; channels outside of the flags come from the
// source, which may be the same world.
template <class T>
void emit_strip(const LineJob<T>& job, i64 dst_line, i32 lines, i32 width, i64 low, i64 high, T* strip) {
  if ((job.call.flags & ZR_BlurFlag_AllChannels) != ZR_BlurFlag_AllChannels) {
    const auto keep = [&](u32 flag) { return (job.call.flags & flag) == 0; };
    const bool a = keep(ZR_BlurFlag_Alpha), r = keep(ZR_BlurFlag_Red), g = keep(ZR_BlurFlag_Green),
               b = keep(ZR_BlurFlag_Blue);
    for (i64 p = low; p < high; ++p) {
      const bool inside = p >= 0 && p < job.src.length;
      for (i32 l = 0; l < lines; ++l) {
        const T was = inside ? *job.src.at(p, dst_line + job.line_shift + l) : T{};
        T& now = strip[(p - low) * width + l];
        if (a) now.alpha = was.alpha;
        if (r) now.red = was.red;
        if (g) now.green = was.green;
        if (b) now.blue = was.blue;
      }
    }
  }
  const i64 first = low - job.dst_low;
  if (job.dst.vertical) {
    for (i64 p = 0; p < high - low; ++p)
      std::memcpy(job.dst.at(first + p, dst_line), strip + p * width, static_cast<std::size_t>(lines) * sizeof(T));
  } else {
    job.turn(strip, width * static_cast<i64>(sizeof(T)), high - low, lines, job.dst.at(first, dst_line),
             job.dst.across);
  }
}

// Runs the last pass of a strip: body(low, high, out, step) fills consecutive positions, from dst_low to dst_high,
// with whole groups of lines. `chunk` has room for chunk_positions.
inline constexpr i64 chunk_positions = 64;
template <class T, class Body>
void write_strip(const LineJob<T>& job, i64 dst_line, i32 lines, i32 width, T* chunk, Body body) {
  if (job.writes_in_place(lines)) {
    body(job.dst_low, job.dst_high, job.dst.at(0, dst_line), job.dst.along / static_cast<i64>(sizeof(T)));
    return;
  }
  for (i64 low = job.dst_low; low < job.dst_high; low += chunk_positions) {
    const i64 high = std::min(low + chunk_positions, job.dst_high);
    if (!job.dst.vertical && sizeof(T) < 16) {
      // Lines of the destination, on their way while the chunk is made; of floats they are too many.
      const i64 bytes = (high - low) * static_cast<i64>(sizeof(T));
      for (i32 l = 0; l < lines; ++l) {
        const char* const line = reinterpret_cast<const char*>(job.dst.at(low - job.dst_low, dst_line + l));
        for (i64 b = 0; b < bytes; b += 64) __builtin_prefetch(line + b, 1);
      }
    }
    body(low, high, chunk, i64{width});
    emit_strip(job, dst_line, lines, width, low, high, chunk);
  }
}

// -------------------------------------------------------------------------------- memory and threads

// A block of counted memory for each thread; throws when there is none.
class ThreadScratch {
 public:
  explicit ThreadScratch(u64 bytes_each) : bytes_((bytes_each + 63) / 64 * 64) {
    HB_GetNumThreads(&threads_, 1);
    const u64 threads = static_cast<u64>(threads_);
    const u64 all = bytes_ > ~u64{0} / 2 / threads ? ~u64{0} / 2 : bytes_ * threads;
    block_ = static_cast<char*>(HB_AllocatePtr(all + 64, HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_BlurMemory, 0, 0),
                                               ZR_ModuleCode | ZR_Site_Blur));
    if (block_ == nullptr) fail(ZR_Err_OutOfMemory);
    first_ = block_ + (64 - reinterpret_cast<std::uintptr_t>(block_) % 64) % 64;
  }
  ~ThreadScratch() { HB_FreePtr(block_); }
  ThreadScratch(const ThreadScratch&) = delete;
  ThreadScratch& operator=(const ThreadScratch&) = delete;
  // Null for an index that nobody announced.
  char* of(i32 thread) const {
    return thread >= 0 && thread < threads_ ? first_ + static_cast<u64>(thread) * bytes_ : nullptr;
  }

 private:
  u64 bytes_;
  i32 threads_ = 1;
  char *block_ = nullptr, *first_ = nullptr;
};

template <class T>
void clear_lines(const LineJob<T>& job, i64 first, i64 end) {
  const Lines<T>& dst = job.dst;
  if (first >= end) return;
  if (dst.vertical)
    for (i64 p = 0; p < dst.length; ++p)
      std::memset(dst.at(p, first), 0, static_cast<std::size_t>(end - first) * sizeof(T));
  else
    for (i64 l = first; l < end; ++l) std::memset(dst.at(0, l), 0, static_cast<std::size_t>(dst.length) * sizeof(T));
}

// Hands strips of up to `width` destination lines to body(scratch, first_line, lines), all with a source line, through
// the generic iterator. Throws what stops it.
template <class T, class Body>
void for_strips(const LineJob<T>& job, i32 width, const ThreadScratch& scratch, const Body& body) {
  struct Work {
    const LineJob<T>& job;
    const i32 width;
    const ThreadScratch& scratch;
    const Body& body;
    std::atomic<i32> stop = 0;

    // The lines from `first` on that the host lets pass. Its answers are asked for line by line, but before the
    // strip, whose lines are finished together: what stands in the destination at the end is the same.
    i64 allowed(i32 thread, i64 first, i64 end) {
      const ZR_ProgressInfo* const info = job.call.progress;
      if (stop.load(std::memory_order_relaxed) != 0) return first;
      if (thread != 0 || info == nullptr || info->abort == nullptr) return end;
      for (i64 line = first; line < end; ++line) {
        const i32 code = info->abort(info->refcon);
        if (code == 0) continue;
        stop.store(code, std::memory_order_relaxed);
        return line + 1;
      }
      return end;
    }
    i32 strip(i32 thread, i32 index) {
      char* const memory = scratch.of(thread);
      if (memory == nullptr) return failed_verification(ZR_Site_Blur, "a blur runs on more threads than announced");
      const i64 first = i64{index} * width;
      const i64 end = allowed(thread, first, std::min(first + width, job.dst.count));
      const i64 low = std::clamp<i64>(-job.line_shift, first, end);
      const i64 high = std::clamp<i64>(job.src.count - job.line_shift, low, end);
      clear_lines(job, first, low);
      if (high > low) body(memory, low, static_cast<i32>(high - low));
      clear_lines(job, high, end);
      return stop.load(std::memory_order_relaxed);
    }
  };
  if (job.dst.count < 1 || job.dst.length < 1) return;
  Work work{job, width, scratch, body};
  const i32 strips = static_cast<i32>((job.dst.count - 1) / width + 1);
  const i32 error = ZR_IterateGeneric(strips, &work, [](void* refcon, i32 thread, i32 i, i32) -> i32 {
    return guarded([&] { return static_cast<Work*>(refcon)->strip(thread, i); });
  });
  if (error != 0) fail(error);
}

// Both worlds' depth, or throws.
inline i32 blur_depth(const ZR_World* src, const ZR_World* dst) {
  if (src == nullptr || dst == nullptr) fail(failed_verification(ZR_Site_Blur, "a blur needs two worlds"));
  if (src->data == nullptr || dst->data == nullptr)
    fail(failed_verification(ZR_Site_Blur, "a blur needs worlds with pixels"));
  const i32 depth = src->GetBitDepth();
  if (depth != dst->GetBitDepth()) fail(failed_verification(ZR_Site_Blur, "a blur needs worlds of one depth"));
  return depth;
}

}  // namespace zr
