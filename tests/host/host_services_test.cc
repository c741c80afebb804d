// Handles, the platform query and batch sampling, as plug-ins reach them through the block.
#include <ZR/callback_block.h>

#include <SHM/shm.h>

#include <cstring>

#include "support/born_library.h"

namespace {

class HostServices : public BornLibrary {
 protected:
  void SetUp() override {
    BornLibrary::SetUp();
    ASSERT_EQ(ZR_GetCallbackBlock(1, 1, block), 0);
  }
  template <class Function>
  Function entry(int number) const {
    return reinterpret_cast<Function>(block[number]);
  }
  void* block[69];
};

class Handles : public HostServices {
 protected:
  void** make(i32 size) { return entry<ZR_HandleNewFunc>(20)(size); }
  void* lock(void** handle) { return entry<ZR_HandleLockFunc>(21)(handle); }
  void unlock(void** handle) { entry<ZR_HandleUnlockFunc>(22)(handle); }
  void dispose(void** handle) { entry<ZR_HandleDisposeFunc>(23)(handle); }
  u64 size(void** handle) { return entry<ZR_HandleSizeFunc>(55)(handle); }
  i32 resize(void** handle, i32 bytes) { return entry<ZR_HandleResizeFunc>(58)(handle, bytes); }
};

TEST_F(Handles, KeepTheirContentsWhenTheyAreResized) {
  void** const handle = make(3);
  ASSERT_NE(handle, nullptr);
  EXPECT_EQ(size(handle), 3u);
  EXPECT_EQ(lock(handle), *handle);
  std::memcpy(lock(handle), "abc", 3);
  for (const i32 bytes : {100000, 2, 64}) {
    ASSERT_EQ(resize(handle, bytes), 0);
    EXPECT_EQ(size(handle), static_cast<u64>(bytes));
    EXPECT_EQ(std::memcmp(lock(handle), "ab", 2), 0) << bytes;
  }
  unlock(handle);
  EXPECT_EQ(std::memcmp(lock(handle), "ab", 2), 0) << "unlocking has no effect";
  dispose(handle);
  EXPECT_TRUE(caught.quiet());
}

TEST_F(Handles, TakeNullForNothing) {
  EXPECT_EQ(lock(nullptr), nullptr);
  EXPECT_EQ(size(nullptr), 0u);
  unlock(nullptr);
  dispose(nullptr);
  EXPECT_TRUE(caught.quiet());
  EXPECT_EQ(resize(nullptr, 8), 3);
}

TEST_F(Handles, FailWithoutAMessageAndKeepWhatTheyHad) {
  for (u64 n = 1; n <= 2; ++n) {
    HB_FailNthAllocation(n);
    void** const handle = make(16);
    HB_FailNthAllocation(0);
    if (handle != nullptr) {
      EXPECT_EQ(n, 2u) << "the first allocation has to count";
      dispose(handle);
    }
  }
  EXPECT_EQ(make(-1), nullptr);
  EXPECT_TRUE(caught.quiet());

  void** const handle = make(4);
  std::memcpy(lock(handle), "wxyz", 4);
  HB_FailNthAllocation(1);
  EXPECT_EQ(resize(handle, 1 << 20), 4);
  HB_FailNthAllocation(0);
  EXPECT_EQ(size(handle), 4u);
  EXPECT_EQ(std::memcmp(lock(handle), "wxyz", 4), 0);
  EXPECT_TRUE(caught.quiet()) << "errors of a resize are quiet";
  EXPECT_EQ(resize(handle, -1), 3);
  dispose(handle);
}

TEST_F(HostServices, PlatformQueryAnswersAndStillRefuses) {
  int window = 0;
  SHM_SetMainWindow(&window);
  const auto query = entry<ZR_PlatformQueryFunc>(54);
  for (const i32 kind : {0, 1, -1, 7}) {
    void* found = this;
    EXPECT_EQ(query(nullptr, kind, &found), 516);
    EXPECT_EQ(found, kind == 0 ? static_cast<void*>(&window) : this) << kind;
    ASSERT_EQ(caught.messages().size(), 1u);
    EXPECT_EQ(caught.messages()[0].code, 0x250038u);
    EXPECT_EQ(caught.take_message(), "bad parameter passed to effect callback");
  }
  EXPECT_EQ(query(nullptr, 0, nullptr), 516);
  SHM_SetMainWindow(nullptr);
}

TEST_F(HostServices, BatchSamplingSaysThatItHasEnded) {
  void* selected = nullptr;
  ASSERT_EQ(ZR_GetCallbackAddr(nullptr, 0, 0, 4, &selected), 0);
  for (void* const routine : {block[3], selected}) {
    EXPECT_EQ(reinterpret_cast<i32 (*)()>(routine)(), 3);
    ASSERT_EQ(caught.verifications().size(), 1u);
    EXPECT_EQ(caught.verifications()[0].code, 0x25002eu);
    EXPECT_EQ(caught.take_verification(),
              "Batch Sampling has been deprecated; please update your plug-in calling code");
  }
}

}  // namespace
