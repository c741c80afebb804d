// The callback block: every entry for each quality and alpha mode, and the change of quality.
#include <cmath>
#include <set>

#include "host/callback_surface.h"
#include "world/effect_world.h"

namespace {

constexpr SlotChoice from_slots[] = {
    {0, {0, 0, 0, 0}},      {1, {2, 2, 3, 4}},      {2, {2, 2, 5, 6}},      {4, {1, 1, 1, 1}},
    {5, {7, 8, 9, 10}},     {7, {28, 28, 28, 28}},  {8, {23, 23, 24, 25}},  {11, {42, 42, 42, 42}},
    {16, {43, 43, 43, 43}}, {17, {44, 44, 44, 44}}, {56, {51, 51, 51, 51}}, {57, {53, 53, 53, 53}},
    {59, {63, 63, 64, -1}}, {60, {63, 63, 65, -1}}, {63, {42, 42, 42, 42}}, {64, {43, 43, 43, 43}},
    {65, {51, 51, 51, 51}},
};

using CallbackBlock = CallbackSurface;

TEST_F(CallbackBlock, ReadsTheTableByQualityAndAlpha) {
  mark_slots();
  for (int mode = 0; mode < 4; ++mode) {
    void* block[70];
    std::fill(std::begin(block), std::end(block), &block);
    ASSERT_EQ(ZR_GetCallbackBlock(modes[mode].quality, modes[mode].flags, block), 0);
    for (const SlotChoice& entry : from_slots)
      EXPECT_EQ(block[entry.number], slot_mark(entry.slots[mode])) << "entry " << entry.number << ", mode " << mode;
    EXPECT_EQ(block[69], &block) << "69 entries and no more";
  }
}

TEST_F(CallbackBlock, HoldsTheFixedRoutines) {
  const struct {
    int entry;
    void* straight;
    void* premul;
  } fixed[] = {
      {6, address_of(&ZR_Blend_Straight), address_of(&ZR_Blend_Premul)},
      {9, address_of(&ZR_Fill), address_of(&ZR_Fill)},
      {10, address_of(&ZR_GaussianKernel), address_of(&ZR_GaussianKernel)},
      {12, address_of(&ZR_Premul), address_of(&ZR_Premul)},
      {13, address_of(&ZR_PremulColor), address_of(&ZR_PremulColor)},
      {14, address_of(&zr::new_world_from_flags), address_of(&zr::new_world_from_flags)},
      {15, address_of(&ZR_DisposeEffectWorld), address_of(&ZR_DisposeEffectWorld)},
      {18, address_of(&transfer_rect_adapter), address_of(&transfer_rect_adapter)},
      {19, address_of(&transform_world_adapter), address_of(&transform_world_adapter)},
      {24, address_of(&ZR_GetCallbackAddr), address_of(&ZR_GetCallbackAddr)},
      {25, address_of(&ZR_AppCallback), address_of(&ZR_AppCallback)},
      {34, address_of(&ZR_Hypot), address_of(&ZR_Hypot)},
      {46, address_of(&ZR_RGBtoHLS_Straight), address_of(&ZR_RGBtoHLS_Premul)},
      {47, address_of(&ZR_HLStoRGB_Straight), address_of(&ZR_HLStoRGB_Premul)},
      {48, address_of(&ZR_RGBtoYIQ_Straight), address_of(&ZR_RGBtoYIQ_Premul)},
      {49, address_of(&ZR_YIQtoRGB_Straight), address_of(&ZR_YIQtoRGB_Premul)},
      {50, address_of(&ZR_Luminance_Straight), address_of(&ZR_Luminance_Premul)},
      {51, address_of(&ZR_Hue_Straight), address_of(&ZR_Hue_Premul)},
      {52, address_of(&ZR_Lightness_Straight), address_of(&ZR_Lightness_Premul)},
      {53, address_of(&ZR_Saturation_Straight), address_of(&ZR_Saturation_Premul)},
      {61, address_of(&ZR_Fill16), address_of(&ZR_Fill16)},
      {62, address_of(&ZR_PremulColor16), address_of(&ZR_PremulColor16)},
      {66, address_of(&ZR_GetPixelData8), address_of(&ZR_GetPixelData8)},
      {67, address_of(&ZR_GetPixelData16), address_of(&ZR_GetPixelData16)},
      {45, nullptr, nullptr},
      {68, nullptr, nullptr},
  };
  for (const Mode& mode : modes) {
    void* block[69];
    ASSERT_EQ(ZR_GetCallbackBlock(mode.quality, mode.flags, block), 0);
    for (const auto& one : fixed) EXPECT_EQ(block[one.entry], mode.flags != 0 ? one.straight : one.premul) << one.entry;
    for (const int entry : {3, 20, 21, 22, 23, 54, 55, 58}) EXPECT_NE(block[entry], nullptr) << entry;
  }
}

TEST_F(CallbackBlock, OnlyBitZeroOfFlagsAndZeroQualityCount) {
  void *best[69], *other[69];
  ASSERT_EQ(ZR_GetCallbackBlock(1, 1, best), 0);
  ASSERT_EQ(ZR_GetCallbackBlock(-7, 0x7fffff01, other), 0);
  EXPECT_TRUE(std::equal(best, best + 69, other));
}

TEST_F(CallbackBlock, IsNotReachedByLaterOverrides) {
  void* block[69];
  ASSERT_EQ(ZR_GetCallbackBlock(1, 1, block), 0);
  void* const before = block[ZR_Entry_iterate_generic];
  const SlotOverride other(ZR_Slot_iterate_generic, slot_mark(1));
  EXPECT_EQ(block[ZR_Entry_iterate_generic], before);
}

TEST_F(CallbackBlock, NullIsRefused) {
  EXPECT_EQ(ZR_GetCallbackBlock(1, 1, nullptr), 3);
  EXPECT_EQ(caught.take_message(), "bad parameter passed to effect callback");
  EXPECT_EQ(ZR_SetCallbackBlockQuality(1, 1, nullptr), 3);
}

// A switch gives the block of the new quality, but at best premultiplied 59 and 60 stay what they were.
TEST_F(CallbackBlock, SwitchingQualityRewritesWhatDependsOnItAndNothingElse) {
  mark_slots();
  const std::set<int> dependent = {1, 2, 5, 6, 8, 46, 47, 48, 49, 50, 51, 52, 53, 59, 60};
  for (const Mode& mode : modes) {
    void* fresh[69];
    ASSERT_EQ(ZR_GetCallbackBlock(mode.quality, mode.flags, fresh), 0);
    void* block[70];
    void* const mark = &block;
    std::fill(std::begin(block), std::end(block), mark);
    ASSERT_EQ(ZR_SetCallbackBlockQuality(mode.quality, mode.flags, block), 0);
    const bool gap = mode.quality != 0 && mode.flags == 0;
    for (int entry = 0; entry < 69; ++entry) {
      const bool rewritten = dependent.contains(entry) && !(gap && entry >= 59);
      EXPECT_EQ(block[entry], rewritten ? fresh[entry] : mark) << "entry " << entry;
    }
    EXPECT_EQ(block[69], mark);
  }
}

// The C library's functions in their order, told apart by what they compute.
TEST_F(CallbackBlock, HoldsTheCLibraryInItsOrder) {
  void* block[69];
  ASSERT_EQ(ZR_GetCallbackBlock(0, 0, block), 0);
  const auto unary = [&](int entry, f64 x) { return reinterpret_cast<f64 (*)(f64)>(block[entry])(x); };
  const auto binary = [&](int entry, f64 x, f64 y) { return reinterpret_cast<f64 (*)(f64, f64)>(block[entry])(x, y); };
  EXPECT_EQ(unary(26, 0.5), std::atan(0.5));
  EXPECT_EQ(binary(27, 0.5, -2), std::atan2(0.5, -2));
  EXPECT_EQ(unary(28, 0.5), 1);
  EXPECT_EQ(unary(29, 0.5), std::cos(0.5));
  EXPECT_EQ(unary(30, 0.5), std::exp(0.5));
  EXPECT_EQ(unary(31, -0.5), 0.5);
  EXPECT_EQ(unary(32, -0.5), -1);
  EXPECT_EQ(binary(33, 5.5, 2), 1.5);
  EXPECT_EQ(binary(34, 3, 4), 5);
  EXPECT_EQ(unary(35, 0.5), std::log(0.5));
  EXPECT_EQ(unary(36, 0.5), std::log10(0.5));
  EXPECT_EQ(binary(37, 2, 5), 32);
  EXPECT_EQ(unary(38, 0.5), std::sin(0.5));
  EXPECT_EQ(unary(39, 0.25), 0.5);
  EXPECT_EQ(unary(40, 0.5), std::tan(0.5));
  char text[16], copy[16];
  EXPECT_EQ(reinterpret_cast<int (*)(char*, const char*, ...)>(block[41])(text, "%d-%s", 7, "x"), 3);
  EXPECT_STREQ(reinterpret_cast<char* (*)(char*, const char*)>(block[42])(copy, text), "7-x");
  EXPECT_EQ(unary(43, 0.5), std::asin(0.5));
  EXPECT_EQ(unary(44, 0.5), std::acos(0.5));
}

}  // namespace
