// Slots that modules rewrote, looked at by a Hostkit; and files that are no modules.
#include <ZR/hostkit.h>
#include <ZR/module.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <optional>

#include "slot_trials.h"

namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

class ModuleCheck : public testing::Test {
 protected:
  void SetUp() override {
    log_ = testing::TempDir() + "zr_" + testing::UnitTest::GetInstance()->current_test_info()->name() + ".log";
    std::filesystem::remove(log_);
    setenv("ZR_LOG_FILE", log_.c_str(), 1);
  }
  void TearDown() override {
    host.reset();
    unsetenv("ZR_LOG_FILE");
    unsetenv("ZR_MODULE_CHECK");
    std::filesystem::remove(log_);
  }
  // Null: the preference is not set.
  void live_with(const char* folder, const char* check) {
    host.reset();
    check != nullptr ? setenv("ZR_MODULE_CHECK", check, 1) : unsetenv("ZR_MODULE_CHECK");
    zr::HostkitOptions options{.threads = 1};
    if (folder != nullptr) options.module_folders = {std::string(ZR_TEST_MODULES "/") + folder};
    options.message_sink = [](u32, i32, const std::string&) {};
    host.emplace(std::move(options));
  }
  // "premul_row8 2" and so on: the slots found rewritten, with verdicts.
  static std::vector<std::string> found() {
    std::vector<std::string> all;
    ZR_ModuleSlot slot{};
    for (i32 i = 0; ZR_GetModuleSlot(i, &slot) == 0; ++i) {
      EXPECT_STREQ(slot.routine, "rows");
      all.push_back(std::string(ZR_GetSlotName(slot.slot)) + ' ' + std::to_string(slot.verdict));
    }
    return all;
  }
  // Since the last call.
  std::string log() {
    std::ifstream stream(log_);
    const std::string all{std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
    const std::string news = all.substr(std::min(read_, all.size()));
    read_ = all.size();
    return news;
  }
  static u8 red_of_half() {
    ZR_Pixel8 pixel{128, 100, 0, 0};
    reinterpret_cast<ZR_ModuleRow8>(ZRp_G_OverFuncs[ZR_Slot_premul_row8])(1, nullptr, &pixel);
    return pixel.red;
  }
  std::optional<zr::Hostkit> host;

 private:
  std::string log_;
  std::size_t read_ = 0;
};

TEST_F(ModuleCheck, PutsExactlyTheWrongSlotBack) {
  live_with(nullptr, nullptr);
  std::vector<ZR_SlotFunc> defaults(std::begin(ZRp_G_OverFuncs), std::end(ZRp_G_OverFuncs));
  for (const char* strict : {static_cast<const char*>(nullptr), "strict", "whatever"}) {
    live_with("wrong", strict);
    EXPECT_THAT(found(), ElementsAre("premul_row8 2", "unmul_row8 3", "unmul_row16 3"));
    EXPECT_EQ(red_of_half(), 50);
    for (int slot = 0; slot < ZR_SlotCount; ++slot)
      EXPECT_EQ(ZRp_G_OverFuncs[slot] == defaults[static_cast<size_t>(slot)],
                slot != ZR_Slot_unmul_row8 && slot != ZR_Slot_unmul_row16)
          << slot;
    const std::string told = log();
    EXPECT_THAT(told, HasSubstr("slot 35 (premul_row8) of rows does not do what the routine before it does: put back"));
    EXPECT_THAT(told, Not(HasSubstr("unmul_row8")));
    const bool unknown = strict != nullptr && strict[0] == 'w';
    EXPECT_EQ(told.find("module.check is 'whatever'") != std::string::npos, unknown);
    ASSERT_EQ(host->End(), 0);
    EXPECT_THAT(found(), IsEmpty()) << "after death";
  }
}

TEST_F(ModuleCheck, WarnKeepsAndOffDoesNotAsk) {
  live_with("wrong", "warn");
  EXPECT_THAT(found(), ElementsAre("premul_row8 1", "unmul_row8 3", "unmul_row16 3"));
  EXPECT_EQ(red_of_half(), 51);
  EXPECT_THAT(log(), HasSubstr("slot 35 (premul_row8) of rows does not do what the routine before it does: kept"));
  live_with("wrong", "off");
  EXPECT_THAT(found(), ElementsAre("premul_row8 0", "unmul_row8 0", "unmul_row16 0"));
  EXPECT_EQ(red_of_half(), 51);
  EXPECT_EQ(log(), "");
}

TEST_F(ModuleCheck, FillsAnEmptiedSlotAgainAndLetsARightModuleBe) {
  live_with("emptying", "strict");
  EXPECT_THAT(found(), ElementsAre("premul_row8 2"));
  EXPECT_EQ(red_of_half(), 50);
  EXPECT_THAT(log(), HasSubstr("premul_row8"));
  live_with("right", "strict");
  EXPECT_THAT(found(), ElementsAre("unmul_row8 3", "unmul_row16 3"));
  EXPECT_EQ(log(), "");
}

TEST_F(ModuleCheck, FilesThatAreNoModulesAreToldWithTheReason) {
  const struct {
    const char *folder, *reason;
  } cases[] = {{"damaged", "damaged.ZNX"},
               {"nameless", "it exports no ZR_Module"},
               {"newer", "its descriptor has version 7 and not 1"},
               {"without_entry", "loading it gave error 516"},
               {"other_version", "none of its routines was taken"}};
  for (const auto& each : cases) {
    live_with(each.folder, nullptr);
    ZR_ModuleFile file{};
    ASSERT_EQ(ZR_GetModuleFile(0, &file), 0) << each.folder;
    EXPECT_EQ(file.accepted, 0) << each.folder;
    EXPECT_THAT(file.path, HasSubstr(each.folder));
    EXPECT_THAT(file.reason, HasSubstr(each.reason));
    EXPECT_EQ(ZR_GetModuleFile(1, &file), ZR_Err_BadParam);
    EXPECT_THAT(found(), IsEmpty());
    EXPECT_EQ(red_of_half(), 50) << "the library lives on";
  }
}

// A slot against itself: the signature that a trial has in mind is that of the routine, or a sanitizer speaks.
TEST_F(ModuleCheck, TrialsRunAndRepeat) {
  live_with(nullptr, nullptr);
  int tried = 0;
  for (i32 slot = 0; slot < ZR_SlotCount; ++slot) {
    zr::SlotTrial* const trial = zr::slot_trial(slot);
    if (trial == nullptr) continue;
    ++tried;
    const ZR_SlotFunc routine = ZRp_G_OverFuncs[slot];
    ASSERT_NE(routine, nullptr) << slot;
    EXPECT_EQ(zr::check_slot(nullptr, slot, routine, routine), 0) << ZR_GetSlotName(slot);
    zr::Outcome outcome;
    trial(routine, outcome);
    EXPECT_FALSE(outcome == zr::Outcome()) << ZR_GetSlotName(slot);
  }
  EXPECT_GE(tried, 40);
}

// Slots of one signature whose routines differ: each trial tells them apart.
TEST_F(ModuleCheck, TrialsTellRoutinesApart) {
  live_with(nullptr, nullptr);
  const struct {
    i32 slot, other;
  } pairs[] = {{ZR_Slot_premul_row16, ZR_Slot_unmul_row16},
               {ZR_Slot_premul_rowFloat, ZR_Slot_unmul_rowFloat},
               {ZR_Slot_white_fade_row8, ZR_Slot_grey_fade_row8},
               {ZR_Slot_nn_sample8, ZR_Slot_bilinear_straight8},
               {ZR_Slot_bilinear_straight8, ZR_Slot_bilinear_premul8},
               {ZR_Slot_bilinear_straight16, ZR_Slot_area_straight16},
               {ZR_Slot_copy_bits_draft, ZR_Slot_copy_bits_hq_straight},
               {ZR_Slot_copy_bits_hq_premul, ZR_Slot_copy_bits_draft}};
  for (const auto& each : pairs)
    EXPECT_EQ(zr::check_slot(nullptr, each.slot, ZRp_G_OverFuncs[each.slot], ZRp_G_OverFuncs[each.other]), 1)
        << ZR_GetSlotName(each.slot);
}

}  // namespace
