// Pixels, lines, spots and planes against plain models of their steps.
#include <ZR/callback_block.h>
#include <ZR/drawing.h>

#include <algorithm>
#include <cmath>
#include <numeric>
#include <vector>

#include "support/born_library.h"
#include "support/worlds.h"

namespace {

class Drawing : public BornLibrary {};

TEST_F(Drawing, PixelsInsideOnly) {
  TestWorld<ZR_Pixel8> eight(3, 2);
  TestWorld<ZR_Pixel16> sixteen(3, 2);
  TestWorld<ZR_PixelFloat> real(3, 2);
  const ZR_Pixel8 p = {1, 2, 3, 4};
  const ZR_Pixel16 q = {40000, 2, 3, 4};
  const ZR_PixelFloat r = {NAN, 2, 3, 4};
  const struct {
    i32 x, y, stored;
  } places[] = {{0, 0, 1}, {2, 1, 1}, {3, 1, 0}, {-1, 0, 0}, {0, 2, 0}, {0, -1, 0}, {INT32_MAX, INT32_MIN, 0}};
  for (const auto& at : places) {
    EXPECT_EQ(ZR_SetPixel8(at.x, at.y, &p, eight), at.stored);
    EXPECT_EQ(ZR_SetPixel16(at.x, at.y, &q, sixteen), at.stored);
    EXPECT_EQ(ZR_SetPixelFloat(at.x, at.y, &r, real), at.stored);
  }
  EXPECT_EQ(eight.at(2, 1).blue, 4);
  EXPECT_EQ(sixteen.at(2, 1).alpha, 40000);
  EXPECT_EQ(real.at(0, 0).green, 3);
  EXPECT_EQ(eight.at(1, 0).blue, 0);
  EXPECT_TRUE(eight.guards_intact() && sixteen.guards_intact() && real.guards_intact());
  EXPECT_EQ(ZR_SetPixel8(0, 0, nullptr, eight), 0);
  EXPECT_EQ(ZR_SetPixel8(0, 0, &p, nullptr), 0);
}

// The stated steps one by one, in 64 bits.
template <class T>
void model_line(const f64 from[2], const f64 to[2], const T& pixel, TestWorld<T>& world) {
  const auto set = [&](i64 x, i64 y) {
    if (x >= 0 && y >= 0 && x < world.width() && y < world.height())
      world.at(static_cast<i32>(x), static_cast<i32>(y)) = pixel;
  };
  const auto away = [](f64 v) { return static_cast<i64>(65536 * v + (v < 0 ? -0.5 : 0.5)); };
  i64 x = away(from[0]), y = away(from[1]);
  const f64 dx = to[0] - from[0], dy = to[1] - from[1];
  if (std::abs(dx) < 1e-12 && std::abs(dy) < 1e-12) return set((x + 32768) >> 16, (y + 32768) >> 16);
  const bool steep = std::abs(dy) >= std::abs(dx);
  i64& major = steep ? y : x;
  i64& minor = steep ? x : y;
  i64 major_step = 65536, minor_step = away(steep ? dx / dy : dy / dx);
  const i64 snapped = (major + 32768) & ~i64{65535};
  minor += ((minor_step * (snapped - major)) >> 16) + 32768;
  major = snapped;
  i64 count = static_cast<i64>(0.5 + (steep ? to[1] : to[0])) - (snapped >> 16);
  if (count < 0) count = -count, major_step = -major_step, minor_step = -minor_step;
  for (i64 i = 0; i <= count; ++i) {
    set(x >> 16, y >> 16);
    major += major_step;
    minor += minor_step;
  }
}

template <class T>
class Lines : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(Lines, Depths);

TYPED_TEST(Lines, FollowTheSteps) {
  std::mt19937 random(9);
  const ZR_PixelFloat colour = {1, 0.25f, 0.5f, 1.5f};
  using D = zr::Depth<TypeParam>;
  TypeParam pixel = {static_cast<zr::Channel<TypeParam>>(D::white), 0, 0, 0};
  if constexpr (std::is_same_v<TypeParam, ZR_PixelFloat>)
    pixel = colour;
  else if constexpr (std::is_same_v<TypeParam, ZR_Pixel8>)
    pixel = {255, 64, 128, 383 & 255};
  else
    pixel = {32768, 8192, 16384, 49152};
  for (i32 round = 0; round < 3000; ++round) {
    TestWorld<TypeParam> drawn(17, 11), expected(17, 11);
    const u32 kind = static_cast<u32>(round) % 5;
    const auto coordinate = [&] {
      const f64 unit = static_cast<f64>(random()) * 0x1p-32;
      if (kind == 0) return std::round(unit * 20) - 2;
      if (kind == 1) return std::round(unit * 80) / 4 - 3;
      return unit * (kind == 2 ? 60000 : 40) - (kind == 2 ? 30000 : 12);
    };
    f64 from[2] = {coordinate(), coordinate()}, to[2] = {coordinate(), coordinate()};
    if (kind == 3) to[0] = from[0] + (to[1] - from[1]);  // at 45 degrees
    if (kind == 4 && round % 3 == 0) to[0] = from[0] + 1e-13, to[1] = from[1];
    ASSERT_EQ(ZR_DrawLine(from, to, &colour, drawn), 0);
    model_line(from, to, pixel, expected);
    ASSERT_TRUE(drawn == expected) << from[0] << "," << from[1] << " to " << to[0] << "," << to[1];
    ASSERT_TRUE(drawn.guards_intact());
  }
}

TEST_F(Drawing, LinesThatAreHardToDraw) {
  TestWorld<ZR_Pixel8> world(9, 9);
  const TestWorld<ZR_Pixel8> empty(9, 9);
  const ZR_PixelFloat white = {1, 1, 1, 1};
  const f64 inside[2] = {4, 4};
  for (const f64 odd : {static_cast<f64>(NAN), static_cast<f64>(INFINITY), -static_cast<f64>(INFINITY)})
    for (const i32 axis : {0, 1}) {
      f64 outside[2] = {4, 4};
      outside[axis] = odd;
      EXPECT_EQ(ZR_DrawLine(inside, outside, &white, world), 0);
      EXPECT_EQ(ZR_DrawLine(outside, inside, &white, world), 0);
      EXPECT_TRUE(world == empty);
    }
  // Ends at once although thousands of millions of pixels lie outside.
  const f64 far_right[2] = {2e9, 4}, farther[2] = {1e300, -1e300};
  EXPECT_EQ(ZR_DrawLine(inside, far_right, &white, world), 0);
  EXPECT_EQ(world.at(8, 4).red, 255);
  EXPECT_EQ(world.at(3, 4).red, 0);
  EXPECT_EQ(ZR_DrawLine(farther, inside, &white, world), 0);
  EXPECT_TRUE(world.guards_intact());
  EXPECT_EQ(ZR_DrawLine(nullptr, inside, &white, world), 3);
  EXPECT_EQ(ZR_DrawLine(inside, inside, nullptr, world), 3);
  EXPECT_EQ(ZR_DrawLine(inside, inside, &white, nullptr), 3);
}

TEST_F(Drawing, Spots) {
  std::vector<u32> weights(49);
  for (size_t i = 0; i < weights.size(); ++i) weights[i] = static_cast<u32>(i * 37 % 256);
  const ZR_Pixel8 colour = {250, 0, 100, 255};
  const struct {
    u32 flags;
    i32 half_width, half_height;
  } forms[] = {{0, 3, 3}, {1, 3, 0}, {33, 0, 3}, {32, 3, 3}};
  for (const auto& form : forms)
    for (const GX_LPoint at : {GX_LPoint{5, 4}, {0, 0}, {10, 7}, {-2, 8}, {12, -3}, {-4, 4}, {INT32_MAX, INT32_MIN}}) {
      TestWorld<ZR_Pixel8> world(11, 8);
      world.randomise(4);
      TestWorld<ZR_Pixel8> expected(world);
      for (i32 dy = -form.half_height; dy <= form.half_height; ++dy)
        for (i32 dx = -form.half_width; dx <= form.half_width; ++dx) {
          const i64 x = i64{at.x} + dx, y = i64{at.y} + dy;
          if (x < 0 || y < 0 || x >= 11 || y >= 8) continue;
          const u32 w =
              weights[static_cast<size_t>((dy + form.half_height) * (2 * form.half_width + 1) + dx + form.half_width)];
          ZR_Pixel8& p = expected.at(static_cast<i32>(x), static_cast<i32>(y));
          const auto mix = [w](u32 c, u32 k) { return static_cast<u8>((c * (255 - w) + k * w) / 255); };
          p = {mix(p.alpha, 250), mix(p.red, 0), mix(p.green, 100), mix(p.blue, 255)};
        }
      EXPECT_EQ(ZR_PaintSpot(nullptr, at.x, at.y, form.flags, 7, weights.data(), colour, world), 0);
      EXPECT_TRUE(world == expected) << form.flags << " at " << at.x << "," << at.y;
      EXPECT_TRUE(world.guards_intact());
    }
  TestWorld<ZR_Pixel8> world(3, 3);
  TestWorld<ZR_Pixel16> deep(3, 3);
  EXPECT_EQ(ZR_PaintSpot(nullptr, 1, 1, 0, 1, &weights[1], colour, world), 0);
  EXPECT_EQ(world.at(1, 1).blue, 37);
  for (const i32 diameter : {-1, 0, 2, 6, INT32_MIN})
    EXPECT_EQ(ZR_PaintSpot(nullptr, 1, 1, 0, diameter, weights.data(), colour, world), 3) << diameter;
  EXPECT_EQ(ZR_PaintSpot(nullptr, 1, 1, 0, 1, nullptr, colour, world), 3);
  EXPECT_EQ(ZR_PaintSpot(nullptr, 1, 1, 0, 1, weights.data(), colour, nullptr), 3);
  EXPECT_EQ(ZR_PaintSpot(nullptr, 1, 1, 0, 1, weights.data(), colour, deep), 3);
  EXPECT_EQ(caught.take_message(), "bad parameter passed to effect callback");
}

TEST_F(Drawing, PlanesOutAndIn) {
  void* block[69];
  ASSERT_EQ(ZR_GetCallbackBlock(1, 1, block), 0);
  const auto dispose = reinterpret_cast<ZR_HandleDisposeFunc>(block[ZR_Entry_handle_dispose]);
  for (const i32 width : {1, 15, 16, 67})
    for (u32 planes = 0; planes < 16; ++planes) {
      TestWorld<ZR_Pixel8> world(width, 5);
      world.randomise(planes);
      const TestWorld<ZR_Pixel8> before(world);
      const i32 count = std::popcount(planes);
      void** handle = nullptr;
      i32 row_bytes = 0;
      ASSERT_EQ(ZR_ExtractPlanes(nullptr, world, planes, &handle, &row_bytes), 0);
      EXPECT_EQ(row_bytes, ((width + 8) * count + 3) & ~1);
      const u8* const packed = static_cast<const u8*>(*handle);
      for (i32 y = 0; y < 5; ++y)
        for (i32 x = 0, k = 0; x < width; ++x)
          for (u32 c = 0; c < 4; ++c)
            if ((planes >> c & 1) != 0) {
              ASSERT_EQ(packed[y * row_bytes + k++], reinterpret_cast<const u8*>(&before.at(x, y))[c]);
            }
      // Back onto other pixels: the chosen channels come from the block, the rest stays.
      TestWorld<ZR_Pixel8> target(width, 5);
      target.fill({1, 2, 3, 4});
      EXPECT_EQ(ZR_InsertPlanes(nullptr, packed, row_bytes, planes, target), 0);
      for (i32 y = 0; y < 5; ++y)
        for (i32 x = 0; x < width; ++x)
          for (u32 c = 0; c < 4; ++c)
            ASSERT_EQ(reinterpret_cast<const u8*>(&target.at(x, y))[c],
                      (planes >> c & 1) != 0 ? reinterpret_cast<const u8*>(&before.at(x, y))[c] : c + 1);
      EXPECT_TRUE(world == before && target.guards_intact());
      dispose(handle);
    }
  TestWorld<ZR_Pixel8> world(4, 4);
  TestWorld<ZR_Pixel16> deep(4, 4);
  void** handle = nullptr;
  i32 row_bytes = -5;
  EXPECT_EQ(ZR_ExtractPlanes(nullptr, world, 16, &handle, &row_bytes), 3);
  EXPECT_EQ(ZR_ExtractPlanes(nullptr, deep, 1, &handle, &row_bytes), 3);
  EXPECT_EQ(ZR_ExtractPlanes(nullptr, nullptr, 1, &handle, &row_bytes), 3);
  EXPECT_EQ(ZR_ExtractPlanes(nullptr, world, 1, nullptr, &row_bytes), 3);
  caught.clear();
  for (const u64 n : {u64{1}, u64{2}}) {
    HB_FailNthAllocation(n);
    EXPECT_EQ(ZR_ExtractPlanes(nullptr, world, 7, &handle, &row_bytes), 4);
    EXPECT_NE(caught.take_message().find("image plane buffer"), std::string::npos);
  }
  EXPECT_EQ(handle, nullptr);
  EXPECT_EQ(row_bytes, -5);
  const TestWorld<ZR_Pixel8> before(world);
  const u8 data[64] = {9};
  EXPECT_EQ(ZR_InsertPlanes(nullptr, nullptr, 8, 1, world), 0);
  EXPECT_EQ(ZR_InsertPlanes(nullptr, data, 8, 99, world), 0);
  EXPECT_EQ(ZR_InsertPlanes(nullptr, data, 8, 1, nullptr), 0);
  EXPECT_TRUE(world == before && caught.quiet());
}

}  // namespace
