// Blurs against their plain model, bit for bit: depths, directions, alpha, flags, origins, ends, instruction sets.
#include <ZR/blur.h>
#include <ZR/hostkit.h>

#include <limits>
#include <string>

#include "filter/blur_model.h"
#include "support/born_library.h"
#include "support/edge_rows.h"
#include "support/thrown.h"

namespace {

// The thrown code, or 0.
template <class T>
i32 blur(const ZR_ProgressInfo* progress, ZR_World& src, const BlurCase& c, ZR_WorldX<T>& dst) {
  return thrown_by([&] {
    if (c.iterations == 0)
      ZR_GaussianBlur1D(progress, &src, c.radius, c.flags, c.src_vertical, c.src_premultiplied, c.dst_vertical,
                        c.dst_premultiplied, c.copy, &dst);
    else
      ZR_BoxBlur1D(progress, &src, c.radius, c.iterations, c.flags, c.src_vertical, c.src_premultiplied, c.dst_vertical,
                   c.dst_premultiplied, c.copy, &dst);
  });
}

std::string told(const BlurCase& c) {
  return "radius " + std::to_string(c.radius) + " iterations " + std::to_string(c.iterations) + " flags " +
         std::to_string(c.flags) + (c.src_vertical ? " columns" : " rows") + (c.src_premultiplied ? "" : " straight") +
         (c.dst_vertical ? " to columns" : " to rows") + (c.dst_premultiplied ? "" : " straight") +
         (c.copy ? " copied" : "");
}

template <class T>
class Blurs : public BornLibrary {
 protected:
  struct Place {
    i32 width, height;
    GX_LPoint origin;
  };
  // Runs the case and its model on fresh worlds, on the instruction set in force.
  void check(const Place& from, const BlurCase& c, const Place& to, u32 seed) {
    TestWorld<T> src(from.width, from.height), made(to.width, to.height), expected(to.width, to.height);
    src.randomise(seed);
    made.randomise(seed + 1);
    expected.randomise(seed + 1);
    ZR_WorldX<T> a(src.layer(), false), b(made.layer(), false);
    a.origin = from.origin;
    b.origin = to.origin;
    ASSERT_EQ(blur(nullptr, a, c, b), 0) << told(c);
    model_blur(src, from.origin, c, to.origin, expected);
    ASSERT_TRUE(made == expected) << told(c) << first_difference(made, expected);
    ASSERT_TRUE(made.guards_intact()) << told(c);
  }
  static std::string first_difference(TestWorld<T>& made, TestWorld<T>& expected) {
    for (i32 y = 0; y < made.height(); ++y)
      for (i32 x = 0; x < made.width(); ++x)
        for (int k = 0; k < 4; ++k) {
          const auto m = channel_of(made.at(x, y), k), e = channel_of(expected.at(x, y), k);
          if (std::memcmp(&m, &e, sizeof m) != 0)
            return ": channel " + std::to_string(k) + " at " + std::to_string(x) + ", " + std::to_string(y) + " is " +
                   std::to_string(m) + ", not " + std::to_string(e);
        }
    return "";
  }
};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(Blurs, Depths);

TYPED_TEST(Blurs, EqualTheModelInEveryForm) {
  constexpr u32 flag_words[] = {15, 31, 1, 17, 14, 30, 5, 22, 0};
  constexpr f32 radii[] = {0, 0.5f, 2.3f, 7, 40};
  for (int level = 0; level < 4 && Instructions::has(level); ++level) {
    const Instructions instructions(level);
    u32 turn = 0;
    for (const f32 radius : radii)
      for (const u32 flags : flag_words)
        for (u32 form = 0; form < 16; ++form, ++turn) {
          const u32 iterations = turn % 4;
          const BlurCase c = {radius,          iterations,      flags,           (form & 1) != 0,
                              (form & 2) != 0, (form & 4) != 0, (form & 8) != 0, turn % 3 == 0};
          // Odd sizes: whole strips, strips with a rest, and a place off to each side.
          const i32 shift = static_cast<i32>(turn % 5) - 2;
          SCOPED_TRACE(Instructions::names[level]);
          this->check({23, 31, {shift, 1 - shift}}, c, {29, 22, {-shift, 2}}, turn);
          if (this->HasFatalFailure()) return;
        }
  }
}

// Long enough for whole strips side by side and for blocks along the line, with every tap inside.
TYPED_TEST(Blurs, EqualTheModelOnLargerWorlds) {
  for (int level = 0; level < 4 && Instructions::has(level); ++level) {
    const Instructions instructions(level);
    SCOPED_TRACE(Instructions::names[level]);
    u32 seed = 0;
    for (const u32 iterations : {0u, 1u, 3u})
      for (const u32 form : {0u, 1u, 2u, 3u})
        for (const f32 radius : {10.6f, 90.0f}) {
          const BlurCase c = {radius, iterations, 15, (form & 1) != 0, true, (form & 1) != 0, (form & 2) != 0, false};
          this->check({153, 141, {0, 0}}, c, {153, 141, {0, 0}}, ++seed);
          if (this->HasFatalFailure()) return;
        }
  }
}

// Means of 16 bits are found in other ways where sums pass 2^23 and 2^24: levels and radii on both sides, also ones
// that are reached in the middle of a line only.
using DeepBlurs = Blurs<ZR_Pixel16>;
TEST_F(DeepBlurs, LevelsNearTheEndOfExactSums) {
  struct Levels {
    u16 low, high;
  };
  const Levels ranges[] = {{0, 32768}, {41600, 41800}, {65400, 65535}, {0, 65535}};
  for (int level = 0; level < 4 && Instructions::has(level); ++level) {
    const Instructions instructions(level);
    for (const f32 radius : {63.0f, 64.0f, 100.0f, 127.0f, 128.0f, 130.0f, 200.5f})
      for (const Levels& range : ranges)
        for (const u32 form : {0u, 1u, 2u}) {
          const bool down = form == 1;
          TestWorld<ZR_Pixel16> src(down ? 11 : 700, down ? 700 : 11), made(src.width(), src.height()),
              expected(src.width(), src.height());
          std::mt19937 random(4);
          const auto channel = [&](u32 from) { return static_cast<u16>(from + random() % (range.high - from + 1u)); };
          for (i32 y = 0; y < src.height(); ++y)
            for (i32 x = 0; x < src.width(); ++x) {
              const u32 from = std::max(x, y) > 250 ? range.low : 0;
              src.at(x, y) = {channel(from), channel(from), range.high, channel(0)};
            }
          const BlurCase c = {radius, 1, form == 2 ? 31u : 15u, down, true, down, true, false};
          ZR_WorldX<ZR_Pixel16> a(src.layer(), false), b(made.layer(), false);
          ASSERT_EQ(blur(nullptr, a, c, b), 0);
          model_blur(src, {0, 0}, c, {0, 0}, expected);
          ASSERT_TRUE(made == expected) << Instructions::names[level] << " " << told(c) << " to " << range.high
                                        << first_difference(made, expected);
        }
  }
}

TYPED_TEST(Blurs, OneWorldMayBeBothWhenLinesAreCopied) {
  using T = TypeParam;
  for (const u32 iterations : {0u, 1u, 2u})
    for (const bool vertical : {false, true}) {
      const BlurCase c = {3.5f, iterations, 13, vertical, false, vertical, false, true};
      TestWorld<T> world(37, 26), expected(37, 26);
      world.randomise(9);
      model_blur(world, {0, 0}, c, {0, 0}, expected);
      ZR_WorldX<T> both(world.layer(), false);
      ASSERT_EQ(blur(nullptr, both, c, both), 0);
      EXPECT_TRUE(world == expected) << told(c);
    }
}

TYPED_TEST(Blurs, AbortIsAskedLineByLine) {
  using T = TypeParam;
  struct Host {
    i32 asked = 0, stop_at;
    static i32 abort(void* self) {
      auto& host = *static_cast<Host*>(self);
      return ++host.asked == host.stop_at ? 77 : 0;
    }
    static i32 progress(void*, i32, i32) { return 99; }  // never called
  };
  for (const bool vertical : {false, true})
    for (const i32 stop_at : {1, 5, 16, 17, 30, 1000}) {
      const BlurCase c = {2, 1, 15, vertical, true, vertical, true, false};
      TestWorld<T> src(30, 30), dst(30, 30), whole(30, 30);
      src.randomise(1);
      dst.fill(T{1, 1, 1, 1});
      const TestWorld<T> before = dst;
      model_blur(src, {0, 0}, c, {0, 0}, whole);
      ZR_WorldX<T> a(src.layer(), false), b(dst.layer(), false);
      Host host{0, stop_at};
      const ZR_ProgressInfo info = {&host, Host::abort, Host::progress};
      EXPECT_EQ(blur(&info, a, c, b), stop_at <= 30 ? 77 : 0);
      EXPECT_EQ(host.asked, std::min(stop_at, 30));
      for (i32 y = 0; y < 30; ++y)
        for (i32 x = 0; x < 30; ++x) {
          const bool done = (vertical ? x : y) < stop_at;
          ASSERT_TRUE(same_pixel(dst.at(x, y), done ? whole.at(x, y) : before.at(x, y)))
              << stop_at << " " << x << " " << y;
        }
    }
}

TYPED_TEST(Blurs, ThreadsAndShortMemoryChangeNothing) {
  using T = TypeParam;
  const BlurCase cases[] = {{4.25f, 3, 15, false, false, true, false, false},
                            {6, 0, 31, true, true, true, false, true}};
  for (const BlurCase& c : cases) {
    TestWorld<T> src(120, 90), dst(120, 90), expected(120, 90);
    src.randomise(3);
    model_blur(src, {0, 0}, c, {0, 0}, expected);
    ZR_WorldX<T> a(src.layer(), false), b(dst.layer(), false);
    const TestWorld<T> before = dst;
    i32 error = 4;
    for (u64 n = 1; error != 0; ++n) {  // each allocation fails once, until none is left
      ASSERT_LT(n, 20u);
      HB_FailNthAllocation(n);
      error = blur(nullptr, a, c, b);
      HB_FailNthAllocation(0);
      if (error == 0) break;
      EXPECT_EQ(error, 4);
      EXPECT_TRUE(dst == before) << "memory is found before the first line";
    }
    EXPECT_TRUE(dst == expected);
    dst.clear();
    HB_SetNumThreads(2);
    {
      // Thread indices in any order, from a walk that goes backwards.
      const SlotOverride walk(ZR_Slot_iterate_generic,
                              reinterpret_cast<void*>(+[](i32 n, void* refcon, ZR_GenericFunc fn) -> i32 {
                                for (i32 i = n - 1; i >= 0; --i)
                                  if (const i32 code = fn(refcon, i % 2, i, n); code != 0) return code;
                                return 0;
                              }));
      EXPECT_EQ(blur(nullptr, a, c, b), 0);
    }
    HB_SetNumThreads(0);
    EXPECT_TRUE(dst == expected);
  }
}

TYPED_TEST(Blurs, RefuseWhatDoesNotFit) {
  using T = TypeParam;
  constexpr f32 nan = std::numeric_limits<f32>::quiet_NaN(), inf = std::numeric_limits<f32>::infinity();
  constexpr bool bytes = sizeof(T) == 4;
  struct Refusal {
    f32 radius;
    u32 iterations;
    i32 error;
  };
  const Refusal refusals[] = {
      {-1, 1, 3},         {-0.001f, 0, 3},       {nan, 1, 3},   {nan, 0, 3},   {1e9f, 1, 3},
      {1e9f, 0, 3},       {inf, 1, 3},           {40000, 0, 3}, {-0.0f, 1, 0}, {-0.0f, 0, 0},
      {1, 0xffffffff, 4}, {1e6f, 0xffffffff, 4}, {1e6f, 1, 0},  {20000, 0, 0}, {9000, 2, bytes ? 3 : 0}};
  TestWorld<T> src(5, 4), dst(5, 4);
  src.fill(T{1, 1, 1, 1});
  ZR_WorldX<T> a(src.layer(), false), b(dst.layer(), false);
  for (const Refusal& r : refusals) {
    const BlurCase c = {r.radius, r.iterations, 31, false, true, false, true, false};
    if (r.error == 4) HB_FailNthAllocation(1);  // what it asks for may be there
    EXPECT_EQ(blur(nullptr, a, c, b), r.error) << r.radius << " x " << r.iterations;
    HB_FailNthAllocation(0);
    EXPECT_EQ(this->caught.quiet(), r.error == 0);
    this->caught.clear();
  }
  EXPECT_THROW(ZR_BoxBlur1D(nullptr, &a, 1, 0, 15, false, true, false, true, false, &b), i32);
  EXPECT_THROW(ZR_BoxBlur1D(nullptr, nullptr, 1, 1, 15, false, true, false, true, false, &b), i32);
  using Other = std::conditional_t<bytes, ZR_Pixel16, ZR_Pixel8>;
  TestWorld<Other> other(5, 4);
  ZR_WorldX<Other> c(other.layer(), false);
  EXPECT_EQ(blur(nullptr, c, BlurCase{1, 0, 15, false, true, false, true, false}, b), 3);
}

}  // namespace
