// Preferences from a file and the environment, and the log that they steer.
#include <HB/hb.h>
#include <JRN/jrn.h>
#include <OPT/opt.h>

#include <sstream>
#include <thread>
#include <vector>

#include "support/temporary_folder.h"
#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace {

class Preferences : public testing::Test {
 protected:
  void TearDown() override { OPT_Reload(); }
  TemporaryFolder folder;
  EnvironmentVariable config{"XDG_CONFIG_HOME", folder.path()};
  EnvironmentVariable log{"ZR_LOG_FILE", folder / "log.txt"};
};

TEST_F(Preferences, TheEnvironmentStandsBeforeTheFile) {
  const EnvironmentVariable file("ZR_PREFERENCES", folder.write("p.toml", R"(
cpu = "sse4"
[log]
level = 20
[modules]
folders = ["/one", "/two"]
[deep.er]
flag = true
ratio = 0.5
word = "12x"
)"));
  OPT_Reload();
  const struct {
    const char *key, *value;
  } cases[] = {{"cpu", "sse4"},          {"log.level", "20"},      {"modules.folders", "/one:/two"},
               {"deep.er.flag", "true"}, {"deep.er.ratio", "0.5"}, {"deep.er", "none"},
               {"absent", "none"}};
  for (const auto& one : cases) EXPECT_EQ(OPT_GetString(one.key, "none"), one.value) << one.key;
  EXPECT_EQ(OPT_GetInt("log.level", 30), 20);
  EXPECT_EQ(OPT_GetInt("deep.er.word", 7), 7);
  EXPECT_EQ(OPT_GetInt("deep.er.ratio", 7), 7);
  const EnvironmentVariable level("ZR_LOG_LEVEL", "40"), flag("ZR_DEEP_ER_FLAG", "");
  EXPECT_EQ(OPT_GetInt("log.level", 30), 40);
  EXPECT_EQ(OPT_GetString("deep.er.flag", "none"), "");
}

TEST_F(Preferences, AreReadOnceUntilReloadFromTheConfigurationFolder) {
  std::filesystem::create_directory(folder / "zr");
  folder.write("zr/preferences.toml", "a = 1");
  OPT_Reload();
  EXPECT_EQ(OPT_GetInt("a", 0), 1);
  folder.write("zr/preferences.toml", "a = 2");
  EXPECT_EQ(OPT_GetInt("a", 0), 1);
  OPT_Reload();
  EXPECT_EQ(OPT_GetInt("a", 0), 2);
}

TEST_F(Preferences, ADamagedFileIsToldOnceAndCountsAsEmpty) {
  const EnvironmentVariable file("ZR_PREFERENCES", folder.write("bad.toml", "good = 1\nb = = 2\n"));
  OPT_Reload();
  EXPECT_EQ(OPT_GetInt("good", 5), 5);
  EXPECT_EQ(OPT_GetInt("good", 6), 6);
  const std::string told = slurp(folder / "log.txt");
  EXPECT_THAT(told, testing::HasSubstr("line 2"));
  EXPECT_EQ(std::count(told.begin(), told.end(), '\n'), 1) << told;
  const EnvironmentVariable missing("ZR_PREFERENCES", folder / "not_there.toml");
  OPT_Reload();
  EXPECT_EQ(OPT_GetInt("good", 5), 5);
  EXPECT_THAT(slurp(folder / "log.txt"), testing::HasSubstr("not_there.toml"));
}

TEST_F(Preferences, TheLogKeepsWholeLinesFromItsLevelUp) {
  OPT_Reload();
  JRN_Log(10, "ZR", "Birth", "below the level {}");
  std::vector<std::thread> threads;
  for (i32 t = 0; t < 4; ++t)
    threads.emplace_back([] {
      for (i32 i = 0; i < 25; ++i) JRN_Log(30, "ZR", "Key", "text with {} and %s");
    });
  for (std::thread& thread : threads) thread.join();
  HBp_ReportErrString(0x250012, 8, "a message without a sink");
  HB_ReportFailedVerification(0x250013, 77, 0, "a check without a sink");
  JRN_Log(40, nullptr, nullptr, nullptr);
  std::istringstream lines(slurp(folder / "log.txt"));
  i32 whole = 0, others = 0;
  for (std::string line; std::getline(lines, line);) line.ends_with("ZR Key: text with {} and %s") ? ++whole : ++others;
  EXPECT_EQ(whole, 100);
  EXPECT_EQ(others, 3);
  EXPECT_THAT(lines.str(), testing::HasSubstr("0x250012: a message without a sink"));
  EXPECT_THAT(lines.str(), testing::HasSubstr("0x250013:77: a check without a sink"));
  const EnvironmentVariable level("ZR_LOG_LEVEL", "10"), file("ZR_LOG_FILE", folder / "other.txt");
  JRN_Log(10, "ZR", "Birth", "ZR Birth");
  EXPECT_THAT(slurp(folder / "other.txt"), testing::HasSubstr("ZR Birth: ZR Birth"));
}

TEST_F(Preferences, ALogFileThatCannotBeOpenedIsNoFailure) {
  const EnvironmentVariable file("ZR_LOG_FILE", folder.path());
  testing::internal::CaptureStderr();
  JRN_Log(40, "ZR", "Key", "goes to the terminal");
  EXPECT_THAT(testing::internal::GetCapturedStderr(), testing::HasSubstr("goes to the terminal"));
}

}  // namespace
