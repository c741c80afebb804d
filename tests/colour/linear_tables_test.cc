// Tables of linear light against a second telling, and worlds between depths.
#include <cmath>

#include "colour/colour_support.h"
#include "support/odd_world.h"

namespace {

class LinearTables : public ColourLibrary {};

// Linear value of a grey by plain lcms, and the inverse by a search that walks nothing.
std::vector<i32> plain_to_linear(const TON_PRISMA_Profile& profile) {
  const auto shared = boost::make_shared<TON_PRISMA_Profile>(profile);
  const PlainLcms plain(profile, *TON_PRISMA_GetLinearRGBProfile(shared), 1);
  std::vector<i32> out;
  for (u32 i = 0; i < 256; ++i) {
    const f32 stored = static_cast<f32>((i * 0x808080u + 33200u) >> 16) / 32768.0f;
    const f32 in[3] = {stored, stored, stored};
    f32 linear[3];
    plain(in, linear);
    out.push_back(rounded<ZR_Pixel16>(linear[0]));
  }
  return out;
}

i32 searched_from_linear(const u16 (&to_linear)[256], i32 linear) {
  std::vector<i32> u(4097);
  for (i32 k = 0; k <= 4096; ++k) {
    const i64 t = 8 * static_cast<i64>(k) * 255;
    const i64 i = t / 32768, f = t % 32768;
    u[static_cast<size_t>(k)] =
        k == 4096
            ? to_linear[255]
            : static_cast<i32>(to_linear[i] +
                               std::floor(static_cast<f64>(f * (to_linear[i + 1] - to_linear[i]) + 16384) / 32768));
    if (k > 0) u[static_cast<size_t>(k)] = std::max(u[static_cast<size_t>(k)], u[static_cast<size_t>(k) - 1]);
  }
  if (linear >= u[4096]) return 32768;
  size_t j = 0;
  for (size_t k = 0; k < 4096; ++k)
    if (u[k] <= linear) j = k;
  if (linear < u[0]) return 0;
  const i32 low = u[j], high = u[j + 1];
  return ((high - low) / 2 + (linear - low) * 8) / (high - low) + 8 * static_cast<i32>(j);
}

TEST_F(LinearTables, ConstructionBitForBit) {
  for (const char* const name :
       {"sRGB-v4", "sRGB-v2-magic", "AdobeCompat-v4", "ProPhoto-v4", "Rec709-v4", "scRGB-v2"}) {
    const auto one = shared_profile(name);
    const auto tables = ZR_MakeLinearizationTables(one);
    const std::vector<i32> plain = plain_to_linear(*one);
    for (u32 i = 0; i < 256; ++i) EXPECT_NEAR(tables->to_linear[i], plain[i], 1) << name << " " << i;
    for (i32 k = 0; k <= 4096; ++k)
      ASSERT_EQ(tables->from_linear[k], searched_from_linear(tables->to_linear, 8 * k)) << name << " " << k;
    f32 green = 0;
    ZR_GetCalRGBGammas(one.get(), nullptr, &green, nullptr);
    EXPECT_EQ(tables->to_linear_gamma, green);
    EXPECT_EQ(tables->from_linear_gamma, static_cast<f32>(1.0 / green));
    EXPECT_EQ(tables->to_linear[255], 32768);
    EXPECT_EQ(tables->from_linear[4096], 32768);
  }
}

TEST_F(LinearTables, EmptyIsSrgbAndWrongProfilesAreRefused) {
  const auto tables = ZR_MakeLinearizationTables({});
  EXPECT_NEAR(tables->to_linear[188], 16384, 250);  // sRGB: half the light is code 188
  EXPECT_EQ(thrown_by([] { ZR_MakeLinearizationTables(shared_profile("sGrey-v4")); }), PRISMA_Err_ColourSpace);
  EXPECT_EQ(thrown_by([] { ZR_MakeLinearizationTables(shared_profile("CGATS001Compat-v2-micro")); }),
            PRISMA_Err_ColourSpace);
}

TEST_F(LinearTables, DepthConvertRefusals) {
  const auto tables = ZR_MakeLinearizationTables({});
  ZR_WorldX<ZR_Pixel8> src(4, 4, 0);
  ZR_WorldX<ZR_Pixel16> wide(5, 4, ZR_WorldFlag_Clear), small(2, 2, ZR_WorldFlag_Clear);
  randomise(src, 1);
  ZR_DepthConvertWorld(tables->to_linear, &src, &wide);
  EXPECT_EQ(wide.At(0, 0)->alpha | wide.At(3, 3)->red, 0) << "unequal sizes: nothing is done";
  OddWorld odd(2);
  EXPECT_EQ(thrown_by([&] { ZR_DepthConvertWorld(tables->to_linear, &odd, &small); }), ZR_Err_Internal);
  EXPECT_EQ(caught.take_verification(), "Unknown bit depth attempting to depth convert.");
  EXPECT_EQ(thrown_by([&] { ZR_DepthConvertWorld(tables->to_linear, &small, &odd); }), ZR_Err_Internal);
  caught.clear();
  const TON_PRISMA_Transform transform = ZR_GetLinearizeTransform({}, {}, true);
  EXPECT_EQ(thrown_by([&] { ZR_PRISMAApplyTransform(transform.Get(), &odd, &small, true, nullptr); }), ZR_Err_Internal);
  EXPECT_EQ(caught.take_verification(), "Unknown world bitdepth in##CONDITIONNAME");
}

}  // namespace
