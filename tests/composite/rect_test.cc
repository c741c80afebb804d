// The rectangle composite around its pixels: polls, refusals, memory, slots, threads and opacities.
#include <ZR/composite.h>
#include <ZR/transfer_mode.h>
#include <gtest/gtest.h>

#include <limits>
#include <thread>
#include <utility>
#include <vector>

#include "support/born_library.h"
#include "support/worlds.h"
#include "world/slot_table.h"

namespace {

constexpr i32 lowest = std::numeric_limits<i32>::min(), highest = std::numeric_limits<i32>::max();

struct Call {
  GX_LRect rect;
  i32 dest_x, dest_y, field = 0;
  ZR_CompositeModePlus mode{XferInFront, 1.0f, nullptr, false, 0};
  const ZR_MaskWorld* mask = nullptr;

  i32 run(ZR_LayerDef* src, ZR_LayerDef* dst, const ZR_ProgressInfo* progress = nullptr,
          void** scratch = nullptr) const {
    return scratch != nullptr
               ? ZR_TransferRectPlus(progress, 0, 0, field, &rect, src, &mode, nullptr, mask, scratch, dest_x, dest_y,
                                     dst)
               : ZR_TransferRect(progress, 0, 0, field, &rect, src, &mode, nullptr, mask, dest_x, dest_y, dst);
  }
};

template <class T>
class Rect : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(Rect, Depths);

struct Polls {
  std::vector<std::pair<i32, i32>> seen;
  size_t stop_at = 0;
  ZR_ProgressInfo info() {
    return {this, nullptr, [](void* self, i32 done, i32 total) -> i32 {
              auto& polls = *static_cast<Polls*>(self);
              polls.seen.emplace_back(done, total);
              return polls.seen.size() == polls.stop_at ? 77 : 0;
            }};
  }
};

TYPED_TEST(Rect, PollsEvery128thDestinationRowAndStopsThere) {
  using T = TypeParam;
  TestWorld<T> src(2, 300), empty(2, 400);
  src.fill({1, 1, 1, 1});
  const Call call = {{0, 0, 2, 300}, 0, 100};
  const std::pair<i32, i32> all[] = {{28, 300}, {156, 300}, {284, 300}};
  for (size_t stop = 0; stop <= 4; ++stop) {
    TestWorld<T> dst = empty;
    Polls polls{.seen = {}, .stop_at = stop};
    const ZR_ProgressInfo info = polls.info();
    const bool stopped = stop >= 1 && stop <= 3;
    EXPECT_EQ(call.run(src, dst, &info), stopped ? 77 : 0);
    const size_t count = stopped ? stop : 3;
    EXPECT_EQ(polls.seen, std::vector(all, all + count));
    const i32 rows = stopped ? all[count - 1].first + 1 : 300;  // the row that was polled after is done
    for (i32 y = 0; y < 400; ++y) EXPECT_EQ(dst.at(1, y).red != 0, y >= 100 && y < 100 + rows) << y;
  }
  const ZR_ProgressInfo abort_only = {nullptr, [](void*) -> i32 { return 9; }, nullptr}, neither = {};
  TestWorld<T> dst = empty;
  EXPECT_EQ(call.run(src, dst, &abort_only), 9);
  EXPECT_EQ(call.run(src, dst, &neither), 0);
}

TYPED_TEST(Rect, RefusalsLeaveTheDestinationAlone) {
  using T = TypeParam;
  using Other = std::conditional_t<std::is_same_v<T, ZR_Pixel8>, ZR_Pixel16, ZR_Pixel8>;
  TestWorld<T> src(4, 4), dst(4, 4), matte(4, 4);
  TestWorld<Other> other(4, 4);
  src.randomise(1), dst.randomise(2), matte.randomise(3);
  const TestWorld<T> before = dst;
  const Call call = {{0, 0, 4, 4}, 0, 0};
  void* own[10] = {};

  EXPECT_EQ(call.run(other, dst), 3);
  EXPECT_EQ(this->caught.take_verification(), "ZR_TransferRect requires src and dst worlds to have same bit depth");
  EXPECT_EQ(call.run(other, dst, nullptr, own), 3);
  EXPECT_EQ(this->caught.take_verification(), "ZR_TransferRectPlus requires src and dst worlds to have same bit depth");
  EXPECT_TRUE(this->caught.messages().empty());

  for (i32 mode : {-4, -1, 41, 1000, lowest}) {
    Call unknown = call;
    unknown.mode.xfer = mode;
    Polls polls;
    const ZR_ProgressInfo info = polls.info();
    EXPECT_EQ(unknown.run(src, dst, &info), 5);
    EXPECT_EQ(this->caught.take_message(), "unimplemented blending mode.");
    EXPECT_TRUE(polls.seen.empty());
    unknown.dest_x = 4;  // nothing to draw, nothing to refuse
    EXPECT_EQ(unknown.run(src, dst), 0);
    EXPECT_TRUE(this->caught.quiet());
  }

  Call masked = call;
  const ZR_MaskWorld foreign = {*other.layer(), 0, 0, 1};
  masked.mask = &foreign;
  EXPECT_EQ(masked.run(src, dst), 3);
  EXPECT_FALSE(this->caught.take_verification().empty());

  ZR_LayerDef no_src = *src.layer(), no_dst = *dst.layer();
  no_src.data = no_dst.data = nullptr;
  ZR_MaskWorld no_mask = {*matte.layer(), 0, 0, 0};
  no_mask.world.data = nullptr;
  for (u32 kind = 0; kind < 4; ++kind) {
    no_mask.kind = kind;
    masked.mask = &no_mask;
    EXPECT_EQ(masked.run(src, dst), 3);
    EXPECT_EQ(this->caught.take_message(), "bad parameter passed to effect callback");
  }
  for (auto [from, to] : {std::pair(&no_src, dst.layer()), std::pair(src.layer(), &no_dst)}) {
    EXPECT_EQ(call.run(from, to), 3);
    EXPECT_EQ(this->caught.take_message(), "bad parameter passed to effect callback");
  }
  Call keeps = call;
  keeps.mode.keep_alpha = true;
  EXPECT_EQ(keeps.run(src, dst, nullptr, own), 3) << "a record without the row that is needed";
  this->caught.clear();
  EXPECT_TRUE(dst == before);
}

TYPED_TEST(Rect, FailingAllocations) {
  using T = TypeParam;
  TestWorld<T> src(1100, 2), dst(1100, 2), done(1100, 2);
  src.fill({1, 1, 1, 1});
  const TestWorld<T> before = dst;
  const Call call = {{lowest, 0, highest, 2}, lowest, 0};
  for (u64 n = 1;; ++n) {
    ASSERT_LT(n, 9u);
    HB_FailNthAllocation(n);
    const i32 error = call.run(src, dst);
    HB_FailNthAllocation(0);
    if (error == 0) break;
    EXPECT_EQ(error, 4);
    EXPECT_EQ(this->caught.messages().size(), 1u);
    this->caught.clear();
    EXPECT_TRUE(dst == before) << n;
  }
  EXPECT_EQ(call.run(src, done), 0);
  EXPECT_TRUE(dst == done);
  HB_MemoryStats stats;
  HB_GetMemoryStats(&stats);
  EXPECT_LT(stats.live_bytes, 10'000'000u) << "rows are as wide as the source, not as the rectangle";
}

TYPED_TEST(Rect, RowsGoThroughTheirSlot) {
  using T = TypeParam;
  constexpr ZR_SlotIndex slot = std::is_same_v<T, ZR_Pixel8>    ? ZR_Slot_transfer_rows8
                                : std::is_same_v<T, ZR_Pixel16> ? ZR_Slot_transfer_rows16
                                                                : ZR_Slot_transfer_rowsFloat;
  TestWorld<T> src(3, 3), dst(3, 3);
  const Call call = {{0, 0, 3, 3}, 0, 0};
  zr::TransferRowsFunc<T>* const refuse = [](auto...) -> i32 { return 123; };
  SlotOverride replacement(slot, reinterpret_cast<void*>(refuse));
  EXPECT_EQ(call.run(src, dst), 123);
  SlotOverride empty(slot, nullptr);
  EXPECT_EQ(call.run(src, dst), 3);
}

TYPED_TEST(Rect, ThreadsWithScratchOfTheirOwn) {
  using T = TypeParam;
  constexpr i32 width = 40, height = 60;
  TestWorld<T> src(width, height), dst(width, height), matte(width, height);
  src.randomise(5), dst.randomise(6), matte.randomise(8);
  const ZR_MaskWorld mask = {*matte.layer(), 3, -2, 3};
  Call call = {{0, 0, width, height}, 0, 0};
  call.mode = {XferMultiply, 0.7f, nullptr, true, 4};
  call.mask = &mask;
  TestWorld<T> expected = dst;
  ASSERT_EQ(call.run(src, expected), 0);
  std::vector<std::thread> threads;
  for (i32 half = 0; half < 2; ++half)
    threads.emplace_back([&, half] {
      std::vector<f32> alpha(width), cells(width * 4);
      void* scratch[10] = {alpha.data(), cells.data()};
      for (i32 y = half; y < height; y += 2) {
        Call row = call;
        row.rect.top = row.dest_y = y, row.rect.bottom = y + 1;
        EXPECT_EQ(row.run(src, dst, nullptr, scratch), 0);
      }
    });
  for (std::thread& thread : threads) thread.join();
  EXPECT_TRUE(dst == expected);
}

TYPED_TEST(Rect, ClearingAlphaWithoutPixels) {
  using T = TypeParam;
  const GX_LRect part = {1, 1, 3, 3}, all = {0, 0, 5, 4};
  TestWorld<T> world(5, 4);
  ZR_LayerDef bare = *world.layer();
  bare.data = nullptr;
  EXPECT_EQ(ZR_ClearAlphaExceptRect(nullptr, &all, &bare), 0) << "nothing to clear";
  EXPECT_EQ(ZR_ClearAlphaExceptRect(nullptr, &part, &bare), 3);
  EXPECT_EQ(this->caught.take_message(), "bad parameter passed to effect callback");
  bare.width = 0;
  EXPECT_EQ(ZR_ClearAlphaExceptRect(nullptr, &part, &bare), 0);
}

TEST(CompositeModes, OpacitiesBeyondWhiteWrap) {
  const struct {
    f32 opacity;
    u8 narrow;
    u16 wide;
  } channels[] = {{0.0f, 0, 0}, {1.0f, 255, 32768}, {0.5f, 128, 16384}, {1.5f, 127, 49152}, {-1.0f, 2, 32769}};
  for (const auto& row : channels) {
    const ZR_CompositeModePlus plus(XferCopy, row.opacity, nullptr, true, 5);
    EXPECT_EQ(ZR_BlendingMode<ZR_Pixel8>(plus).opacity, row.narrow) << row.opacity;
    EXPECT_EQ(ZR_BlendingMode<ZR_Pixel16>(plus).opacity, row.wide) << row.opacity;
    EXPECT_EQ(ZR_BlendingMode<ZR_PixelFloat>(plus).opacity, row.opacity);
  }
}

}  // namespace
