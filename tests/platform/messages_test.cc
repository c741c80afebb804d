// Messages and quiet pairs, texts, exceptions, and the processor record.
#include <HB/hb.h>
#include <OPT/opt.h>

#include <cstring>
#include <new>
#include <stdexcept>
#include <thread>
#include <vector>

#include "support/messages.h"
#include "support/temporary_folder.h"
#include <gtest/gtest.h>

namespace {

TEST(Messages, QuietPairsNestAndTellTheFirstErrorDroppedInThem) {
  CaughtMessages caught;
  EXPECT_EQ(HB_EndQuietErrorsOnCurrentThread(), 0);  // one too many
  EXPECT_EQ(HB_StartQuietErrorsOnCurrentThread(), 0);
  EXPECT_EQ(HB_StartQuietErrorsOnCurrentThread(), 0);
  EXPECT_EQ(HB_EndQuietErrorsOnCurrentThread(), 0) << "nothing was dropped";
  HBp_ReportErrString(0x250001, 8, "first");
  HB_StartQuietErrorsOnCurrentThread();
  HBp_ReportErrString(0x250002, 8, "second");
  HBp_ReportErrString(0x250003, 8, "third");
  EXPECT_EQ(HB_EndQuietErrorsOnCurrentThread(), 0x250002);
  EXPECT_TRUE(caught.quiet());
  HB_ReportFailedVerification(0x250004, 1, 0, "not held back");
  EXPECT_EQ(caught.take_verification(), "not held back");
  std::thread([] { HBp_ReportErrString(0x250005, 8, "other thread"); }).join();
  EXPECT_EQ(caught.take_message(), "other thread");
  EXPECT_EQ(HB_EndQuietErrorsOnCurrentThread(), 0x250001);
  HBp_ReportErrString(0x250006, 8, "loud again");
  EXPECT_EQ(caught.take_message(), "loud again");
}

TEST(Messages, AnErrorDroppedInsideCountsForTheOuterPairAtAnyDepth) {
  CaughtMessages caught;
  for (i32 i = 0; i < 100; ++i) HB_StartQuietErrorsOnCurrentThread();
  HBp_ReportErrString(0x250009, 8, "deep");
  for (i32 i = 0; i < 100; ++i) EXPECT_EQ(HB_EndQuietErrorsOnCurrentThread(), 0x250009) << i;
  HBp_ReportErrString(0x250009, 8, "out");
  EXPECT_EQ(caught.take_message(), "out");
}

TEST(Messages, ExceptionsBecomeCodesAndAreShown) {
  CaughtMessages caught;
  EXPECT_EQ(HB_TranslateAndReportException(std::runtime_error("went wrong")), ZR_Err_Internal);
  EXPECT_EQ(caught.take_message(), "went wrong");
  EXPECT_EQ(HB_TranslateAndReportException(std::bad_array_new_length()), ZR_Err_OutOfMemory);
  EXPECT_EQ(caught.messages().size(), 1u);
}

TEST(Texts, TheTableGivesTheTextBehindTheKey) {
  static const char* const strings[] = {
      "$$$/a/b=invalid selector", "$$$/c=can#{rsquo}t do #{rsquo}", "no key", nullptr, "k=a=b",
      "k=can#{rsquo}t #{other}"};
  const HB_StringTable table{"T", 6, strings};
  const struct {
    i32 index;
    const char* text;
  } cases[] = {{0, "invalid selector"},
               {1, "can\u2019t do \u2019"},
               {2, "no key"},
               {3, nullptr},
               {4, "a=b"},
               {5, "can\u2019t #{other}"},
               {-1, nullptr},
               {6, nullptr}};
  for (const auto& one : cases)
    EXPECT_STREQ(HB_ZLookupLStrCache(&table, one.index, 0, 0), one.text) << "index " << one.index;
  EXPECT_EQ(HB_ZLookupLStrCache(nullptr, 0, 0, 0), nullptr);
}

TEST(Texts, AreTheSameAddressFromEveryThread) {
  static const char* const strings[] = {"k=one#{rsquo}", "k=two#{rsquo}", "k=three#{rsquo}"};
  static const HB_StringTable table{"T", 3, strings};
  const char* seen[4][3] = {};
  std::vector<std::thread> threads;
  for (auto& mine : seen)
    threads.emplace_back([&mine] {
      for (i32 round = 0; round < 100; ++round)
        for (i32 i = 0; i < 3; ++i) mine[i] = HB_ZLookupLStrCache(&table, i, 0, 0);
    });
  for (std::thread& thread : threads) thread.join();
  for (const auto& other : seen)
    for (i32 i = 0; i < 3; ++i) EXPECT_EQ(other[i], seen[0][i]);
}

TEST(Texts, SubstitutionIsBounded) {
  const struct {
    const char *format, *first, *second;
    std::size_t limit;
    i32 error;
    const char* text;
  } cases[] = {
      {"size (^L1x^L2).", "640", "480", 64, 0, "size (640x480)."},
      {"size (^L1x^L2).", "640", "480", 16, 0, "size (640x480)."},
      {"size (^L1x^L2).", "640", "480", 15, ZR_Err_BadParam, ""},
      {"^L2^L1^L2", "a", "b", 64, 0, "bab"},
      {"^L1", "^L2", "b", 64, 0, "^L2"},
      {"^L3^L4.", "a", "b", 64, 0, "."},
      {"^L5 ^L ^", "a", "b", 64, 0, "^L5 ^L ^"},
      {"", "a", "b", 1, 0, ""},
      {"x", "a", "b", 1, ZR_Err_BadParam, ""},
      {"^L1", "ab", nullptr, 2, ZR_Err_BadParam, ""},
  };
  for (const auto& one : cases) {
    char out[80];
    std::memset(out, '!', sizeof out);
    EXPECT_EQ(HB_SubString(out, one.limit, one.format, one.first, one.second), one.error) << one.format;
    EXPECT_STREQ(out, one.text);
    for (std::size_t i = one.limit; i < sizeof out; ++i)
      ASSERT_EQ(out[i], '!') << one.format << " wrote past the limit";
  }
  char untouched = '!';
  EXPECT_EQ(HB_SubString(&untouched, 0, "x", "a"), ZR_Err_BadParam);
  EXPECT_EQ(untouched, '!');
}

TEST(Threads, AreWhatTheHostSaysElseTheDefaultNeverBelowOne) {
  const struct {
    i32 set, fallback, result;
  } cases[] = {{0, 4, 4}, {0, 0, 1}, {0, -3, 1}, {6, 4, 6}, {-2, 5, 5}, {1, 5, 1}};
  for (const auto& one : cases) {
    i32 count = 99;
    HB_SetNumThreads(one.set);
    EXPECT_EQ(HB_GetNumThreads(&count, one.fallback), 0);
    EXPECT_EQ(count, one.result) << one.set << " " << one.fallback;
  }
  HB_SetNumThreads(0);
}

TEST(Processor, TheCapTakesAwayWhatStandsAboveIt) {
  HB_PrepareCpuData();
  std::vector<i32> full(HB_G_CPU_DataP, HB_G_CPU_DataP + HB_CPU_WordCount);
#if defined(__x86_64__)
  EXPECT_NE(full[2], 0) << "every x86-64 processor has SSE2";
#endif
  const struct {
    const char* level;
    i32 first_above;
  } cases[] = {{"scalar", 0}, {"sse4", 7}, {"avx2", 8}, {"avx512", HB_CPU_WordCount}};
  for (const auto& one : cases) {
    const EnvironmentVariable level("ZR_CPU", one.level);
    HB_PrepareCpuData();
    for (i32 word = 0; word < HB_CPU_WordCount; ++word)
      EXPECT_EQ(HB_G_CPU_DataP[word], word < one.first_above ? full[static_cast<std::size_t>(word)] : 0)
          << one.level << " word " << word;
  }
  HB_PrepareCpuData();
}

}  // namespace
