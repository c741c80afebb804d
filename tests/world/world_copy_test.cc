// Copies between worlds: clipping in every position against a per-pixel model, all pairs of depths, a world
// onto itself, fields, polling.
#include <ZR/world.h>

#include <limits>
#include <memory>
#include <tuple>
#include <vector>

#include "support/born_library.h"
#include "support/thrown.h"
#include "support/worlds.h"
#include "world/depth_rows.h"

namespace {

template <class T>
std::unique_ptr<ZR_World> reference(TestWorld<T>& world) {
  return std::unique_ptr<ZR_World>(ZR_World::NewReference(world.layer()));
}

template <class To, class From>
To converted(const From& pixel) {
  if constexpr (std::is_same_v<To, From>) {
    return pixel;
  } else {
    To out;
    zr::convert_row(1, &pixel, &out, false);
    return out;
  }
}

// What a copy does, pixel by pixel.
template <class To, class From>
void copy_model(const TestWorld<From>& src, const GX_LRect& r, i32 dst_x, i32 dst_y, TestWorld<To>& dst) {
  for (i32 y = 0; y < dst.height(); ++y)
    for (i32 x = 0; x < dst.width(); ++x) {
      const i64 sx = i64{x} - dst_x + r.left, sy = i64{y} - dst_y + r.top;
      if (sx < std::max(r.left, 0) || sx >= std::min(r.right, src.width())) continue;
      if (sy < std::max(r.top, 0) || sy >= std::min(r.bottom, src.height())) continue;
      dst.at(x, y) = converted<To>(src.at(static_cast<i32>(sx), static_cast<i32>(sy)));
    }
}

template <class Pair>
class Copies : public BornLibrary {};
template <class To_, class From_>
struct Pair {
  using To = To_;
  using From = From_;
};
using P8 = ZR_Pixel8;
using P16 = ZR_Pixel16;
using PF = ZR_PixelFloat;
using Pairs = testing::Types<Pair<P8, P8>, Pair<P8, P16>, Pair<P8, PF>, Pair<P16, P8>, Pair<P16, P16>, Pair<P16, PF>,
                             Pair<PF, P8>, Pair<PF, P16>, Pair<PF, PF>>;
TYPED_TEST_SUITE(Copies, Pairs);

TYPED_TEST(Copies, EveryPositionIsClippedLikeTheModel) {
  using To = typename TypeParam::To;
  using From = typename TypeParam::From;
  constexpr i32 low = std::numeric_limits<i32>::min(), high = std::numeric_limits<i32>::max();
  TestWorld<From> src(6, 5);
  src.randomise(1);
  // left, right and position for each axis; both axes run through the table, out of step
  struct Span {
    i32 first, last, to;
  };
  const Span spans[] = {{0, 6, 0},         {0, 5, 1},       {1, 4, 0},     {2, 5, 4},   {-3, 4, 0},   {-3, 9, -2},
                        {0, 6, -4},        {0, 6, 7},       {4, 2, 0},     {3, 3, 1},   {5, 6, 6},    {-9, -2, 0},
                        {7, 12, 0},        {low, high, 0},  {low, 3, low}, {0, 6, low}, {0, 6, high}, {high, low, 0},
                        {low, high, high}, {high, high, 3}, {low, low, 1}};
  i32 written = 0;
  for (const Span& across : spans)
    for (const Span& down : spans) {
      const GX_LRect rect = {across.first, down.first, across.last, down.last};
      TestWorld<To> dst(7, 6);
      dst.randomise(2);
      TestWorld<To> expected(dst), untouched(dst);
      copy_model(src, rect, across.to, down.to, expected);
      written += !(expected == untouched);
      reference(dst)->CopyRectPossiblyDifferentBitdepth(reference(src).get(), rect, false, across.to, down.to, nullptr);
      ASSERT_TRUE(dst == expected) << across.first << ".." << across.last << " to " << across.to << ", " << down.first
                                   << ".." << down.last << " to " << down.to;
      ASSERT_TRUE(dst.guards_intact());
      if constexpr (std::is_same_v<To, From>) {
        TestWorld<To> again(untouched);
        reference(again)->CopyRect(reference(src).get(), rect, across.to, down.to);
        ASSERT_TRUE(again == expected);
      }
    }
  EXPECT_GT(written, 40) << "the table must not consist of empty copies";
}

// Beyond the size from which rows go in bands, and conversions past the caches; rows begin anywhere in a line.
TYPED_TEST(Copies, LargeWorldsAreCopiedRowByRow) {
  using To = typename TypeParam::To;
  using From = typename TypeParam::From;
  constexpr i32 width = 2999, height = (i32{34} << 20) / (width * static_cast<i32>(sizeof(To) + sizeof(From))), few = 7;
  TestWorld<From> some(width, few), src(width, height);
  some.randomise(9);
  for (i32 y = 0; y < height; ++y) std::memcpy(&src.at(0, y), &some.at(0, y % few), width * sizeof(From));
  TestWorld<To> dst(width + 1, height);
  const SlotOverride order(ZR_Slot_iterate_generic, reinterpret_cast<void*>(&iterate_backwards));
  reference(dst)->CopyRectPossiblyDifferentBitdepth(reference(src).get(), {0, 0, width, height}, false, 1, 0, nullptr);
  EXPECT_TRUE(dst.guards_intact());
  const size_t row_bytes = static_cast<size_t>(width) * sizeof(To);
  std::vector<To> row(static_cast<size_t>(width));
  for (i32 y = 0; y < height; ++y) {
    if constexpr (std::is_same_v<To, From>)
      std::memcpy(row.data(), &src.at(0, y), row_bytes);
    else
      zr::convert_row(width, &src.at(0, y), row.data(), false);
    ASSERT_EQ(std::memcmp(&dst.at(1, y), row.data(), row_bytes), 0) << y;
  }
  if constexpr (std::is_same_v<To, ZR_Pixel8> && !std::is_same_v<To, From>) {  // dither goes on from row to row
    ZR_ResetDitherRandomIndex();
    reference(dst)->CopyRectPossiblyDifferentBitdepth(reference(src).get(), {0, 0, width, height}, true, 1, 0, nullptr);
    std::vector<To> behind(row);
    zr::convert_row(width, &src.at(0, 0), behind.data(), true);
    ZR_ResetDitherRandomIndex();
    for (i32 y = 0; y < height; ++y) {
      zr::convert_row(width, &src.at(0, y), row.data(), true);
      ASSERT_EQ(std::memcmp(&dst.at(1, y), row.data(), row_bytes), 0) << y;
    }
    zr::convert_row(width, &src.at(0, 0), row.data(), true);
    EXPECT_EQ(std::memcmp(behind.data(), row.data(), row_bytes), 0);
  }
  if constexpr (std::is_same_v<To, From>) {  // onto itself, a few rows down: from the top on, rows are seen again
    reference(dst)->CopyRect(reference(dst).get(), {0, 0, width + 1, height}, 0, few - 2);
    for (i32 y = 0; y < height; ++y)
      ASSERT_EQ(std::memcmp(&dst.at(1, y), &src.at(0, y % (few - 2)), row_bytes), 0) << y;
  }
}

TYPED_TEST(Copies, FieldsTakeEvenOrOddRowsOfTheDestinationAndAlwaysDither) {
  using To = typename TypeParam::To;
  using From = typename TypeParam::From;
  TestWorld<From> src(9, 12);
  src.randomise(3);
  for (const i32 top : {-3, -2, 0, 1})  // a negative top: the copy starts on an even or odd row
    for (const i32 field : {0, 1, 2, 3}) {
      const GX_LRect rect = {1, top, 8, 11};
      TestWorld<To> dst(10, 13);
      dst.randomise(4);
      TestWorld<To> expected(dst), all(dst);
      ZR_ResetDitherRandomIndex();
      // Row by row, in order: skipped rows draw no words.
      for (i32 y = 0; y < 13; ++y) {
        if (y + top < 0 || (field == 1 && y % 2 == 1) || (field == 2 && y % 2 == 0)) continue;
        reference(expected)->CopyRectPossiblyDifferentBitdepth(
            reference(src).get(), {1, y + top, 8, std::min(y + top + 1, 11)}, true, 0, y, nullptr);
      }
      ZR_ResetDitherRandomIndex();
      reference(dst)->CopyRectPossiblyDifferentBitdepthWithField(reference(src).get(), rect, field);
      ASSERT_TRUE(dst == expected) << "field " << field << ", top " << top;
      ASSERT_FALSE(dst == all);
      ASSERT_TRUE(dst.guards_intact());
    }
}

struct Polls {
  std::vector<i32> done;
  i32 total = 0, stop_at = -1, asked = 0;  // stop at this poll, counted from 0
  static i32 progress(void* self, i32 done, i32 total) {
    auto& polls = *static_cast<Polls*>(self);
    polls.done.push_back(done);
    polls.total = total;
    return polls.asked++ == polls.stop_at ? 99 : 0;
  }
  static i32 abort(void* self) {
    auto& polls = *static_cast<Polls*>(self);
    return polls.asked++ == polls.stop_at ? 98 : 0;
  }
};

TYPED_TEST(Copies, PollsBehindEverySixtyFourthRowAndStopsThere) {
  using To = typename TypeParam::To;
  using From = typename TypeParam::From;
  for (const i32 rows : {1, 63, 64, 65, 128, 200}) {
    TestWorld<From> src(3, rows);
    src.randomise(5);
    for (i32 stop_at = -1; stop_at <= rows / 64; ++stop_at)
      for (const bool progress_too : {true, false}) {
        Polls polls;
        polls.stop_at = stop_at;
        ZR_ProgressInfo info = {&polls, Polls::abort, progress_too ? Polls::progress : nullptr};
        TestWorld<To> dst(3, rows + 2);
        dst.randomise(6);
        TestWorld<To> expected(dst);
        const i32 code = thrown_by([&] {
          reference(dst)->CopyRectPossiblyDifferentBitdepth(reference(src).get(), {0, 0, 3, rows}, false, 0, 1, &info);
        });
        const bool stops = stop_at >= 0 && stop_at < rows / 64;
        EXPECT_EQ(code, !stops ? 0 : progress_too ? 99 : 98);
        EXPECT_EQ(polls.asked, stops ? stop_at + 1 : rows / 64);
        if (progress_too && polls.asked > 0) {
          EXPECT_EQ(polls.done.back(), polls.asked * 64 - 1);
          EXPECT_EQ(polls.total, rows);
        }
        copy_model(src, {0, 0, 3, stops ? (stop_at + 1) * 64 : rows}, 0, 1, expected);
        ASSERT_TRUE(dst == expected) << rows << " rows, stopped at poll " << stop_at;
      }
  }
}

class SelfCopies : public BornLibrary {};

TEST_F(SelfCopies, AWorldOntoItselfGoesTopRowFirstWithWholeRows) {
  for (const i32 padding : {0, 3})
    for (i32 dx = -3; dx <= 3; ++dx)
      for (i32 dy = -3; dy <= 3; ++dy) {
        TestWorld<P8> world(6, 7, padding);
        world.randomise(7);
        TestWorld<P8> expected(world);
        for (i32 y = 0; y < 7; ++y) {
          if (y - dy < 0 || y - dy >= 7) continue;
          P8 row[6];
          for (i32 x = 0; x < 6; ++x) row[x] = expected.at(x, y - dy);
          for (i32 x = 0; x < 6; ++x)
            if (x - dx >= 0 && x - dx < 6) expected.at(x, y) = row[x - dx];
        }
        const auto self = reference(world);
        self->CopyRect(self.get(), {0, 0, 6, 7}, dx, dy);
        ASSERT_TRUE(world == expected) << dx << ", " << dy << ", padding " << padding;
        ASSERT_TRUE(world.guards_intact());
      }
}

TEST_F(SelfCopies, CopyWorldTakesAllOfTheSource) {
  TestWorld<P16> src(4, 3), dst(5, 2);
  src.randomise(8);
  TestWorld<P16> expected(dst);
  copy_model(src, {0, 0, 4, 3}, 0, 0, expected);
  reference(dst)->CopyWorld(reference(src).get());
  EXPECT_TRUE(dst == expected);
}

}  // namespace
