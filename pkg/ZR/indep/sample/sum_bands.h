// How threads share the building of a summed-area table.
#pragma once

#include <HB/allocator.h>
#include <ZR/zr.h>

#include <algorithm>
#include <atomic>
#include <thread>
#include <vector>

#include "sample/lane_summed.h"

namespace zr {

struct SumRowLabel {
  static constexpr char text[] = "rows of a summed-area table";
};

// Blocks of a table, filled by any number of threads. Each waits for those above and to the left of it: a thread takes
// a band of blocks and goes on in it as far as the band above has come. It only ever waits for blocks that are being
// filled, so that one thread alone, in any order of calls, fills them all.
template <class Entry>
class SumBands {
 public:
  SumBands(const ZR_World& world, SumBlockFunc<Entry>* fill, f64* above, f64* carried, Entry* table)
      : world_(world), fill_(fill), above_(above), carried_(carried), table_(table) {
    HB_GetNumThreads(&threads_, 1);
    const i32 rows = (world.height - 1) / (std::max(threads_, 1) * bands_a_thread) + 1;
    rows_ = std::max(least_rows, (rows + 3) / 4 * 4);
    down_ = (world.height - 1) / rows_ + 1;
    bands_ = Bands(static_cast<size_t>(down_));
    columns_ = Columns(static_cast<size_t>(across_));
  }

  i32 run() {
    const i32 together = std::min({threads_, across_, down_});
    if (together > 1)
      return ZR_IterateGeneric(together, this, [](void* self, i32, i32, i32) {
        static_cast<SumBands*>(self)->work();
        return i32{ZR_Err_None};
      });
    fill_(world_, {0, world_.height, 0, world_.width, &columns_[0].has_fractions}, above_, carried_, table_);
    return ZR_Err_None;
  }

 private:
  // Few bands, as each is handed from one thread's cache to another's at its lower edge, but many enough for a thread
  // that gets less of its processor to do fewer of them.
  static constexpr i32 bands_a_thread = 8, least_rows = 32, block_columns = 256, most_yields = 1000;
  struct Band {
    std::atomic<i32> filled{0};  // blocks, from the left
    std::atomic<bool> taken{false};
  };
  using Bands = std::vector<Band, HB_Allocator<Band, SumRowLabel>>;
  struct Column {  // a byte of its own, as threads write neighbours
    bool has_fractions = false;
  };
  using Columns = std::vector<Column, HB_Allocator<Column, SumRowLabel>>;

  i32 filled(i32 band) const { return bands_[static_cast<size_t>(band)].filled.load(std::memory_order_acquire); }
  bool is_ready(i32 band) const { return filled(band) < (band == 0 ? across_ : filled(band - 1)); }

  void work() {
    for (i32 first = 0; first < down_;) {
      const i32 before = all_filled_.load(std::memory_order_acquire);
      if (filled(first) == across_)
        ++first;
      else if (!fill_some(first))
        wait_for_another(before);
    }
  }
  // For as long as a block may take the thread stays awake, as being woken takes long; but it may stand in the way of
  // the very thread that it waits for.
  void wait_for_another(i32 before) const {
    for (i32 i = 0; i < most_yields; ++i) {
      if (all_filled_.load(std::memory_order_acquire) != before) return;
      std::this_thread::yield();
    }
    all_filled_.wait(before, std::memory_order_acquire);
  }
  // Blocks of the first band from there on that can go on.
  bool fill_some(i32 band) {
    while (band < down_ && !(is_ready(band) && !bands_[static_cast<size_t>(band)].taken.exchange(true)))
      if (filled(band++) == 0) return false;  // nor can those below
    if (band == down_) return false;
    while (is_ready(band)) fill_next(band);
    bands_[static_cast<size_t>(band)].taken.store(false);
    return true;
  }
  void fill_next(i32 band) {
    const i32 y = band * rows_, column = filled(band), x = column * block_columns;
    fill_(world_,
          {y, std::min(y + rows_, world_.height), x, std::min(x + block_columns, world_.width),
           &columns_[static_cast<size_t>(column)].has_fractions},
          above_, carried_, table_);
    bands_[static_cast<size_t>(band)].filled.fetch_add(1, std::memory_order_release);
    all_filled_.fetch_add(1, std::memory_order_release);
    all_filled_.notify_all();
  }

  const ZR_World& world_;
  SumBlockFunc<Entry>* const fill_;
  f64 *const above_, *const carried_;
  Entry* const table_;
  i32 threads_ = 1, rows_ = 0;
  const i32 across_ = (world_.width - 1) / block_columns + 1;
  i32 down_ = 0;
  Bands bands_;
  Columns columns_;                 // of blocks
  std::atomic<i32> all_filled_{0};  // blocks of any band: who finds none to go on with waits for the next of them
};

}  // namespace zr
