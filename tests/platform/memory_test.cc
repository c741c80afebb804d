// Counted memory: what each attempt that fails leaves behind, under one thread and under many.
#include <ADDIN/addin.h>
#include <DSK/dsk.h>
#include <GX/gx.h>
#include <HB/hb.h>
#include <RS/rs.h>
#include <SEQ/seq.h>

#include <atomic>
#include <cstring>
#include <functional>
#include <limits>
#include <thread>
#include <vector>

#include "support/messages.h"
#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace {

HB_MemoryStats stats() {
  HB_MemoryStats now;
  HB_GetMemoryStats(&now);
  return now;
}

bool aligned(const void* block, u64 to) { return reinterpret_cast<u64>(block) % to == 0; }

struct Operation {
  const char* name;
  u64 attempts;                    // that it makes
  const char* message;             // a part of what the user is told, or null when it is quiet
  std::function<bool()> succeeds;  // undoes itself after success
};

struct Tracked : HB_MemTrackedObject {
  u64 word = 7;
};

const Operation operations[] = {
    {"Block", 1, "some pixels",
     [] {
       void* const block = HB_AllocatePtr(100, "some pixels", 0x250012);
       HB_FreePtr(block);
       return block != nullptr;
     }},
    {"QuietBlock", 1, nullptr,
     [] {
       void* const block = HB_AllocatePtrQuiet(0);
       HB_FreePtr(block);
       return block != nullptr;
     }},
    {"ClearHandle", 2, "some mask",
     [] {
       const HB_Handle handle = HB_AllocateHandleClear(50, "some mask", 0x250012);
       HB_FreeHandle(handle);
       return handle != nullptr;
     }},
    {"QuietHandle", 2, nullptr,
     [] {
       const HB_Handle handle = HB_AllocateHandleQuiet(50);
       HB_FreeHandle(handle);
       return handle != nullptr;
     }},
    {"TrackedObject", 1, nullptr,
     [] {
       const Tracked* const object = new Tracked;
       delete object;
       return object != nullptr;
     }},
    {"Frame", 1, nullptr,
     [] {
       void* const frame = RS_AllocateFrameQuiet(70000);
       RS_FreeFrame(frame, 70000);
       return frame != nullptr;
     }},
    {"RasterWorld", 3, "17 x 5 pixels, 64 bits",
     [] {
       const GX_Rect bounds{2, 3, 7, 20};
       RS_World** raster = reinterpret_cast<RS_World**>(1);
       const i32 error = RS_NewWorld(&bounds, 8, 64, &raster);
       EXPECT_EQ(raster == nullptr, error != 0);
       EXPECT_TRUE(error == 0 || error == ZR_Err_OutOfMemory);
       RS_DisposeWorld(raster);
       return error == 0;
     }},
    {"ListAndInsert", 3, "list of records",
     [] {
       SEQ_List* list = nullptr;
       const u32 record[2] = {1, 2};
       i32 error = SEQ_New(2, sizeof record, 1, 1, &list);
       for (i32 i = 0; error == 0 && i < 2; ++i) error = SEQ_Insert(list, -1, record);
       EXPECT_TRUE(error == 0 || error == ZR_Err_OutOfMemory);
       SEQ_Dispose(list);
       return error == 0;
     }},
    {"ByteTables", 1, "multiply and divide",
     [] {
       const u8 *multiply = nullptr, *divide = nullptr;
       const i32 error = GX_PrepareFCMD(1, 0, 0, &multiply, &divide);
       EXPECT_TRUE(error == 0 || error == ZR_Err_OutOfMemory);
       if (error == 0) GX_UnprepareFCMD();
       return error == 0;
     }},
    {"TrigTable", 1, "trigonometry",
     [] {
       const i32 error = GX_PrepareFTrig(1, 0, 0, nullptr);
       if (error == 0) GX_UnprepareFTrig();
       return error == 0;
     }},
    {"ExtensionMap", 1, "file extension map",
     [] {
       const i32 error = DSK_AddExtensionMap(".xyz", 5, -1);
       EXPECT_TRUE(error == 0 || error == ZR_Err_OutOfMemory);
       DSK_ClearExtensionMap();
       return error == 0;
     }},
    {"Suite", 1, "list of suites",
     [] {
       static void* const table[1] = {};
       const i32 error = ADDIN_AddTWSuite(0, 0, "a suite", 1, 1, 1, table);
       EXPECT_TRUE(error == 0 || error == ZR_Err_OutOfMemory);
       ADDIN_ClearTWSuites();
       return error == 0;
     }},
};

class Memory : public testing::TestWithParam<Operation> {};

