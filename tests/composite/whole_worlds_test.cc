// Mixes, premultiplication and the composite behind, around their pixels: order, aborts, slots, refusals.
#include <gtest/gtest.h>

#include <type_traits>
#include <utility>

#include "composite/composite_rect.h"
#include "composite/premultiply.h"
#include "support/born_library.h"
#include "support/worlds.h"

namespace {

using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;

using BlendFunc = decltype(&ZR_Blend);

template <class T>
class Blend : public BornLibrary {};
TYPED_TEST_SUITE(Blend, Depths);

TYPED_TEST(Blend, Refusals) {
  using T = TypeParam;
  using Other = std::conditional_t<std::is_same_v<T, ZR_Pixel8>, ZR_Pixel16, ZR_Pixel8>;
  TestWorld<T> world(3, 3), narrow(2, 3), low(3, 2);
  TestWorld<Other> other(3, 3);
  ZR_LayerDef bare = *world.layer();
  bare.data = nullptr;
  const char depth[] = "ZR_BlendPremul requires src1, src2 and dst worlds to be same depth";
  const char size[] = "ZR_Blend requires width and height of all worlds to be the same";
  const char data[] = "bad parameter passed to effect callback";
  for (BlendFunc blend : {&ZR_Blend, &ZR_Blend_Straight, &ZR_Blend_Premul})
    for (i32 place = 0; place < 3; ++place)
      for (const auto& [odd, text] : {std::pair<ZR_LayerDef*, const char*>{other.layer(), depth},
                                      {narrow.layer(), size},
                                      {low.layer(), size},
                                      {&bare, data}}) {
        ZR_LayerDef* worlds[3] = {world, world, world};
        worlds[place] = odd;
        EXPECT_EQ(blend(nullptr, worlds[0], worlds[1], 0, worlds[2]), 3);
        const std::string verification = this->caught.take_verification();
        EXPECT_EQ(verification + this->caught.take_message(), text) << place;
      }
}

using World = TestWorld<ZR_Pixel8>;
using RectFunc = decltype(&ZR_CompositeRectDraft_Straight);

class CompositeRect : public BornLibrary {};

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

template <class T>
class Premultiply : public BornLibrary {};
TYPED_TEST_SUITE(Premultiply, Depths);

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

TYPED_TEST(Premultiply, RowsInAnyOrderAndOneAbort) {
  using T = TypeParam;
  TestWorld<T> src(200, 500), plain_done(200, 500), coloured_done(200, 500);
  src.randomise(12), plain_done.randomise(12);
  const ZR_PixelFloat matte = {1, 0.5f, 0.25f, 1};
  ASSERT_EQ(ZR_PremulRect_S(nullptr, 1, nullptr, plain_done), 0);
  ASSERT_EQ(ZR_PremulColorFloat(nullptr, src, &matte, 1, coloured_done), 0);
  for (const bool reversed : {false, true}) {
    SlotOverride order(ZR_Slot_iterate_generic, reversed ? reinterpret_cast<void*>(&iterate_backwards)
                                                         : reinterpret_cast<void*>(&ZR_IterateGeneric_Static));
    for (i32 answer : {0, 66}) {
      TestWorld<T> plain = src, coloured(200, 500);
      const TestWorld<T> clear(200, 500);
      Asked asked{0, answer};
      const ZR_ProgressInfo info = asked.info();
      EXPECT_EQ(ZR_PremulRect_S(&info, 1, nullptr, plain), answer);
      EXPECT_EQ(ZR_PremulColorFloat(&info, src, &matte, 1, coloured), answer);
      EXPECT_EQ(asked.count, 2);
      if (answer != 0 && reversed) {  // all but the band of row 0 was done before
        EXPECT_EQ(std::memcmp(&plain.at(0, 0), &src.at(0, 0), sizeof(T) * 200), 0);
        EXPECT_EQ(std::memcmp(&plain.at(0, 499), &plain_done.at(0, 499), sizeof(T) * 200), 0);
      } else {
        EXPECT_TRUE(plain == (answer == 0 ? plain_done : src) && coloured == (answer == 0 ? coloured_done : clear))
            << reversed << answer;
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
