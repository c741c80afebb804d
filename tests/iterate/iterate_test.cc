// The iterators against a model of their calls: areas, sources placed anywhere, progress, early stops.
#include <ZR/world.h>
#include <ZR/zr.h>

#include <algorithm>
#include <functional>
#include <limits>
#include <new>
#include <tuple>
#include <vector>

#include "iterate/iterate.h"
#include "support/born_library.h"
#include "support/worlds.h"
#include "world/slot_table.h"

namespace {

constexpr i32 low = std::numeric_limits<i32>::min(), high = std::numeric_limits<i32>::max();

// One call of a pixel function; `in` is told as an address, or as `outside` for a transparent pixel that
// belongs to neither world.
struct PixelCall {
  i32 x, y;
  const void *in, *out;
  bool operator==(const PixelCall&) const = default;
};
const char outside_marker = 0;
const void* const outside = &outside_marker;

struct Recorder {
  std::vector<PixelCall> calls;
  std::vector<i32> progress;  // the counts told
  i32 total = 0;
  size_t stop_at = ~size_t{0};  // the call that returns 55
  std::function<i32(size_t)> answer = [](size_t) { return 0; };
  std::function<bool(const void*)> known = [](const void*) { return true; };

  static i32 pixel(void* self, i32 x, i32 y, const void* in, void* out) {
    auto& r = *static_cast<Recorder*>(self);
    if (in != nullptr && !r.known(in)) {
      constexpr ZR_Pixel8 clear = {};
      EXPECT_EQ(std::memcmp(in, &clear, sizeof clear), 0) << "transparent black outside";
      in = outside;
    }
    r.calls.push_back({x, y, in, out});
    return r.calls.size() - 1 == r.stop_at ? 55 : 0;
  }
  static i32 host(void* self, i32 done, i32 total) {
    auto& r = *static_cast<Recorder*>(self);
    r.progress.push_back(done);
    r.total = total;
    return r.answer(r.progress.size() - 1);
  }
  ZR_InData in_data() {
    ZR_InData data = {};
    data.progress = host;
    data.effect_ref = this;
    return data;
  }
};

enum class Kind { iterate, origin, no_clip };

i32 run(Kind kind, Recorder& recorder, i32 base, i32 final, ZR_LayerDef* src, const GX_LRect* area,
        const GX_LPoint& origin, ZR_LayerDef* dst) {
  ZR_InData data = recorder.in_data();
  switch (kind) {
    case Kind::iterate: return ZR_Iterate(&data, base, final, src, area, &recorder, Recorder::pixel, dst);
    case Kind::origin: return ZR_IterateOrigin(&data, base, final, src, area, &origin, &recorder, Recorder::pixel, dst);
    default:
      return zr::slot<ZR_Slot_iterate_origin_no_clip>()(&data, base, final, src, area, &origin, &recorder,
                                                        Recorder::pixel, dst);
  }
}

struct Expected {
  std::vector<PixelCall> calls;
  i64 rows = 0;  // that progress is told of
};

// The walk told pixel by pixel, for calls with a source (or in place for ZR_Iterate).
template <class T>
Expected model(Kind kind, TestWorld<T>* src, const GX_LRect* area, GX_LPoint origin, TestWorld<T>& dst) {
  Expected expected;
  if (kind == Kind::iterate) origin = {0, 0};
  const i64 w = dst.width(), h = dst.height();
  const bool cuts = src != nullptr && kind != Kind::no_clip;
  const i64 src_right = cuts ? i64{src->width()} + origin.x : 0, src_bottom = cuts ? i64{src->height()} + origin.y : 0;
  i64 left = 0, top = 0, right = w, bottom = h;
  if (area != nullptr) {
    if (area->right < 1 || area->left > w || area->bottom < 1 || area->top > h) return expected;
    if (cuts && (area->left > src_right || area->top > src_bottom)) return expected;
    left = std::max(area->left, 0), top = std::max(area->top, 0);
    right = std::min<i64>(area->right, w), bottom = std::min<i64>(area->bottom, h);
  }
  if (cuts) {
    left = std::max<i64>(left, origin.x), top = std::max<i64>(top, origin.y);
    right = std::min(right, src_right), bottom = std::min(bottom, src_bottom);
  }
  if (kind != Kind::iterate && (right <= left || bottom <= top)) return expected;
  for (i64 y = top; y < bottom; ++y, ++expected.rows)
    for (i64 x = left; x < right; ++x) {
      T* const out = &dst.at(static_cast<i32>(x), static_cast<i32>(y));
      const void* in = out;
      if (src != nullptr) {
        const i64 sx = x - origin.x, sy = y - origin.y;
        const bool inside = sx >= 0 && sx < src->width() && sy >= 0 && sy < src->height();
        in = inside ? static_cast<const void*>(&src->at(static_cast<i32>(sx), static_cast<i32>(sy))) : outside;
      }
      expected.calls.push_back({static_cast<i32>(x), static_cast<i32>(y), in, out});
    }
  return expected;
}

const GX_LRect areas[] = {
    {0, 0, 7, 5},           {1, 1, 6, 4},   {-3, -2, 4, 9},       {5, 3, 2, 1}, {0, 0, 0, 5},   {7, 0, 9, 5},
    {8, 0, 9, 5},           {0, 5, 7, 9},   {0, 6, 7, 9},         {2, 2, 2, 4}, {-9, -9, 0, 0}, {low, low, high, high},
    {high, high, low, low}, {low, 1, 3, 2}, {4, low, high, high}, {3, 4, 9, 3}, {0, 4, 1, 5}};
const GX_LPoint origins[] = {{0, 0},   {2, 1},  {-2, -1},   {7, 5},       {6, 4},
                             {-4, -3}, {-5, 0}, {low, low}, {high, high}, {3, low}};

template <class T>
class Iterators : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(Iterators, Depths);

TYPED_TEST(Iterators, EveryAreaAndPlacedSourceIsWalkedLikeTheModel) {
  using T = TypeParam;
  TestWorld<T> dst(7, 5), small(4, 3), large(9, 8), upward(6, 7);
  upward.turn_over();
  size_t calls = 0;
  for (const Kind kind : {Kind::iterate, Kind::origin, Kind::no_clip})
    for (TestWorld<T>* const src : {&small, &large, &upward, &dst, static_cast<TestWorld<T>*>(nullptr)}) {
      if (src == nullptr && kind != Kind::iterate) continue;
      for (size_t a = 0; a <= std::size(areas); ++a)
        for (const GX_LPoint& origin : origins) {
          const GX_LRect* const area = a < std::size(areas) ? &areas[a] : nullptr;
          const Expected expected = model(kind, src, area, origin, dst);
          Recorder recorder;
          recorder.known = [&](const void* p) {
            const TestWorld<T>& world = src != nullptr ? *src : dst;
            const auto ends = std::minmax<const void*>({&world.at(0, 0), &world.at(0, world.height() - 1)});
            return p >= ends.first && p < static_cast<const T*>(ends.second) + world.width();
          };
          EXPECT_EQ(run(kind, recorder, 10, 100, src != nullptr ? src->layer() : nullptr, area, origin, dst), 0);
          ASSERT_TRUE(recorder.calls == expected.calls)
              << "kind " << static_cast<int>(kind) << ", area " << a << ", origin " << origin.x << " " << origin.y;
          ASSERT_EQ(static_cast<i64>(recorder.progress.size()), expected.rows) << "area " << a;
          for (size_t row = 0; row < recorder.progress.size(); ++row)
            ASSERT_EQ(recorder.progress[row], 11 + static_cast<i32>(row));
          calls += expected.calls.size();
        }
    }
  EXPECT_GT(calls, 5000u) << "the tables must not consist of empty walks";
}

TYPED_TEST(Iterators, WithoutSourceAWalkByOriginVisitsHalfTheColumnsEverFurtherLeft) {
  using T = TypeParam;
  for (const i32 padding : {0, 3})
    for (const Kind kind : {Kind::origin, Kind::no_clip})
      for (const GX_LRect area : {GX_LRect{0, 0, 7, 5}, {1, 1, 7, 5}, {2, 0, 3, 5}, {-4, 2, 90, 90}}) {
        TestWorld<T> dst(7, 5, padding);
        Recorder recorder;
        EXPECT_EQ(run(kind, recorder, 0, 9, nullptr, &area, {3, 3}, dst), 0);
        const i32 left = std::max(area.left, 0), top = std::max(area.top, 0), right = std::min(area.right, 7);
        std::vector<PixelCall> expected;
        const char* at = reinterpret_cast<const char*>(&dst.at(left, top));
        for (i32 y = top; y < 5; ++y) {
          for (i32 x = left; x < right; x += 2, at += sizeof(T)) expected.push_back({x, y, nullptr, at});
          at += dst.layer()->row_bytes - (right - left) * static_cast<i32>(sizeof(T));
        }
        EXPECT_TRUE(recorder.calls == expected) << "padding " << padding << ", left " << left;
        EXPECT_EQ(static_cast<i32>(recorder.progress.size()), 5 - top);
      }
}

TYPED_TEST(Iterators, WithoutSourceAWorldThatRunsUpwardsIsNotLeft) {
  using T = TypeParam;
  TestWorld<T> pixels(6, 5);
  ZR_LayerDef upwards = *pixels.layer();
  upwards.data = &pixels.at(0, 4);
  upwards.row_bytes = -upwards.row_bytes;
  Recorder recorder;
  EXPECT_EQ(run(Kind::origin, recorder, 0, 0, nullptr, nullptr, {}, &upwards), 0);
  EXPECT_FALSE(recorder.calls.empty());
  for (const PixelCall& call : recorder.calls) {
    EXPECT_GE(call.out, &pixels.at(0, 0));
    EXPECT_LE(call.out, &pixels.at(5, 4));
  }
}

TYPED_TEST(Iterators, AResultOfThePixelFunctionStopsAndIsReturned) {
  using T = TypeParam;
  TestWorld<T> src(4, 3), dst(7, 5);
  for (const Kind kind : {Kind::iterate, Kind::origin, Kind::no_clip})
    for (const bool with_src : {true, false})
      for (size_t stop_at = 0; stop_at < 12; ++stop_at) {
        Recorder recorder;
        recorder.stop_at = stop_at;
        EXPECT_EQ(run(kind, recorder, 0, 9, with_src ? src.layer() : nullptr, nullptr, {0, 0}, dst), 55);
        EXPECT_EQ(recorder.calls.size(), stop_at + 1);
      }
}

TYPED_TEST(Iterators, OnlyTheAbortCodeStopsAndTheLastAnswerIsTheResult) {
  using T = TypeParam;
  TestWorld<T> src(4, 3), dst(4, 3);
  for (const Kind kind : {Kind::iterate, Kind::origin, Kind::no_clip}) {
    for (size_t stop_at = 0; stop_at < 3; ++stop_at) {
      Recorder recorder;
      recorder.answer = [&](size_t row) { return row == stop_at ? 517 : 0; };
      EXPECT_EQ(run(kind, recorder, 0, 9, src.layer(), nullptr, {}, dst), 517);
      EXPECT_EQ(recorder.calls.size(), 4 * (stop_at + 1)) << "whole rows";
    }
    Recorder early, late, silent;
    early.answer = [](size_t row) { return row == 1 ? 77 : 0; };
    EXPECT_EQ(run(kind, early, 0, 9, src.layer(), nullptr, {}, dst), 0) << "not the last row's answer";
    late.answer = [](size_t row) { return row == 2 ? 77 : 0; };
    EXPECT_EQ(run(kind, late, high, 9, src.layer(), nullptr, {}, dst), 77);
    EXPECT_EQ(late.calls.size(), 12u);
    EXPECT_EQ(late.progress.front(), low) << "a count past the end wraps";
    EXPECT_EQ(run(kind, silent, 0, 0, src.layer(), nullptr, {}, dst), 0);
    EXPECT_TRUE(silent.progress.empty());
    EXPECT_EQ(silent.calls.size(), 12u);
  }
  Recorder recorder;
  EXPECT_EQ(ZR_Iterate(nullptr, 0, 0, nullptr, nullptr, &recorder, Recorder::pixel, dst), 0) << "no host record";
  EXPECT_EQ(recorder.calls.size(), 12u);
}

class IteratorFailures : public BornLibrary {
 protected:
  void expect_bad_param(i32 result, u32 code) {
    EXPECT_EQ(result, ZR_Err_Internal);
    ASSERT_EQ(caught.messages().size(), 1u);
    EXPECT_EQ(caught.messages().back().code, code);
    EXPECT_EQ(caught.take_message(), "bad parameter passed to effect callback");
  }
};

TEST_F(IteratorFailures, BadWorldsAndFunctionsAreReportedUnderTheSiteOfTheIterator) {
  TestWorld<ZR_Pixel8> good(3, 3);
  TestWorld<ZR_Pixel16> deep(3, 3);
  ZR_LayerDef empty = *good.layer();
  empty.data = nullptr;
  const GX_LPoint origin = {};
  struct Case {
    ZR_LayerDef *src, *dst;
    ZR_PixelFunc fn;
  };
  for (const Case& c : {Case{&empty, good, Recorder::pixel},
                        {good, nullptr, Recorder::pixel},
                        {good, &empty, Recorder::pixel},
                        {good, good, nullptr},
                        {nullptr, good, nullptr}}) {
    expect_bad_param(ZR_Iterate(nullptr, 0, 0, c.src, nullptr, nullptr, c.fn, c.dst), 0x25000e);
    expect_bad_param(ZR_IterateOrigin(nullptr, 0, 0, c.src, nullptr, &origin, nullptr, c.fn, c.dst), 0x250052);
    expect_bad_param(zr::iterate_origin_no_clip_body(nullptr, 0, 0, c.src, nullptr, &origin, nullptr, c.fn, c.dst),
                     0x250052);
  }
  for (const auto& result : {ZR_Iterate(nullptr, 0, 0, good, nullptr, nullptr, Recorder::pixel, deep),
                             ZR_IterateOrigin(nullptr, 0, 0, good, nullptr, &origin, nullptr, Recorder::pixel, deep)})
    EXPECT_EQ(result, ZR_Err_Internal);
  ASSERT_EQ(caught.verifications().size(), 2u);
  EXPECT_EQ(caught.take_verification(), "ZR_Iterate requires source and dst worlds to be same depth");
}

struct GenericCalls {
  std::vector<std::tuple<i32, i32, i32>> calls;
  i32 stop_at = -1;
  static i32 call(void* self, i32 thread, i32 i, i32 n) {
    auto& calls = *static_cast<GenericCalls*>(self);
    calls.calls.emplace_back(thread, i, n);
    return i == calls.stop_at ? 55 : 0;
  }
};

TEST_F(IteratorFailures, TheGenericBodyCallsInOrderAndStopsAtAResult) {
  for (const i32 count : {-2, -1, 0, 1, 7, 8, 9, 100}) {
    GenericCalls all;
    EXPECT_EQ(ZR_IterateGeneric(count, &all, GenericCalls::call), 0);
    std::vector<std::tuple<i32, i32, i32>> expected;
    if (count == -1) expected = {{0, 0, 1}};
    for (i32 i = 0; i < count; ++i) expected.emplace_back(0, i, count);
    EXPECT_EQ(all.calls, expected);
    for (i32 stop_at = 0; stop_at < count; ++stop_at) {
      GenericCalls some;
      some.stop_at = stop_at;
      EXPECT_EQ(ZR_IterateGeneric_Static(count, &some, GenericCalls::call), 55);
      EXPECT_EQ(static_cast<i32>(some.calls.size()), stop_at + 1);
    }
  }
  expect_bad_param(ZR_IterateGeneric(5, nullptr, nullptr), 0x250046);
}

TEST_F(IteratorFailures, NothingThrownByACallbackLeavesAnExport) {
  TestWorld<ZR_Pixel8> world(3, 3);
  const ZR_PixelFunc throws = [](void*, i32, i32, const void*, void*) -> i32 { throw std::bad_alloc(); };
  EXPECT_EQ(ZR_Iterate(nullptr, 0, 0, nullptr, nullptr, nullptr, throws, world), ZR_Err_OutOfMemory);
  caught.clear();
}

class Tables : public BornLibrary {};

TEST_F(Tables, EveryChannelGoesThroughItsOwnTable) {
  u8 tables[4][256];
  for (i32 c = 0; c < 4; ++c)
    for (i32 i = 0; i < 256; ++i) tables[c][i] = static_cast<u8>(i * (2 * c + 3) + 17 * c);
  TestWorld<ZR_Pixel8> small(4, 3), large(9, 8);
  small.randomise(1), large.randomise(2);
  for (TestWorld<ZR_Pixel8>* const src : {&small, &large, static_cast<TestWorld<ZR_Pixel8>*>(nullptr)})
    for (size_t a = 0; a <= std::size(areas); ++a)
      for (u32 given = 0; given < 16; ++given) {  // which tables are there
        const GX_LRect* const area = a < std::size(areas) ? &areas[a] : nullptr;
        TestWorld<ZR_Pixel8> dst(7, 5);
        dst.randomise(3);
        TestWorld<ZR_Pixel8> expected(dst);
        const Expected walk = model(Kind::iterate, src, area, {}, dst);
        for (const PixelCall& call : walk.calls) {
          const auto& in = *static_cast<const ZR_Pixel8*>(call.in);
          const auto table = [&](u32 c, u8 v) { return (given >> c & 1) != 0 ? tables[c][v] : v; };
          expected.at(call.x, call.y) = {table(0, in.alpha), table(1, in.red), table(2, in.green), table(3, in.blue)};
        }
        Recorder host;
        ZR_InData data = host.in_data();
        const auto lut = [&](u32 c) { return (given >> c & 1) != 0 ? tables[c] : nullptr; };
        EXPECT_EQ(ZR_IterateLUT(&data, 4, 9, src != nullptr ? src->layer() : nullptr, area, lut(0), lut(1), lut(2),
                                lut(3), dst),
                  0);
        ASSERT_TRUE(dst == expected) << "area " << a << ", tables " << given;
        ASSERT_TRUE(dst.guards_intact());
        const i64 rows = walk.calls.empty() ? 0 : walk.rows;  // nothing to do: the host is not told
        ASSERT_EQ(static_cast<i64>(host.progress.size()), rows) << "area " << a;
        if (rows > 0) {
          EXPECT_EQ(host.progress.back(), 4 + rows);
        }
      }
}

TEST_F(Tables, ProgressStopsAndIsReturnedAndDeepWorldsAreRefused) {
  TestWorld<ZR_Pixel8> world(3, 4);
  u8 ones[256];
  std::fill(std::begin(ones), std::end(ones), u8{1});
  Recorder host;
  host.answer = [](size_t row) { return row == 1 ? 517 : 0; };
  ZR_InData data = host.in_data();
  EXPECT_EQ(ZR_IterateLUT(&data, 0, 4, nullptr, nullptr, ones, ones, ones, ones, world), 517);
  for (i32 y = 0; y < 4; ++y) EXPECT_EQ(world.at(2, y).blue, y < 2 ? 1 : 0);
  Recorder late;
  late.answer = [](size_t row) { return row == 3 ? 77 : row == 1 ? 66 : 0; };
  data = late.in_data();
  EXPECT_EQ(ZR_IterateLUT(&data, 0, 4, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, world), 77);

  TestWorld<ZR_Pixel16> deep(3, 4);
  ZR_LayerDef empty = *world.layer();
  empty.data = nullptr;
  const std::pair<ZR_LayerDef*, ZR_LayerDef*> refused[] = {{deep, world},   {world, deep},   {nullptr, deep},
                                                           {&empty, world}, {world, &empty}, {world, nullptr}};
  for (const auto& [src, dst] : refused) {
    EXPECT_EQ(ZR_IterateLUT(nullptr, 0, 0, src, nullptr, nullptr, nullptr, nullptr, nullptr, dst), ZR_Err_Internal);
    ASSERT_EQ(caught.messages().size(), 1u);
    EXPECT_EQ(caught.messages().back().code, 0x25000eu);
    EXPECT_EQ(caught.take_message(), "bad parameter passed to effect callback");
  }
}

}  // namespace
