// Results of transforms against plain lcms at float precision, over profiles, intents and depths.
#include <algorithm>
#include <cmath>

#include "colour/colour_support.h"

namespace {

class EngineAccuracy : public ColourLibrary {};

template <class T>
constexpr f32 allowed_codes = std::is_same_v<T, ZR_Pixel8>    ? 1.0f
                              : std::is_same_v<T, ZR_Pixel16> ? 2.0f
                                                              : 1e-5f;

template <class T>
f32 unit(zr::Channel<T> v) {
  return static_cast<f32>(v) / white_of<T>;
}

// Largest difference of a pixel in codes; of floats relative to the largest channel, if that is above 1.
template <class To>
f32 difference(const To& is, const f32 (&should)[3]) {
  const zr::Channel<To> channels[3] = {is.red, is.green, is.blue};
  f32 worst = 0, size = 1;
  for (int c = 0; c < 3; ++c) {
    size = std::max(size, std::fabs(should[c]));
    worst = std::max(worst, std::fabs(static_cast<f32>(channels[c]) - static_cast<f32>(rounded<To>(should[c]))));
  }
  return std::is_same_v<To, ZR_PixelFloat> ? worst / size : worst;
}

template <class From, class To>
f32 worst_difference(const TON_PRISMA_Transform& transform, const PlainLcms& plain, bool wide, i32 height = 48) {
  ZR_WorldX<From> src(64, height, 0);
  ZR_WorldX<To> dst(64, height, ZR_WorldFlag_Clear);
  randomise(src, 7, wide);
  ZR_PRISMAApplyTransform(transform.Get(), &src, &dst, false, nullptr);
  f32 worst = 0;
  for (i32 y = 0; y < src.height; ++y)
    for (i32 x = 0; x < src.width; ++x) {
      const From p = *src.At(x, y);
      const To q = *dst.At(x, y);
      const f32 in[3] = {unit<From>(p.red), unit<From>(p.green), unit<From>(p.blue)};
      f32 out[3];
      plain(in, out);
      worst = std::max(worst, difference(q, out));
    }
  return worst;
}

TEST_F(EngineAccuracy, RgbBetweenAllProfilesAndDepths) {
  const char* const names[] = {"sRGB-v4",     "sRGB-v2-magic", "DisplayP3-v4", "AdobeCompat-v4",
                               "ProPhoto-v4", "Rec2020-v4",    "Rec709-v4",    "scRGB-v2"};
  for (const char* const from : names)
    for (const char* const to : names)
      for (const i32 intent : {PRISMA_Intent_RelativeColorimetric, PRISMA_Intent_AbsoluteColorimetric}) {
        SCOPED_TRACE(std::string(from) + " to " + to + ", intent " + std::to_string(intent));
        const TON_PRISMA_Profile a = profile(from), b = profile(to);
        const TON_PRISMA_Transform transform(a, b, intent, TON_GetDefaultPRISMAOptions());
        const PlainLcms plain(a, b, intent);
        each_depth([&]<class From>() {
          each_depth([&]<class To>() {
            EXPECT_LE((worst_difference<From, To>(transform, plain, true)), allowed_codes<To>)
                << zr::Depth<From>::bits << " to " << zr::Depth<To>::bits;
          });
        });
      }
}

// An inverse curve of samples is a staircase: one argument in some ten thousand lies so near to a step that only
// the same arithmetic gives the same result.
TEST_F(EngineAccuracy, StepsOfSampledCurvesAreMet) {
  const TON_PRISMA_Profile a = profile("Rec709-v4"), b = profile("sRGB-v2-magic");
  const PlainLcms plain(a, b, 1);
  const TON_PRISMA_Transform transform(a, b, 1, TON_GetDefaultPRISMAOptions());
  EXPECT_LE((worst_difference<ZR_PixelFloat, ZR_PixelFloat>(transform, plain, true, 4000)), 1e-5f);
  EXPECT_LE((worst_difference<ZR_Pixel8, ZR_Pixel16>(transform, plain, true, 4000)), 2.0f);
}

TEST_F(EngineAccuracy, PerceptualGoesThroughLcms) {
  const TON_PRISMA_Profile a = profile("DisplayP3-v4"), b = profile("sRGB-v4");
  const PlainLcms plain(a, b, PRISMA_Intent_Perceptual);
  const TON_PRISMA_Transform transform(a, b, PRISMA_Intent_Perceptual, TON_GetDefaultPRISMAOptions());
  each_depth([&]<class T>() { EXPECT_LE((worst_difference<T, T>(transform, plain, false)), allowed_codes<T>); });
}

template <class From, class To>
f32 worst_of_ink(const TON_PRISMA_Transform& transform, const PlainLcms& plain) {
  ZR_WorldX<From> src(40, 30, 0);
  ZR_WorldX<To> dst(40, 30, ZR_WorldFlag_Clear);
  randomise(src, 11);
  ZR_PRISMAApplyTransformSrcCMYK(transform.Get(), &src, &dst, false, nullptr);
  f32 worst = 0;
  for (i32 y = 0; y < src.height; ++y)
    for (i32 x = 0; x < src.width; ++x) {
      const From p = *src.At(x, y);
      const To q = *dst.At(x, y);
      const f32 in[4] = {100 * unit<From>(p.alpha), 100 * unit<From>(p.red), 100 * unit<From>(p.green),
                         100 * unit<From>(p.blue)};
      f32 out[3];
      plain(in, out);
      worst = std::max(worst, difference(q, out));
    }
  return worst;
}

TEST_F(EngineAccuracy, InkToRgb) {
  const TON_PRISMA_Profile ink = profile("CGATS001Compat-v2-micro"), rgb = profile("sRGB-v4");
  for (const i32 intent : {0, 1, 2, 3}) {
    const TON_PRISMA_Transform transform(ink, rgb, intent, TON_GetDefaultPRISMAOptions());
    const PlainLcms plain(ink, rgb, intent);
    EXPECT_LE((worst_of_ink<ZR_Pixel8, ZR_Pixel8>(transform, plain)), 1.0f) << intent;
    EXPECT_LE((worst_of_ink<ZR_Pixel16, ZR_Pixel16>(transform, plain)), 2.0f) << intent;
    EXPECT_LE((worst_of_ink<ZR_Pixel16, ZR_PixelFloat>(transform, plain)), 1e-5f) << intent;
  }
  // No ink is paper: the channel order and the sense of the values.
  const TON_PRISMA_Transform relative(ink, rgb, 1, TON_GetDefaultPRISMAOptions());
  ZR_WorldX<ZR_Pixel8> src(2, 1, 0), dst(2, 1, ZR_WorldFlag_Clear);
  *src.At(0, 0) = {0, 0, 0, 0};
  *src.At(1, 0) = {255, 0, 0, 0};  // cyan only: little red
  ZR_PRISMAApplyTransformSrcCMYK(relative.Get(), &src, &dst, false, nullptr);
  EXPECT_GT(dst.At(0, 0)->red, 250);
  EXPECT_GT(dst.At(0, 0)->blue, 250);
  EXPECT_LT(dst.At(1, 0)->red, 40);
  EXPECT_GT(dst.At(1, 0)->blue, 150);
}

TEST_F(EngineAccuracy, FastOptionsClampFloatsAndTabulate) {
  const TON_PRISMA_Profile linear = profile("scRGB-v2"), rgb = profile("sRGB-v4");
  ZR_WorldX<ZR_PixelFloat> src(1, 1, 0), dst(1, 1, 0);
  *src.At(0, 0) = {1, 4.0f, -0.5f, 0.25f};
  const auto through = [&](const PRISMA_Options& options) {
    const TON_PRISMA_Transform transform(linear, rgb, 1, options);
    ZR_PRISMAApplyTransform(transform.Get(), &src, &dst, false, nullptr);
    return *dst.At(0, 0);
  };
  EXPECT_GT(through(TON_GetDefaultPRISMAOptions()).red, 1.5f);
  EXPECT_LT(dst.At(0, 0)->green, 0.0f);
  EXPECT_EQ(through(TON_GetFastPRISMAOptions()).red, 1.0f);
  EXPECT_NEAR(dst.At(0, 0)->green, 0.0f, 1e-6f);
  EXPECT_NEAR(dst.At(0, 0)->blue, 0.537099f, 1e-4f);

  // Ink goes through a grid: near the exact result, but not the same.
  const TON_PRISMA_Profile ink = profile("CGATS001Compat-v2-micro");
  ZR_WorldX<ZR_Pixel16> inks(64, 64, 0), exact(64, 64, 0), fast(64, 64, 0), faster(64, 64, 0);
  randomise(inks, 3);
  const TON_PRISMA_Transform precise(ink, rgb, 1, TON_GetDefaultPRISMAOptions());
  const TON_PRISMA_Transform tabulated(ink, rgb, 1, TON_GetFastPRISMAOptions());
  ZR_PRISMAApplyTransformSrcCMYK(precise.Get(), &inks, &exact, false, nullptr);
  ZR_PRISMAApplyTransformSrcCMYK(tabulated.Get(), &inks, &fast, false, nullptr);
  ZR_PRISMAApplyTransformSrcCMYK(precise.Optimise(TON_GetOptimisePRISMAOptions()).Get(), &inks, &faster, false,
                                 nullptr);
  int differing = 0, worst = 0;
  for (i32 y = 0; y < 64; ++y)
    for (i32 x = 0; x < 64; ++x) {
      const int by_grid = std::abs(exact.At(x, y)->green - fast.At(x, y)->green);
      differing += by_grid != 0;
      worst = std::max({worst, by_grid, std::abs(exact.At(x, y)->green - faster.At(x, y)->green)});
    }
  EXPECT_GT(differing, 100);
  EXPECT_LT(worst, 1500);
}

TEST_F(EngineAccuracy, SameProfileChangesNothing) {
  for (const char* const name : {"sRGB-v4", "AdobeCompat-v4", "DisplayP3-v4", "scRGB-v2"}) {
    const TON_PRISMA_Transform same(profile(name), profile(name), 1, TON_GetDefaultPRISMAOptions());
    each_depth([&]<class T>() {
      if constexpr (!std::is_same_v<T, ZR_PixelFloat>) {
        ZR_WorldX<T> world(256, 4, 0), before(256, 4, 0);
        randomise(world, 5);
        for (i32 x = 0; x < 256; ++x) {
          const auto code = static_cast<zr::Channel<T>>(static_cast<f32>(x) * white_of<T> / 255.0f);
          *world.At(x, 0) = {0, code, code, code};
        }
        before.CopyWorld(&world);
        ZR_PRISMAApplyTransform(same.Get(), &world, &world, false, nullptr);
        for (i32 y = 0; y < 4; ++y)
          ASSERT_EQ(std::memcmp(world.Row(y), before.Row(y), 256 * sizeof(T)), 0) << name << " row " << y;
      }
    });
  }
}

TEST_F(EngineAccuracy, SpecialFloatsStayWhereTheyAre) {
  const TON_PRISMA_Transform transform(profile("sRGB-v4"), profile("DisplayP3-v4"), 1, TON_GetDefaultPRISMAOptions());
  const f32 inf = std::numeric_limits<f32>::infinity(), nan = std::numeric_limits<f32>::quiet_NaN();
  ZR_WorldX<ZR_PixelFloat> world(6, 1, 0);
  ZR_WorldX<ZR_Pixel8> bytes(6, 1, 0);
  const f32 values[6] = {nan, inf, -inf, 1e30f, 1e-40f, -1e-40f};
  for (i32 x = 0; x < 6; ++x) *world.At(x, 0) = {nan, values[x], 0.5f, values[x]};
  ZR_PRISMAApplyTransform(transform.Get(), &world, &bytes, false, nullptr);
  EXPECT_EQ(bytes.At(0, 0)->red, 0) << "NaN becomes black";
  EXPECT_EQ(bytes.At(1, 0)->red, 255);
  EXPECT_EQ(bytes.At(3, 0)->blue, 255);
  ZR_PRISMAApplyTransform(transform.Get(), &world, &world, false, nullptr);
  EXPECT_TRUE(std::isnan(world.At(0, 0)->red));
  for (i32 x = 1; x < 6; ++x) EXPECT_TRUE(std::isfinite(world.At(x, 0)->red)) << values[x];
}

}  // namespace
