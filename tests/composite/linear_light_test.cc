// Linear light: the conversions, the wrapper around a row, and its failures.
#include "composite/linear_light.h"

#include <ZR/composite.h>

#include <cstdlib>
#include <limits>
#include <new>

#include "support/born_library.h"
#include "support/gamma_tables.h"

namespace {

// Of the plain operator new on this thread: the n-th from now on fails; 0 for none.
thread_local int failing_new = 0;
thread_local int live_news = 0;

}  // namespace

void* operator new(std::size_t bytes) {
  if (failing_new > 0 && --failing_new == 0) throw std::bad_alloc();
  void* const block = std::malloc(bytes != 0 ? bytes : 1);
  if (block == nullptr) throw std::bad_alloc();
  ++live_news;
  return block;
}
void operator delete(void* block) noexcept {
  if (block != nullptr) --live_news;
  std::free(block);
}
void operator delete(void* block, std::size_t) noexcept { operator delete(block); }
// Sanitizers bring array forms that do not come by the plain ones.
void* operator new[](std::size_t bytes) { return operator new(bytes); }
void operator delete[](void* block) noexcept { operator delete(block); }
void operator delete[](void* block, std::size_t) noexcept { operator delete(block); }

namespace {

using Linear = BornLibrary;
template <class T>
class LinearAt : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(LinearAt, Depths);

TEST_F(Linear, ChannelsBetweenEntries) {
  ZR_LinearBlendingTables t = gamma_tables(1);
  t.to_linear[10] = 1000, t.to_linear[11] = 2001, t.to_linear[12] = 1500;
  t.from_linear[10] = 100, t.from_linear[11] = 107, t.from_linear[12] = 95;
  struct Case {
    u16 in, out;
  };
  // 1286 * 255 is 250 / 32768 past entry 10, 1414 * 255 122 / 32768 past entry 11: one up, one down by rounding.
  for (const Case& c : {Case{1286, 1008}, {1349, 1498}, {1414, 1999}, {1415, 1995}})
    EXPECT_EQ(zr::to_linear_16(c.in, t), c.out) << c.in;
  for (const Case& c : {Case{80, 100}, {81, 101}, {84, 104}, {87, 106}, {88, 107}, {89, 106}, {95, 97}, {96, 95}})
    EXPECT_EQ(zr::from_linear_16(c.in, t), c.out) << c.in;
  EXPECT_EQ(zr::to_linear_16(32768, t), t.to_linear[255]);
  EXPECT_EQ(zr::from_linear_16(32768, t), t.from_linear[4096]);
  for (const u16 illegal : {u16{32769}, u16{40000}, u16{65535}}) {
    EXPECT_EQ(zr::to_linear_16(illegal, t), t.to_linear[255]);
    EXPECT_EQ(zr::from_linear_16(illegal, t), t.from_linear[4096]);
  }
}

// An identity profile changes no byte and keeps 16-bit channels within one; gamma loses little.
TEST_F(Linear, ThereAndBack) {
  ZR_LinearBlendingTables one = gamma_tables(1);
  const ZR_LinearBlendingTables gamma = gamma_tables(2.2);
  for (int v = 0; v < 256; ++v) {
    const u8 c = static_cast<u8>(v);
    EXPECT_EQ(zr::from_linear<ZR_Pixel8>(zr::to_linear(ZR_Pixel8{c, c, c, c}, one), one).red, c);
    const ZR_Pixel8 back = zr::from_linear<ZR_Pixel8>(zr::to_linear(ZR_Pixel8{c, c, c, c}, gamma), gamma);
    EXPECT_EQ(back.alpha, c);
    EXPECT_TRUE(back.green == c || v < 16) << v << ": eight linear steps are coarse in the dark only";
  }
  for (int v = 0; v <= 32768; ++v) {
    const u16 c = static_cast<u16>(v);
    EXPECT_NEAR((zr::from_linear<ZR_Pixel16>(zr::to_linear(ZR_Pixel16{0, c, c, c}, one), one).red), v, 1);
  }
}

TEST_F(Linear, FloatKeepsTheSign) {
  ZR_LinearBlendingTables t = gamma_tables(2);
  const ZR_PixelFloat in = zr::to_linear(ZR_PixelFloat{0.5f, 3, -3, -0.0f}, t);
  EXPECT_EQ(in.alpha, 0.5f);
  EXPECT_EQ(in.red, 9);
  EXPECT_EQ(in.green, -9);
  EXPECT_EQ(in.blue, 0);
  const ZR_PixelFloat out = zr::from_linear<ZR_PixelFloat>(in, t);
  EXPECT_EQ(out.red, 3);
  EXPECT_EQ(out.green, -3);
}

// Half of white over black, opaque: 186 and not 128.
TEST_F(Linear, HalfAMixIsBrighterThanItsCodes) {
  const ZR_LinearBlendingTables gamma = gamma_tables(2.2);
  ZR_Pixel8 d{255, 0, 0, 0};
  ZR_Get_Xfer1_table8(XferInFront)({128, 255, 255, 255}, &gamma, &d);
  EXPECT_EQ(d.red, 186);
  EXPECT_EQ(d.alpha, 255);
}

// What a mode leaves alone still pays the way there and back, except under alpha 0.
TEST_F(Linear, DissolveAndBehindMakeTheRoundTrip) {
  ZR_LinearBlendingTables dark = gamma_tables(2.2);
  std::fill(std::begin(dark.to_linear), std::end(dark.to_linear), u16{0});
  for (const i32 mode : {XferDissolve, XferBehind}) {
    ZR_Pixel8 d{255, 200, 100, 50};
    ZR_Get_Xfer1_table8(mode)({0, 9, 9, 9}, &dark, &d);
    EXPECT_EQ(d.red, 200) << mode;
    ZR_Get_Xfer1_table8(mode)({255, 9, 9, 9}, &dark, &d);
    EXPECT_EQ(d.red, 0) << mode;
    EXPECT_EQ(d.alpha, 255) << mode;
  }
}

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
