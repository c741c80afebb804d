// The composite behind an 8-bit destination.
#include "composite/composite_rect.h"

#include <gtest/gtest.h>

#include <utility>
#include <vector>

#include "support/born_library.h"
#include "support/worlds.h"

namespace {

using World = TestWorld<ZR_Pixel8>;
using RectFunc = decltype(&ZR_CompositeRectDraft_Straight);

u8 product(u32 a, u32 b) { return static_cast<u8>((2 * a * b + 255) / 510); }

ZR_Pixel8 straight(ZR_Pixel8 s, u64 o, ZR_Pixel8 d) {
  if (d.alpha == 255) return d;
  if (d.alpha == 0) return {product(static_cast<u32>(o), s.alpha), s.red, s.green, s.blue};
  const u64 w = o * (255u - d.alpha) * s.alpha, k = d.alpha * u64{65025};
  const auto mix = [&](u64 a, u64 b) { return static_cast<u8>((a * w + b * k) / (k + w)); };
  return {static_cast<u8>((k + w) / 65025), mix(s.red, d.red), mix(s.green, d.green), mix(s.blue, d.blue)};
}

ZR_Pixel8 premultiplied(ZR_Pixel8 s, u32 o, ZR_Pixel8 d) {
  if (d.alpha == 255) return d;
  const auto add = [&](u8 a, u8 b) {
    const u8 faded = product(o, a);
    return d.alpha == 0 ? faded : static_cast<u8>(b + product(255u - d.alpha, faded));
  };
  return {add(s.alpha, d.alpha), add(s.red, d.red), add(s.green, d.green), add(s.blue, d.blue)};
}

class CompositeRect : public BornLibrary {};

TEST_F(CompositeRect, EveryPairOfAlphas) {
  for (u32 o : {1u, 2u, 100u, 254u, 255u}) {
    World src(256, 256), dst(256, 256), behind(256, 256), added(256, 256);
    src.randomise(o), dst.randomise(o + 1000);
    for (i32 y = 0; y < 256; ++y)
      for (i32 x = 0; x < 256; ++x) {
        src.at(x, y).alpha = static_cast<u8>(x), dst.at(x, y).alpha = static_cast<u8>(y);
        behind.at(x, y) = straight(src.at(x, y), o, dst.at(x, y));
        added.at(x, y) = premultiplied(src.at(x, y), o, dst.at(x, y));
      }
    for (const auto& [call, expected] : {std::pair<RectFunc, World*>{ZR_CompositeRectDraft_Straight, &behind},
                                         {ZR_CompositeRectBest_Straight, &behind},
                                         {ZR_CompositeRectDraft_Premul, &added},
                                         {ZR_CompositeRectBest_Premul, &added}}) {
      World out = dst;
      EXPECT_EQ(call(nullptr, nullptr, static_cast<u8>(o), src, 0, 0, 0, 0, out), 0);
      EXPECT_TRUE(out == *expected) << o;
      EXPECT_EQ(call(nullptr, nullptr, 0, src, 0, 0, 0, 0, out), 0);
      EXPECT_TRUE(out == *expected) << "opacity 0 does nothing";
    }
  }
}

TEST_F(CompositeRect, PlaceFieldsAndPolls) {
  static constexpr i32 rows = 70;
  World src(6, rows), empty(9, rows + 5);
  src.fill({255, 9, 9, 9});
  const GX_LRect rect = {1, 0, 5, rows};
  struct Seen {
    std::vector<i32> rows;
    i32 stop_at = -1;
  };
  for (i32 dest_y : {0, 3})
    for (i32 field = 0; field < 3; ++field)
      for (i32 stop_at : {-1, 0, 32, 64}) {
        World dst = empty;
        Seen seen{{}, stop_at};
        const ZR_ProgressInfo progress = {&seen, nullptr, [](void* self, i32 done, i32 total) -> i32 {
                                            EXPECT_EQ(total, rows);
                                            auto& to = *static_cast<Seen*>(self);
                                            to.rows.push_back(done);
                                            return done == to.stop_at ? 55 : 0;
                                          }};
        EXPECT_EQ(ZR_CompositeRectBest_Straight(&progress, &rect, 255, src, 2, dest_y, field, 0, dst),
                  stop_at < 0 ? 0 : 55);
        const std::vector<i32> polls = {0, 32, 64};
        EXPECT_EQ(seen.rows,
                  std::vector<i32>(polls.begin(), stop_at < 0 ? polls.end() : polls.begin() + stop_at / 32 + 1));
        const i32 done = stop_at < 0 ? rows : stop_at;
        for (i32 y = 0; y < dst.height(); ++y)
          for (i32 x = 0; x < dst.width(); ++x) {
            const bool kept = field == 0 || (field == 1) == (y % 2 == 0);
            const bool covered = x >= 2 && x < 6 && y >= dest_y && y < dest_y + done && kept;
            ASSERT_EQ(dst.at(x, y).red, covered ? 9 : 0) << field << " at " << x << ',' << y;
          }
        EXPECT_TRUE(dst.guards_intact());
      }
}

TEST_F(CompositeRect, RowsGoThroughTheirSlots) {
  World src(2, 2), dst(2, 2);
  zr::CompositeBehindRowFunc* const mark = [](i32 n, u8 opacity, const ZR_Pixel8*, ZR_Pixel8* to) {
    for (i32 i = 0; i < n; ++i) to[i].blue = opacity;
  };
  for (const auto& [slot, call] :
       {std::pair<ZR_SlotIndex, RectFunc>{ZR_Slot_composite_behind_row_straight, ZR_CompositeRectDraft_Straight},
        {ZR_Slot_composite_behind_row_premul, ZR_CompositeRectDraft_Premul}}) {
    dst.clear();
    SlotOverride replacement(slot, reinterpret_cast<void*>(mark));
    EXPECT_EQ(call(nullptr, nullptr, 44, src, 0, 0, 0, 0, dst), 0);
    EXPECT_EQ(dst.at(1, 1).blue, 44);
  }
}

TEST_F(CompositeRect, Refusals) {
  World world(2, 2);
  TestWorld<ZR_Pixel16> deep(2, 2);
  ZR_LayerDef bare = *world.layer();
  bare.data = nullptr;
  for (const auto& [src, dst] : {std::pair<ZR_LayerDef*, ZR_LayerDef*>{deep, world}, {world, deep}, {deep, deep}}) {
    EXPECT_EQ(ZR_CompositeRectBest_Premul(nullptr, nullptr, 1, src, 0, 0, 0, 0, dst), 3);
    EXPECT_FALSE(caught.take_verification().empty());
  }
  for (const auto& [src, dst] :
       {std::pair<ZR_LayerDef*, ZR_LayerDef*>{&bare, world}, {world, &bare}, {nullptr, world}}) {
    EXPECT_EQ(ZR_CompositeRectBest_Premul(nullptr, nullptr, 1, src, 0, 0, 0, 0, dst), 3);
    EXPECT_EQ(caught.take_message(), "bad parameter passed to effect callback");
  }
}

}  // namespace
