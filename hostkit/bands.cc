// Cutting into bands, and running them through the threaded iterate body.
#include "bands.h"

#include <algorithm>
#include <atomic>
#include <thread>

#include "threaded_iterate.h"
#include "threaded_iterate_state.h"

namespace zr {
namespace {

constexpr i32 bands_per_thread = 4;  // evens out rows of unlike cost, and lets an abort take effect soon

struct Run {
  const Bands& bands;
  const ZR_ProgressInfo* progress;
  void* refcon;
  DrawBand draw;
  std::thread::id caller = std::this_thread::get_id();
  std::atomic<i32> done = 0;

  i32 poll() const {
    if (progress == nullptr || std::this_thread::get_id() != caller) return 0;
    if (progress->progress != nullptr)
      return progress->progress(progress->refcon, done.load(std::memory_order_relaxed), bands.rows());
    return progress->abort != nullptr ? progress->abort(progress->refcon) : 0;
  }
};

i32 draw_one(void* refcon, i32 worker, i32 i, i32 /*count*/) {
  Run& run = *static_cast<Run*>(refcon);
  if (const i32 stop = i > 0 ? run.poll() : 0; stop != 0) return stop;
  const Rows band = run.bands[i];
  const i32 error = run.draw(run.refcon, worker, band);
  if (error == 0) run.done.fetch_add(band.end - band.first, std::memory_order_relaxed);
  return error;
}

}  // namespace

Bands::Bands(const GX_LRect& bounds, i32 threads, i32 least_pixels)
    : top_(bounds.top), bottom_(bounds.bottom), height_(rows()) {
  const i32 width = bounds.right - bounds.left;
  if (threads < 2 || width < 1 || rows() < 2) return;
  const i64 share = rows() / (i64{threads} * bands_per_thread), least = (least_pixels + i64{width} - 1) / width;
  const i64 height = (std::max<i64>({share, least, 1}) + 1) & ~i64{1};
  if (2 * height > rows()) return;
  height_ = static_cast<i32>(height);
  count_ = (rows() + (top_ & 1) + height_ - 1) / height_;
}

Rows Bands::operator[](i32 i) const {
  const i64 first = i64{top_ & ~1} + i64{i} * height_;
  const i64 end = i + 1 == count_ ? bottom_ : first + height_;
  return {std::max(static_cast<i32>(first), top_), static_cast<i32>(end)};
}

i32 threads_from_here() {
  const WorkerPool* const pool = G_iterate_workers.load(std::memory_order_acquire);
  return pool != nullptr && G_running_index < 0 ? pool->count() : 1;
}

i32 draw_bands(const Bands& bands, const ZR_ProgressInfo* progress, void* refcon, DrawBand draw) {
  Run run{.bands = bands, .progress = progress, .refcon = refcon, .draw = draw};
  try {
    if (const i32 stop = run.poll(); stop != 0) return stop;
  } catch (const i32 code) {
    return code;
  }
  return threaded_iterate(bands.count(), &run, draw_one);
}

}  // namespace zr
