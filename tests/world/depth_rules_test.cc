// The rules between depths, against arithmetic that does not share their form: points by hand, then all
// values, then rules that are close and wrong.
#include <ZR/depth.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <functional>
#include <limits>

#include "support/born_library.h"

namespace {

constexpr f32 inf = std::numeric_limits<f32>::infinity(), nan = std::numeric_limits<f32>::quiet_NaN();

i64 rounded_quotient(i64 n, i64 d) { return (2 * n + d) / (2 * d); }  // halves go up

TEST(DepthRules, EveryByteWidensAndComesBack) {
  for (i32 v = 0; v <= 255; ++v) {
    const u16 wide = zr::widen_8_to_16(static_cast<u8>(v));
    EXPECT_EQ(wide, ((v << 15) | 128) / 255) << v;
    EXPECT_EQ(zr::narrow_16_to_8(wide), v);
    EXPECT_EQ(zr::widen_8_to_float(static_cast<u8>(v)), static_cast<f32>(v) * (1.0f / 255.0f));
    EXPECT_EQ(zr::widen_8_to_float_d(static_cast<u8>(v)), static_cast<f32>(v / 255.0));
  }
  EXPECT_EQ(zr::widen_8_to_16(1), 129);
  EXPECT_EQ(zr::widen_8_to_16(254), 32640) << "not the nearest, which is 32639";
}

TEST(DepthRules, SixteenBitsNarrowToTheNearestByte) {
  for (u32 v = 0; v <= 65535; ++v)  // illegal ones wrap
    ASSERT_EQ(zr::narrow_16_to_8(static_cast<u16>(v)), (v * 255 + 16384) / 32768 % 256) << v;
}

TEST(DepthRules, DitherReplacesTheRoundingTermByFifteenBitsOfTheWord) {
  for (i32 v = 0; v <= 32768; v += 7) {
    EXPECT_EQ(zr::narrow_16_to_8_dither(static_cast<u16>(v), 0xffff8000u), v * 255 / 32768);
    EXPECT_EQ(zr::narrow_16_to_8_dither(static_cast<u16>(v), 0xffffffffu), (v * 255 + 32767) / 32768);
  }
  EXPECT_EQ(zr::dither_offset(0), -1.0f / 512.0f);
  EXPECT_EQ(zr::dither_offset(0x80000000u), 0.0f);
  EXPECT_EQ(zr::dither_offset(0x40000000u), -1.0f / 1024.0f);
}

struct FloatPoint {
  f32 in;
  i32 colour8, alpha8, vector8, colour16, alpha16;
};
const FloatPoint float_points[] = {
    {0.0f, 0, 0, 0, 0, 0},
    {1.0f, 255, 255, 255, 32768, 32768},
    {0.5f, 128, 128, 128, 16384, 16384},  // 127.5: both go to 128
    {2.5f / 255.0f, 3, 3, 2, 321, 321},   // an exact half: the vector rule takes the even
    {1.5f, 255, 127, 255, 32768, 49152},  // alpha wraps in 8 bits, and fits 16
    {3.0f, 255, 765 & 255, 255, 32768, 98304 & 65535},
    {-0.001f, 0, 0, 0, 0, (-32) & 65535},  // -0.255 + 0.5 and -32.768 + 0.5
    {-1.0f, 0, (-254) & 255, 0, 0, (-32767) & 65535},
    {1e6f, 255, 255000000 & 255, 255, 32768, 0},  // 1e6 * 32768 does not fit 32 bits
    {1e9f, 255, 0, 0, 32768, 0},                  // nor does 1e9 * 255: the lowest integer
    {-1e9f, 0, 0, 0, 0, 0},
    {inf, 255, 0, 0, 32768, 0},
    {-inf, 0, 0, 0, 0, 0},
    {nan, 0, 0, 0, 0, 0},
};

TEST(DepthRules, FloatsNarrowAsWritten) {
  ASSERT_EQ(2.5f / 255.0f * 255.0f, 2.5f) << "the point of the exact half needs it";
  for (const FloatPoint& p : float_points) {
    EXPECT_EQ(zr::narrow_float_colour<ZR_Pixel8>(p.in), p.colour8) << p.in;
    EXPECT_EQ(zr::narrow_float_alpha<ZR_Pixel8>(p.in), p.alpha8) << p.in;
    EXPECT_EQ(zr::narrow_float_to_8_nearest(p.in), p.vector8) << p.in;
    EXPECT_EQ(zr::narrow_float_colour<ZR_Pixel16>(p.in), p.colour16) << p.in;
    EXPECT_EQ(zr::narrow_float_alpha<ZR_Pixel16>(p.in), p.alpha16) << p.in;
  }
}

TEST(DepthRules, FloatsAroundEveryStepOfAByteNarrowLikeTheSlowForm) {
  for (i32 step = -300; step <= 600; ++step)
    for (const f32 nudge : {-2.0f, -1.0f, 0.0f, 1.0f, 2.0f}) {
      const f32 c = (static_cast<f32>(step) + 0.5f + nudge * 1e-5f) / 255.0f, scaled = c * 255.0f;
      const i32 even = static_cast<i32>(std::nearbyint(scaled));
      EXPECT_EQ(zr::narrow_float_to_8_nearest(c), std::clamp(even, 0, 255)) << c;
      const i32 colour = 0.0f > scaled ? 0 : scaled > 255.0f ? 255 : static_cast<i32>(scaled + 0.5f);
      EXPECT_EQ(zr::narrow_float_colour<ZR_Pixel8>(c), colour) << c;
      EXPECT_EQ(zr::narrow_float_alpha<ZR_Pixel8>(c), static_cast<i32>(scaled + 0.5f) & 255) << c;
    }
}

class BlackRules : public BornLibrary {};

TEST_F(BlackRules, EveryPairOfBytesMultipliesAndDividesToTheNearest) {
  for (i32 a = 0; a <= 255; ++a)
    for (i32 c = 0; c <= 255; ++c) {
      ASSERT_EQ(zr::premultiply<ZR_Pixel8>(static_cast<u8>(c), static_cast<u8>(a)), rounded_quotient(c * a, 255));
      const i64 quotient = c >= a ? 255 : (c * 255 + a / 2) / a;
      ASSERT_EQ(zr::unmultiply<ZR_Pixel8>(static_cast<u8>(c), static_cast<u8>(a)), quotient) << c << " / " << a;
      ASSERT_EQ(ZRp_G_fcm_table[a * 256 + c], rounded_quotient(c * a, 255));
    }
}

TEST(DepthRules, FloatsDivideByNothingThatIsZeroOrDenormal) {
  const f32 denormal = std::numeric_limits<f32>::denorm_min();
  for (const f32 a : {0.0f, -0.0f, denormal, -denormal, std::numeric_limits<f32>::min() / 2})
    EXPECT_EQ(zr::unmultiply<ZR_PixelFloat>(0.25f, a), 1.0f);
  EXPECT_EQ(zr::unmultiply<ZR_PixelFloat>(3.0f, 0.5f), 6.0f) << "no clamp";
  EXPECT_EQ(zr::unmultiply<ZR_PixelFloat>(-1.0f, -0.25f), 4.0f);
}

}  // namespace
