// The life of a Hostkit: what it sets, what it takes back, and what it refuses.
#include <ZR/hostkit.h>
#include <ZR/platform.h>
#include <ZR/slots.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <stdexcept>

namespace {

ZR_SlotFunc iterate_slot() { return ZRp_G_OverFuncs[ZR_Slot_iterate_generic]; }
const ZR_SlotFunc serial_body = reinterpret_cast<ZR_SlotFunc>(&ZR_IterateGeneric_Static);

i32 threads_by_default() {
  i32 count = 0;
  HB_GetNumThreads(&count, 77);
  return count;
}

TEST(Hostkit, InstallsThreadsForItsLifeOnly) {
  for (const int threads : {2, 1, 3}) {
    zr::Hostkit host({.threads = threads});
    EXPECT_EQ(host.threads(), threads);
    EXPECT_EQ(iterate_slot() == serial_body, threads == 1);
    EXPECT_EQ(threads_by_default(), threads);
    EXPECT_EQ(host.End(), 0);
    EXPECT_EQ(iterate_slot(), serial_body);
    EXPECT_EQ(threads_by_default(), 77);
    EXPECT_EQ(host.End(), 0) << "a second end is nothing";
    EXPECT_EQ(host.threads(), 0);
  }
}

TEST(Hostkit, TakesTheMachinesThreadsByDefault) {
  const zr::Hostkit host;
  EXPECT_GE(host.threads(), 1);
  EXPECT_EQ(threads_by_default(), host.threads());
}

TEST(Hostkit, RefusesToBeTwo) {
  zr::Hostkit host({.threads = 2});
  EXPECT_THROW(zr::Hostkit({.threads = 3}), std::runtime_error);
  EXPECT_EQ(threads_by_default(), 2);
  EXPECT_NE(iterate_slot(), serial_body) << "the first one lives on";
}

TEST(Hostkit, ThrowsWhenBirthFailsAndLeavesNothingSet) {
  setenv("ZR_LOG_LEVEL", "1000", 1);
  std::string told;
  zr::HostkitOptions options{.threads = 4};
  options.message_sink = [&](u32, i32, const std::string& text) { told += text; };
  HB_FailNthAllocation(1);
  EXPECT_THROW(zr::Hostkit{options}, std::runtime_error);
  HB_FailNthAllocation(0);
  EXPECT_NE(told, "") << "why it failed";
  EXPECT_EQ(threads_by_default(), 77);
  told.clear();
  HBp_ReportErrString(0x250000, 8, "to nobody in particular");
  EXPECT_EQ(told, "") << "the sink is gone";
  const zr::Hostkit next(options);
  EXPECT_EQ(next.threads(), 4);
  unsetenv("ZR_LOG_LEVEL");
}

TEST(Hostkit, CarriesMessagesAndVerifications) {
  struct Report {
    u32 code;
    i32 number;
    std::string text;
    bool operator==(const Report&) const = default;
  };
  std::vector<Report> messages, verifications;
  zr::HostkitOptions options;
  options.message_sink = [&](u32 code, i32 severity, const std::string& text) {
    messages.push_back({code, severity, text});
  };
  options.verification_sink = [&](u32 code, i32 line, const std::string& text) {
    verifications.push_back({code, line, text});
  };
  const zr::Hostkit host(std::move(options));
  EXPECT_EQ(ZR_OverrideStdFuncs(), 515);
  EXPECT_EQ(messages, (std::vector<Report>{{0x25002f, 8, "Obsolete routine"}}));
  HB_ReportFailedVerification(0x250007, 42, 0, "a check");
  EXPECT_EQ(verifications, (std::vector<Report>{{0x250007, 42, "a check"}}));
}

TEST(Hostkit, LoadsModulesFromItsFoldersAndSaysGoodbyeToThem) {
  std::vector<std::string> told;
  zr::HostkitOptions options{.threads = 2};
  options.module_folders = {"/not/there", ZR_TEST_MODULES "/good"};
  options.message_sink = [&](u32, i32, const std::string& text) { told.push_back(text); };
  setenv("ZR_LOG_LEVEL", "1000", 1);
  zr::Hostkit host(std::move(options));
  EXPECT_EQ(told.size(), 4u);
  EXPECT_NE(ZRp_G_OverFuncs[ZR_Slot_module0], nullptr);
  told.clear();
  EXPECT_EQ(host.End(), 0);
  EXPECT_EQ(told, std::vector<std::string>(4, "unload"));
  const zr::Hostkit plain;
  EXPECT_EQ(ZRp_G_OverFuncs[ZR_Slot_module0], nullptr) << "folders are those of the host that named them";
  unsetenv("ZR_LOG_LEVEL");
}

TEST(Hostkit, LimitsTheFramePool) {
  zr::HostkitOptions options;
  options.frame_pool_limit = 0;
  const zr::Hostkit host(std::move(options));
  ZR_LayerDef world{};
  ASSERT_EQ(ZR_NewEffectWorld(nullptr, 64, 64, 8, true, false, &world), 0);
  ASSERT_EQ(ZR_DisposeEffectWorld(nullptr, &world), 0);
  EXPECT_EQ(RS_GetFramePoolSize(), 0u) << "nothing waits for reuse";
}

}  // namespace
