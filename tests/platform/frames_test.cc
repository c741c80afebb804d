// The pool of frames, and raster worlds on top of it.
#include <HB/hb.h>
#include <RS/rs.h>
#include <SHM/shm.h>

#include <algorithm>
#include <cstring>
#include <limits>
#include <random>
#include <vector>
#include <thread>

#include "support/messages.h"
#include <gtest/gtest.h>

namespace {

bool aligned(const void* block) { return reinterpret_cast<u64>(block) % 64 == 0; }

class Frames : public testing::Test {
 protected:
  void SetUp() override { RS_PurgeFramePool(); }
  void TearDown() override {
    RS_SetFramePoolLimit(u64{256} << 20);
    RS_PurgeFramePool();
  }
  static u64 live() {
    HB_MemoryStats now;
    HB_GetMemoryStats(&now);
    return now.live_bytes;
  }
};

TEST_F(Frames, OneOfTheSameSizeComesBackFromThePool) {
  const u64 before = live();
  for (const std::size_t bytes :
       {std::size_t{0}, std::size_t{1}, std::size_t{64}, std::size_t{4096}, std::size_t{4097}, std::size_t{8294408}}) {
    void* const first = RS_AllocateFrameQuiet(bytes);
    ASSERT_TRUE(aligned(first)) << bytes;
    std::memset(first, 0xab, bytes);
    RS_FreeFrame(first, bytes);
    EXPECT_GE(RS_GetFramePoolSize(), bytes);
    EXPECT_EQ(live(), before) << "a frame at rest is not live";
    void* const other = RS_AllocateFrameQuiet(bytes + 4096);
    EXPECT_NE(other, first) << "another size";
    void* const again = RS_AllocateFrameQuiet(bytes);
    EXPECT_EQ(again, first) << bytes;
    RS_FreeFrame(again, bytes);
    RS_FreeFrame(other, bytes + 4096);
    RS_PurgeFramePool();
    EXPECT_EQ(RS_GetFramePoolSize(), 0u);
  }
  EXPECT_EQ(live(), before);
}

TEST_F(Frames, TheLimitGivesTheOldestBack) {
  constexpr std::size_t size = 1 << 16;
  RS_SetFramePoolLimit(3 * size);
  void* frames[4];
  for (void*& frame : frames) frame = RS_AllocateFrameQuiet(size);
  for (void* frame : frames) RS_FreeFrame(frame, size);
  EXPECT_EQ(RS_GetFramePoolSize(), 3 * size);
  for (i32 i = 3; i >= 1; --i) EXPECT_EQ(RS_AllocateFrameQuiet(size), frames[i]) << "the one freed last comes first";
  EXPECT_EQ(RS_GetFramePoolSize(), 0u);
  for (i32 i = 1; i <= 3; ++i) RS_FreeFrame(frames[i], size);
  RS_SetFramePoolLimit(size);
  EXPECT_EQ(RS_GetFramePoolSize(), size);
  void* const large = RS_AllocateFrameQuiet(2 * size);
  RS_FreeFrame(large, 2 * size);
  EXPECT_EQ(RS_GetFramePoolSize(), size) << "one that can never fit drives nothing out";
  RS_SetFramePoolLimit(0);
  EXPECT_EQ(RS_GetFramePoolSize(), 0u);
}

TEST_F(Frames, NoTwoThreadsHoldTheSameFrame) {
  static constexpr std::size_t sizes[] = {64, 64, 640, 8192, 12288};
  RS_SetFramePoolLimit(20000);
  const u64 before = live();
  std::vector<std::thread> threads;
  for (u32 t = 1; t <= 4; ++t)
    threads.emplace_back([t] {
      std::minstd_rand random(t);
      std::vector<std::pair<u32*, std::size_t>> held;
      for (i32 i = 0; i < 3000; ++i) {
        const std::size_t bytes = sizes[random() % std::size(sizes)];
        auto* const frame = static_cast<u32*>(RS_AllocateFrameQuiet(bytes));
        ASSERT_NE(frame, nullptr);
        frame[0] = frame[bytes / 4 - 1] = t;
        held.emplace_back(frame, bytes);
        if (held.size() < 4) continue;
        const auto [old, old_bytes] = held.front();
        held.erase(held.begin());
        ASSERT_TRUE(old[0] == t && old[old_bytes / 4 - 1] == t) << "somebody else wrote into a frame in use";
        RS_FreeFrame(old, old_bytes);
      }
      for (const auto& [frame, bytes] : held) RS_FreeFrame(frame, bytes);
    });
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(live(), before);
  EXPECT_LE(RS_GetFramePoolSize(), 20000u);
}

TEST_F(Frames, RasterWorldsAreZeroedEvenInARecycledFrame) {
  const struct {
    i32 bits, width, height, row_bytes;
  } cases[] = {{32, 1, 1, 64},   {32, 16, 3, 64},        {32, 17, 3, 128},  {64, 33, 2, 320},
               {128, 5, 7, 128}, {32, 32767, 1, 131072}, {64, 1, 32767, 64}};
  for (const auto& one : cases)
    for (i32 round = 0; round < 2; ++round) {
      const GX_Rect bounds{-5, -7, static_cast<i16>(one.height - 5), static_cast<i16>(one.width - 7)};
      RS_World** raster = nullptr;
      ASSERT_EQ(RS_NewWorld(&bounds, 8, one.bits, &raster), 0);
      const RS_World& world = **raster;
      EXPECT_EQ(world.width, one.width);
      EXPECT_EQ(world.height, one.height);
      EXPECT_EQ(world.bits_per_pixel, one.bits);
      EXPECT_EQ(world.row_bytes, one.row_bytes);
      EXPECT_EQ(world.channel_order, 0);
      ASSERT_TRUE(aligned(world.base));
      EXPECT_EQ(RSp_GetPixBaseAddr(raster), world.base);
      const auto size = static_cast<std::size_t>(one.row_bytes * one.height);
      auto* const bytes = static_cast<u8*>(world.base);
      EXPECT_EQ(std::count(bytes, bytes + size, 0), static_cast<i64>(size));
      std::memset(bytes, 0xff, size);
      RS_DisposeWorld(raster);
    }
}

TEST_F(Frames, RasterWorldsOfOtherSizesAndDepthsAreRefused) {
  const struct {
    const char* why;
    GX_Rect bounds;
    i32 bits;
  } cases[] = {{"no width", {0, 5, 5, 5}, 32},
               {"no height", {5, 0, 5, 5}, 32},
               {"inverted", {0, 5, 5, 0}, 32},
               {"wider than its field", {0, -32768, 1, 32767}, 32},
               {"higher than its field", {-1, 0, 32767, 1}, 32},
               {"24 bits", {0, 0, 5, 5}, 24},
               {"0 bits", {0, 0, 5, 5}, 0}};
  for (const auto& one : cases) {
    RS_World** raster = reinterpret_cast<RS_World**>(1);
    EXPECT_EQ(RS_NewWorld(&one.bounds, 8, one.bits, &raster), ZR_Err_BadParam) << one.why;
    EXPECT_EQ(raster, nullptr) << one.why;
  }
}

TEST_F(Frames, LocksAreCountedAndNeverBelowZero) {
  const GX_Rect bounds{0, 0, 4, 4};
  RS_World** raster = nullptr;
  ASSERT_EQ(RS_NewWorld(&bounds, 8, 32, &raster), 0);
  RS_UnlockPixels(raster);
  EXPECT_EQ((*raster)->lock_count, 0u);
  EXPECT_EQ(RS_LoadLockPixels(raster), 0);
  EXPECT_EQ(RS_LoadLockPixels(raster), 0);
  RS_UnlockPixels(raster);
  EXPECT_EQ((*raster)->lock_count, 1u);
  RS_DisposeWorld(raster);
  EXPECT_EQ(RS_LoadLockPixels(nullptr), ZR_Err_BadParam);
}

TEST(Window, ModesNestOnEachThread) {
  SHM_EndGdiMinimalisticWindowCreationMode();
  SHM_BeginGdiMinimalisticWindowCreationMode();
  SHM_BeginGdiMinimalisticWindowCreationMode();
  SHM_EndGdiMinimalisticWindowCreationMode();
  EXPECT_TRUE(SHM_InGdiMinimalisticWindowCreationMode());
  std::thread([] { EXPECT_FALSE(SHM_InGdiMinimalisticWindowCreationMode()); }).join();
  SHM_EndGdiMinimalisticWindowCreationMode();
  EXPECT_FALSE(SHM_InGdiMinimalisticWindowCreationMode());
}

}  // namespace
