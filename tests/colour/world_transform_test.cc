// Transforms on worlds: which road is taken, what happens to alpha, polls and refusals; the monitor path.
#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <memory>
#include <thread>

#include "colour/colour_support.h"
#include "support/worlds.h"

namespace {

class WorldTransform : public ColourLibrary {
 protected:
  TON_PRISMA_Transform to_p3() {
    return TON_PRISMA_Transform(profile("sRGB-v4"), profile("DisplayP3-v4"), 1, TON_GetDefaultPRISMAOptions());
  }
};

TEST_F(WorldTransform, AllRoadsGiveTheSameColours) {
  const TON_PRISMA_Transform transform = to_p3();
  each_depth([&]<class T>() {
    ZR_WorldX<T> src(160, 300, 0), packed(160, 300, ZR_WorldFlag_Clear);  // above the size that goes out in bands
    randomise(src, 31);
    ASSERT_EQ(src.row_bytes, 160 * static_cast<i32>(sizeof(T)));
    TestWorld<T> padded_memory(160, 300), alpha_memory(160, 300, 0);
    ZR_WorldX<T> padded(padded_memory.layer(), true), with_alpha(alpha_memory.layer(), true);
    ZR_PRISMAApplyTransform(transform.Get(), &src, &packed, false, nullptr);
    ZR_PRISMAApplyTransform(transform.Get(), &src, &padded, false, nullptr);
    ZR_PRISMAApplyTransform(transform.Get(), &src, &with_alpha, true, nullptr);
    ZR_WorldX<T> in_place(160, 300, 0);
    in_place.CopyWorld(&src);
    ZR_PRISMAApplyTransform(transform.Get(), &in_place, &in_place, false, nullptr);
    for (i32 y = 0; y < 300; ++y)
      for (i32 x = 0; x < 160; ++x) {
        T expected = *packed.At(x, y);
        ASSERT_EQ(expected.alpha, 0) << "alpha stays as it was";
        ASSERT_EQ(std::memcmp(padded.At(x, y), &expected, sizeof(T)), 0);
        expected.alpha = src.At(x, y)->alpha;
        ASSERT_EQ(std::memcmp(with_alpha.At(x, y), &expected, sizeof(T)), 0);
        ASSERT_EQ(std::memcmp(in_place.At(x, y), &expected, sizeof(T)), 0);
      }
    EXPECT_TRUE(padded_memory.guards_intact());
    EXPECT_TRUE(alpha_memory.guards_intact());
  });
}

struct Polls {
  std::vector<i32> rows;
  i32 total = 0, stop_at = -1;
  static i32 progress(void* self, i32 done, i32 total) {
    static_cast<Polls*>(self)->total = total;
    return abort(self, done);
  }
  static i32 abort(void* self, i32 row) {
    auto& polls = *static_cast<Polls*>(self);
    polls.rows.push_back(row);
    return row == polls.stop_at ? 77 : 0;
  }
};
i32 abort_with_row(void* self, i32 row) { return Polls::abort(self, row); }

TEST_F(WorldTransform, PollsEvery64thRowOnTheRowRoad) {
  const TON_PRISMA_Transform transform = to_p3();
  TestWorld<ZR_Pixel8> from(9, 200), to(9, 200);
  from.randomise(3);
  ZR_WorldX<ZR_Pixel8> src(from.layer(), true), dst(to.layer(), true);
  Polls polls;
  const ZR_ProgressInfo with_progress = {&polls, nullptr, Polls::progress};
  ZR_PRISMAApplyTransform(transform.Get(), &src, &dst, false, &with_progress);
  EXPECT_EQ(polls.rows, (std::vector<i32>{63, 127, 191}));
  EXPECT_EQ(polls.total, 200);

  polls = {};
  polls.stop_at = 127;
  to.clear();
  const ZR_ProgressInfo with_abort = {&polls, std::bit_cast<ZR_AbortFunc>(&abort_with_row), nullptr};
  EXPECT_EQ(thrown_by([&] { ZR_PRISMAApplyTransform(transform.Get(), &src, &dst, true, &with_abort); }), 77);
  EXPECT_EQ(polls.rows, (std::vector<i32>{63, 127}));
  for (i32 y = 0; y < 200; ++y)
    for (i32 x = 0; x < 9; ++x) EXPECT_EQ(to.at(x, y).alpha, y < 128 ? from.at(x, y).alpha : 0) << "whole rows";

  polls = {};
  ZR_WorldX<ZR_Pixel8> packed(16, 200, 0);
  ZR_PRISMAApplyTransform(transform.Get(), &packed, &packed, false, &with_progress);
  EXPECT_TRUE(polls.rows.empty()) << "one piece";
}

TEST_F(WorldTransform, Refusals) {
  const TON_PRISMA_Transform rgb = to_p3();
  const TON_PRISMA_Transform ink(profile("CGATS001Compat-v2-micro"), profile("sRGB-v4"), 1,
                                 TON_GetDefaultPRISMAOptions());
  ZR_WorldX<ZR_Pixel8> eight(8, 8, ZR_WorldFlag_Clear), narrow(7, 8, ZR_WorldFlag_Clear);
  ZR_WorldX<ZR_Pixel16> sixteen(8, 8, ZR_WorldFlag_Clear);
  ZR_WorldX<ZR_PixelFloat> floats(8, 8, ZR_WorldFlag_Clear);
  const auto untouched = [&] {
    for (i32 i = 0; i < 64; ++i)
      if (*reinterpret_cast<u32*>(eight.At(i % 8, i / 8)) != 0) return false;
    return true;
  };
  EXPECT_EQ(thrown_by([&] { ZR_PRISMAApplyTransform(rgb.Get(), &sixteen, &eight, true, nullptr); }), ZR_Err_Internal);
  EXPECT_EQ(caught.take_verification(), "Can't copy alpha if src and dst have different depth.");
  EXPECT_EQ(thrown_by([&] { ZR_PRISMAApplyTransformSrcCMYK(ink.Get(), &floats, &eight, false, nullptr); }),
            ZR_Err_Internal);
  EXPECT_EQ(caught.take_verification(), "ZRp_PRISMAApplyTransform only works on 8 and 16 bit CMYK data");
  EXPECT_EQ(thrown_by([&] { ZR_PRISMAApplyTransform(rgb.Get(), &eight, &narrow, false, nullptr); }), ZR_Err_Internal);
  EXPECT_FALSE(caught.take_verification().empty());
  EXPECT_EQ(thrown_by([&] { ZR_PRISMAApplyTransform(ink.Get(), &eight, &eight, false, nullptr); }),
            PRISMA_Err_ColourSpace);
  EXPECT_EQ(thrown_by([&] { ZR_PRISMAApplyTransformSrcCMYK(rgb.Get(), &eight, &eight, true, nullptr); }),
            PRISMA_Err_ColourSpace);
  EXPECT_EQ(thrown_by([&] { ZR_PRISMAApplyTransform(nullptr, &eight, &eight, false, nullptr); }), PRISMA_Err_BadParam);
  const TON_PRISMA_Profile grey = profile("sGrey-v4"), srgb = profile("sRGB-v4");
  const PRISMA_Options options = TON_GetDefaultPRISMAOptions();
  EXPECT_EQ(thrown_by([&] { TON_PRISMA_Transform(grey, srgb, 1, options); }), PRISMA_Err_ColourSpace);
  EXPECT_EQ(thrown_by([&] { TON_PRISMA_Transform(srgb, grey, 1, options); }), PRISMA_Err_ColourSpace);
  EXPECT_EQ(thrown_by([&] { TON_PRISMA_Transform(srgb, srgb, 4, options); }), PRISMA_Err_BadParam);
  EXPECT_EQ(thrown_by([&] { TON_PRISMA_Transform(TON_PRISMA_Profile(), srgb, 1, options); }), PRISMA_Err_BadProfile);
  EXPECT_EQ(thrown_by([&] { ZR_GetCalRGBGammas(&grey, nullptr, nullptr, nullptr); }), PRISMA_Err_ColourSpace);
  EXPECT_EQ(thrown_by([] { TON_PRISMA_Profile missing("/nowhere/at/all.icc"); }), PRISMA_Err_File);
  EXPECT_TRUE(untouched());
  caught.clear();
  eight.height = 0;
  ZR_PRISMAApplyTransform(rgb.Get(), &eight, &eight, true, nullptr);
  eight.height = 8;
  EXPECT_TRUE(caught.quiet());
}

TEST_F(WorldTransform, ConvertProfileToProfile) {
  ZR_WorldX<ZR_Pixel16> world(1, 1, 0);
  *world.At(0, 0) = {9, 32768, 0, 0};
  ZR_ConvertProfileToProfile(PRISMA_Profile_sRGB, PRISMA_Profile_DisplayP3, &world, &world, true, nullptr);
  EXPECT_EQ(world.At(0, 0)->alpha, 9);
  EXPECT_NEAR(world.At(0, 0)->red / 32768.0, 0.9175, 1e-3);  // the red of sRGB in Display P3
  EXPECT_NEAR(world.At(0, 0)->green / 32768.0, 0.2003, 1e-3);
  EXPECT_NEAR(world.At(0, 0)->blue / 32768.0, 0.1387, 1e-3);
}

TEST_F(WorldTransform, LinearizeBothWays) {
  const auto p3 = shared_profile("DisplayP3-v4"), rec = shared_profile("Rec2020-v4");
  ZR_WorldX<ZR_PixelFloat> world(1, 1, 0);
  *world.At(0, 0) = {1, 0.5f, 0.5f, 0.5f};
  ZR_PRISMAApplyTransform(ZR_GetLinearizeTransform(p3, p3, true).Get(), &world, &world, false, nullptr);
  EXPECT_NEAR(world.At(0, 0)->red, 0.214041f, 1e-4f);
  ZR_PRISMAApplyTransform(ZR_GetLinearizeTransform(p3, p3, false).Get(), &world, &world, false, nullptr);
  EXPECT_NEAR(world.At(0, 0)->red, 0.5f, 1e-5f);
  *world.At(0, 0) = {1, 0, 1.0f, 0};
  ZR_PRISMAApplyTransform(ZR_GetLinearizeTransform(p3, rec, true).Get(), &world, &world, false, nullptr);
  EXPECT_NEAR(world.At(0, 0)->red, 0.19858f, 2e-3f);  // the green of P3 by the primaries of Rec. 2020
}

// First uses race for the tables; whoever comes later takes what is there.
TEST_F(WorldTransform, OneTransformFromManyThreads) {
  for (const bool by_lcms : {false, true}) {
    const TON_PRISMA_Transform transform(profile("sRGB-v4"), profile("DisplayP3-v4"), by_lcms ? 0 : 1,
                                         TON_GetDefaultPRISMAOptions());
    ZR_WorldX<ZR_Pixel8> src(64, 40, 0);
    randomise(src, 41);
    std::vector<std::unique_ptr<ZR_WorldX<ZR_Pixel8>>> results;
    for (int i = 0; i < 4; ++i) results.push_back(std::make_unique<ZR_WorldX<ZR_Pixel8>>(64, 40, ZR_WorldFlag_Clear));
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i)
      threads.emplace_back([&, i] {
        ZR_PRISMAApplyTransform(transform.Get(), &src, results[static_cast<size_t>(i)].get(), i % 2 != 0, nullptr);
      });
    for (std::thread& thread : threads) thread.join();
    for (i32 y = 0; y < 40; ++y) {
      EXPECT_EQ(std::memcmp(results[0]->Row(y), results[2]->Row(y), 64 * 4), 0);
      EXPECT_EQ(std::memcmp(results[1]->Row(y), results[3]->Row(y), 64 * 4), 0);
      EXPECT_EQ(results[0]->At(7, y)->green, results[1]->At(7, y)->green);
    }
  }
}

