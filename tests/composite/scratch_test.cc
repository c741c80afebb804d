// Growth, shrinking and failure of the shared scratch, and scratch that callers make.
#include "composite/scratch_state.h"

#include <ZR/composite.h>
#include <gtest/gtest.h>

#include <cstring>
#include <limits>

#include "support/born_library.h"

namespace {

class Scratch : public BornLibrary {
 protected:
  static u64 attempts() {
    HB_MemoryStats stats;
    HB_GetMemoryStats(&stats);
    return stats.allocations;
  }
  // Attempts to allocate that a call makes; every block it hands out is written to its end.
  u64 attempts_of(i32 width, bool force, i32 expected = 0) {
    const u64 before = attempts();
    EXPECT_EQ(ZRp_ReallocScratch(width, 4, force, record), expected);
    const u64 made = attempts() - before;
    if (expected == 0) {
      const size_t w = static_cast<size_t>(width);
      const size_t sizes[10] = {w * 4, w * 16, w * 16, 2048, 2048, 2048, 4096, 4096, 18432, 26624};
      for (i32 i = 0; i < 10; ++i) std::memset(record[i], 1, sizes[i]);
    }
    return made;
  }
  void* record[10] = {};
};

TEST_F(Scratch, GrowsOnDemandAndShrinksByForce) {
  EXPECT_EQ(attempts_of(1, false), 0u);
  EXPECT_EQ(attempts_of(1024, false), 0u);
  void* const rows[] = {record[0], record[1], record[2]};
  EXPECT_EQ(attempts_of(1025, false), 3u);
  for (i32 i = 0; i < 3; ++i) EXPECT_NE(record[i], rows[i]);
  EXPECT_EQ(attempts_of(1025, false), 0u);
  EXPECT_EQ(ZR_FreeUpSomeMemory(), 0);
  EXPECT_EQ(attempts_of(1024, false), 0u);
  EXPECT_EQ(attempts_of(1025, false), 3u);
  EXPECT_EQ(attempts_of(0, true), 3u);
  EXPECT_EQ(attempts_of(1024, true), 3u);
  EXPECT_TRUE(caught.quiet());
}

TEST_F(Scratch, AFailedGrowthMakesTheNextCallTryAgain) {
  for (u64 n = 1; n <= 3; ++n) {
    HB_FailNthAllocation(n);
    EXPECT_EQ(attempts_of(2000, false, 4), n);
    ASSERT_EQ(caught.messages().size(), 1u);
    EXPECT_EQ(caught.messages()[0].code, 2424903u);
    EXPECT_NE(caught.messages()[0].text.find("blending scratch buffer"), std::string::npos);
    caught.clear();
    EXPECT_EQ(attempts_of(1, false), 3u);
  }
  for (i32 width : {-1, std::numeric_limits<i32>::min(), std::numeric_limits<i32>::max()})
    EXPECT_EQ(attempts_of(width, true, 4), 0u) << "what cannot be counted is not tried";
  EXPECT_EQ(attempts_of(1024, false), 3u);
}

TEST_F(Scratch, TheFixedBlocksAreMadeWhole) {
  zr::free_scratch();
  for (u64 n = 1; n <= 7; ++n) {
    HB_FailNthAllocation(n);
    EXPECT_EQ(attempts_of(1024, false, 4), n);
  }
  EXPECT_EQ(attempts_of(1024, false), 10u);
}

TEST_F(Scratch, OtherDepthsAreRefused) {
  for (i32 bytes : {0, 3, 8, -1}) {
    EXPECT_EQ(ZRp_ReallocScratch(1, bytes, true, record), 3);
    EXPECT_EQ(caught.take_verification(), "Unexpected bitdepth in ZRp_ReallocScratch()");
  }
}

TEST_F(Scratch, SetsOfACaller) {
  void* blocks[7];
  for (u64 n = 1; n <= 7; ++n) {
    HB_FailNthAllocation(n);
    EXPECT_EQ(ZR_AllocateMotionBlurScratch(blocks), 4);
    EXPECT_EQ(caught.messages().size(), 1u);
    EXPECT_NE(caught.take_message().find("motion blur scratch data" + std::to_string(n)), std::string::npos);
    for (u64 i = 0; i < 7; ++i) EXPECT_EQ(blocks[i] != nullptr, i + 1 < n);
    ZR_DisposeMotionBlurScratch(blocks);
  }
  ASSERT_EQ(ZR_AllocateMotionBlurScratch(blocks), 0);
  std::memset(blocks[6], 1, 26624);
  ZR_DisposeMotionBlurScratch(blocks);
  for (void* block : blocks) EXPECT_EQ(block, nullptr);
  ZR_DisposeMotionBlurScratch(blocks);
}

}  // namespace
