// Lazy tiles: which rectangles reach the operator, once each, and the two operators of the library.
#include <ZR/lazy_tiles.h>

#include <array>

#include "mask/masks.h"
#include "support/worlds.h"

namespace {

using Rect = std::array<i32, 4>;  // top, left, bottom, right
struct Seen {
  std::vector<Rect> rects;
  i32 asked = 0;
  bool alive = true, throws = false;
};
class Recorder final : public ZR_LazyOperator {
 public:
  Recorder(Seen& seen, i16 width, i16 height) : seen_(seen), extent_{width, height} {}
  ~Recorder() override { seen_.alive = false; }
  GX_Vector2T<i16> GetExtent() const override { return ++seen_.asked, extent_; }
  void DoItImp(const GX_Rect& rect) override {
    seen_.rects.push_back({rect.top, rect.left, rect.bottom, rect.right});
    if (seen_.throws) throw i32{19};
  }

 private:
  Seen& seen_;
  GX_Vector2T<i16> extent_;
};

struct LazyTiles : BornLibrary {
  std::vector<Rect> sent(ZR_LazyTiles& tiles, const GX_Rect& rect) {
    seen.rects.clear();
    tiles.MakeValid(rect);
    return seen.rects;
  }
  Seen seen;
};

TEST_F(LazyTiles, ReachTheOperatorOnceInRunsAlongRows) {
  boost::scoped_ptr<ZR_LazyOperator> work(new Recorder(seen, 45, 25));
  {
    ZR_LazyTiles tiles(10, &work);
    EXPECT_EQ(work, nullptr);
    using Rects = std::vector<Rect>;
    EXPECT_EQ(sent(tiles, {0, 45, 25, 99}), Rects{});
    EXPECT_EQ(sent(tiles, {5, 5, 5, 30}), Rects{});
    EXPECT_EQ(sent(tiles, {12, 12, 13, 13}), (Rects{Rect{10, 10, 20, 20}}));
    EXPECT_EQ(sent(tiles, {0, 0, 20, 30}), (Rects{Rect{0, 0, 10, 30}, Rect{10, 0, 20, 10}, Rect{10, 20, 20, 30}}));
    EXPECT_EQ(sent(tiles, {0, 0, 20, 30}), Rects{});
    tiles.SetOffset({10, 0});
    EXPECT_EQ(tiles.GetOffset().x, 10);
    EXPECT_EQ(sent(tiles, {20, 0, 30, 10}), (Rects{Rect{20, 10, 25, 20}}));
    tiles.SetOffset({-32768, 0});
    EXPECT_EQ(sent(tiles, {0, -32768, 9, -32763}), Rects{}) << "sums of 16 bits wrap; that tile is done";
    tiles.SetOffset({0, 0});
    EXPECT_EQ(sent(tiles, {-100, -100, 32767, 32767}),
              (Rects{Rect{0, 30, 10, 45}, Rect{10, 30, 20, 45}, Rect{20, 0, 25, 10}, Rect{20, 20, 25, 45}}));
    EXPECT_TRUE(seen.alive);
  }
  EXPECT_FALSE(seen.alive);
}

TEST_F(LazyTiles, WithAConditionAskTwiceAndDoNothingWhileItIsFalse) {
  boost::scoped_ptr<ZR_LazyOperator> work(new Recorder(seen, 20, 10));
  ZR_LazyTilesCondition tiles(10, &work, false);
  tiles.ConditionalMakeValid({0, 0, 10, 20});
  EXPECT_TRUE(seen.rects.empty());
  tiles.SetCondition(true);
  seen.asked = 0;
  tiles.ConditionalMakeValid({0, 0, 10, 20});
  EXPECT_EQ(seen.rects, (std::vector<Rect>{Rect{0, 0, 10, 20}}));
  EXPECT_EQ(seen.asked, 2);
}

TEST_F(LazyTiles, AreNotMadeWithoutWorkOrSizeAndMarkBeforeTheyWork) {
  boost::scoped_ptr<ZR_LazyOperator> none, some(new Recorder(seen, 20, 10)), thrower(new Recorder(seen, 20, 20));
  EXPECT_THROW(ZR_LazyTiles(10, &none), i32);
  EXPECT_THROW(ZR_LazyTiles(0, &some), i32);
  EXPECT_FALSE(seen.alive) << "taken over, and gone with the map";
  ZR_LazyTiles tiles(10, &thrower);
  seen.throws = true;
  EXPECT_THROW(tiles.MakeValid({0, 0, 20, 20}), i32);
  seen.throws = false;
  EXPECT_EQ(sent(tiles, {0, 0, 20, 20}), (std::vector<Rect>{Rect{10, 0, 20, 20}}));
}

TEST_F(LazyTiles, CopyWorldsAndFillMasks) {
  TestWorld<ZR_Pixel8> src(25, 14), other(25, 14), dst(25, 14);
  src.randomise(3);
  other.randomise(4);
  const auto copier = new ZR_LazyWorldCopyOperator(src.layer(), dst.layer());
  boost::scoped_ptr<ZR_LazyOperator> work(copier);
  ZR_LazyTiles tiles(8, &work);
  EXPECT_EQ(tiles.GetOperator(), copier);
  tiles.MakeValid({0, 0, 14, 8});
  copier->SetSourceWorld(other.layer());
  tiles.MakeValid({0, 0, 14, 25});
  for (i32 y = 0; y < 14; ++y)
    for (i32 x = 0; x < 25; ++x)
      EXPECT_EQ(std::memcmp(&dst.at(x, y), x < 8 ? &src.at(x, y) : &other.at(x, y), 4), 0) << x << ' ' << y;
  for (const i32 depth : {8, 16}) {
    boost::scoped_ptr<ZR_UnoBuffer> buffer(new ZR_UnoBuffer(20, 20, depth));
    const auto filler = new ZR_LazyFillUnoBufferOperator(&buffer, 200);
    boost::scoped_ptr<ZR_LazyOperator> fill(filler);
    ZR_LazyTiles filled(7, &fill);
    filled.MakeValid({8, 8, 9, 9});
    const ZR_UnoBuffer& made = *filler->GetBuffer();
    for (i32 i = 0; i < 400; ++i) {
      const bool inside = i / 20 >= 7 && i / 20 < 14 && i % 20 >= 7 && i % 20 < 14;
      const i32 value = depth == 8 ? static_cast<u8*>(*made.data)[i] : static_cast<u16*>(*made.data)[i];
      EXPECT_EQ(value, inside ? 200 : 0) << i;
    }
  }
}

}  // namespace