// Legs of plain lcms at float precision, one after the other.
using Legs = std::vector<std::shared_ptr<PlainLcms>>;

TEST_F(WorldTransform, DisplayBranches) {
  const TON_PRISMA_Profile working = profile("DisplayP3-v4"), linear = profile("scRGB-v2"),
                           display = profile("AdobeCompat-v4"), simulation = profile("Rec709-v4"),
                           output = profile("sRGB-v4");
  const auto leg = [](const TON_PRISMA_Profile& a, const TON_PRISMA_Profile& b, i32 intent) {
    return std::make_shared<PlainLcms>(a, b, intent);
  };
  const struct {
    const char* what;
    const TON_PRISMA_Profile &from, *simulation, *output;
    bool skip;
    Legs legs;
  } cases[] = {
      {"direct", working, nullptr, nullptr, false, {leg(working, display, 1)}},
      {"direct, over range", linear, nullptr, nullptr, false, {leg(linear, display, 3)}},
      {"simulation without output", working, &simulation, nullptr, false, {leg(working, display, 1)}},
      {"output", working, nullptr, &output, false, {leg(working, output, 1), leg(output, display, 1)}},
      {"output, over range", linear, nullptr, &output, false, {leg(linear, output, 3), leg(output, display, 1)}},
      {"skip", working, nullptr, &output, true, {leg(output, display, 1)}},
      {"chain",
       working,
       &simulation,
       &output,
       false,
       {leg(working, simulation, 1), leg(simulation, output, 1), leg(output, display, 1)}},
      {"chain cut", working, &simulation, &output, true, {leg(working, simulation, 1), leg(output, display, 1)}},
      {"over-range simulation", working, &linear, &output, true, {leg(working, linear, 3), leg(output, display, 1)}},
  };
  for (const auto& c : cases)
    for (const bool fast : {false, true}) {
      const TON_PRISMA_Transform transform =
          ZR_NewDisplayTransform(c.from, display, c.simulation, c.output, c.skip, fast);
      ZR_WorldX<ZR_Pixel8> src(32, 32, 0), dst(32, 32, 0);
      randomise(src, 17);
      ZR_PRISMAApplyTransform(transform.Get(), &src, &dst, false, nullptr);
      int worst = 0;
      for (i32 y = 0; y < 32; ++y)
        for (i32 x = 0; x < 32; ++x) {
          const ZR_Pixel8 p = *src.At(x, y), q = *dst.At(x, y);
          f32 colour[3] = {static_cast<f32>(p.red) / 255, static_cast<f32>(p.green) / 255,
                           static_cast<f32>(p.blue) / 255};
          for (const auto& one : c.legs) (*one)(colour, colour);
          worst = std::max({worst, std::abs(q.red - rounded<ZR_Pixel8>(colour[0])),
                            std::abs(q.green - rounded<ZR_Pixel8>(colour[1])),
                            std::abs(q.blue - rounded<ZR_Pixel8>(colour[2]))});
        }
      EXPECT_LE(worst, 1) << c.what << (fast ? ", fast" : "");
    }
}

