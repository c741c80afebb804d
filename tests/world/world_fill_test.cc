// Clearing, filling and alpha of worlds, and the exported fills, against per-pixel models between guards.
#include <ZR/world.h>

#include <functional>
#include <limits>
#include <memory>
#include <vector>

#include "support/born_library.h"
#include "support/worlds.h"

namespace {

constexpr i32 low = std::numeric_limits<i32>::min(), high = std::numeric_limits<i32>::max();

const GX_LRect rects[] = {{0, 0, 9, 7},     {2, 1, 5, 4},           {-5, -5, 5, 5},    {3, 0, 3, 7},
                          {4, 2, 2, 5},     {0, 6, 9, 2},           {8, 6, 20, 20},    {9, 0, 12, 7},
                          {-9, -9, -1, -1}, {low, low, high, high}, {low, 2, high, 3}, {high, high, low, low},
                          {-3, 5, 4, -2},   {7, 7, -1, -1},         {0, 0, 0, 0}};

bool inside(const GX_LRect& r, i32 x, i32 y) { return x >= r.left && x < r.right && y >= r.top && y < r.bottom; }
bool clipped_is_empty(const GX_LRect& r) {
  return std::max(r.left, 0) >= std::min(r.right, 9) || std::max(r.top, 0) >= std::min(r.bottom, 7);
}

template <class T>
class Fills : public BornLibrary {
 protected:
  // Runs `act` on a random world and expects it to make `pixel(x, y, before)` of each pixel.
  void check(const std::function<void(TestWorld<T>&, ZR_World*)>& act, const std::function<T(i32, i32, T)>& pixel,
             const GX_LRect& rect) {
    TestWorld<T> world(9, 7);
    world.randomise(1);
    TestWorld<T> expected(world);
    for (i32 y = 0; y < 7; ++y)
      for (i32 x = 0; x < 9; ++x) expected.at(x, y) = pixel(x, y, world.at(x, y));
    const std::unique_ptr<ZR_World> reference(ZR_World::NewReference(world.layer()));
    act(world, reference.get());
    EXPECT_TRUE(world == expected) << rect.left << " " << rect.top << " " << rect.right << " " << rect.bottom;
    EXPECT_TRUE(world.guards_intact());
  }
};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(Fills, Depths);

TYPED_TEST(Fills, MembersTakeARectangleAsItIs) {
  using T = TypeParam;
  const ZR_PixelFloat colour = {1.5f, 2.0f, -1.0f, 0.25f};
  const ZR_Pixel16 deep = {16384, 32768, 1, 129};
  const T from_float = zr::convert_colour<T>(colour), from_deep = zr::convert_colour<T>(deep), zero = {};
  if constexpr (std::is_same_v<T, ZR_Pixel8>) {
    EXPECT_EQ(from_float.alpha, 127) << "alpha wraps, colours clamp";
    EXPECT_EQ(from_float.red, 255);
    EXPECT_EQ(from_float.green, 0);
  }
  for (const GX_LRect& rect : rects) {
    const auto in_rect = [&](const T& pixel) {
      return [&, pixel](i32 x, i32 y, T before) { return inside(rect, x, y) ? pixel : before; };
    };
    this->check([&](TestWorld<T>&, ZR_World* world) { world->Clear(&rect); }, in_rect(zero), rect);
    this->check([&](TestWorld<T>&, ZR_World* world) { world->Fill(colour, &rect); }, in_rect(from_float), rect);
    this->check([&](TestWorld<T>&, ZR_World* world) { world->Fill(deep, &rect); }, in_rect(from_deep), rect);
    const auto kept = [&](i32 x, i32 y, T before) {
      return !clipped_is_empty(rect) && inside(rect, x, y) ? before : zero;
    };
    this->check([&](TestWorld<T>&, ZR_World* world) { world->ClearExceptRect(rect); }, kept, rect);
  }
  const auto all = [](const T& pixel) { return [pixel](i32, i32, T) { return pixel; }; };
  this->check([&](TestWorld<T>&, ZR_World* world) { world->Fill(deep, nullptr); }, all(from_deep), {});
  this->check([&](TestWorld<T>&, ZR_World* world) { world->Clear(nullptr); }, all(zero), {});
}

TYPED_TEST(Fills, ClearingFullRowsWithoutPaddingReachesTheWorldsEnd) {
  using T = TypeParam;
  std::vector<T> pixels(5 * 8, T{1, 1, 1, 1});
  ZR_WorldX<T> world(pixels.data(), 5, 4, static_cast<i32>(5 * sizeof(T)));
  const GX_LRect lower = {0, 2, 5, 3};
  world.Clear(&lower);
  for (i32 i = 0; i < 40; ++i) EXPECT_EQ(pixels[static_cast<size_t>(i)].alpha, i >= 10 && i < 20 ? 0 : 1) << i;
}

TYPED_TEST(Fills, PremultiplyingGoesThroughTheExportsAndIsRefusedOnFloats) {
  using T = TypeParam;
  TestWorld<T> world(9, 7), by_export(9, 7);
  const ZR_Pixel16 matte = {32768, 30000, 20000, 10000};
  const std::unique_ptr<ZR_World> reference(ZR_World::NewReference(world.layer()));
  const std::function<void()> members[] = {[&] { reference->Premultiply(); }, [&] { reference->Unmultiply(); },
                                           [&] { reference->PremulColor(matte); },
                                           [&] { reference->UnmulColor(matte); }};
  for (int which = 0; which < 4; ++which) {
    const i32 forward = which % 2 == 0;
    world.randomise(3), by_export.randomise(3);
    if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
      EXPECT_THROW(members[which](), i32);
      EXPECT_TRUE(world == by_export) << "nothing was done";
    } else {
      members[which]();
      if (which < 2) {
        EXPECT_EQ(ZR_Premul(nullptr, forward, by_export), 0);
      } else if constexpr (std::is_same_v<T, ZR_Pixel16>) {
        EXPECT_EQ(ZR_PremulColor16(nullptr, by_export, &matte, forward, by_export), 0);
      } else {
        const ZR_Pixel8 narrow = zr::convert_colour<ZR_Pixel8>(matte);
        EXPECT_EQ(ZR_PremulColor(nullptr, by_export, &narrow, forward, by_export), 0);
      }
      EXPECT_TRUE(world == by_export) << which;
    }
  }
}

