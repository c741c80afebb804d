// Birth and death: failing at every allocation, twice, out of order.
#include <ADDIN/addin.h>
#include <GX/gx.h>

#include <cstdlib>

#include "support/born_library.h"
#include "world/constants_state.h"

namespace {

// Error lines of failing births are what is wanted here; they need not be read.
class QuietLog {
 public:
  QuietLog() { setenv("ZR_LOG_LEVEL", "1000", 1); }
  ~QuietLog() { unsetenv("ZR_LOG_LEVEL"); }
};

u64 live_blocks() {
  HB_MemoryStats stats;
  HB_GetMemoryStats(&stats);
  return stats.live_blocks;
}

bool slots_are_empty() {
  return std::all_of(std::begin(ZRp_G_OverFuncs), std::end(ZRp_G_OverFuncs),
                     [](ZR_SlotFunc routine) { return routine == nullptr; });
}

class Birth : public testing::Test {
 protected:
  void TearDown() override {
    HB_FailNthAllocation(0);
    EXPECT_EQ(ZR_Death(), 0);
    EXPECT_EQ(live_blocks(), before_) << "something was not given back";
  }
  u64 before() const { return before_; }
  CaughtMessages caught;
  QuietLog quiet;

 private:
  u64 before_ = live_blocks();
};

TEST_F(Birth, FailingAtAnyAllocationLeavesNothingAndMayBeTriedAgain) {
  u64 n = 1;
  for (;; ++n) {
    ASSERT_LT(n, 1000u);
    HB_FailNthAllocation(n);
    const i32 error = ZR_Birth();
    HB_FailNthAllocation(0);
    if (error == 0) break;
    EXPECT_EQ(error, 4) << "allocation " << n;
    EXPECT_TRUE(slots_are_empty()) << "allocation " << n;
    EXPECT_EQ(live_blocks(), before()) << "allocation " << n;
    EXPECT_EQ(ZR_Death(), 0) << "death after a failed birth, allocation " << n;
    ASSERT_EQ(ZR_Birth(), 0) << "birth after one that failed at allocation " << n;
    EXPECT_EQ(ZR_Death(), 0);
  }
  EXPECT_GT(n, 12u) << "tables, scratch, module list: all of them have to have failed once";
}

TEST_F(Birth, ASecondOneStartsOverAndHoldsNoMore) {
  ASSERT_EQ(ZR_Birth(), 0);
  const u64 held = live_blocks();
  const ZR_SlotFunc iterate = ZRp_G_OverFuncs[ZR_Slot_iterate];
  ASSERT_EQ(ZR_SetOverrideFunc(ZR_Slot_iterate, reinterpret_cast<void*>(&ZR_Hypot)), 0);
  ASSERT_EQ(ZR_SetOverrideFunc(ZR_Slot_module1, reinterpret_cast<void*>(&ZR_Hypot)), 0);
  ZR_G_LiveWorlds = 5;
  ZR_G_LiveChunks = -3;
  ASSERT_EQ(ZR_Birth(), 0);
  EXPECT_EQ(ZRp_G_OverFuncs[ZR_Slot_iterate], iterate);
  EXPECT_EQ(ZRp_G_OverFuncs[ZR_Slot_module1], nullptr);
  EXPECT_EQ(ZR_G_LiveWorlds, 0);
  EXPECT_EQ(ZR_G_LiveChunks, 0);
  EXPECT_EQ(live_blocks(), held);
}

TEST_F(Birth, AFailingSecondOneEndsTheFirstLife) {
  ASSERT_EQ(ZR_Birth(), 0);
  HB_FailNthAllocation(1);
  EXPECT_EQ(ZR_Birth(), 4);
  HB_FailNthAllocation(0);
  EXPECT_TRUE(slots_are_empty());
  EXPECT_EQ(live_blocks(), before());
}

TEST_F(Birth, DeathMayComeTwiceAndLeavesTheTableAsItIs) {
  ASSERT_EQ(ZR_Birth(), 0);
  const ZR_SlotFunc iterate = ZRp_G_OverFuncs[ZR_Slot_iterate];
  EXPECT_EQ(ZR_Death(), 0);
  EXPECT_EQ(ZR_Death(), 0);
  EXPECT_EQ(ZRp_G_OverFuncs[ZR_Slot_iterate], iterate);
}

TEST_F(Birth, DeathGivesBackOnlyItsOwnHoldOnTheTables) {
  const u8* multiply = nullptr;
  ASSERT_EQ(GX_PrepareFCMD(1, 0, 0, &multiply, nullptr), 0);  // somebody else's
  ASSERT_EQ(ZR_Birth(), 0);
  EXPECT_EQ(ZRp_G_fcm_table, multiply);
  EXPECT_EQ(ZR_Death(), 0);
  EXPECT_EQ(ZR_Death(), 0);
  EXPECT_EQ(multiply[255 * 256 + 200], 200);
  EXPECT_GT(live_blocks(), before()) << "the table is still held";
  EXPECT_EQ(GX_UnprepareFCMD(), 0);
}

TEST_F(Birth, ReadsThePreferencesOfItsOwnTime) {
  setenv("ZR_CPU", "scalar", 1);
  ASSERT_EQ(ZR_Birth(), 0);
  EXPECT_EQ(HB_G_CPU_DataP[2], 0);
  EXPECT_EQ(HB_G_CPU_DataP[6], 0);
  EXPECT_NE(ZRp_G_OverFuncs[ZR_Slot_premul_row8], nullptr) << "the plain rows serve any processor";
  unsetenv("ZR_CPU");
}

}  // namespace
