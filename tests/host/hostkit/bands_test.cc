// Calls divided over threads beside the undivided ones: the same bytes, polls from the caller, failures, replacements.
#include <ZR/hostkit.h>
#include <ZR/platform.h>
#include <ZR/slots.h>
#include <ZR/transfer_mode.h>

#include <algorithm>
#include <atomic>
#include <cmath>
#include <string>
#include <thread>
#include <vector>

#include "support/born_library.h"
#include "support/gamma_tables.h"
#include "support/worlds.h"
#include "world/slot_table.h"

namespace {

using Random = std::mt19937;
i32 pick(Random& random, i32 low, i32 high) {
  return low + static_cast<i32>(random() % static_cast<u32>(high - low + 1));
}

GX_Matrix3 placed(f64 degrees, f64 scale, f64 x, f64 y) {
  const f64 a = degrees * 0.017453292519943295, c = scale * std::cos(a), s = scale * std::sin(a);
  return {{{c, -s, x}, {s, c, y}, {0, 0, 1}}};
}

// A drawing with everything that may vary, drawn either way; matrices make it a transform.
template <class T>
struct Drawing {
  TestWorld<T> src, mask, dst;
  ZR_CompositeModePlus mode{XferInFront, 1.0f, nullptr, false, 0};
  i32 field = 0, quality = 1, kind = -1;  // of the mask; -1 without
  i32 mask_x = 0, mask_y = 0, dest_x = 0, dest_y = 0;
  bool linear = false, onto_itself = false;
  GX_LRect rect{0, 0, 5000, 5000};
  std::vector<GX_Matrix3> matrices{};

