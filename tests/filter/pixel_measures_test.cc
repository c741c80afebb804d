// Pixel measures and conversions: stated values, exact integer measures of random pixels, and round trips.
#include <ZR/pixel_measures.h>

#include <cmath>

#include "support/born_library.h"

namespace {

constexpr i32 one = 65536;

class PixelMeasures : public BornLibrary {};

TEST_F(PixelMeasures, RoundTripsAndSumsOfRoundedTerms) {
  for (u32 seed = 0; seed < 4096; ++seed) {
    const u32 word = seed * 2654435761u;
    const ZR_Pixel8 p = {200, static_cast<u8>(word), static_cast<u8>(word >> 8), static_cast<u8>(word >> 16)};
    i32 words[3];
    const auto expect_back = [&](const ZR_Pixel8& back, i32 within) {
      EXPECT_EQ(back.alpha, 7) << "alpha is the caller's";
      EXPECT_NEAR(back.red, p.red, within);
      EXPECT_NEAR(back.green, p.green, within);
      EXPECT_NEAR(back.blue, p.blue, within);
    };
    ZR_Pixel8 back = {7, 0, 0, 0};
    ZR_RGBtoHLS_Straight(nullptr, &p, words);
    ZR_HLStoRGB_Straight(nullptr, words, &back);
    expect_back(back, 0);
    ZR_RGBtoYIQ_Straight(nullptr, &p, words);
    const auto term = [](f32 unit, f32 weight) {
      return static_cast<i32>(std::lround(static_cast<f64>(unit * weight) * one));
    };
    const f32 r = static_cast<f32>(p.red) / 255, g = static_cast<f32>(p.green) / 255,
              b = static_cast<f32>(p.blue) / 255;
    EXPECT_NEAR(words[0], term(r, 0.2989f) + term(g, 0.5866f) + term(b, 0.1144f), 1);
    EXPECT_NEAR(words[1], term(r, 0.5959f) + term(g, -0.2741f) + term(b, -0.3218f), 1);
    EXPECT_NEAR(words[2], term(r, 0.2113f) + term(g, -0.5227f) + term(b, 0.3113f), 1);
    ZR_YIQtoRGB_Straight(nullptr, words, &back);
    expect_back(back, 1);
    // At 16 bits the same words give the same colours, finer.
    ZR_Pixel16 deep = {7, 0, 0, 0};
    ZR_YIQtoRGB_Straight16(nullptr, words, &deep);
    EXPECT_NEAR(deep.red * 255 / 32768.0, back.red, 0.51);
    EXPECT_EQ(deep.alpha, 7);
  }
  const i32 bright[3] = {3 * one, 0, 0};
  ZR_PixelFloat above = {0.25f, 0, 0, 0};
  ZR_YIQtoRGB_StraightFloat(nullptr, bright, &above);
  EXPECT_EQ(above.green, 3.0f);
  EXPECT_EQ(above.alpha, 0.25f);
}

TEST_F(PixelMeasures, OfAnythingAreDefined) {
  i32 words[3] = {INT32_MIN, INT32_MAX, INT32_MIN}, number;
  f32 real;
  ZR_PixelFloat odd = {NAN, INFINITY, -INFINITY, NAN};
  ZR_Pixel16 illegal = {65535, 65535, 65000, 65535};
  EXPECT_EQ(ZR_HLStoRGB_Straight16(nullptr, words, &illegal), 0);
  EXPECT_EQ(ZR_RGBtoHLS_StraightFloat(nullptr, &odd, words), 0);
  EXPECT_EQ(ZR_RGBtoYIQ_StraightFloat(nullptr, &odd, words), 0);
  EXPECT_EQ(ZR_Hue_StraightFloat(nullptr, &odd, &real), 0);
  illegal = {65535, 65535, 65000, 0};
  EXPECT_EQ(ZR_Saturation_Straight16(nullptr, &illegal, &number), 0);
  EXPECT_EQ(number, 1);
  EXPECT_EQ(ZR_Luminance_Straight(nullptr, nullptr, &number), 0);
  EXPECT_EQ(ZR_HLStoRGB_Premul(nullptr, words, nullptr), 0);
  EXPECT_EQ(ZR_YIQtoRGB_Premul(nullptr, nullptr, nullptr), 0);
}

}  // namespace
