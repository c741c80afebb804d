// Where a transform stops, which slots it goes through, what it refuses, and matrices and worlds that no
// picture is made with: nothing outside a world is touched.
#include <gtest/gtest.h>

#include <limits>
#include <thread>

#include "copy/transform_model.h"
#include "support/born_library.h"

extern "C" i32 transform_world_adapter(const ZR_ProgressInfo*, i32, u32, i32, ZR_LayerDef*, const ZR_CompositeMode*,
                                       const ZR_MaskWorld*, const GX_Matrix3*, i32, bool, const GX_LRect*,
                                       ZR_LayerDef*);

namespace {

constexpr f64 infinity = std::numeric_limits<f64>::infinity(), nan = std::numeric_limits<f64>::quiet_NaN();
const GX_Matrix3 identity = {{{1, 0, 0}, {0, 1, 0}, {0, 0, 1}}}, half_right = {{{1, 0, 0.5}, {0, 1, 0}, {0, 0, 1}}},
                 moved = {{{1, 0, 2}, {0, 1, 1}, {0, 0, 1}}}, turned = {{{0.8, -0.6, 2}, {0.6, 0.8, 0}, {0, 0, 1}}};

template <class T>
class TransformEdges : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(TransformEdges, Depths);

TYPED_TEST(TransformEdges, PollsAndStopsAfterThePolledRow) {
  using T = TypeParam;
  struct {
    i32 quality, count, field, every;
  } const cases[] = {{0, 1, 0, 64}, {1, 1, 0, 32}, {3, 1, 2, 64}, {0, 1, 1, 128},
                     {0, 2, 0, 8},  {2, 3, 3, 8},  {1, 2, 1, 16}};
  struct Polls {
    std::vector<i32> rows;
    size_t stop_at = 0;
    i32 total = 0;
  };
  TestWorld<T> src(3, 200), empty(3, 300);
  src.fill({1, 1, 1, 1});
  for (const auto& c : cases) {
    TransformCall call;
    call.quality = c.quality, call.field = c.field;
    for (i32 i = 0; i < c.count; ++i) call.matrices.push_back({{{1.01, 0, 0.25 * i}, {0, 1.0001, 60}, {0, 0, 1}}});
    const auto run = [&](Polls& polls, TestWorld<T>& dst) {
      const ZR_ProgressInfo info = {&polls, nullptr, [](void* self, i32 done, i32 total) -> i32 {
                                      auto& p = *static_cast<Polls*>(self);
                                      p.rows.push_back(done), p.total = total;
                                      return p.rows.size() == p.stop_at ? 77 : 0;
                                    }};
      return call.run(src, dst, &info);
    };
    Polls all;
    TestWorld<T> whole = empty;
    ASSERT_EQ(run(all, whole), 0);
    ASSERT_EQ(static_cast<i32>(all.rows.size()), (all.total + c.every - 1) / c.every);
    for (size_t n = 1; n <= all.rows.size(); ++n) {
      Polls polls{.rows = {}, .stop_at = n};
      TestWorld<T> dst = empty;
      EXPECT_EQ(run(polls, dst), 77);
      EXPECT_EQ(polls.rows.back(), static_cast<i32>(n - 1) * c.every);
      const i32 next = 58 + polls.rows.back() + 1;  // two rows of room above the layer; the polled row is done
      for (i32 y = 0; y < 300; ++y)
        EXPECT_EQ(std::memcmp(&dst.at(0, y), &(y < next ? whole : empty).at(0, y), 3 * sizeof(T)), 0) << y;
    }
  }
}

TYPED_TEST(TransformEdges, FailingAllocations) {
  using T = TypeParam;
  TestWorld<T> src(4, 4), before(1500, 3);
  src.fill({1, 1, 1, 1});
  const auto line = [](i32 count, f64 turn) {
    TransformCall call;
    for (i32 i = 0; i < count; ++i)
      call.matrices.push_back({{{200, turn * i, 0.1 * i}, {0, 1, 0.0001 * i}, {0, 0, 1}}});
    return call;
  };
  // The shared rows grow; sums of a wide row and more matrices than a block holds; more samples than one holds.
  for (const TransformCall& call : {line(1, 0), line(900, 1), line(5000, 0)})
    for (u64 n = 1;; ++n) {
      ASSERT_LT(n, 12u);
      EXPECT_EQ(ZRp_ReallocScratch(1024, 1, true, nullptr), 0);
      TestWorld<T> out = before;
      HB_FailNthAllocation(n);
      const i32 error = call.run(src, out);
      HB_FailNthAllocation(0);
      EXPECT_EQ(out == before, error != 0);
      EXPECT_EQ(this->caught.messages().size(), error != 0 ? 1u : 0u);
      this->caught.clear();
      if (error == 0) break;
      EXPECT_EQ(error, 4);
    }
}

struct Seen {
  GX_LRect rect;
  i32 dest_x, dest_y;
  bool operator==(const Seen& o) const { return std::memcmp(this, &o, sizeof o) == 0; }
};
Seen seen;

TYPED_TEST(TransformEdges, WhatGoesThroughWhichSlot) {
  using T = TypeParam;
  const auto rect = [](const ZR_ProgressInfo*, i32, u32, i32, const GX_LRect* r, ZR_LayerDef*,
                       const ZR_CompositeModePlus*, const ZR_LinearBlendingTables*, const ZR_MaskWorld*, i32 x, i32 y,
                       ZR_LayerDef*) -> i32 {
    return seen = {*r, x, y}, 41;
  };
  const auto rect_plus = [](const ZR_ProgressInfo*, i32, u32, i32, const GX_LRect* r, ZR_LayerDef*,
                            const ZR_CompositeModePlus*, const ZR_LinearBlendingTables*, const ZR_MaskWorld*, void**,
                            i32 x, i32 y, ZR_LayerDef*) -> i32 {
    return seen = {*r, x, y}, 42;
  };
  const auto transform = [](const ZR_ProgressInfo*, i32, u32, i32, ZR_LayerDef*, const ZR_CompositeModePlus*,
                            const ZR_LinearBlendingTables*, const ZR_MaskWorld*, const GX_Matrix3*, i32, bool,
                            const GX_LRect* r, ZR_LayerDef*) -> i32 {
    return seen = {*r, 0, 0}, 43;
  };
  TestWorld<T> src(4, 3), dst(12, 9), through_adapter(12, 9);
  src.randomise(1);
  TransformCall call;
  call.matrices = {turned};
  call.mode.opacity = 0.5f;
  const ZR_CompositeMode plain = {XferInFront, 0, 128, 0, 16384};
  EXPECT_EQ(call.run(src, dst), 0);
  EXPECT_EQ(
      transform_world_adapter(nullptr, 1, 0, 0, src, &plain, nullptr, &turned, 1, true, &call.rect, through_adapter),
      0);
  EXPECT_TRUE(dst == through_adapter);
  {
    const SlotOverride one(ZR_Slot_transfer_rect, reinterpret_cast<void*>(+rect)),
        two(ZR_Slot_transfer_rect_plus, reinterpret_cast<void*>(+rect_plus));
    void* own[10] = {};
    call.matrices = {moved};
    for (void** const scratch : {static_cast<void**>(nullptr), own}) {
      EXPECT_EQ(call.run(src, dst, nullptr, scratch), scratch == nullptr ? 41 : 42);
      EXPECT_EQ(seen, (Seen{{-2, -1, 6, 5}, 0, 0}));  // two pixels of room
    }
    for (const auto& [matrix, quality, result] : {std::tuple(half_right, 0, 41), {half_right, 1, 0}, {turned, 0, 0}}) {
      call.matrices = {matrix};
      call.quality = quality;
      EXPECT_EQ(call.run(src, dst), result);
    }
  }
  const SlotOverride three(ZR_Slot_transform_world, reinterpret_cast<void*>(+transform));
  const GX_Matrix3 singular = {{{0, 0, 0}, {0, 0, 0}, {0, 0, 0}}};
  for (const auto& [matrix, bounds] : {std::pair(moved, GX_LRect{0, 0, 8, 6}), {singular, call.rect}}) {
    call.matrices = {matrix};
    EXPECT_EQ(call.run(src, dst), 43);
    EXPECT_EQ(seen, (Seen{bounds, 0, 0}));
  }
}

TYPED_TEST(TransformEdges, RefusalsLeaveTheDestinationAlone) {
  using T = TypeParam;
  using Other = std::conditional_t<std::is_same_v<T, ZR_Pixel8>, ZR_Pixel16, ZR_Pixel8>;
  TestWorld<T> src(4, 4), dst(4, 4), matte(4, 4);
  TestWorld<Other> other(4, 4);
  src.randomise(1), dst.randomise(2), matte.randomise(3);
  const TestWorld<T> before = dst;
  ZR_LayerDef bare = *src.layer();
  bare.data = nullptr;
  const auto refused = [&](i32 error, i32 expected, const char* text) {
    EXPECT_EQ(error, expected) << text;
    EXPECT_EQ(this->caught.take_message() + this->caught.take_verification(), text);
  };
  const char bad_parameter[] = "bad parameter passed to effect callback";
  TransformCall call;
  for (const GX_Matrix3& matrix : {identity, turned}) {
    call.matrices = {matrix};
    refused(call.run(&bare, dst), 3, bad_parameter);
    refused(call.run(src, &bare), 3, bad_parameter);
    refused(call.run(other, dst), 3, "ZR_TransformWorld requires src and dst worlds to have same bit depth");
    for (u32 kind = 0; kind < 4; ++kind) {
      const ZR_MaskWorld no_mask = {bare, 0, 0, kind}, foreign = {*other.layer(), 0, 0, kind};
      call.mask = &no_mask;
      refused(call.run(src, dst), 3, bad_parameter);
      call.mask = &foreign;
      refused(call.run(src, dst), 3, "ZR_TransformWorld requires mask and dst worlds to have same bit depth");
      call.mask = nullptr;
    }
    call.mode.xfer = 41;
    refused(call.run(src, dst), 5, "unimplemented blending mode.");
    call.mode.xfer = XferInFront;
  }
  const auto raw = [&](ZR_LayerDef* s, const ZR_CompositeModePlus* mode, const GX_Matrix3* matrices, i32 count,
                       const GX_LRect* rect, ZR_LayerDef* d) {
    const i32 error = ZR_TransformWorld(nullptr, 1, 0, 0, s, mode, nullptr, nullptr, matrices, count, true, rect, d);
    refused(error, 3, bad_parameter);
  };
  raw(nullptr, &call.mode, &turned, 1, &call.rect, dst);
  raw(src, nullptr, &turned, 1, &call.rect, dst);
  raw(src, &call.mode, nullptr, 1, &call.rect, dst);
  raw(src, &call.mode, &turned, 0, &call.rect, dst);
  raw(src, &call.mode, &turned, 1, nullptr, dst);
  raw(src, &call.mode, &turned, 1, &call.rect, nullptr);
  void* no_rows[10] = {};
  refused(call.run(src, dst, nullptr, no_rows), 3, bad_parameter);
  EXPECT_TRUE(dst == before);
}

// Every call ends, stays inside, and gives 0; what is not finite and rectangles that meet nothing draw nothing.
TYPED_TEST(TransformEdges, HostileMatricesStayInside) {
  using T = TypeParam;
  const f64 values[] = {0, -0.0, 1e-300, 5e-324, 1e-7, 32766.5, -40000, 65536, 1e150, -1e300, infinity, nan};
  const i32 far = std::numeric_limits<i32>::max();
  const GX_LRect rects[] = {{0, 0, 9, 9}, {-far - 1, -far - 1, far, far}, {5, 5, 2, 2}, {far - 4, 0, far, 4}};
  for (const f64 value : values)
    for (i32 place = 0; place < 9 * 4 * 4 * 3; ++place) {
      const i32 size = place % 2 == 0 ? 1 : 7;
      TestWorld<T> src(size, size), dst(size, size + 2);
      src.randomise(1), dst.randomise(2);
      TransformCall call;
      call.quality = place / 9 % 4;
      call.rect = rects[place / 36 % 4];
      call.mode.xfer = place % 5 == 0 ? XferMultiplyAlpha : XferInFront;
      GX_Matrix3 matrix = turned;
      matrix.m[place / 3 % 3][place % 3] = value;
      for (const GX_Matrix3& each : {matrix, turned, matrix, identity}) call.matrices.push_back(each);
      call.matrices.resize(static_cast<size_t>(place / 144 * 3 / 2 + 1), identity);  // 1, 2 or 4
      const TestWorld<T> before = dst;
      for (call.src2dst = false;; call.src2dst = true) {
        ASSERT_EQ(call.run(src, dst), 0) << value << ' ' << place;
        ASSERT_TRUE(dst.guards_intact() && src.guards_intact()) << value << ' ' << place;
        if (call.src2dst) break;
      }
      ASSERT_TRUE(dst == before || (std::isfinite(value) && place / 36 % 4 < 2)) << value << ' ' << place;
    }
  EXPECT_TRUE(this->caught.quiet());
}

// A step of 32768 pixels wraps: every other pixel of a row lies inside, and those between lie far away.
TYPED_TEST(TransformEdges, RowsThatWrap) {
  using T = TypeParam;
  TestWorld<T> src(6, 6), dst(9, 9);
  src.randomise(1);
  const GX_Matrix3 leaps = {{{32768, 0, -16382 + 0.25}, {0, 1, 0.25}, {0, 0, 1}}};
  for (i32 quality = 0; quality < 4; ++quality) {
    TransformCall call;
    call.quality = quality;
    call.src2dst = false;
    call.matrices = {leaps, identity, leaps};  // stands still; the one between widens the bounds
    TestWorld<T> expected = dst;
    TransformModel<T>(call, src, expected).draw();
    EXPECT_EQ(call.run(src, dst), 0);
    EXPECT_TRUE(dst == expected) << quality;
    EXPECT_NE(dst.at(4, 3).alpha, 0);
  }
}

TYPED_TEST(TransformEdges, TenThousandMatrices) {
  using T = TypeParam;
  TestWorld<T> src(2, 2), dst(3, 2);
  src.randomise(1);
  for (i32 quality : {0, 1})
    for (f64 turn : {0.0, 1e-5}) {
      TransformCall call;
      call.quality = quality;
      for (i32 i = 0; i < 10000; ++i)
        call.matrices.push_back({{{1, -turn * i, 1e-4 * i}, {turn * i, 1, 0}, {0, 0, 1}}});
      TestWorld<T> expected = dst;
      TransformModel<T>(call, src, expected).draw();
      EXPECT_EQ(call.run(src, dst), 0);
      EXPECT_TRUE(dst == expected) << quality << ' ' << turn;
    }
}

TYPED_TEST(TransformEdges, ThreadsWithScratchOfTheirOwn) {
  using T = TypeParam;
  TestWorld<T> src(40, 40), expected(60, 60);
  src.randomise(1);
  std::vector<TransformCall> calls(3);
  calls[0].matrices = {turned};
  calls[1].matrices = {moved};
  calls[2].matrices = {turned, moved, identity};
  for (const TransformCall& call : calls) ASSERT_EQ(call.run(src, expected), 0);
  std::vector<std::thread> threads;
  for (i32 t = 0; t < 2; ++t)
    threads.emplace_back([&] {
      std::vector<u8> rows[3] = {std::vector<u8>(60 * 16), std::vector<u8>(60 * 16), std::vector<u8>(60 * 16)};
      void* scratch[10] = {rows[0].data(), rows[1].data(), rows[2].data()};
      EXPECT_EQ(ZR_AllocateMotionBlurScratch(scratch + 3), 0);
      for (i32 round = 0; round < 5; ++round) {
        TestWorld<T> dst(60, 60);
        for (const TransformCall& call : calls) EXPECT_EQ(call.run(src, dst, nullptr, scratch), 0);
        EXPECT_TRUE(dst == expected);
      }
      ZR_DisposeMotionBlurScratch(scratch + 3);
    });
  for (std::thread& thread : threads) thread.join();
}

}  // namespace
