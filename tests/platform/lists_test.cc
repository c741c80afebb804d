// Lists of records, random words, and file extensions.
#include <DIE/die.h>
#include <DSK/dsk.h>
#include <SEQ/seq.h>

#include <bit>
#include <set>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

namespace {

std::vector<u64> contents(SEQ_List* list) {
  std::vector<u64> all;
  for (i32 i = 0; i < SEQ_GetCount(list); ++i) {
    all.push_back(*static_cast<const u64*>(SEQ_GetAddress(list, i)));
    SEQ_Unlock(list);
  }
  return all;
}

TEST(Lists, BehaveLikeAVector) {
  SEQ_List* list = nullptr;
  ASSERT_EQ(SEQ_New(2, sizeof(u64), 0, 1, &list), 0);
  std::vector<u64> expected;
  for (u64 i = 0; i < 300; ++i) {
    const i32 index = i % 3 == 0 ? -1 : static_cast<i32>((i * 7919) % (expected.size() + 1));
    ASSERT_EQ(SEQ_Insert(list, index, &i), 0);
    expected.insert(index == -1 ? expected.end() : expected.begin() + index, i);
  }
  ASSERT_EQ(SEQ_AppendClear(list, 0), 0);
  ASSERT_EQ(SEQ_AppendClear(list, 70), 0);
  expected.resize(expected.size() + 70);
  EXPECT_EQ(SEQ_AppendClear(list, -1), ZR_Err_BadParam);
  EXPECT_EQ(SEQ_AppendClear(list, 0x7fffffff), ZR_Err_OutOfMemory);
  EXPECT_EQ(contents(list), expected);
  SEQ_Dispose(list);
}

TEST(Lists, RefuseBadIndicesAndWhatWouldMoveALockedRecord) {
  SEQ_List* list = nullptr;
  const u64 record = 5;
  EXPECT_EQ(SEQ_New(2, 0, 1, 1, &list), ZR_Err_BadParam);
  EXPECT_EQ(list, nullptr);
  ASSERT_EQ(SEQ_New(2, sizeof record, 1, 1, &list), 0);
  for (const i32 index : {-2, 1, 1000}) EXPECT_EQ(SEQ_Insert(list, index, &record), ZR_Err_BadParam) << index;
  ASSERT_EQ(SEQ_Insert(list, 0, &record), 0);
  EXPECT_EQ(SEQ_GetAddress(list, 1), nullptr);
  EXPECT_EQ(SEQ_GetAddress(list, -1), nullptr);
  ASSERT_NE(SEQ_GetAddress(list, 0), nullptr);
  ASSERT_NE(SEQ_GetAddress(list, 0), nullptr);
  SEQ_Unlock(list);
  EXPECT_EQ(SEQ_Insert(list, -1, &record), ZR_Err_Internal) << "one lock is left";
  EXPECT_EQ(SEQ_AppendClear(list, 1), ZR_Err_Internal);
  SEQ_Unlock(list);
  EXPECT_EQ(SEQ_Insert(list, -1, &record), 0);
  SEQ_Dispose(list);
  SEQ_Dispose(nullptr);
}

TEST(RandomWords, AreAPrimeNumberTheSameForAllThreads) {
  const u32* start = nullptr;
  i32 count = 0;
  std::thread([&] { DIE_GetPrimeSizedTable(&start, &count); }).join();
  ASSERT_GT(count, 60000);
  for (i32 divisor = 2; divisor * divisor <= count; ++divisor) ASSERT_NE(count % divisor, 0) << divisor;
  const u32* again = nullptr;
  DIE_GetPrimeSizedTable(&again, nullptr);
  EXPECT_EQ(again, start);
}

TEST(Extensions, TheFirstMappingOfANameWins) {
  DSK_ClearExtensionMap();
  ASSERT_EQ(DSK_AddExtensionMap(".ZNX", 1, -1), 0);
  ASSERT_EQ(DSK_AddExtensionMap(".znx", 2, -1), 0);
  ASSERT_EQ(DSK_AddExtensionMap(".tar", 3, -1), 0);
  EXPECT_EQ(DSK_AddExtensionMap(".a_name_far_too_long", 4, -1), ZR_Err_BadParam);
  EXPECT_EQ(DSK_AddExtensionMap("", 4, -1), ZR_Err_BadParam);
  const struct {
    const char* path;
    u32 type;
  } cases[] = {{"/a/b.ZNX", 1}, {"b.znX", 1},   {"b.ZNX.tar", 3}, {"b.ZN", 0}, {"b.ZNXX", 0}, {"/a.ZNX/b", 0},
               {".ZNX", 0},     {"/a/.ZNX", 0}, {"ZNX", 0},       {"b.", 0},   {"", 0},       {"x/..ZNX", 1}};
  for (const auto& one : cases) EXPECT_EQ(DSK_TypeOfPath(one.path), one.type) << one.path;
  DSK_ClearExtensionMap();
  EXPECT_EQ(DSK_TypeOfPath("b.ZNX"), 0u);
}

}  // namespace