TEST_P(Memory, LeavesNothingBehindWhicheverAttemptFails) {
  CaughtMessages caught;
  const HB_MemoryStats before = stats();
  u64 n = 1;
  for (;; ++n) {
    ASSERT_LE(n, 10u) << "never succeeds";
    HB_FailNthAllocation(n);
    const bool succeeded = GetParam().succeeds();
    HB_FailNthAllocation(0);
    EXPECT_EQ(stats().live_blocks, before.live_blocks) << "attempt " << n;
    EXPECT_EQ(stats().live_bytes, before.live_bytes) << "attempt " << n;
    if (succeeded) break;
    const bool loud = GetParam().message != nullptr;
    ASSERT_EQ(caught.messages().size(), loud ? 1u : 0u);
    if (loud) {
      EXPECT_THAT(caught.take_message(), testing::HasSubstr(GetParam().message));
    }
  }
  EXPECT_EQ(n - 1, GetParam().attempts);
  EXPECT_TRUE(caught.quiet());
}
INSTANTIATE_TEST_SUITE_P(Each, Memory, testing::ValuesIn(operations),
                         [](const auto& one) { return std::string(one.param.name); });

TEST(Memory, AFailedResizeKeepsTheHandleAsItWas) {
  CaughtMessages caught;
  const HB_MemoryStats before = stats();
  const HB_Handle handle = HB_AllocateHandleClear(40, "x", 0);
  ASSERT_NE(handle, nullptr);
  for (i32 i = 0; i < 40; ++i) ASSERT_EQ(static_cast<u8*>(*handle)[i], 0);
  std::memset(*handle, 0x77, 40);
  for (const std::size_t bytes : {std::size_t{20}, std::size_t{90}, std::numeric_limits<std::size_t>::max()}) {
    HB_FailNthAllocation(1);
    EXPECT_EQ(HB_ResizeHandle(handle, bytes, "effect handle data", 0x250038), ZR_Err_OutOfMemory);
    ASSERT_EQ(caught.messages().size(), 1u);
    EXPECT_EQ(caught.messages()[0].code, 0x250038u);
    EXPECT_THAT(caught.take_message(), testing::HasSubstr("effect handle data"));
    EXPECT_EQ(HB_GetHandleSize(handle), 40u);
    EXPECT_EQ(static_cast<u8*>(*handle)[39], 0x77);
  }
  EXPECT_EQ(HB_ResizeHandle(handle, 3000, "x", 0), 0);
  for (i32 i = 0; i < 40; ++i) ASSERT_EQ(static_cast<u8*>(*handle)[i], 0x77);
  EXPECT_EQ(HB_ResizeHandle(handle, 5, "x", 0), 0);
  EXPECT_EQ(HB_GetHandleSize(handle), 5u);
  EXPECT_EQ(static_cast<u8*>(*handle)[4], 0x77);
  EXPECT_EQ(stats().live_blocks, before.live_blocks + 2);
  HB_FreeHandle(handle);
  EXPECT_EQ(stats().live_bytes, before.live_bytes);
}

TEST(Memory, HugeSizesFailLikeAnyOther) {
  CaughtMessages caught;
  const HB_MemoryStats before = stats();
  constexpr std::size_t most = std::numeric_limits<std::size_t>::max();
  for (const std::size_t bytes : {most, most - 15, most / 2, std::size_t{1} << 60}) {
    EXPECT_EQ(HB_AllocatePtr(bytes, "huge", 0), nullptr);
    EXPECT_EQ(HB_AllocateHandleQuiet(bytes), nullptr);
    EXPECT_EQ(RS_AllocateFrameQuiet(bytes), nullptr);
  }
  EXPECT_EQ(caught.messages().size(), 4u);
  EXPECT_EQ(stats().live_blocks, before.live_blocks);
}

TEST(Memory, CountsBlocksBytesAndThePeak) {
  const HB_MemoryStats before = stats();
  const u64 top = before.peak_bytes + (u64{1} << 20);
  void* const block = HB_AllocatePtrQuiet(top);
  EXPECT_TRUE(aligned(block, 16));
  EXPECT_EQ(stats().live_blocks, before.live_blocks + 1);
  EXPECT_EQ(stats().live_bytes, before.live_bytes + top);
  EXPECT_EQ(stats().allocations, before.allocations + 1);
  HB_FreePtr(block);
  EXPECT_EQ(stats().peak_bytes, before.live_bytes + top);
  EXPECT_EQ(stats().live_bytes, before.live_bytes);
}

TEST(Memory, ExactlyOneAttemptFailsAmongManyThreads) {
  const HB_MemoryStats before = stats();
  for (const u64 n : {u64{1}, u64{777}, u64{4000}, u64{4001}}) {
    std::atomic<i32> failures{0};
    HB_FailNthAllocation(n);
    std::vector<std::thread> threads;
    for (i32 t = 0; t < 4; ++t)
      threads.emplace_back([&failures, t] {
        for (std::size_t i = 0; i < 1000; ++i) {
          const bool frame = (i + static_cast<std::size_t>(t)) % 2 == 0;
          void* const block = frame ? RS_AllocateFrameQuiet(64 * (i % 7)) : HB_AllocatePtrQuiet(i);
          if (block == nullptr) ++failures;
          frame ? RS_FreeFrame(block, 64 * (i % 7)) : HB_FreePtr(block);
        }
      });
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(failures, n <= 4000 ? 1 : 0) << "attempt " << n;
    HB_FailNthAllocation(0);
  }
  EXPECT_EQ(stats().live_blocks, before.live_blocks);
  EXPECT_EQ(stats().live_bytes, before.live_bytes);
  EXPECT_EQ(stats().allocations, before.allocations + 16000);
}

}  // namespace
