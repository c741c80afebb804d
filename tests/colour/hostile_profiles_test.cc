// Damaged profiles and memory that runs out: a code, nothing written in part, nothing left behind.
#include "colour/colour_support.h"

namespace {

class HostileProfiles : public ColourLibrary {};

// Everything that can be asked of a profile; whatever it throws is fine.
void use(const TON_PRISMA_Profile& one, const TON_PRISMA_Profile& other, bool forth, i32 intent) {
  const auto shared = boost::make_shared<TON_PRISMA_Profile>(one);
  thrown_by([&] { TON_PRISMA_Profile_GetName(one); });
  thrown_by([&] { TON_PRISMA_Profile_IsOverRange(one); });
  thrown_by([&] { TON_PRISMA_GetCalRGB(one); });
  thrown_by([&] { TON_PRISMA_GetLinearRGBProfile(shared); });
  const bool ink = one.GetColourSpace() == PRISMA_Word("CMYK");
  ZR_WorldX<ZR_Pixel8> world(3, 1, ZR_WorldFlag_Clear);
  ZR_WorldX<ZR_PixelFloat> floats(3, 1, ZR_WorldFlag_Clear);
  const i32 code = thrown_by([&] {
    const TON_PRISMA_Transform transform(forth ? one : other, forth ? other : one, intent,
                                         TON_GetDefaultPRISMAOptions());
    if (ink && forth)
      ZR_PRISMAApplyTransformSrcCMYK(transform.Get(), &world, &floats, false, nullptr);
    else
      ZR_PRISMAApplyTransform(transform.Get(), &world, &floats, false, nullptr);
  });
  EXPECT_TRUE(code == 0 || floats.At(1, 0)->red == 0.0f) << "a refused call writes nothing";
}

TEST_F(HostileProfiles, FlippedAndCut) {
  std::mt19937 random(20);
  const TON_PRISMA_Profile other(PRISMA_Profile_DisplayP3);
  int opened = 0;
  for (const char* const name : {"sRGB-v4", "sRGB-v2-magic", "scRGB-v2", "sGrey-v4", "CGATS001Compat-v2-micro"}) {
    const std::vector<u8> whole = profile_bytes(name);
    ASSERT_FALSE(whole.empty()) << name;
    const int tries = whole.size() > 4000 ? 150 : 900;
    for (int i = 0; i < tries; ++i) {
      std::vector<u8> bytes = whole;
      const u32 kind = static_cast<u32>(random()) % 4;
      if (kind == 0) bytes.resize(random() % bytes.size());
      for (u32 flips = kind == 0 ? 0 : 1 + static_cast<u32>(random()) % 6; flips > 0; --flips) {
        // Mostly in the header, the table of tags and the beginnings of tags.
        const size_t at = random() % (kind == 1 ? std::min<size_t>(bytes.size(), 360) : bytes.size());
        bytes[at] = random() % 3 == 0 ? 0xff : static_cast<u8>(random());
      }
      TON_PRISMA_Profile one;
      if (thrown_by([&] { one = TON_PRISMA_Profile(bytes.data(), bytes.size()); }) != 0) continue;
      ++opened;
      use(one, other, i % 2 == 0, i % 3 == 0 ? 3 : 1);
    }
  }
  EXPECT_GT(opened, 500) << "most damage lies behind the header";
  caught.clear();
}

TEST_F(HostileProfiles, NotProfilesAtAll) {
  const std::vector<u8> zeros(4096), whole = profile_bytes("sRGB-v4");
  EXPECT_EQ(thrown_by([&] { TON_PRISMA_Profile(zeros.data(), zeros.size()); }), PRISMA_Err_BadProfile);
  EXPECT_EQ(thrown_by([&] { TON_PRISMA_Profile(whole.data(), 100); }), PRISMA_Err_BadProfile);
  EXPECT_EQ(thrown_by([&] { TON_PRISMA_Profile(nullptr, 4096); }), PRISMA_Err_BadProfile);
  EXPECT_EQ(thrown_by([&] { TON_PRISMA_Profile(whole.data(), size_t{1} << 40); }), PRISMA_Err_BadProfile);
  caught.clear();
}

// Fails the n-th allocation for n = 1, 2, ... until the call goes through.
template <class Body>
void fail_each_allocation(const char* what, Body&& body) {
  HB_MemoryStats before, after;
  HB_GetMemoryStats(&before);
  int failures = 0;
  for (u64 n = 1; n < 2000; ++n) {
    HB_FailNthAllocation(n);
    const i32 code = thrown_by(body);
    HB_FailNthAllocation(0);
    HB_GetMemoryStats(&after);
    ASSERT_EQ(after.live_blocks, before.live_blocks) << what << " at allocation " << n;
    if (code == 0 && after.allocations - before.allocations < n) {
      EXPECT_GT(failures, 2) << what;
      return;
    }
    before.allocations = after.allocations;
    // lcms may do without a block (a cache, a name); when it cannot, the code says memory.
    EXPECT_TRUE(code == 0 || code == ZR_Err_OutOfMemory) << code << ": " << what << " at allocation " << n;
    failures += code != 0;
  }
  FAIL() << what << " never went through";
}

TEST_F(HostileProfiles, MemoryRunsOut) {
  const std::vector<u8> srgb = profile_bytes("sRGB-v4"), magic = profile_bytes("sRGB-v2-magic"),
                        ink = profile_bytes("CGATS001Compat-v2-micro");
  ZR_WorldX<ZR_Pixel8> world(8, 8, 0);
  ZR_WorldX<ZR_Pixel16> deep(8, 8, 0);
  fail_each_allocation("standard profile", [] { TON_PRISMA_Profile one(PRISMA_Profile_Rec2020); });
  fail_each_allocation("matrix transform", [&] {
    const TON_PRISMA_Profile a(srgb.data(), srgb.size()), b(magic.data(), magic.size());
    const TON_PRISMA_Transform transform(a, b, 1, TON_GetDefaultPRISMAOptions());
    ZR_PRISMAApplyTransform(transform.Get(), &world, &world, true, nullptr);
    ZR_PRISMAApplyTransform(transform.Get(), &deep, &deep, false, nullptr);
  });
  fail_each_allocation("ink transform", [&] {
    const TON_PRISMA_Profile a(ink.data(), ink.size()), b(srgb.data(), srgb.size());
    const TON_PRISMA_Transform transform(a, b, 1, TON_GetDefaultPRISMAOptions());
    ZR_PRISMAApplyTransformSrcCMYK(transform.Get(), &world, &world, false, nullptr);
  });
  fail_each_allocation("settings", [&] {
    TON_PRISMA_ProfilePool pool;
    ZR_ColorSettings settings(&pool);
    TON_PRISMA_Profile own(srgb.data(), srgb.size());
    settings.SetProfile(boost::make_shared<TON_PRISMA_Profile>(own));
    settings.SetLinearBlending(true);
    settings.GetLinearBlendingTables(false);
    settings.SetLinearize(true);
    settings.GetCalGrayGamma();
  });
  caught.clear();
}

}  // namespace