  Drawing(i32 src_width, i32 src_height, i32 width, i32 height, u32 seed)
      : src(src_width, src_height), mask(width - 9, std::max(height - 70, 9)), dst(width, height, 1) {
    src.randomise(seed), mask.randomise(seed + 1), dst.randomise(seed + 2);
  }
  i32 draw(bool divided, TestWorld<T>& to, const ZR_ProgressInfo* progress = nullptr) {
    static const ZR_LinearBlendingTables tables = gamma_tables(2.2);
    ZR_MaskWorld masking{};
    masking.world = *mask.layer(), masking.offset_x = mask_x, masking.offset_y = mask_y;
    masking.kind = static_cast<u32>(kind);
    const ZR_LinearBlendingTables* const light = linear ? &tables : nullptr;
    const ZR_MaskWorld* const through = kind >= 0 ? &masking : nullptr;
    ZR_LayerDef* const from = onto_itself ? to.layer() : src.layer();
    if (matrices.empty())
      return (divided ? ZRHost_TransferRect : ZR_TransferRect)(progress, quality, 0, field, &rect, from, &mode, light,
                                                               through, dest_x, dest_y, to);
    return (divided ? ZRHost_TransformWorld : ZR_TransformWorld)(progress, quality, 0, field, from, &mode, light,
                                                                 through, matrices.data(),
                                                                 static_cast<i32>(matrices.size()), true, &rect, to);
  }
  void expect_same(const std::string& what) {
    TestWorld<T> whole = dst, divided = dst;
    EXPECT_EQ(draw(true, divided), draw(false, whole)) << what;
    EXPECT_TRUE(divided == whole) << what;
    EXPECT_TRUE(divided.guards_intact()) << what;
  }
};

template <class T>
void vary(Drawing<T>& drawing, i32 xfer, Random& random) {
  drawing.mode.xfer = xfer;
  drawing.mode.rand_seed = static_cast<i32>(random());
  drawing.mode.keep_alpha = pick(random, 0, 3) == 0;
  drawing.mode.opacity = static_cast<f32>(pick(random, 60, 100)) / 100;
  drawing.field = pick(random, 0, 2), drawing.quality = pick(random, 0, 2), drawing.kind = pick(random, -2, 3);
  drawing.mask_x = pick(random, -20, 20), drawing.mask_y = pick(random, -20, 90);
  drawing.linear = pick(random, 0, 3) == 0;
}

std::vector<GX_Matrix3> random_matrices(Random& random) {
  const f64 x = pick(random, 0, 900) / 10.0, y = pick(random, -200, 200) / 10.0;
  switch (pick(random, 0, 8)) {
    case 0: return {placed(0, 1, std::floor(x), std::floor(y))};
    case 1: return {placed(0, 1, x, y)};
    case 2: return {placed(0, 0.6, x, y)};
    case 3: return {placed(0, 0, x, y)};
    case 4: return {placed(0, 1e-7, x, y)};
    case 5: return {placed(0, 1, x, y), placed(0, 1, x + 9, y + 3)};
    case 6: return {placed(3, 1.2, x, y), placed(3, 1.2, x + 2, y), placed(3, 1.2, x + 4, y)};
    case 7: return {placed(0, 1.2, x, y), placed(4, 1.2, x, y), placed(12, 1.1, x, y)};
    default: return {placed(pick(random, -35, 35), 1.3, x, y)};
  }
}

// Every mode in one depth, in each depth for one of 2, 3 and 7 threads.
template <class Body>
void each_mode(i32 threads, Body&& body) {
  for (i32 xfer = XferCopyFast; xfer <= XferKeyProtect; ++xfer) {
    if (xfer == -1) continue;
    switch ((xfer + 3 + threads) % 3) {
      case 0: body.template operator()<ZR_Pixel8>(xfer); break;
      case 1: body.template operator()<ZR_Pixel16>(xfer); break;
      default: body.template operator()<ZR_PixelFloat>(xfer);
    }
  }
}

class Bands : public testing::TestWithParam<int> {
 protected:
  zr::Hostkit host{{.threads = GetParam(), .message_sink = [](u32, i32, const std::string&) {}}};
};
INSTANTIATE_TEST_SUITE_P(Threads, Bands, testing::Values(1, 2, 3, 7));

TEST_P(Bands, CompositesAreThoseOfOneCall) {
  Random random(11);
  each_mode(GetParam(), [&]<class T>(i32 xfer) {
    const i32 width = pick(random, 120, 400);
    Drawing<T> drawing(width + pick(random, -9, 9), 75000 / width, width, 75000 / width + 41,
                       static_cast<u32>(random()));
    vary(drawing, xfer, random);
    drawing.rect = {pick(random, -5, 9), pick(random, -5, 9), 5000, 5000};
    drawing.dest_x = pick(random, -7, 7), drawing.dest_y = pick(random, 0, 40);
    drawing.onto_itself = pick(random, 0, 9) == 0;
    drawing.expect_same("mode " + std::to_string(xfer) + " depth " + std::to_string(zr::Depth<T>::bits));
  });
}

TEST_P(Bands, TransformsAreThoseOfOneCall) {
  Random random(12);
  each_mode(GetParam(), [&]<class T>(i32 xfer) {
    Drawing<T> drawing(120, 200, 130, 290, static_cast<u32>(random()));
    vary(drawing, xfer, random);
    drawing.matrices = random_matrices(random);
    drawing.rect = {pick(random, -5, 9), pick(random, -5, 9), 125, pick(random, 260, 300)};
    drawing.onto_itself = pick(random, 0, 9) == 0;
    drawing.expect_same("mode " + std::to_string(xfer) + " depth " + std::to_string(zr::Depth<T>::bits));
  });
}

// What a poll sees; refuses the n-th.
struct Poller {
  i32 refuse = 0, polls = 0, last = 0, total = 0;
  bool in_order = true;
  std::thread::id caller = std::this_thread::get_id();
  ZR_ProgressInfo info{this, nullptr, [](void* self, i32 done, i32 rows) {
                         auto& poller = *static_cast<Poller*>(self);
                         poller.in_order &= std::this_thread::get_id() == poller.caller && done >= poller.last &&
                                            done <= rows && (poller.polls == 0 || rows == poller.total);
                         poller.last = done, poller.total = rows;
                         return ++poller.polls == poller.refuse ? 517 : 0;
                       }};
};

TEST_P(Bands, TheCallerPollsAndItsRefusalLeavesWholeRows) {
  for (const bool transform : {false, true}) {
    Drawing<ZR_Pixel8> drawing(160, 1500, 160, 1500, 5);
    if (transform) drawing.matrices = {placed(5, 1.2, 3, -4)};
    TestWorld<ZR_Pixel8> whole = drawing.dst;
    ASSERT_EQ(drawing.draw(false, whole), 0);
    for (i32 n = 1;; ++n) {
      TestWorld<ZR_Pixel8> drawn = drawing.dst;
      Poller poller;
      poller.refuse = n;
      const i32 result = drawing.draw(true, drawn, &poller.info);
      EXPECT_TRUE(poller.in_order) << n;
      if (poller.polls < n) {
        EXPECT_EQ(result, 0);
        EXPECT_TRUE(drawn == whole);
        EXPECT_GT(n, 1) << "polled at least once";
        break;
      }
      EXPECT_EQ(result, 517);
      EXPECT_EQ(poller.polls, n) << "nobody asks again";
      for (i32 y = 0; y < drawn.height(); ++y) {
        const auto row_of = [y](const TestWorld<ZR_Pixel8>& world) { return &world.at(0, y); };
        EXPECT_TRUE(std::memcmp(row_of(drawn), row_of(whole), 160 * 4) == 0 ||
                    std::memcmp(row_of(drawn), row_of(drawing.dst), 160 * 4) == 0)
            << "row " << y << " at poll " << n;
      }
    }
  }
}

TEST_P(Bands, ReturnsTheCodeOfTheTopmostBandThatFails) {
  static zr::TransferRectPlusFunc* body;
  static std::atomic<i32> calls;
  body = zr::slot<ZR_Slot_transfer_rect_plus>();
  calls = 0;
  zr::TransferRectPlusFunc* const fails_below =
      [](const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, const GX_LRect* rect, ZR_LayerDef* src,
         const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask,
         void* scratch[10], i32 x, i32 y, ZR_LayerDef* dst) -> i32 {
    ++calls;
    if (y >= 700) return 10000 + y;
    return body(progress, quality, flags, field, rect, src, mode, tables, mask, scratch, x, y, dst);
  };
  const SlotOverride replaced(ZR_Slot_transfer_rect_plus, reinterpret_cast<void*>(fails_below));
  Drawing<ZR_Pixel16> drawing(200, 1600, 200, 1600, 6);
  const i32 code = drawing.draw(true, drawing.dst);
  EXPECT_EQ(code >= 10700, GetParam() > 1) << code;
  for (int round = 0; round < 20; ++round) EXPECT_EQ(drawing.draw(true, drawing.dst), code);
  EXPECT_GE(calls, GetParam() > 1 ? 2 * 21 : 21) << "the replacement is what draws";
}

// Slots whose routine cannot draw bands: it is called once, with the whole.
TEST_P(Bands, AReplacementWithoutScratchOrRowsDrawsTheWhole) {
  static i32 calls;
  const auto counts = [](auto... arguments) -> i32 {
    ++calls;
    return 40 + static_cast<i32>(sizeof...(arguments));
  };
  zr::TransferRectFunc* const rect = counts;
  zr::TransformWorldFunc* const world = counts;
  zr::TransformRowsFunc<ZR_Pixel8>* const rows = counts;
  struct Case {
    ZR_SlotIndex slot;
    void* routine;
    std::vector<GX_Matrix3> matrices;
  };
  for (const Case& c : {Case{ZR_Slot_transfer_rect, reinterpret_cast<void*>(rect), {}},
                        Case{ZR_Slot_transfer_rect, reinterpret_cast<void*>(rect), {placed(0, 1, 3, 4)}},
                        Case{ZR_Slot_transform_world, reinterpret_cast<void*>(world), {placed(4, 1, 3, 4)}},
                        Case{ZR_Slot_transform_row8, reinterpret_cast<void*>(rows), {placed(4, 1, 3, 4)}}}) {
    const SlotOverride replaced(c.slot, c.routine);
    Drawing<ZR_Pixel8> drawing(300, 500, 300, 500, 7);
    drawing.matrices = c.matrices;
    calls = 0;
    EXPECT_EQ(drawing.draw(true, drawing.dst), drawing.draw(false, drawing.dst)) << c.slot;
    EXPECT_EQ(calls, 2) << c.slot;
  }
}

TEST_P(Bands, WithoutMemoryForScratchNothingIsDrawn) {
  HB_MemoryStats before;
  HB_GetMemoryStats(&before);
  for (const i32 height : {900, 20}) {
    Drawing<ZR_Pixel8> drawing(200, height + 1, 200, height, 8);
    drawing.mode.xfer = XferMultiplyAlpha;
    drawing.rect = {0, 1, 190, height + 1};
    i32 failures = 0;
    for (;; ++failures) {
      TestWorld<ZR_Pixel8> drawn = drawing.dst;
      HB_FailNthAllocation(1 + static_cast<u64>(failures % 7));
      const i32 result = drawing.draw(true, drawn);
      HB_FailNthAllocation(0);
      if (result == 0) break;
      EXPECT_EQ(result, 4);
      ASSERT_TRUE(drawn == drawing.dst);
      ASSERT_LT(failures, 1000);
      if (failures < 7) continue;
      drawing.expect_same("after failures");
    }
    EXPECT_EQ(failures > 0, height == 900) << "scratch is kept between calls";
  }
  host.End();
  const zr::Hostkit next({.threads = GetParam()});
  HB_MemoryStats after;
  HB_GetMemoryStats(&after);
  EXPECT_EQ(after.live_blocks, before.live_blocks) << "the host frees it";
}

TEST_P(Bands, CallsFromSeveralThreadsAreIndependent) {
  std::vector<std::thread> callers;
  for (u32 caller = 0; caller < 4; ++caller)
    callers.emplace_back([caller] {
      const bool large = caller < 3;
      Drawing<ZR_Pixel8> drawing(large ? 260 : 90, large ? 460 : 30, large ? 260 : 90, large ? 460 : 100, caller);
      drawing.mode.keep_alpha = true;
      if (caller > 1) drawing.matrices = {placed(7, 0.9, 5, 5), placed(9, 0.9, 5, 5)};
      TestWorld<ZR_Pixel8> first = drawing.dst;
      ASSERT_EQ(drawing.draw(true, first), 0);
      for (int round = 0; round < 5; ++round) {
        TestWorld<ZR_Pixel8> next = drawing.dst;
        ASSERT_EQ(drawing.draw(true, next), 0);
        ASSERT_TRUE(next == first) << caller;
      }
    });
  for (std::thread& caller : callers) caller.join();
}

}  // namespace