TYPED_TEST(Fills, LongRowsOfEveryLengthAreFilledToTheirEnd) {
  using T = TypeParam;
  const ZR_Pixel16 colour = {1, 2, 3, 4};
  // Up to all blocks of 64 bytes, and on both sides of the lengths at which another store takes over.
  for (i32 width = 1; width <= 515; width += width == 70 ? 184 : width == 259 ? 250 : 1) {
    TestWorld<T> world(width, 2, 1), expected(width, 2, 1);
    expected.fill(zr::convert_colour<T>(colour));
    EXPECT_EQ(ZR_Fill16(nullptr, &colour, nullptr, world), 0);
    ASSERT_TRUE(world == expected) << width;
    ASSERT_TRUE(world.guards_intact());
  }
}

TYPED_TEST(Fills, WithoutPixelsTheExportsReportABadParameter) {
  using T = TypeParam;
  const ZR_Pixel8 c8 = {};
  const ZR_Pixel16 c16 = {};
  const ZR_PixelFloat cf = {};
  ZR_LayerDef empty = {};
  empty.flags = zr::Depth<T>::layer_flags;
  empty.width = empty.height = 5;
  const std::function<i32(ZR_LayerDef*)> exports[] = {
      [&](ZR_LayerDef* w) { return ZR_Fill(nullptr, &c8, nullptr, w); },
      [&](ZR_LayerDef* w) { return ZR_Fill16(nullptr, &c16, nullptr, w); },
      [&](ZR_LayerDef* w) { return ZR_FillFloat(nullptr, &cf, nullptr, w); }};
  for (const auto& fill : exports)
    for (ZR_LayerDef* const world : {&empty, static_cast<ZR_LayerDef*>(nullptr)}) {
      EXPECT_EQ(fill(world), ZR_Err_Internal);
      ASSERT_EQ(this->caught.messages().size(), 1u);
      EXPECT_EQ(this->caught.messages().back().code, 0x25000du);
      EXPECT_EQ(this->caught.take_message(), "bad parameter passed to effect callback");
    }
}

}  // namespace
