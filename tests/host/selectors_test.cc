// Selectors: what each number leads to, and the numbers that lead nowhere.
#include <set>

#include "host/callback_surface.h"

namespace {

constexpr SlotChoice from_slots[] = {
    {-13, {92, 92, 92, 92}}, {-12, {61, 61, 61, 61}}, {-11, {60, 60, 60, 60}}, {-9, {58, 58, 58, 58}},
    {-8, {57, 57, 57, 57}},  {-6, {54, 54, 54, 54}},  {-2, {26, 27, 26, 27}},  {1, {0, 0, 0, 0}},
    {2, {2, 2, 3, 4}},       {3, {2, 2, 5, 6}},       {5, {1, 1, 1, 1}},       {6, {7, 8, 9, 10}},
    {8, {28, 28, 28, 28}},   {9, {23, 23, 24, 25}},   {12, {42, 42, 42, 42}},  {25, {43, 43, 43, 43}},
    {26, {44, 44, 44, 44}},  {29, {51, 51, 51, 51}},  {30, {53, 53, 53, 53}},  {31, {63, 63, 64, 64}},
    {32, {63, 63, 65, 65}},  {35, {42, 42, 42, 42}},  {36, {43, 43, 43, 43}},  {37, {51, 51, 51, 51}},
};
// Routines that nobody replaces, and their entries in the block.
constexpr struct {
  i32 selector;
  int entry;
} from_block[] = {{4, 3},   {7, 6},   {10, 9},  {11, 10}, {13, 12}, {14, 13}, {15, 46}, {16, 47}, {17, 48}, {18, 49},
                  {19, 50}, {20, 51}, {21, 52}, {22, 53}, {23, 14}, {24, 15}, {27, 18}, {28, 19}, {33, 61}, {34, 62}};

using Selectors = CallbackSurface;

TEST_F(Selectors, ReadTheTableByQualityAndAlpha) {
  mark_slots();
  for (int mode = 0; mode < 4; ++mode)
    for (const SlotChoice& one : from_slots) {
      void* found = &found;
      EXPECT_EQ(ZR_GetCallbackAddr(nullptr, modes[mode].quality, modes[mode].flags, one.number, &found), 0);
      EXPECT_EQ(found, slot_mark(one.slots[mode])) << "selector " << one.number << ", mode " << mode;
    }
}

TEST_F(Selectors, GiveTheSameFixedRoutinesAsTheBlock) {
  for (const Mode& mode : modes) {
    void* block[69];
    ASSERT_EQ(ZR_GetCallbackBlock(mode.quality, mode.flags, block), 0);
    for (const auto& one : from_block) {
      void* found = &found;
      EXPECT_EQ(ZR_GetCallbackAddr(nullptr, mode.quality, mode.flags, one.selector, &found), 0);
      EXPECT_EQ(found, block[one.entry]) << "selector " << one.selector;
    }
  }
}

TEST_F(Selectors, LeadToRoutinesThatNoBlockHolds) {
  void* block[69];
  ASSERT_EQ(ZR_GetCallbackBlock(1, 1, block), 0);
  const std::pair<i32, void*> routines[] = {{-5, address_of(&ZRp_GaussianValue)},
                                            {-4, address_of(&ZR_InsertPlanes)},
                                            {-3, address_of(&ZR_ExtractPlanes)},
                                            {-1, address_of(&ZR_PaintSpot)}};
  for (const auto& [selector, routine] : routines) {
    void* found = nullptr;
    EXPECT_EQ(ZR_GetCallbackAddr(nullptr, 0, 0, selector, &found), 0);
    EXPECT_EQ(found, routine) << selector;
  }
}

TEST_F(Selectors, OthersAreRefusedByName) {
  std::set<i32> listed = {-5, -4, -3, -1};
  for (const SlotChoice& one : from_slots) listed.insert(one.number);
  for (const auto& one : from_block) listed.insert(one.selector);
  std::vector<i32> numbers = {INT32_MIN, INT32_MAX};
  for (i32 number = -30; number <= 80; ++number) numbers.push_back(number);
  for (const i32 number : numbers) {
    void* found = &found;
    const bool known = listed.contains(number);
    EXPECT_EQ(ZR_GetCallbackAddr(nullptr, 1, 1, number, &found), known ? 0 : 515) << number;
    EXPECT_EQ(caught.messages().size(), known ? 0u : 1u) << number;
    if (!known) {
      EXPECT_EQ(found, nullptr) << number;
      EXPECT_EQ(caught.messages().at(0).code, 0x250001u);
      EXPECT_EQ(caught.take_message(), "invalid callback selector");
    }
  }
  EXPECT_EQ(listed.size(), 48u);
}

TEST_F(Selectors, NullResultIsABadParameter) {
  EXPECT_EQ(ZR_GetCallbackAddr(nullptr, 1, 1, 2, nullptr), 3);
  ASSERT_EQ(caught.messages().size(), 1u);
  EXPECT_EQ(caught.messages()[0].code, 0x250001u);
  EXPECT_EQ(caught.take_message(), "bad parameter passed to effect callback");
}

}  // namespace
