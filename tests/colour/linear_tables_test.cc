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

// One pixel between depths by the stated rules.
template <class To, class From>
To converted(const From& p, const ZR_LinearBlendingTables& t) {
  const auto forward = [&](i32 v) {
    v = std::min(v, 32768);
    const i32 i = v * 255 / 32768, f = v * 255 % 32768;
    return f == 0 ? i32{t.to_linear[i]} : t.to_linear[i] + ((f * (t.to_linear[i + 1] - t.to_linear[i]) + 16384) >> 15);
  };
  const auto back = [&](f32 c) {
    const f32 scaled = c * 32768.0f;
    const i32 v = !(scaled > 0) ? 0 : scaled >= 32768 ? 32768 : static_cast<i32>(scaled + 0.5f);
    const i32 i = v / 8, f = v % 8;
    return f == 0 ? i32{t.from_linear[i]}
                  : t.from_linear[i] + ((f * (t.from_linear[i + 1] - t.from_linear[i]) + 4) >> 3);
  };
  constexpr int from = zr::Depth<From>::bits, to = zr::Depth<To>::bits;
  const auto colour = [&](auto c) -> f64 {
    const i32 v = from == 32 ? 0 : static_cast<i32>(c);
    if (from == to) return c;
    if (from == 8 && to == 16) return (static_cast<u32>(v) * 0x808080u + 33200u) >> 16;
    if (from == 16 && to == 8) return (v * 255 + 16384) >> 15;
    if (from == 8) return t.to_linear[v] / 32768.0;
    if (from == 16) return forward(v) / 32768.0;
    const i32 stored = back(static_cast<f32>(c));
    return to == 16 ? stored : (stored * 255 + 16384) >> 15;
  };
  const auto alpha = [&](auto a) -> f64 {
    if (from == to || (from != 32 && to != 32)) return colour(a);
    if (from == 8) return static_cast<f32>(a) * 0.003921569f;
    if (from == 16) return static_cast<f32>(a) * 3.0517578e-5f;
    return std::trunc(static_cast<f32>(a) * (to == 8 ? 255.0f : 32768.0f) + 0.5f);
  };
  using C = zr::Channel<To>;
  return {static_cast<C>(alpha(p.alpha)), static_cast<C>(colour(p.red)), static_cast<C>(colour(p.green)),
          static_cast<C>(colour(p.blue))};
}

TEST_F(LinearTables, DepthConvertAllPairs) {
  const auto tables = ZR_MakeLinearizationTables(shared_profile("DisplayP3-v4"));
  each_depth([&]<class From>() {
    each_depth([&]<class To>() {
      ZR_WorldX<From> src(67, 41, 0);
      ZR_WorldX<To> dst(67, 41, 0);
      randomise(src, 21);
      for (i32 x = 0; x < 67; ++x)  // colours outside 0..1, and NaN
        if constexpr (std::is_same_v<From, ZR_PixelFloat>)
          src.At(x, 0)->red = x == 0 ? std::nanf("") : static_cast<f32>(x - 20) * 0.05f;
      ZR_DepthConvertWorld(tables->to_linear, &src, &dst);
      for (i32 y = std::is_same_v<From, To> ? 1 : 0; y < 41; ++y)
        for (i32 x = 0; x < 67; ++x) {
          const To expected = converted<To>(*src.At(x, y), *tables);
          ASSERT_EQ(std::memcmp(dst.At(x, y), &expected, sizeof(To)), 0)
              << zr::Depth<From>::bits << " to " << zr::Depth<To>::bits << " at " << x << ", " << y;
        }
    });
  });
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
