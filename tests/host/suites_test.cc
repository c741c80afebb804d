// Suites: what a plug-in finds by name, and the functions that no other table has.
#include <ZR/suites.h>
#include <gtest/gtest.h>

#include <cstring>

#include "support/born_library.h"

namespace {

const void* suite(const char* name, i32 version) {
  const ZR_BasicSuite* basic = nullptr;
  EXPECT_EQ(ZR_GetBasicSuite(&basic), 0);
  const void* table = nullptr;
  EXPECT_EQ(basic->acquire(name, version, &table), 0) << name;
  EXPECT_EQ(basic->release(name, version), 0) << name;
  return table;
}

struct Named {
  const char* name;
  i32 version;
  int count;
};
constexpr Named suites[] = {{"ZN CPU Data Suite", 1, 4},      {"ZR ANSI Suite", 1, 19},
                            {"ZR Handle Suite", 2, 6},        {"ZR Color Suite", 1, 8},
                            {"ZR Color16 Suite", 1, 8},       {"ZR ColorFloat Suite", 1, 8},
                            {"ZR Sampling8 Suite", 1, 3},     {"ZR Sampling16 Suite", 1, 3},
                            {"ZR SamplingFloat Suite", 1, 3}, {"ZR World Suite", 1, 2},
                            {"ZR Iterate8 Suite", 1, 5},      {"ZR iterate16 Suite", 1, 3},
                            {"ZR iterateFloat Suite", 1, 3},  {"ZR World Transform Suite", 1, 7},
                            {"ZR Fill Matte Suite", 2, 7},    {"ZR Pixel Data Suite", 1, 3},
                            {"ZR World Suite", 2, 3}};

TEST_F(BornLibrary, SuitesAreFoundWhole) {
  for (const Named& each : suites) {
    const auto* const table = static_cast<void* const*>(suite(each.name, each.version));
    ASSERT_NE(table, nullptr) << each.name;
    for (int i = 0; i < each.count; ++i) EXPECT_NE(table[i], nullptr) << each.name << ' ' << i;
  }
  const auto* const batch = static_cast<void* const*>(suite("ZR Batch Sampling Suite", 1));
  for (int i = 0; i < 4; ++i) EXPECT_EQ(batch[i], nullptr);
  const ZR_BasicSuite* basic = nullptr;
  ASSERT_EQ(ZR_GetBasicSuite(&basic), 0);
  const void* table = &basic;
  EXPECT_EQ(basic->acquire("ZR Iterate16 Suite", 1, &table), ZR_Err_BadSelector);  // its name has a small i
  EXPECT_EQ(table, nullptr);
  EXPECT_EQ(basic->acquire("ZR Handle Suite", 1, &table), ZR_Err_BadSelector);
  EXPECT_EQ(ZR_GetBasicSuite(nullptr), ZR_Err_BadParam);
}

TEST_F(BornLibrary, SuitesKeepWhatSlotsHeldAtBirth) {
  const auto* const sampling = static_cast<const ZR_Sampling8Suite1*>(suite(ZR_Sampling8Suite_Name, 1));
  const auto before = sampling->nearest;
  EXPECT_EQ(reinterpret_cast<ZR_SlotFunc>(before), ZRp_G_OverFuncs[ZR_Slot_nn_sample8]);
  ASSERT_EQ(ZR_SetOverrideFunc(ZR_Slot_nn_sample8, reinterpret_cast<void*>(sampling->area)), 0);
  EXPECT_EQ(static_cast<const ZR_Sampling8Suite1*>(suite(ZR_Sampling8Suite_Name, 1))->nearest, before);
  ASSERT_EQ(ZR_Birth(), 0);  // a second birth brings the default back, and registers anew
  EXPECT_EQ(static_cast<const ZR_Sampling8Suite1*>(suite(ZR_Sampling8Suite_Name, 1))->nearest, before);
}

TEST_F(BornLibrary, WorldSuiteKnowsFormats) {
  const auto& worlds = *static_cast<const ZR_WorldSuite2*>(suite(ZR_WorldSuite_Name, 2));
  const struct {
    const char* letters;
    i32 depth;
  } formats[] = {{"argb", 8}, {"zn16", 16}, {"zn32", 32}};
  for (const auto& each : formats) {
    u32 format = 0, read = 0;
    std::memcpy(&format, each.letters, 4);
    ZR_LayerDef world{};
    ASSERT_EQ(worlds.new_world(nullptr, 3, 2, true, format, &world), 0) << each.letters;
    i32 depth = 0;
    EXPECT_EQ(ZR_GetEffectWorldDepth(nullptr, &world, &depth), 0);
    EXPECT_EQ(depth, each.depth);
    EXPECT_EQ(worlds.get_pixel_format(&world, &read), 0);
    EXPECT_EQ(read, format);
    EXPECT_EQ(worlds.dispose_world(nullptr, &world), 0);
  }
  ZR_LayerDef world{};
  u32 format = 7;
  EXPECT_EQ(worlds.new_world(nullptr, 3, 2, true, 0x20203233, &world), ZR_Err_Internal);
  EXPECT_EQ(worlds.get_pixel_format(nullptr, &format), ZR_Err_Internal);
  world.flags = 3u << 24;
  EXPECT_EQ(worlds.get_pixel_format(&world, &format), ZR_Err_Internal);
  EXPECT_EQ(format, 7u);
}

TEST_F(BornLibrary, SuiteFunctionsWork) {
  const auto& ansi = *static_cast<const ZR_ANSISuite1*>(suite(ZR_ANSISuite_Name, 1));
  char text[16];
  EXPECT_EQ(ansi.sprintf(text, "%d", 42), 2);
  EXPECT_EQ(ansi.hypot(3, 4), 5.0);
  EXPECT_EQ(ansi.fmod(7.5, 2), 1.5);
  const auto& handles = *static_cast<const ZR_HandleSuite2*>(suite(ZR_HandleSuite_Name, 2));
  void** const handle = handles.create(4);
  ASSERT_NE(handle, nullptr);
  std::memcpy(handles.lock(handle), "abc", 4);
  EXPECT_EQ(handles.resize(handle, 4096), 0);
  EXPECT_STREQ(static_cast<const char*>(handles.lock(handle)), "abc");
  EXPECT_EQ(handles.size(handle), 4096u);
  handles.dispose(handle);
  const auto& color = *static_cast<const ZR_Color16Suite1*>(suite(ZR_Color16Suite_Name, 1));
  const ZR_Pixel16 white{32768, 32768, 32768, 32768};
  i32 luminance = 0;
  EXPECT_EQ(color.luminance(nullptr, &white, &luminance), 0);
  EXPECT_EQ(luminance, 3276800);
  const auto& cpu = *static_cast<const ZR_CPUDataSuite1*>(suite(ZR_CPUDataSuite_Name, 1));
  bool sse2 = false;
  EXPECT_EQ(cpu.has_sse2(&sse2), 0);
  EXPECT_EQ(sse2, HB_G_CPU_DataP[2] != 0);
}

}  // namespace
