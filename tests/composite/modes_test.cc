// Per-pixel transfer functions: points by hand, then every mode against a plain second telling.
#include <ZR/transfer_mode.h>

#include <bit>
#include <limits>
#include <random>

#include "composite/mode_model.h"
#include "composite/random_pixels.h"
#include "composite/soft_light_state.h"
#include "support/born_library.h"

namespace {

// One face for the nine getters.
template <class T>
void transfer(i32 mode, const T& src, const ZR_LinearBlendingTables* tables, const zr::Channel<T>* opacity, int count,
              T& dst) {
  const auto call = [&](auto plain, auto one, auto two) {
    if (count == 0) plain(mode)(src, tables, &dst);
    if (count == 1) one(mode)(src, tables, opacity[0], &dst);
    if (count == 2) two(mode)(src, tables, opacity[0], opacity[1], &dst);
  };
  if constexpr (std::is_same_v<T, ZR_Pixel8>)
    call(ZR_Get_Xfer1_table8, ZR_Get_Xfer1_Opacity_table8, ZR_Get_Xfer1_Opacity2_table8);
  else if constexpr (std::is_same_v<T, ZR_Pixel16>)
    call(ZR_Get_Xfer1_table16, ZR_Get_Xfer1_Opacity_table16, ZR_Get_Xfer1_Opacity2_table16);
  else
    call(ZR_Get_Xfer1_tableF, ZR_Get_Xfer1_Opacity_tableF, ZR_Get_Xfer1_Opacity2_tableF);
}

template <class T>
bool same(const T& a, const T& b) {
  return std::memcmp(&a, &b, sizeof(T)) == 0;
}
template <class T>
std::string text(const T& p) {
  std::string out = "(";
  for (const auto c : {p.alpha, p.red, p.green, p.blue}) out += std::to_string(c) + " ";
  return out.replace(out.size() - 1, 1, ")");
}

template <class T>
class ModesAt : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(ModesAt, Depths);
using Modes = BornLibrary;

// ------------------------------------------------------------------------------ points by hand

template <class T>
struct Point {
  const char* what;
  i32 mode;
  T src, dst, expected;
};

template <class T>
void check(std::initializer_list<Point<T>> points) {
  for (const Point<T>& p : points) {
    T d = p.dst;
    transfer<T>(p.mode, p.src, nullptr, nullptr, 0, d);
    EXPECT_TRUE(same(d, p.expected)) << p.what << ": " << text(d) << " and not " << text(p.expected);
  }
}

TEST_F(Modes, EightBitPoints) {
  check<ZR_Pixel8>({
      {"in front of nothing copies exactly", XferInFront, {77, 3, 200, 255}, {0, 9, 9, 9}, {77, 3, 200, 255}},
      {"in front, half over opaque", XferInFront, {128, 255, 0, 100}, {255, 0, 255, 100}, {255, 128, 127, 100}},
      {"behind an opaque destination", XferBehind, {255, 1, 2, 3}, {255, 7, 8, 9}, {255, 7, 8, 9}},
      {"behind nothing, opaque", XferBehind, {255, 1, 2, 3}, {0, 7, 8, 9}, {255, 1, 2, 3}},
      {"copy takes alpha too", XferCopy, {9, 1, 2, 3}, {255, 7, 8, 9}, {9, 1, 2, 3}},
      {"linear light doubles around 128", XferLinearLight, {255, 128, 255, 0}, {255, 100, 0, 255}, {255, 100, 254, 0}},
      {"hard light loses one at white", XferHardLight, {255, 255, 128, 0}, {255, 0, 9, 9}, {255, 254, 9, 0}},
      {"soft light keeps white at white", XferSoftLight, {255, 255, 0, 255}, {255, 64, 64, 1}, {255, 128, 16, 4}},
      {"exclusion of white", XferExclusion, {255, 255, 255, 0}, {255, 255, 0, 0}, {255, 0, 255, 0}},
      {"dodge of white is white", XferColorDodge, {255, 255, 255, 0}, {255, 0, 7, 7}, {255, 255, 255, 7}},
      {"weighted dodge keeps black", XferColorDodgeW, {255, 255, 255, 0}, {255, 0, 7, 7}, {255, 0, 255, 7}},
      {"weighted burn keeps white", XferColorBurnW, {255, 0, 0, 255}, {255, 255, 254, 9}, {255, 255, 0, 9}},
      {"divide by less", XferDivide, {255, 0, 100, 100}, {255, 0, 50, 101}, {255, 0, 128, 255}},
      {"alpha times alpha", XferMultiplyAlpha, {128, 1, 2, 3}, {255, 7, 8, 9}, {128, 7, 8, 9}},
      {"alpha times luma", XferMultiplyAlphaLuma, {255, 255, 0, 0}, {255, 7, 8, 9}, {76, 7, 8, 9}},
      {"alphas add to full", XferAlphaAdd, {155, 10, 10, 10}, {100, 10, 10, 10}, {255, 10, 10, 10}},
      {"alphas add to less", XferAlphaAdd, {100, 200, 0, 50}, {100, 0, 200, 50}, {200, 99, 99, 51}},
      {"premultiplied adds under alpha 0", XferAddPremul, {0, 10, 20, 250}, {255, 1, 2, 9}, {255, 11, 22, 255}},
      {"blue alone from half on", XferBlueThreshold, {128, 1, 2, 3}, {5, 7, 8, 9}, {255, 7, 8, 3}},
      {"blue not below half", XferBlueThreshold, {127, 1, 2, 3}, {5, 7, 8, 9}, {5, 7, 8, 9}},
      {"black is no marker", XferKeyProtect, {9, 1, 2, 3}, {5, 0, 0, 0}, {9, 1, 2, 3}},
      {"a quarter blue is one", XferKeyProtect, {9, 1, 2, 3}, {5, 0, 0, 64}, {5, 0, 0, 64}},
      {"three quarters blue too", XferKeyProtect, {9, 1, 2, 3}, {5, 0, 0, 191}, {5, 0, 0, 191}},
      {"red too", XferKeyProtect, {9, 1, 2, 3}, {5, 255, 0, 0}, {5, 255, 0, 0}},
      {"dissolve has no row", XferDissolve, {255, 1, 2, 3}, {5, 7, 8, 9}, {5, 7, 8, 9}},
      {"colour of grey is grey", XferColor, {255, 90, 90, 90}, {255, 255, 0, 0}, {255, 76, 76, 76}},
      {"the lighter of two", XferLighterColor, {255, 0, 255, 0}, {255, 255, 0, 255}, {255, 0, 255, 0}},
      {"the darker of two", XferDarkerColor, {255, 0, 255, 0}, {255, 255, 0, 255}, {255, 255, 0, 255}},
  });
}

TEST_F(Modes, SixteenBitPoints) {
  check<ZR_Pixel16>({
      {"add stops at white", XferAdd, {32768, 30000, 1, 0}, {32768, 30000, 1, 0}, {32768, 32768, 2, 0}},
      {"dodge of white is white", XferColorDodge, {32768, 32768, 0, 0}, {32768, 0, 5, 0}, {32768, 32768, 5, 0}},
      {"weighted dodge keeps black", XferColorDodgeW, {32768, 32768, 0, 0}, {32768, 0, 5, 0}, {32768, 0, 5, 0}},
      {"multiply pays in the inverse", XferMultiply, {32768, 1, 16384, 32768}, {32768, 16384, 1, 7}, {32768, 1, 1, 7}},
      {"hard light at white", XferHardLight, {32768, 32768, 16384, 0}, {32768, 0, 9, 9}, {32768, 32768, 9, 0}},
      {"three quarters blue", XferKeyProtect, {9, 1, 2, 3}, {5, 0, 0, 24576}, {5, 0, 0, 24576}},
      {"a quarter blue", XferKeyProtect, {9, 1, 2, 3}, {5, 0, 0, 8192}, {5, 0, 0, 8192}},
      {"the 8-bit blue is none", XferKeyProtect, {9, 1, 2, 3}, {5, 0, 0, 191}, {9, 1, 2, 3}},
  });
}

TEST_F(Modes, FloatPoints) {
  const f32 step = 1.001358e-5f;
  check<ZR_PixelFloat>({
      {"add goes on above white", XferAdd, {1, 0.75f, 2, 0}, {1, 0.75f, 3, 0}, {1, 1.5f, 5, 0}},
      {"soft light above white does nothing", XferSoftLight, {1, 0, 0.3f, 1}, {1, 2, 2, 2}, {1, 2, 2, 2}},
      {"luma of next to nothing clears alpha", XferMultiplyAlphaLuma, {1, 0, 1.7e-17f, 0}, {1, 7, 8, 9}, {0, 7, 8, 9}},
      {"luma above white stops at white", XferMultiplyAlphaLuma, {1, 9, 9, 9}, {1, 7, 8, 9}, {1, 7, 8, 9}},
      {"divide by nothing", XferDivide, {1, 0, 0, 2}, {1, 0, 1, 1}, {1, 0, 1.0f / 1.8189894e-6f, 0.5f}},
      {"dodge by white of less than black", XferColorDodge, {1, 1, 1, 1}, {1, -1, 0, 2}, {1, 1, 1, 1}},
      {"an alpha above white is partial", XferInFront, {2, 1, 1, 1}, {1, 0, 0, 0}, {1, 2, 2, 2}},
  });
  // Hard mix is a ramp of that width where s + d passes white.
  ZR_PixelFloat d{1, 1e-5f + step / 2, 1e-5f + 2 * step, 0};
  transfer<ZR_PixelFloat>(XferHardMix, {1, 1, 1, 1}, nullptr, nullptr, 0, d);
  EXPECT_FLOAT_EQ(d.red, (1e-5f + step / 2) / step < 1 ? (1e-5f + step / 2) / step : 1);
  EXPECT_EQ(d.green, 1);
  EXPECT_EQ(d.blue, 0);
  ZR_PixelFloat ramp{1, step / 2, 0, 0};
  transfer<ZR_PixelFloat>(XferHardMix, {1, 1, 0, 0}, nullptr, nullptr, 0, ramp);
  EXPECT_EQ(ramp.red, 0.5f);
}

// ------------------------------------------------------------------------------ against the second telling

template <class T>
testing::AssertionResult agrees(i32 mode, const T& src, const ZR_LinearBlendingTables* tables,
                                const zr::Channel<T>* opacity, int count, const T& dst) {
  T d = dst;
  transfer<T>(mode, src, tables, opacity, count, d);
  const T expected = model::transfer<T>(mode, src, tables, opacity, count, dst);
  if (same(d, expected)) return testing::AssertionSuccess();
  return testing::AssertionFailure() << "mode " << mode << (tables ? " linear" : "") << ", " << count
                                     << " opacities: " << text(src) << " onto " << text(dst) << " gives " << text(d)
                                     << " and not " << text(expected);
}

TEST_F(Modes, EightBitEveryPairOfChannels) {
  static constexpr u8 alphas[][2] = {{255, 255}, {255, 90}, {255, 0},   {1, 255},
                                     {128, 254}, {77, 3},   {254, 128}, {3, 0}};
  for (i32 mode = 0; mode <= 40; ++mode)
    for (const auto& [A, D] : alphas)
      for (int s = 0; s < 256; ++s)
        for (int d = 0; d < 256; d += 3) {
          const auto c = [](int v) { return static_cast<u8>(v); };
          const int d2 = std::min(d + 1, 255), d3 = std::min(d + 2, 255);
          const ZR_Pixel8 src{A, c(s), c(s), c(s)}, dst{D, c(d), c(d2), c(d3)};
          ASSERT_TRUE(agrees<ZR_Pixel8>(mode, src, nullptr, nullptr, 0, dst));
        }
}

TEST_F(Modes, EightBitEveryPairOfAlphas) {
  const ZR_Pixel8 colours[][2] = {{{0, 200, 3, 128}, {0, 10, 255, 127}}, {{0, 254, 65, 190}, {0, 128, 64, 33}}};
  for (i32 mode = 0; mode <= 40; ++mode)
    for (const auto& pair : colours)
      for (int a = 0; a < 65536; ++a) {
        ZR_Pixel8 src = pair[0], dst = pair[1];
        src.alpha = static_cast<u8>(a >> 8), dst.alpha = static_cast<u8>(a);
        ASSERT_TRUE(agrees<ZR_Pixel8>(mode, src, nullptr, nullptr, 0, dst));
      }
}

TYPED_TEST(ModesAt, RandomPixelsUnderEveryFormOfOpacity) {
  RandomPixels<TypeParam> random;
  const ZR_LinearBlendingTables tables = model::gamma_tables(2.2);
  for (i32 mode = 0; mode <= 40; ++mode)
    for (int round = 0; round < 6000; ++round) {
      const TypeParam src = random.pixel(), dst = random.pixel();
      const zr::Channel<TypeParam> opacity[2] = {random.alpha(), random.alpha()};
      ASSERT_TRUE(agrees<TypeParam>(mode, src, round % 2 ? &tables : nullptr, opacity, round % 3, dst));
    }
}

// ------------------------------------------------------------------------------ what holds for all

TYPED_TEST(ModesAt, AClearSourceChangesNothingButInAddPremul) {
  using D = zr::Depth<TypeParam>;
  RandomPixels<TypeParam> random;
  const ZR_LinearBlendingTables tables = model::gamma_tables(2.2);
  const auto white = static_cast<zr::Channel<TypeParam>>(D::white);
  for (i32 mode = 0; mode <= 40; ++mode)
    for (const auto* linear : {static_cast<const ZR_LinearBlendingTables*>(nullptr), &tables}) {
      TypeParam src = random.pixel(), dst = random.pixel();
      src.alpha = 0, src.red = white, dst.alpha = white, dst.red = 0;
      TypeParam d = dst;
      transfer<TypeParam>(mode, src, linear, nullptr, 0, d);
      EXPECT_EQ(same(d, dst), mode != XferAddPremul) << mode;
      // An opacity of 0 leaves nothing of a premultiplied source either, but its kernel still runs.
      const zr::Channel<TypeParam> none[2] = {0, 0};
      src.alpha = white, d = dst;
      transfer<TypeParam>(mode, src, linear, none, 1, d);
      EXPECT_TRUE(same(d, dst) || mode == XferAddPremul) << mode;
    }
}

TYPED_TEST(ModesAt, OpacitiesAreAppliedOneAfterTheOther) {
  if constexpr (std::is_same_v<TypeParam, ZR_Pixel8>) {
    const u8 opacity[] = {128, 2};
    ZR_Pixel8 d{0, 0, 0, 0};
    transfer<ZR_Pixel8>(XferCopy, {127, 9, 9, 9}, nullptr, opacity, 2, d);
    EXPECT_EQ(d.alpha, 1) << "63.7 is rounded to 64 between the two; the other way round it were 0";
  } else if constexpr (std::is_same_v<TypeParam, ZR_Pixel16>) {
    const u16 opacity[] = {16384, 16384};
    ZR_Pixel16 d{0, 0, 0, 0};
    transfer<ZR_Pixel16>(XferCopy, {3, 9, 9, 9}, nullptr, opacity, 2, d);
    EXPECT_EQ(d.alpha, 0) << "a half rounds down twice: 3, 1, 0";
  } else {
    const f32 opacity[] = {0.1f, 0.7f};
    ZR_PixelFloat d{0, 0, 0, 0};
    transfer<ZR_PixelFloat>(XferCopy, {0.3f, 9, 9, 9}, nullptr, opacity, 2, d);
    EXPECT_EQ(d.alpha, 0.3f * 0.1f * 0.7f);
  }
}

// Whatever is in a pixel, a call ends and reads nothing but its tables; sanitizers watch.
TYPED_TEST(ModesAt, IllegalChannelsDoNoHarm) {
  using Channel = zr::Channel<TypeParam>;
  std::vector<Channel> values;
  if constexpr (std::is_same_v<TypeParam, ZR_PixelFloat>) {
    const f32 inf = std::numeric_limits<f32>::infinity();
    values = {std::nanf(""), inf, -inf, 1e38f, -1e38f, 1e-40f, 3e9f, 0, 1, -0.0f};
  } else {
    values = {0, 1, static_cast<Channel>(~Channel{0}), static_cast<Channel>(zr::Depth<TypeParam>::white + 1)};
    if constexpr (sizeof(Channel) == 2) values.insert(values.end(), {32767, 32768, 40000, 65528});
  }
  const ZR_LinearBlendingTables tables = model::gamma_tables(2.2);
  std::mt19937 random{1};
  const auto any = [&] { return values[random() % values.size()]; };
  for (i32 mode = 0; mode <= 40; ++mode)
    for (int round = 0; round < 4000; ++round) {
      const TypeParam src{any(), any(), any(), any()};
      TypeParam guarded[3] = {src, {any(), any(), any(), any()}, src};
      const Channel opacity[2] = {any(), any()};
      transfer<TypeParam>(mode, src, round % 2 ? &tables : nullptr, opacity, round % 3, guarded[1]);
      ASSERT_TRUE(same(guarded[0], src) && same(guarded[2], src));
    }
}

// ------------------------------------------------------------------------------ tables and names

TEST_F(Modes, SlotsBehindTheModesAreNull) {
  for (i32 mode = 0; mode < 44; ++mode) {
    EXPECT_EQ(ZR_Get_Xfer1_table8(mode) != nullptr, mode <= 40) << mode;
    EXPECT_EQ(ZR_Get_Xfer1_Opacity2_tableF(mode) != nullptr, mode <= 40) << mode;
    EXPECT_EQ(ZR_Get_Xfer1_Opacity_table16(mode), ZRp_G_Xfer1_Opacity_table16[mode]);
  }
}

TEST_F(Modes, SoftLightTablesFollowTheirCurves) {
  using model::N16, model::N8, model::NF;
  for (int i = 0; i < 256; ++i) {
    EXPECT_EQ(zr::soft_light_low_8[static_cast<size_t>(i)], N8::soft(false, i)) << i;
    EXPECT_EQ(zr::soft_light_high_8[static_cast<size_t>(i)], N8::soft(true, i)) << i;
  }
  EXPECT_EQ(*std::max_element(zr::soft_light_low_8.begin(), zr::soft_light_low_8.end()), 64);
  EXPECT_EQ(*std::max_element(zr::soft_light_high_8.begin(), zr::soft_light_high_8.end()), 64);
  for (int i = 0; i <= 4096; ++i) {
    EXPECT_EQ(zr::soft_light_low_16[i], N16::soft_entry(false, i)) << i;
    EXPECT_EQ(zr::soft_light_high_16[i], N16::soft_entry(true, i)) << i;
    EXPECT_EQ(zr::soft_light_low_float[i], NF::soft_entry(false, i)) << i;
    EXPECT_EQ(zr::soft_light_high_float[i], NF::soft_entry(true, i)) << i;
  }
  EXPECT_EQ(zr::soft_light_low_float[4097], 0);
  EXPECT_EQ(zr::soft_light_high_float[4097], 0);
}

TEST_F(Modes, TransferFlags) {
  for (const i32 mode : {-3, 0, 1, 2, 4, 5, 6, 7, 9, 10, 11, 12, 13, 14, 15, 16, 22, 25, 37, 38})
    EXPECT_EQ(ZR_GetTransferFlags(mode), 1) << mode;
  for (const i32 mode : {-4, -2, -1, 3, 8, 17, 21, 23, 24, 26, 36, 39, 40, 41, 60, 61, 100, INT32_MIN, INT32_MAX})
    EXPECT_EQ(ZR_GetTransferFlags(mode), 0) << mode;
}

TEST_F(Modes, NamesAreFoundInEveryForm) {
  i32 count = 0;
  const ZR_TransferModeInfo* list = ZR_ListTransferModes(&count);
  ASSERT_EQ(count, 43);
  for (i32 i = 0; i < count; ++i) {
    EXPECT_STREQ(ZR_TransferModeName(list[i].mode), list[i].name);
    for (const char* name : {list[i].name, list[i].name + 4, list[i].short_name}) {
      i32 mode = -99;
      EXPECT_TRUE(ZR_FindTransferMode(name, &mode)) << name;
      EXPECT_EQ(mode, list[i].mode) << name;
    }
  }
  EXPECT_STREQ(ZR_TransferModeName(23), "XferColorDodge");
  struct Case {
    const char* name;
    i32 mode;  // -99: none
  };
  for (const Case& c : {Case{"in-front", 2},
                        {"IN FRONT", 2},
                        {"infront", 2},
                        {"xfer_color_dodge_w", 27},
                        {"multiply-not-alpha-luma", 20},
                        {"", -99},
                        {"xfer", -99},
                        {"scree", -99},
                        {"screens", -99},
                        {"-", -99}}) {
    i32 mode = -99;
    EXPECT_EQ(ZR_FindTransferMode(c.name, &mode), c.mode != -99) << c.name;
    EXPECT_EQ(mode, c.mode) << c.name;
  }
  for (const i32 mode : {-1, -4, 41}) EXPECT_EQ(ZR_TransferModeName(mode), nullptr);
}

}  // namespace
