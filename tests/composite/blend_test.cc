// The mix of two worlds against exact integers.
#include <gtest/gtest.h>

#include <algorithm>
#include <limits>
#include <utility>

#include "support/born_library.h"
#include "support/worlds.h"

namespace {

using BlendFunc = decltype(&ZR_Blend);

template <class T>
T straight(const T& p, const T& q, u64 w2) {
  const u64 w1 = 65536 - w2;
  T out;
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    const i64 a = static_cast<i64>(p.alpha * static_cast<f32>(w1)),
              b = static_cast<i64>(q.alpha * static_cast<f32>(w2));
    const f32 fa = static_cast<f32>(a), fb = static_cast<f32>(b), sum = static_cast<f32>(a + b);
    const auto colour = [&](f32 c, f32 d) { return a == 0 ? d : b == 0 ? c : (c * fa + d * fb) / sum; };
    out = {sum * 1.5258789e-5f, colour(p.red, q.red), colour(p.green, q.green), colour(p.blue, q.blue)};
  } else {
    const u64 a = p.alpha * w1, b = q.alpha * w2, sum = a + b;
    const auto colour = [&](u64 c, u64 d) {
      return static_cast<zr::Channel<T>>(a == 0 ? d : b == 0 ? c : (c * a + d * b + sum / 2) / sum);
    };
    out = {static_cast<zr::Channel<T>>((sum + 32768) / 65536), colour(p.red, q.red), colour(p.green, q.green),
           colour(p.blue, q.blue)};
  }
  return out;
}

template <class T>
T premultiplied(const T& p, const T& q, u64 w2) {
  const u64 w1 = 65536 - w2;
  const auto channel = [&](auto c, auto d) {
    if constexpr (std::is_same_v<T, ZR_PixelFloat>)
      return (c * static_cast<f32>(w1) + d * static_cast<f32>(w2)) * 1.5258789e-5f;
    else
      return static_cast<zr::Channel<T>>((c * w1 + d * w2 + 32768) / 65536);
  };
  return {channel(p.alpha, q.alpha), channel(p.red, q.red), channel(p.green, q.green), channel(p.blue, q.blue)};
}

template <class T>
class Blend : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(Blend, Depths);

TYPED_TEST(Blend, AsTheModelAtEdgeRatios) {
  using T = TypeParam;
  constexpr i32 size = 64;
  TestWorld<T> first(size, size), second(size, size, 1);
  first.randomise(1), second.randomise(2);
  for (i32 ratio : {std::numeric_limits<i32>::min(), -1, 0, 1, 2, 255, 32767, 32768, 32769, 43210, 65535, 65536,
                    0x20000, std::numeric_limits<i32>::max()}) {
    const u64 w2 = static_cast<u64>(std::clamp(ratio, 0, 65536));
    for (const auto& [blend, form] : {std::pair<BlendFunc, T (*)(const T&, const T&, u64)>{ZR_Blend, straight<T>},
                                      {ZR_Blend_Straight, straight<T>},
                                      {ZR_Blend_Premul, premultiplied<T>}}) {
      TestWorld<T> out(size, size), expected(size, size);
      for (i32 y = 0; y < size; ++y)
        for (i32 x = 0; x < size; ++x) {
          const T &p = first.at(x, y), &q = second.at(x, y);
          expected.at(x, y) = w2 == 0 ? p : w2 == 65536 ? q : form(p, q, w2);
        }
      ASSERT_EQ(blend(nullptr, first, second, ratio, out), 0);
      ASSERT_TRUE(out == expected && out.guards_intact()) << ratio;
      TestWorld<T> in_place = second;
      ASSERT_EQ(blend(nullptr, first, in_place, ratio, in_place), 0);
      ASSERT_TRUE(in_place == expected) << ratio;
    }
  }
}

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

class BlendValues : public BornLibrary {};

TEST_F(BlendValues, FloatsFarOutOfRange) {
  TestWorld<ZR_PixelFloat> first(1, 1), second(1, 1), out(1, 1);
  constexpr f32 inf = std::numeric_limits<f32>::infinity(), nan = std::numeric_limits<f32>::quiet_NaN();
  for (const auto& [a, b, alpha] : {std::tuple(60000.0f, 60000.0f, 60000.0f - 65536.0f),  // sums wrap at 32 bits
                                    std::tuple(inf, 0.0f, -32768.0f), std::tuple(nan, -inf, 0.0f)}) {
    first.fill({a, 1, 1, 1}), second.fill({b, 2, 2, 2});
    EXPECT_EQ(ZR_Blend(nullptr, first, second, 32768, out), 0);
    EXPECT_EQ(out.at(0, 0).alpha, alpha);
  }
}

}  // namespace
