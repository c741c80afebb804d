// Acceleration modules through birth and death: used, refused, rolled back, unloaded, in their order.
#include <ADDIN/addin.h>
#include <dlfcn.h>

#include <cstdlib>
#include <functional>

#include "host/accel_modules_state.h"
#include "support/born_library.h"
#include "support/worlds.h"
#include "world/premul_rows.h"

namespace {

class Modules : public testing::Test {
 protected:
  void SetUp() override {
    setenv("ZR_LOG_LEVEL", "1000", 1);  // refusals are warnings
    ASSERT_EQ(ZR_Birth(), 0);
    std::copy(std::begin(ZRp_G_OverFuncs), std::end(ZRp_G_OverFuncs), defaults.begin());
    ASSERT_EQ(ZR_Death(), 0);
    HB_GetMemoryStats(&before_);
  }
  void TearDown() override {
    HB_FailNthAllocation(0);
    ZR_Death();
    ADDIN_SetModuleFolders(nullptr, 0);
    HB_MemoryStats now;
    HB_GetMemoryStats(&now);
    EXPECT_EQ(now.live_blocks, before_.live_blocks) << "a module left memory behind";
    unsetenv("ZR_LOG_LEVEL");
  }
  static void use_folders(std::initializer_list<const char*> names) {
    std::vector<std::string> paths;
    for (const char* name : names) paths.push_back(std::string(ZR_TEST_MODULES "/") + name);
    std::vector<const char*> pointers;
    for (const std::string& path : paths) pointers.push_back(path.c_str());
    ADDIN_SetModuleFolders(pointers.data(), static_cast<i32>(pointers.size()));
  }
  static i32 birth_with(std::initializer_list<const char*> names) {
    use_folders(names);
    return ZR_Birth();
  }
  // "300 load, 301 load, 080 problem opening..." of what was reported since the last call.
  std::string events() {
    std::string text;
    for (const auto& report : caught.messages()) {
      char code[16];
      std::snprintf(code, sizeof code, "%03x ", report.code & 0xffff);
      text += (text.empty() ? "" : ", ") + (code + report.text);
    }
    caught.clear();
    return text;
  }
  bool slots_are_default() const { return std::equal(defaults.begin(), defaults.end(), std::begin(ZRp_G_OverFuncs)); }
  static i32 ask_slot(int slot) { return reinterpret_cast<i32 (*)()>(ZRp_G_OverFuncs[slot])(); }

  std::array<ZR_SlotFunc, ZR_SlotCount> defaults{};
  CaughtMessages caught;

