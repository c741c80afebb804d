// zr modules: what was found, what it rewrote, what was refused.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <nlohmann/json.hpp>

#include "tool_run.h"

namespace zr::tool {
namespace {

using testing::HasSubstr;

class Modules : public ToolRun {};

TEST_F(Modules, AreListedWithWhatTheyRewrote) {
  std::filesystem::copy_file(ZR_TEST_WRONG_MODULE, folder / "wrong.ZNX");
  std::ofstream(folder / "damaged.ZNX") << "no shared object\n";
  ASSERT_EQ(run("modules ."), 0) << err;
  EXPECT_THAT(out, HasSubstr("damaged.ZNX: refused: "));
  EXPECT_THAT(out, HasSubstr("wrong.ZNX: accepted\n"));
  EXPECT_THAT(out, HasSubstr("  rows: slot 35 (premul_row8): differs, put back\n"));
  EXPECT_THAT(out, HasSubstr("  rows: slot 36 (unmul_row8): checked, the same\n"));

  setenv("ZR_MODULE_CHECK", "off", 1);
  ASSERT_EQ(run("modules --json ."), 0) << err;
  unsetenv("ZR_MODULE_CHECK");
  const auto all = nlohmann::json::parse(out);
  ASSERT_EQ(all["files"].size(), 2u);
  EXPECT_EQ(all["files"][0]["accepted"], false);
  ASSERT_EQ(all["slots"].size(), 3u);
  EXPECT_EQ(all["slots"][0]["name"], "premul_row8");
  EXPECT_EQ(all["slots"][0]["verdict"], "not checked");

  ASSERT_EQ(run("modules /not/there"), 0) << err;
  EXPECT_EQ(out, "no modules found\n");
}

}  // namespace
}  // namespace zr::tool
