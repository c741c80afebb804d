// Premultiplying and unmultiplying against black and matte colours.
#include "composite/premultiply.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <limits>
#include <type_traits>
#include <utility>

#include "support/born_library.h"
#include "support/worlds.h"

namespace {

constexpr i64 floor_divide(i64 n, i64 d) { return n >= 0 ? n / d : -((d - 1 - n) / d); }

// One channel against a matte, in exact integers. The signed 8-bit product is rounded by the fold, which
// for some negative products is one above the nearest; the 16-bit one is floored.
template <class T>
zr::Channel<T> matted(bool forward, zr::Channel<T> c, zr::Channel<T> a, zr::Channel<T> m) {
  constexpr auto white = zr::Depth<T>::white;
  if (a == white || (!forward && a == 0)) return c;
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    return forward ? m + (c - m) * a : (c - m * (1.0f - a)) / a;
  } else {
    constexpr bool narrow = sizeof(T) == 4;
    const i64 t = (static_cast<i64>(c) - m) * a, k = static_cast<i64>(white - a) * m;
    const i64 product = narrow ? floor_divide(t + floor_divide(t + 128, 256) + 128, 256) : floor_divide(t, 32768);
    if (forward) return static_cast<zr::Channel<T>>(m + product);
    const i64 left = std::max<i64>(c - (narrow ? (2 * k + 255) / 510 : (k + 16383) / 32768), 0);
    return static_cast<zr::Channel<T>>(left >= a ? white : (left * white + a / 2) / a);
  }
}

template <class T>
T matted(bool forward, const T& p, const T& m) {
  return {p.alpha, matted<T>(forward, p.red, p.alpha, m.red), matted<T>(forward, p.green, p.alpha, m.green),
          matted<T>(forward, p.blue, p.alpha, m.blue)};
}

template <class T>
class Premultiply : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(Premultiply, Depths);

TEST(PremultiplyColour, EveryByteAndAlpha) {
  ASSERT_EQ(ZR_Birth(), 0);
  TestWorld<ZR_Pixel8> src(256, 256), dst(256, 256), expected(256, 256);
  for (i32 y = 0; y < 256; ++y)
    for (i32 x = 0; x < 256; ++x) {
      const u8 c = static_cast<u8>(x);
      src.at(x, y) = {static_cast<u8>(y), c, c, c};
    }
  for (const ZR_Pixel8& matte : {ZR_Pixel8{0, 1, 2, 77}, {255, 127, 128, 200}, {9, 253, 254, 255}, {0, 0, 0, 1}})
    for (i32 forward : {1, 0}) {
      for (i32 y = 0; y < 256; ++y)
        for (i32 x = 0; x < 256; ++x) expected.at(x, y) = matted(forward != 0, src.at(x, y), matte);
      EXPECT_EQ(ZR_PremulColor(nullptr, src, &matte, forward, dst), 0);
      EXPECT_TRUE(dst == expected) << static_cast<i32>(matte.red) << " forward " << forward;
    }
  EXPECT_EQ(ZR_Death(), 0);
}