 private:
  HB_MemoryStats before_{};
};

constexpr char problem[] = "problem opening plug-in acceleration module.";

TEST_F(Modules, AreLoadedLastRoutineFirstAndUnloadedInTheSameOrder) {
  ASSERT_EQ(birth_with({"good"}), 0);
  EXPECT_EQ(events(), "101 load, 100 load, 201 load, 200 load");
  EXPECT_EQ(zr::loaded_module_count(), 4);
  EXPECT_EQ(ask_slot(ZR_Slot_module0), 0x200);
  EXPECT_EQ(ask_slot(ZR_Slot_module1), 0x200);
  EXPECT_EQ(ask_slot(ZR_Slot_iterate_generic), 0x200);
  EXPECT_EQ(ZRp_G_OverFuncs[ZR_Slot_iterate], defaults[ZR_Slot_iterate]);
  EXPECT_EQ(ZR_Death(), 0);
  EXPECT_EQ(events(), "101 unload, 100 unload, 201 unload, 200 unload");
  EXPECT_EQ(ZR_Death(), 0);
  EXPECT_EQ(events(), "") << "they are called once";
}

TEST_F(Modules, ASecondBirthUnloadsThoseOfTheFirstLife) {
  ASSERT_EQ(birth_with({"good"}), 0);
  events();
  ASSERT_EQ(ZR_Birth(), 0);
  EXPECT_EQ(events(), "101 unload, 100 unload, 201 unload, 200 unload, 101 load, 100 load, 201 load, 200 load");
  ASSERT_EQ(birth_with({}), 0);
  EXPECT_EQ(events(), "101 unload, 100 unload, 201 unload, 200 unload");
  EXPECT_TRUE(slots_are_default());
}

TEST_F(Modules, AFailingRoutineTakesBackItsOwnChangesOnly) {
  ASSERT_EQ(birth_with({"failing"}), 0);
  EXPECT_EQ(events(), std::string("301 load, 300 load, 080 ") + problem);
  EXPECT_EQ(ZRp_G_OverFuncs[ZR_Slot_module0], nullptr) << "written by the routine that failed";
  EXPECT_EQ(ask_slot(ZR_Slot_module1), 0x300) << "written by the one that did not";
  EXPECT_EQ(zr::loaded_module_count(), 1);
  ASSERT_EQ(ADDIN_GetScanReport().size(), 1u);
  EXPECT_FALSE(ADDIN_GetScanReport()[0].accepted);
  EXPECT_NE(ADDIN_GetScanReport()[0].reason.find("77"), std::string::npos);
  EXPECT_EQ(ZR_Death(), 0);
  EXPECT_EQ(events(), "301 unload");
}

TEST_F(Modules, ThoseBesideARefusedOneAreKept) {
  ASSERT_EQ(birth_with({"failing", "damaged", "other_version", "good", "not there"}), 0);
  EXPECT_EQ(events(), std::string("301 load, 300 load, 101 load, 100 load, 201 load, 200 load, 080 ") + problem +
                          ", 080 " + problem);
  EXPECT_EQ(ask_slot(ZR_Slot_module0), 0x200);
  EXPECT_EQ(zr::loaded_module_count(), 5);
}

TEST_F(Modules, TheFirstErrorAtDeathStopsTheCallsAndIsTheResult) {
  ASSERT_EQ(birth_with({"unload_fails", "good"}), 0);
  events();
  EXPECT_EQ(ZR_Death(), 9);
  EXPECT_EQ(events(), "501 unload");
  EXPECT_EQ(zr::loaded_module_count(), 0);
  EXPECT_EQ(ZR_Death(), 0);
  ASSERT_EQ(ZR_Birth(), 0) << "the same modules may come again";
  EXPECT_EQ(zr::loaded_module_count(), 6);
  EXPECT_EQ(ZR_Death(), 9);
}

// At whichever allocation birth or a module fails: nothing leaks, and slots belong to loaded modules only.
TEST_F(Modules, MemoryRunningShortAnywhereLeavesNothingBehind) {
  HB_MemoryStats before;
  HB_GetMemoryStats(&before);
  bool all_loaded = false;
  i32 refused = 0;
  for (u64 n = 1; !all_loaded; ++n) {
    ASSERT_LT(n, 1000u);
    use_folders({"good"});
    HB_FailNthAllocation(n);
    const i32 error = ZR_Birth();
    HB_FailNthAllocation(0);
    all_loaded = error == 0 && zr::loaded_module_count() == 4;
    refused += error == 0 && !all_loaded;
    if (error == 0 && zr::loaded_module_count() == 0) {
      EXPECT_TRUE(slots_are_default()) << "allocation " << n;
    }
    EXPECT_EQ(ZR_Death(), 0) << "allocation " << n;
    HB_MemoryStats now;
    HB_GetMemoryStats(&now);
    EXPECT_EQ(now.live_blocks, before.live_blocks) << "allocation " << n;
  }
  EXPECT_GT(refused, 3) << "manifest, routine, own record and list have to have failed once";
}

TEST_F(Modules, TheExampleEqualsTheRowThatItReplaces) {
  ASSERT_EQ(birth_with({"example"}), 0);
  EXPECT_EQ(events(), "");
  void* const file = dlopen(ZR_TEST_MODULES "/example/accelerate_premul.ZNX", RTLD_NOW | RTLD_NOLOAD);
  ASSERT_NE(file, nullptr) << "birth loaded it";
  const auto rows = reinterpret_cast<u64 (*)()>(dlsym(file, "accelerate_premul_rows"));
  const auto unloads = reinterpret_cast<u64 (*)()>(dlsym(file, "accelerate_premul_unloads"));
  ASSERT_TRUE(rows != nullptr && unloads != nullptr);

  TestWorld<ZR_Pixel8> world(256, 256), expected(256, 256);  // all colours by all alphas
  for (i32 alpha = 0; alpha < 256; ++alpha) {
    for (i32 c = 0; c < 256; ++c) {
      const u8 v = static_cast<u8>(c);
      world.at(c, alpha) =
          expected.at(c, alpha) = {static_cast<u8>(alpha), v, static_cast<u8>(255 - c), static_cast<u8>(v ^ 0x5a)};
    }
    zr::premul_row<ZR_Pixel8>(256, nullptr, &expected.at(0, alpha));
  }
  const u64 before = rows();
  EXPECT_EQ(ZR_Premul(nullptr, 1, world), 0);
  EXPECT_EQ(rows(), before + 256);
  EXPECT_TRUE(world == expected);
  EXPECT_TRUE(world.guards_intact());

  EXPECT_EQ(unloads(), 0u);
  EXPECT_EQ(ZR_Death(), 0);
  EXPECT_EQ(unloads(), 1u);
  dlclose(file);
}

}  // namespace
