// The pool of frames at rest. Fresh pages of a frame cost more than the work on its pixels, so a frame that
// is freed waits here for the next of its size.
#include <HB/hb.h>
#include <RS/rs.h>

#include <cstdint>
#include <cstdlib>
#include <mutex>
#include <new>

#if defined(__linux__)
#include <sys/mman.h>
#endif

namespace {

// Written into the first bytes of a resting frame, so that the pool itself never allocates.
struct Resting {
  std::size_t bytes;                   // its size class
  Resting *newer, *older;              // among all
  Resting *newer_alike, *older_alike;  // among those in the same bucket
};

constexpr std::size_t frame_alignment = 64;
static_assert(sizeof(Resting) <= frame_alignment);
constexpr std::size_t page = 4096;
// Above this a request is an overflow of somebody's arithmetic, not a need.
constexpr std::size_t largest_request = std::size_t{1} << 39;

// Whole cache lines, and whole pages for what is larger than one.
std::size_t size_class(std::size_t bytes) {
  const std::size_t step = bytes > page ? page : frame_alignment;
  return bytes == 0 ? step : (bytes + step - 1) / step * step;
}

// A fresh frame, else null. Rows are walked from end to end, and where pages are small the walk waits for their
// addresses at every 4096 bytes: the system is asked for large ones where whole ones fit.
void* new_frame(std::size_t bytes) {
  void* const frame = std::aligned_alloc(frame_alignment, bytes);
#if defined(__linux__) && defined(MADV_HUGEPAGE)
  constexpr std::uintptr_t large_page = std::uintptr_t{2} << 20;
  const auto start = reinterpret_cast<std::uintptr_t>(frame);
  const std::uintptr_t first = (start + large_page - 1) & ~(large_page - 1), end = (start + bytes) & ~(large_page - 1);
  // Advice: a refusal changes nothing.
  if (frame != nullptr && first < end) madvise(reinterpret_cast<void*>(first), end - first, MADV_HUGEPAGE);
#endif
  return frame;
}

class FramePool {
 public:
  // A frame of the class, the one freed last, else null.
  void* take(std::size_t bytes) {
    const std::lock_guard hold(lock_);
    for (Resting* frame = bucket(bytes); frame != nullptr; frame = frame->older_alike)
      if (frame->bytes == bytes) {
        remove(frame);
        return frame;
      }
    return nullptr;
  }
  // Takes the frame in; the oldest go back to the system until all fit.
  void give(void* frame, std::size_t bytes) {
    const std::lock_guard hold(lock_);
    if (bytes > limit_) {
      std::free(frame);
      return;
    }
    shrink(limit_ - bytes);
    auto* const resting = new (frame) Resting{bytes, nullptr, newest_, nullptr, bucket(bytes)};
    (newest_ != nullptr ? newest_->newer : oldest_) = resting;
    newest_ = resting;
    if (resting->older_alike != nullptr) resting->older_alike->newer_alike = resting;
    bucket(bytes) = resting;
    size_ += bytes;
  }
  void set_limit(u64 bytes) {
    const std::lock_guard hold(lock_);
    limit_ = bytes;
    shrink(limit_);
  }
  u64 size() {
    const std::lock_guard hold(lock_);
    return size_;
  }
  void purge() {
    const std::lock_guard hold(lock_);
    shrink(0);
  }

 private:
  void shrink(u64 most) {
    while (size_ > most) {
      Resting* const frame = oldest_;
      remove(frame);
      std::free(frame);
    }
  }
  void remove(Resting* frame) {
    (frame->newer != nullptr ? frame->newer->older : newest_) = frame->older;
    (frame->older != nullptr ? frame->older->newer : oldest_) = frame->newer;
    (frame->newer_alike != nullptr ? frame->newer_alike->older_alike : bucket(frame->bytes)) = frame->older_alike;
    if (frame->older_alike != nullptr) frame->older_alike->newer_alike = frame->newer_alike;
    size_ -= frame->bytes;
  }
  Resting*& bucket(std::size_t bytes) {
    return buckets_[(static_cast<u64>(bytes / frame_alignment) * 0x9e3779b97f4a7c15ull) >> 58];
  }

  std::mutex lock_;
  Resting* buckets_[64] = {};
  Resting *newest_ = nullptr, *oldest_ = nullptr;
  u64 size_ = 0;
  u64 limit_ = u64{256} << 20;
};

constinit FramePool pool;  // written by every thread that frees a frame

}  // namespace

void* RS_AllocateFrameQuiet(std::size_t bytes) {
  if (!HB_AllocationMayProceed() || bytes > largest_request) return nullptr;
  const std::size_t rounded = size_class(bytes);
  void* frame = pool.take(rounded);
  if (frame == nullptr) frame = new_frame(rounded);
  if (frame == nullptr) {
    pool.purge();  // frames of other sizes may be what is in the way
    frame = new_frame(rounded);
  }
  if (frame != nullptr) HB_CountAllocated(bytes);
  return frame;
}

void RS_FreeFrame(void* frame, std::size_t bytes) {
  if (frame == nullptr) return;
  HB_CountFreed(bytes);
  pool.give(frame, size_class(bytes));
}

extern "C" void RS_SetFramePoolLimit(u64 bytes) { pool.set_limit(bytes); }
extern "C" u64 RS_GetFramePoolSize(void) { return pool.size(); }
extern "C" void RS_PurgeFramePool(void) { pool.purge(); }