TYPED_TEST(Premultiply, MattesOfEachColourDepth) {
  using T = TypeParam;
  constexpr i32 size = 90;
  const ZR_Pixel8 narrow = {1, 51, 128, 255};
  const ZR_Pixel16 deep = {1, 3000, 16384, 32768};
  const ZR_PixelFloat real = {0.1f, 0.25f, 0.7f, 1.5f};
  const GX_LRect rect = {-3, 20, 50, std::numeric_limits<i32>::max()};
  for (i32 forward : {1, 0, -8}) {
    TestWorld<T> src(size, size, 1);
    src.randomise(static_cast<u32>(forward + 100));
    const auto check = [&](const T& matte, bool part, auto&& call) {
      for (const bool in_place : {false, true}) {
        TestWorld<T> dst(size, size);
        TestWorld<T> from = src;
        TestWorld<T>& to = in_place ? from : dst;
        TestWorld<T> expected = to;
        for (i32 y = part ? rect.top : 0; y < size; ++y)
          for (i32 x = 0; x < (part ? rect.right : size); ++x)
            expected.at(x, y) = matted(forward != 0, src.at(x, y), matte);
        EXPECT_EQ(call(from, to), 0);
        EXPECT_TRUE(to == expected && to.guards_intact()) << "forward " << forward << " in place " << in_place;
      }
    };
    const T m8 = zr::convert_colour<T>(narrow), m16 = zr::convert_colour<T>(deep), mf = zr::convert_colour<T>(real);
    check(m8, false, [&](auto& s, auto& d) { return ZR_PremulColor(nullptr, s, &narrow, forward, d); });
    check(m16, false, [&](auto& s, auto& d) { return ZR_PremulColor16(nullptr, s, &deep, forward, d); });
    check(mf, false, [&](auto& s, auto& d) { return ZR_PremulColorFloat(nullptr, s, &real, forward, d); });
    check(m8, true, [&](auto& s, auto& d) { return ZR_PremulColorRect(nullptr, s, &narrow, forward, &rect, d); });
    check(m16, true, [&](auto& s, auto& d) { return zr::premul_color_rect16(nullptr, s, &deep, forward, &rect, d); });
    check(mf, true, [&](auto& s, auto& d) { return ZR_PremulColorRectFloat(nullptr, s, &real, forward, &rect, d); });
  }
}

TYPED_TEST(Premultiply, AgainstBlack) {
  using T = TypeParam;
  using C = zr::Channel<T>;
  constexpr i32 size = 60;
  const ZR_Pixel8 black = {255, 0, 0, 0};
  TestWorld<T> src(size, size);
  src.randomise(4);
  for (i32 forward : {1, 0}) {
    TestWorld<T> whole = src, colour = src, elsewhere(size, size), expected = src, expected_elsewhere = src;
    for (i32 y = 0; y < size; ++y)
      for (i32 x = 0; x < size; ++x) {
        const T& p = src.at(x, y);
        const auto plain = [&](C c) {
          return forward != 0 ? zr::premultiply<T>(c, p.alpha) : zr::unmultiply<T>(c, p.alpha);
        };
        expected.at(x, y) = {p.alpha, plain(p.red), plain(p.green), plain(p.blue)};
        // Into another world the 16-bit product is not rounded; unmultiplying is the same everywhere.
        expected_elsewhere.at(x, y) = forward != 0 ? matted<T>(true, p, T{}) : expected.at(x, y);
      }
    EXPECT_EQ(ZR_Premul(nullptr, forward, whole), 0);
    EXPECT_EQ(ZR_PremulColor(nullptr, colour, &black, forward, colour), 0);
    EXPECT_EQ(ZR_PremulColor(nullptr, src, &black, forward, elsewhere), 0);
    EXPECT_TRUE(whole == expected && colour == expected) << forward;
    EXPECT_TRUE(elsewhere == expected_elsewhere) << forward;
    for (const GX_LRect& rect : {GX_LRect{2, 3, 9, 9},
                                 {std::numeric_limits<i32>::min(), 50, 2, std::numeric_limits<i32>::max()},
                                 {5, 5, 5, 9},
                                 {60, 0, 70, 9},
                                 {8, 8, 2, 2}}) {
      TestWorld<T> part = src, part_expected = src;
      for (i32 y = std::max(rect.top, 0); y < std::min(rect.bottom, size); ++y)
        for (i32 x = std::max(rect.left, 0); x < std::min(rect.right, size); ++x)
          part_expected.at(x, y) = expected.at(x, y);
      EXPECT_EQ(ZR_PremulRect(nullptr, forward, &rect, part), 0);
      EXPECT_TRUE(part == part_expected) << rect.left << ',' << rect.top;
    }
  }
}

