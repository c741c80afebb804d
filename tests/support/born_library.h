// A test's own life of the library: birth before, death after, and the shared state unchanged between.
#pragma once

#include <ZR/platform.h>
#include <ZR/slots.h>
#include <ZR/world.h>
#include <ZR/zr.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <array>

#include "support/messages.h"

class BornLibrary : public testing::Test {
 protected:
  void SetUp() override {
    ASSERT_EQ(ZR_Birth(), 0);
    std::copy(std::begin(ZRp_G_OverFuncs), std::end(ZRp_G_OverFuncs), slots_.begin());
    worlds_ = ZR_G_LiveWorlds;
    chunks_ = ZR_G_LiveChunks;
    HB_GetMemoryStats(&memory_);
  }
  void TearDown() override {
    EXPECT_TRUE(std::equal(slots_.begin(), slots_.end(), std::begin(ZRp_G_OverFuncs))) << "a test left a slot changed";
    EXPECT_EQ(ZR_G_LiveWorlds, worlds_) << "a test left a world behind";
    EXPECT_EQ(ZR_G_LiveChunks, chunks_) << "a test left a chunk behind";
    HB_MemoryStats now;
    HB_GetMemoryStats(&now);
    EXPECT_EQ(now.live_blocks, memory_.live_blocks) << "a test left memory behind";
    HB_FailNthAllocation(0);
    EXPECT_EQ(ZR_Death(), 0);
  }
  CaughtMessages caught;

 private:
  std::array<ZR_SlotFunc, ZR_SlotCount> slots_{};
  i32 worlds_ = 0, chunks_ = 0;
  HB_MemoryStats memory_{};
};

// Another routine in a slot, until the object goes.
class SlotOverride {
 public:
  SlotOverride(ZR_SlotIndex slot, void* routine) : slot_(slot), before_(ZRp_G_OverFuncs[slot]) {
    EXPECT_EQ(ZR_SetOverrideFunc(slot, routine), 0);
  }
  ~SlotOverride() { ZRp_G_OverFuncs[slot_] = before_; }
  SlotOverride(const SlotOverride&) = delete;
  SlotOverride& operator=(const SlotOverride&) = delete;

 private:
  ZR_SlotIndex slot_;
  ZR_SlotFunc before_;
};

// For slot 53: threads may take rows and bands in any order.
inline i32 iterate_backwards(i32 iterations, void* refcon, ZR_GenericFunc fn) {
  i32 result = 0;
  for (i32 i = iterations - 1; i >= 0 && result == 0; --i) result = fn(refcon, 0, i, iterations);
  return result;
}