TEST_F(WorldTransform, DisplayPreferenceClips) {
  const char* const key = "ZR_DISPLAY TRANSFORM SECTION_CLIP OVER RANGE IN DISPLAY TRANSFORM WHEN NOT THEATER PREVIEW";
  const TON_PRISMA_Profile working = profile("sRGB-v4"), display = profile("DisplayP3-v4");
  ZR_WorldX<ZR_PixelFloat> src(1, 1, 0), dst(1, 1, 0);
  *src.At(0, 0) = {1, 1.5f, 1.5f, 1.5f};
  const auto shown = [&] {
    ZR_PRISMAApplyTransform(ZR_NewDisplayTransform(working, display, nullptr, nullptr, false, false).Get(), &src, &dst,
                            false, nullptr);
    return dst.At(0, 0)->red;
  };
  EXPECT_NEAR(shown(), 1.5f, 1e-4f);
  ASSERT_EQ(setenv(key, "true", 1), 0);
  EXPECT_EQ(shown(), 1.0f);
  ASSERT_EQ(setenv(key, "perhaps", 1), 0);
  EXPECT_EQ(thrown_by(shown), ZR_Err_BadParam);
  ASSERT_EQ(unsetenv(key), 0);
}

TEST_F(WorldTransform, DisplayProfileFromThePreference) {
  EXPECT_TRUE(ZR_GetPlatformDisplayProfile(nullptr).GetID() == TON_PRISMA_GetDefaultProfile()->GetID());
  ASSERT_EQ(setenv("ZR_DISPLAY_PROFILE", profile_path("AdobeCompat-v4").c_str(), 1), 0);
  EXPECT_TRUE(ZR_GetPlatformDisplayProfile(nullptr).GetID() == profile("AdobeCompat-v4").GetID());
  ASSERT_EQ(setenv("ZR_DISPLAY_PROFILE", "/nowhere/at/all.icc", 1), 0);
  EXPECT_TRUE(ZR_GetPlatformDisplayProfile(nullptr).GetID() == TON_PRISMA_GetDefaultProfile()->GetID());
  ASSERT_EQ(unsetenv("ZR_DISPLAY_PROFILE"), 0);
}

}  // namespace