struct Asked {
  i32 count = 0, answer = 0;
  ZR_ProgressInfo info() {
    return {this,
            [](void* self) -> i32 {
              auto& asked = *static_cast<Asked*>(self);
              ++asked.count;
              return asked.answer;
            },
            [](void*, i32, i32) -> i32 {
              ADD_FAILURE() << "only abort is asked";
              return 1;
            }};
  }
};

i32 backwards(i32 iterations, void* refcon, ZR_GenericFunc fn) {
  i32 result = 0;
  for (i32 i = iterations - 1; i >= 0 && result == 0; --i) result = fn(refcon, 0, i, iterations);
  return result;
}

TYPED_TEST(Premultiply, RowsInAnyOrderAndOneAbort) {
  using T = TypeParam;
  TestWorld<T> src(200, 500);
  src.randomise(12);
  const ZR_PixelFloat matte = {1, 0.5f, 0.25f, 1};
  for (const bool reversed : {false, true}) {
    SlotOverride order(ZR_Slot_iterate_generic, reversed ? reinterpret_cast<void*>(&backwards)
                                                         : reinterpret_cast<void*>(&ZR_IterateGeneric_Static));
    for (i32 answer : {0, 66}) {
      TestWorld<T> plain = src, plain_expected = src, coloured(200, 500), coloured_expected(200, 500);
      if (answer == 0 || reversed)
        for (i32 y = 0; y < 500; ++y)
          for (i32 x = 0; x < 200; ++x) {
            const T& p = src.at(x, y);
            plain_expected.at(x, y) = {p.alpha, zr::premultiply<T>(p.red, p.alpha),
                                       zr::premultiply<T>(p.green, p.alpha), zr::premultiply<T>(p.blue, p.alpha)};
            coloured_expected.at(x, y) = matted(true, p, zr::convert_colour<T>(matte));
          }
      Asked asked{0, answer};
      const ZR_ProgressInfo info = asked.info();
      EXPECT_EQ(ZR_PremulRect_S(&info, 1, nullptr, plain), answer);
      EXPECT_EQ(ZR_PremulColorFloat(&info, src, &matte, 1, coloured), answer);
      EXPECT_EQ(asked.count, 2);
      if (answer != 0 && reversed) {  // all but the band of row 0 was done before
        EXPECT_EQ(std::memcmp(&plain.at(0, 0), &src.at(0, 0), sizeof(T) * 200), 0);
        EXPECT_EQ(std::memcmp(&plain.at(0, 499), &plain_expected.at(0, 499), sizeof(T) * 200), 0);
      } else {
        EXPECT_TRUE(plain == plain_expected && coloured == coloured_expected) << reversed << answer;
      }
    }
  }
}

TYPED_TEST(Premultiply, Refusals) {
  using T = TypeParam;
  using Other = std::conditional_t<std::is_same_v<T, ZR_Pixel8>, ZR_Pixel16, ZR_Pixel8>;
  TestWorld<T> world(3, 3);
  TestWorld<Other> other(3, 3);
  ZR_LayerDef bare = *world.layer();
  bare.data = nullptr;
  const ZR_Pixel8 grey = {255, 99, 99, 99};
  EXPECT_EQ(ZR_PremulColor(nullptr, other, &grey, 1, world), 3);
  EXPECT_FALSE(this->caught.take_verification().empty());
  const char text[] = "bad parameter passed to effect callback";
  EXPECT_EQ(ZR_Premul(nullptr, 1, &bare), 3);
  EXPECT_EQ(this->caught.take_message(), text);
  for (const auto& [src, colour, dst] : {std::tuple<ZR_LayerDef*, const ZR_Pixel8*, ZR_LayerDef*>{&bare, &grey, world},
                                         {world, &grey, &bare},
                                         {world, nullptr, world},
                                         {nullptr, &grey, world},
                                         {world, &grey, nullptr}}) {
    EXPECT_EQ(ZR_PremulColor(nullptr, src, colour, 1, dst), 3);
    EXPECT_EQ(this->caught.take_message(), text);
  }
}

}  // namespace
