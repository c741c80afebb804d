// The settings value: what is copied, what a change drops, order, hash, names and gammas.
#include <cmath>

#include "colour/colour_support.h"

namespace {

class ColourSettings : public ColourLibrary {};

TEST_F(ColourSettings, WithoutPoolIsEmptyAndRefusesProfiles) {
  ZR_ColorSettings settings;
  settings.SetLinearize(true);
  EXPECT_FALSE(settings.IsValid());
  EXPECT_EQ(settings.GetProfile().get(), nullptr);
  EXPECT_EQ(settings.GetAdjustedProfile(), TON_PRISMA_GetDefaultProfile());
  EXPECT_EQ(thrown_by([&] { settings.SetProfile(shared_profile("sRGB-v4")); }), ZR_Err_Internal);
  EXPECT_EQ(caught.take_verification(), "You have to have a valid profile pool to set a profile.");

  const ZR_ColorSettings copy(settings);
  EXPECT_FALSE(copy.GetLinearize()) << "nothing is copied from a source without a pool";
  TON_PRISMA_ProfilePool pool;
  ZR_ColorSettings kept(&pool);
  kept.SetProfile(shared_profile("DisplayP3-v4"));
  kept = settings;
  EXPECT_TRUE(kept.IsValid());
  kept = *&kept;
  EXPECT_TRUE(kept.IsValid());
}

TEST_F(ColourSettings, AChangeOfProfileClearsFlags) {
  TON_PRISMA_ProfilePool pool;
  ZR_ColorSettings settings(&pool);
  settings.SetLinearize(true);
  settings.SetLinearBlending(true);
  const auto p3 = shared_profile("DisplayP3-v4");
  settings.SetProfile(p3);
  EXPECT_FALSE(settings.GetLinearize());
  EXPECT_FALSE(settings.GetLinearBlending());
  EXPECT_TRUE(settings.IsValid());
  EXPECT_EQ(settings.GetProfile(), p3);
  EXPECT_TRUE(settings.GetProfileID() == p3->GetID());
  settings.SetLinearize(true);
  settings.SetProfileID(PRISMA_EmptyProfile_ID);
  EXPECT_FALSE(settings.GetLinearize());
  EXPECT_FALSE(settings.IsValid());
  settings.SetProfile({});
  EXPECT_FALSE(settings.IsValid()) << "an empty profile is no profile";
}

TEST_F(ColourSettings, TablesAreForBlendingThatNeedsThem) {
  TON_PRISMA_ProfilePool pool;
  ZR_ColorSettings settings(&pool);
  settings.SetProfile(shared_profile("sRGB-v4"));
  const struct {
    bool linearize, blending, force, expected;
  } cases[] = {{false, false, false, false}, {false, true, false, true}, {true, true, false, false},
               {true, false, false, false},  {true, true, true, true},   {false, false, true, true}};
  for (const auto& c : cases) {
    settings.SetLinearize(c.linearize);
    settings.SetLinearBlending(c.blending);
    EXPECT_EQ(settings.GetLinearBlendingTables(c.force) != nullptr, c.expected) << c.linearize << c.blending << c.force;
  }
  const auto tables = settings.GetLinearBlendingTables(true);
  EXPECT_EQ(settings.GetLinearBlendingTables(true), tables) << "made once";
  EXPECT_EQ(tables->from_linear[4096], 32768);
  settings.SetProfile(shared_profile("AdobeCompat-v4"));
  const auto others = settings.GetLinearBlendingTables(true);
  EXPECT_NE(others, tables) << "a change of profile drops them";
  EXPECT_GT(tables.use_count(), 0) << "a reader keeps them";
}

TEST_F(ColourSettings, AdjustedProfileAndGammaFollowLinearize) {
  TON_PRISMA_ProfilePool pool;
  ZR_ColorSettings settings(&pool);
  settings.SetProfile(shared_profile("AdobeCompat-v4"));
  EXPECT_EQ(settings.GetAdjustedProfile(), settings.GetProfile());
  EXPECT_NEAR(settings.GetCalGrayGamma(), 2.2f, 1e-3f);
  settings.SetLinearize(true);
  const auto linear = settings.GetAdjustedProfile();
  EXPECT_NE(linear, settings.GetProfile());
  EXPECT_EQ(settings.GetAdjustedProfile(), linear) << "made once";
  EXPECT_TRUE(TON_PRISMA_Profile_IsOverRange(*linear));
  EXPECT_NEAR(settings.GetCalGrayGamma(), 2.2f, 1e-3f) << "flags drop no cache";
  ZR_ColorSettings copy(settings);
  EXPECT_NEAR(copy.GetCalGrayGamma(), 1.0f, 1e-4f) << "a copy has no cache";
}

TEST_F(ColourSettings, AssignmentBetweenPools) {
  TON_PRISMA_ProfilePool here, there;
  ZR_ColorSettings a(&here), b(&there), none;
  a.SetProfile(shared_profile("Rec2020-v4"));
  a.SetLinearBlending(true);
  b = a;
  EXPECT_EQ(b.GetProfilePool(), &there);
  EXPECT_EQ(b.GetProfile(), a.GetProfile()) << "the object itself went into the other pool";
  EXPECT_TRUE(b.GetLinearBlending());
  EXPECT_TRUE(b.IsValid());
  EXPECT_TRUE(a != b) << "pools differ";
  none = a;
  EXPECT_EQ(none.GetProfilePool(), &here);
  EXPECT_TRUE(none == a);
}

TEST_F(ColourSettings, OrderIsByPoolProfileBlendingLinearize) {
  TON_PRISMA_ProfilePool pools[2];
  const auto p = shared_profile("sRGB-v4"), q = shared_profile("DisplayP3-v4");
  const auto make = [&](int pool, const boost::shared_ptr<TON_PRISMA_Profile>& profile, bool blending, bool linear) {
    ZR_ColorSettings settings(&pools[pool]);
    settings.SetProfile(profile);
    settings.SetLinearBlending(blending);
    settings.SetLinearize(linear);
    return settings;
  };
  const auto &low = p < q ? p : q, &high = p < q ? q : p;
  std::vector<ZR_ColorSettings> ordered;
  for (const int pool : {0, 1})
    for (const auto& one : {low, high})
      for (const bool blending : {false, true})
        for (const bool linear : {false, true}) ordered.push_back(make(pool, one, blending, linear));
  for (size_t i = 0; i < ordered.size(); ++i)
    for (size_t j = 0; j < ordered.size(); ++j) {
      const i32 expected = i < j ? -1 : i > j ? 1 : 0;
      EXPECT_EQ(ordered[i].GetSortOrder(ordered[j]), expected) << i << " and " << j;
      EXPECT_EQ(ordered[i] == ordered[j], i == j) << i << " and " << j;
    }
}

TEST_F(ColourSettings, RenderGuidDependsOnProfileAndFlagsOnly) {
  TON_PRISMA_ProfilePool pools[2];
  ZR_ColorSettings a(&pools[0]), b(&pools[1]);
  a.SetProfile(shared_profile("sRGB-v4"));
  b.SetProfile(shared_profile("sRGB-v4"));
  EXPECT_TRUE(a.GetRenderGuid() == b.GetRenderGuid());
  // The same in every process: another digest would make a host's caches on disk useless.
  EXPECT_EQ(a.GetRenderGuid().ToString(), "81db5f68-cf2d-994b-d0ec-dbb4151efd03");
  std::vector<std::string> seen = {a.GetRenderGuid().ToString()};
  b.SetLinearize(true);
  seen.push_back(b.GetRenderGuid().ToString());
  b.SetLinearBlending(true);
  seen.push_back(b.GetRenderGuid().ToString());
  b.SetLinearize(false);
  seen.push_back(b.GetRenderGuid().ToString());
  b.SetProfile(shared_profile("Rec709-v4"));
  seen.push_back(b.GetRenderGuid().ToString());
  std::sort(seen.begin(), seen.end());
  EXPECT_EQ(std::unique(seen.begin(), seen.end()), seen.end());
}

TEST_F(ColourSettings, PoolKeepsTheFirstOfEqualProfiles) {
  TON_PRISMA_ProfilePool pool;
  const auto first = shared_profile("sRGB-v4"), second = shared_profile("sRGB-v4");
  const _t_PRISMA_ID id = pool.AddProfile(first);
  EXPECT_TRUE(pool.AddProfile(second) == id);
  EXPECT_EQ(pool.GetProfile(id), first);
  EXPECT_TRUE(pool.AddProfile({}) == PRISMA_EmptyProfile_ID);
  EXPECT_EQ(pool.GetProfile(PRISMA_EmptyProfile_ID).get(), nullptr);
}

TEST_F(ColourSettings, NamesOfWorkingSpaces) {
  TON_PRISMA_ProfilePool pool;
  ZR_ColorSettings settings(&pool);
  EXPECT_EQ(ZR_GetWorkingSpaceProfileName(nullptr), u"Working Space - None");
  EXPECT_EQ(ZR_GetWorkingSpaceProfileName(&settings), u"Working Space - None");
  settings.SetProfile(boost::make_shared<TON_PRISMA_Profile>(PRISMA_Profile_DisplayP3));
  EXPECT_EQ(ZR_GetWorkingSpaceProfileName(&settings), u"Working Space - Display P3");
  settings.SetLinearize(true);
  EXPECT_EQ(ZR_GetWorkingSpaceProfileName(&settings), u"Working Space - Display P3 (linear)");
}

TEST_F(ColourSettings, EmergencySettingsAreOneLinearObject) {
  HB_MemoryStats before, after;
  HB_GetMemoryStats(&before);
  ZR_ColorSettings* const settings = ZR_GetEmergencyColorSettings();
  EXPECT_EQ(ZR_GetEmergencyColorSettings(), settings);
  EXPECT_TRUE(settings->IsValid());
  EXPECT_TRUE(settings->GetLinearize());
  EXPECT_EQ(settings->GetProfile(), TON_PRISMA_GetDefaultProfile());
  EXPECT_NEAR(settings->GetCalGrayGamma(), 1.0f, 1e-6f);
  EXPECT_EQ(ZR_Death(), 0);
  ASSERT_EQ(ZR_Birth(), 0);
  ZR_MakeLinearizationTables({});
  HB_GetMemoryStats(&after);
  EXPECT_EQ(after.live_blocks, before.live_blocks) << "death frees them";
}

TEST_F(ColourSettings, GammasOfCurves) {
  // The best single power of a curve, found by trying powers.
  const auto best = [](const std::function<f64(f64)>& curve) {
    f64 best_gamma = 0, least = 1e9;
    for (f64 gamma = 1.0; gamma < 3.0; gamma += 2e-4) {
      f64 sum = 0;
      for (int i = 1; i < 400; ++i) {
        const f64 x = i / 400.0, miss = std::pow(x, gamma) - curve(x);
        sum += miss * miss;
      }
      if (sum < least) least = sum, best_gamma = gamma;
    }
    return best_gamma;
  };
  const f64 of_srgb = best([](f64 x) { return x > 0.04045 ? std::pow((x + 0.055) / 1.055, 2.4) : x / 12.92; });
  const struct {
    const char* name;
    f64 gamma;
  } cases[] = {{"sRGB-v4", of_srgb},    {"sRGB-v2-magic", of_srgb}, {"DisplayP3-v4", of_srgb},
               {"AdobeCompat-v4", 2.2}, {"scRGB-v2", 1.0},          {"ProPhoto-v4", 1.8}};
  for (const auto& c : cases) {
    const TON_PRISMA_Profile one = profile(c.name);
    f32 r = 0, g = 0, b = 0;
    ZR_GetCalRGBGammas(&one, &r, &g, &b);
    EXPECT_NEAR(g, c.gamma, 1e-3) << c.name;
    EXPECT_EQ(r, g);
    EXPECT_EQ(b, g);
  }
  f32 g = 0;
  ZR_GetCalRGBGammas(nullptr, nullptr, &g, nullptr);
  EXPECT_NEAR(g, of_srgb, 1e-3);
}

TEST_F(ColourSettings, StandardProfiles) {
  const struct {
    PRISMA_ProfileCode code;
    const char* like;
  } cases[] = {{PRISMA_Profile_sRGB, "sRGB-v4"},
               {PRISMA_Profile_DisplayP3, "DisplayP3-v4"},
               {PRISMA_Profile_AdobeRGB, "AdobeCompat-v4"},
               {PRISMA_Profile_Rec2020, "Rec2020-v4"},
               {PRISMA_Profile_Rec709, "Rec709-v4"},
               {PRISMA_Profile_ProPhoto, "ProPhoto-v4"},
               {PRISMA_Profile_LinearSRGB, "scRGB-v2"}};
  for (const auto& c : cases) {
    const TON_PRISMA_Profile made(c.code), known = profile(c.like);
    EXPECT_TRUE(made.GetID() == TON_PRISMA_Profile(c.code).GetID());
    EXPECT_EQ(TON_PRISMA_Profile_IsOverRange(made), c.code == PRISMA_Profile_LinearSRGB) << c.like;
    // Through ours and back through the known one: the same colours again, to a few codes of 8 bits.
    ZR_WorldX<ZR_Pixel8> world(16, 16, 0), before(16, 16, 0);
    randomise(world, 9);
    before.CopyWorld(&world);
    const TON_PRISMA_Transform transform(known, made, 1, TON_GetDefaultPRISMAOptions());
    ZR_PRISMAApplyTransform(transform.Get(), &world, &world, false, nullptr);
    for (i32 y = 0; y < 16; ++y)
      for (i32 x = 0; x < 16; ++x) EXPECT_NEAR(world.At(x, y)->green, before.At(x, y)->green, 5) << c.like;
  }
  EXPECT_EQ(thrown_by([] { TON_PRISMA_Profile unknown(static_cast<PRISMA_ProfileCode>(77)); }), PRISMA_Err_BadParam);
}

TEST(ColourBinding, WithoutAnEngineBirthGivesOneAndColourCallsFail) {
  CaughtMessages caught;
  TON_SetQILAddressProc([](const char*) -> const void* { return nullptr; });
  EXPECT_EQ(ZR_Birth(), 1);
  EXPECT_NE(ZRp_G_OverFuncs[ZR_Slot_transfer_rect], nullptr) << "slots are filled";
  EXPECT_EQ(thrown_by([] { TON_PRISMA_GetDefaultProfile(); }), 0x67656e20);
  EXPECT_EQ(thrown_by([] { ZR_GetEmergencyColorSettings(); }), 0x67656e20);
  EXPECT_EQ(thrown_by([] { ZR_MakeLinearizationTables({}); }), 0x67656e20);
  ZR_WorldX<ZR_Pixel8> world(4, 4, 0);
  EXPECT_EQ(thrown_by([&] { ZR_PRISMAApplyTransform(nullptr, &world, &world, false, nullptr); }), 0x67656e20);
  TON_SetQILAddressProc(nullptr);
  EXPECT_EQ(ZR_Death(), 0);
}

TEST(ColourBinding, ObjectsOutliveTheEngine) {
  HB_MemoryStats before, after;
  HB_GetMemoryStats(&before);
  ASSERT_EQ(ZR_Birth(), 0);
  {
    const auto kept = TON_PRISMA_GetDefaultProfile();
    const TON_PRISMA_Transform transform(*kept, profile("DisplayP3-v4"), 1, TON_GetDefaultPRISMAOptions());
    EXPECT_EQ(ZR_Death(), 0);
    CaughtMessages caught;
    EXPECT_EQ(thrown_by([&] { kept->GetID(); }), 0x67656e20);
  }
  HB_GetMemoryStats(&after);
  EXPECT_EQ(after.live_blocks, before.live_blocks);
}

}  // namespace
