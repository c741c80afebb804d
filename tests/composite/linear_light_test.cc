// Linear light: how rows without tables or memory fail.
#include "composite/linear_light.h"

#include <ZR/composite.h>

#include <cstdlib>
#include <new>

#include "support/born_library.h"
#include "support/gamma_tables.h"

namespace {

// Of the plain operator new on this thread: the n-th from now on fails; 0 for none.
thread_local int failing_new = 0;
thread_local int live_news = 0;

}  // namespace

// Not inlined: the compiler would take a new that ends in free for a mistake.
[[gnu::noinline]] void* operator new(std::size_t bytes) {
  if (failing_new > 0 && --failing_new == 0) throw std::bad_alloc();
  void* const block = std::malloc(bytes != 0 ? bytes : 1);
  if (block == nullptr) throw std::bad_alloc();
  ++live_news;
  return block;
}
[[gnu::noinline]] void operator delete(void* block) noexcept {
  if (block != nullptr) --live_news;
  std::free(block);
}
void operator delete(void* block, std::size_t) noexcept { operator delete(block); }
// Sanitizers bring array forms that do not come by the plain ones.
void* operator new[](std::size_t bytes) { return operator new(bytes); }
void operator delete[](void* block) noexcept { operator delete(block); }
void operator delete[](void* block, std::size_t) noexcept { operator delete(block); }

namespace {

template <class T>
class LinearAt : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(LinearAt, Depths);

TYPED_TEST(LinearAt, ARowWithoutTablesIsAFailedVerification) {
  using T = TypeParam;
  for (const i32 mode : {-3, -2, 0, 2, 5, 40}) {
    ZR_InnerBlendingFunc<T> row = nullptr;
    ASSERT_EQ((ZR_GetInnerBlendingFunc<T, false, true>(mode, &row)), 0);
    ZR_BlendingMode<T> record{};
    T pixel{1, 1, 1, 1};
    EXPECT_EQ(row(1, &record, nullptr, &pixel, nullptr, &pixel), ZR_Err_Internal);
    EXPECT_EQ(this->caught.take_verification(), "Invalid tables for linearized blending");
  }
}

// Lots are drawn along a row, so that its copies are whole ones: each in turn finds no memory: the row stays, nothing
// leaks, and the next call works.
TYPED_TEST(LinearAt, NoMemoryForTheCopies) {
  using T = TypeParam;
  const ZR_LinearBlendingTables gamma = gamma_tables(2.2);
  ZR_InnerBlendingFunc<T> row = nullptr;
  ASSERT_EQ((ZR_GetInnerBlendingFunc<T, true, true>(XferDissolve, &row)), 0);
  constexpr auto white = static_cast<zr::Channel<T>>(zr::Depth<T>::white);
  ZR_BlendingMode<T> record{};
  record.mode = XferDissolve;
  record.opacity = white;
  const T source[2] = {{white, white, white, white}, {white, white, white, white}};
  for (int nth = 1;; ++nth) {
    T d[2] = {};
    const int live = live_news;
    failing_new = nth;
    const i32 error = row(2, &record, &gamma, source, source, d);
    const bool all_found = failing_new > 0;
    failing_new = 0;
    if (all_found) {
      EXPECT_EQ(live_news, live);
      EXPECT_EQ(error, 0);
      EXPECT_EQ(d[1].red, white);
      EXPECT_EQ(nth, 1 + (std::is_same_v<T, ZR_Pixel8> ? 3 : 2)) << "8-bit masks are copied too";
      break;
    }
    EXPECT_EQ(error, ZR_Err_OutOfMemory) << nth;
    EXPECT_EQ(d[0].alpha, 0);
    this->caught.clear();  // what was caught of the message is memory too
    EXPECT_LE(live_news, live + 4) << nth;
  }
}

}  // namespace
