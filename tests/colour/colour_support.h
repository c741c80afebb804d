// A life of the library with a colour engine, test profiles, and plain lcms to compare with.
#pragma once

#include <TON/ton.h>
#include <ZR/ZR.h>
#include <gtest/gtest.h>
#include <lcms2.h>

#include <boost/make_shared.hpp>

#include <fstream>
#include <functional>
#include <iterator>
#include <random>
#include <string>
#include <vector>

#include "support/messages.h"
#include "support/thrown.h"

// What the engine keeps for itself is made before memory is counted, and must be gone after death.
class ColourLibrary : public testing::Test {
 protected:
  void SetUp() override {
    HB_GetMemoryStats(&unborn_);
    ASSERT_EQ(ZR_Birth(), 0);
    ZR_MakeLinearizationTables({});  // also has lcms read every tag of the default profile
    HB_GetMemoryStats(&born_);
  }
  void TearDown() override {
    HB_FailNthAllocation(0);
    HB_MemoryStats now;
    HB_GetMemoryStats(&now);
    EXPECT_EQ(now.live_blocks, born_.live_blocks) << "a test left memory behind";
    EXPECT_EQ(ZR_Death(), 0);
    HB_GetMemoryStats(&now);
    EXPECT_EQ(now.live_blocks, unborn_.live_blocks) << "death left memory behind";
  }
  CaughtMessages caught;

 private:
  HB_MemoryStats unborn_{}, born_{};
};

inline std::string profile_path(const std::string& name) { return ZR_TEST_DATA "/icc/" + name + ".icc"; }
inline std::vector<u8> profile_bytes(const std::string& name) {
  std::ifstream file(profile_path(name), std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}
inline TON_PRISMA_Profile profile(const std::string& name) { return TON_PRISMA_Profile(profile_path(name).c_str()); }
inline boost::shared_ptr<TON_PRISMA_Profile> shared_profile(const std::string& name) {
  return boost::make_shared<TON_PRISMA_Profile>(profile(name));
}

// lcms by itself at float precision, in its own packing.
class PlainLcms {
 public:
  PlainLcms(const TON_PRISMA_Profile& from, const TON_PRISMA_Profile& to, i32 intent) {
    cmsHPROFILE const a = open(from), b = open(to);
    const bool ink = cmsGetColorSpace(a) == cmsSigCmykData, ink_out = cmsGetColorSpace(b) == cmsSigCmykData;
    transform_ = cmsCreateTransform(a, ink ? TYPE_CMYK_FLT : TYPE_RGB_FLT, b, ink_out ? TYPE_CMYK_FLT : TYPE_RGB_FLT,
                                    static_cast<u32>(intent), cmsFLAGS_NOOPTIMIZE);
    cmsCloseProfile(a);
    cmsCloseProfile(b);
  }
  PlainLcms(const PlainLcms&) = delete;
  ~PlainLcms() { cmsDeleteTransform(transform_); }
  // Ink is in percent on either side.
  void operator()(const f32* in, f32* out) const { cmsDoTransform(transform_, in, out, 1); }

 private:
  static cmsHPROFILE open(const TON_PRISMA_Profile& profile) {
    size_t size = 0;
    const void* const data = profile.GetData(&size);
    return cmsOpenProfileFromMem(data, static_cast<u32>(size));
  }
  cmsHTRANSFORM transform_;
};

template <class T>
constexpr f32 white_of = static_cast<f32>(zr::Depth<T>::white);

template <class T>
zr::Channel<T> rounded(f32 v) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    return v;
  } else {
    const f32 clamped = v > 0.0f ? v < 1.0f ? v : 1.0f : 0.0f;
    return static_cast<zr::Channel<T>>(clamped * white_of<T> + 0.5f);
  }
}

// Legal random pixels, edge values among them; floats also a little outside 0..1 when `wide`.
template <class T>
void randomise(ZR_WorldX<T>& world, u32 seed, bool wide = false) {
  std::mt19937 random(seed);
  const auto channel = [&]() -> zr::Channel<T> {
    const u32 word = static_cast<u32>(random());
    const f32 unit = static_cast<f32>(word >> 8) * 0x1p-24f;
    switch (word & 15) {
      case 0: return 0;
      case 1: return static_cast<zr::Channel<T>>(zr::Depth<T>::white);
      case 2: return rounded<T>(unit * unit * unit * unit);
      default: return rounded<T>(wide && std::is_same_v<T, ZR_PixelFloat> ? unit * 4.0f - 0.5f : unit);
    }
  };
  for (i32 y = 0; y < world.height; ++y)
    for (i32 x = 0; x < world.width; ++x) *world.At(x, y) = T{channel(), channel(), channel(), channel()};
}

// Runs body.template operator()<T>() for the three depths.
template <class Body>
void each_depth(Body&& body) {
  body.template operator()<ZR_Pixel8>();
  body.template operator()<ZR_Pixel16>();
  body.template operator()<ZR_PixelFloat>();
}
