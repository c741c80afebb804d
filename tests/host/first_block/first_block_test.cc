// Selectors and blocks before and after the first ZR_GetCallbackBlock of a process: one test, since there is
// only one first.
#include <ZR/zr.h>
#include <gtest/gtest.h>

namespace {

// Of routines that nobody replaces.
constexpr i32 private_selectors[] = {-4, -3, -1, 4, 7, 10, 13, 14, 15, 18, 22, 23, 24, 27, 28, 33, 34};

void expect_private(bool alive) {
  for (const i32 flags : {0, 1})
    for (const i32 selector : private_selectors) {
      void* found = &found;
      EXPECT_EQ(ZR_GetCallbackAddr(nullptr, 1, flags, selector, &found), 0) << selector;
      EXPECT_EQ(found != nullptr, alive) << selector;
    }
}

TEST(FirstBlock, BringsTheFixedRoutinesToLifeForGood) {
  ASSERT_EQ(ZR_Birth(), 0);
  expect_private(false);
  void* found = nullptr;
  EXPECT_EQ(ZR_GetCallbackAddr(nullptr, 1, 1, 12, &found), 0);
  EXPECT_NE(found, nullptr) << "what stands in a slot is there from birth on";

  void* block[69] = {&found, &found, &found, &found, &found, &found, &found};
  EXPECT_EQ(ZR_SetCallbackBlockQuality(1, 1, block), 0);
  EXPECT_EQ(block[6], nullptr) << "changing the quality of a block does not fill the table";
  expect_private(false);

  EXPECT_EQ(ZR_GetCallbackBlock(0, 0, block), 0);
  EXPECT_EQ(block[6], reinterpret_cast<void*>(&ZR_Blend_Premul));
  expect_private(true);
  ASSERT_EQ(ZR_Death(), 0);
  ASSERT_EQ(ZR_Birth(), 0);
  expect_private(true);
  EXPECT_EQ(ZR_Death(), 0);
}

}  // namespace
