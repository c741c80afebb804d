// zr verify: what differs is named, and the exit code says so.
#include <nlohmann/json.hpp>

#include "tool_run.h"
#include "verify/manifest.h"

namespace zr::tool {
namespace {

using testing::HasSubstr;

class Verify : public ToolRun {
 protected:
  int verify(const std::string& arguments) { return run("verify " + arguments); }
};

// The built-in manifest with one line damaged.
Manifest damaged(const char* operation, i32 depth) {
  Manifest manifest = parse_manifest(embedded_manifest(), "built in");
  char& digit = manifest.at({operation, depth})[7];
  digit = digit == '0' ? '1' : '0';
  return manifest;
}

constexpr const char* kQuick = " --cpu scalar --threads 1,2 --operation fill --operation transfer/screen";

TEST_F(Verify, NamesADamagedLine) {
  folder.write("m.txt", manifest_text(damaged("transfer/screen", 16)));
  EXPECT_EQ(verify(std::string("--manifest m.txt") + kQuick), 5) << err;
  EXPECT_THAT(out, HasSubstr("transfer/screen 16: scalar, threads 1, 2: "));
  EXPECT_THAT(out, testing::Not(HasSubstr("fill")));
  EXPECT_EQ(err, "zr: verify: 1 differences\n");

  EXPECT_EQ(verify(std::string("--json --manifest m.txt") + kQuick), 5);
  const auto object = nlohmann::json::parse(out);
  EXPECT_EQ(object.at("agree"), false);
  const auto& difference = object.at("differences").at(0);
  EXPECT_EQ(difference.at("operation"), "transfer/screen");
  EXPECT_EQ(difference.at("depth"), "16");
  EXPECT_EQ(difference.at("threads"), nlohmann::json({1, 2}));
  EXPECT_EQ(difference.at("expected").get<std::string>(), damaged("transfer/screen", 16).at({"transfer/screen", 16}));
}

TEST_F(Verify, AManifestThatIsShortIsADifference) {
  Manifest manifest = parse_manifest(embedded_manifest(), "built in");
  manifest.erase({"fill", 32});
  folder.write("m.txt", manifest_text(manifest));
  EXPECT_EQ(verify(std::string("--manifest m.txt") + kQuick), 5);
  EXPECT_THAT(out, HasSubstr("fill float: scalar, threads 1, 2: "));
  EXPECT_THAT(out, HasSubstr("not in the manifest"));
}

TEST_F(Verify, WrongCallsAndFiles) {
  folder.write("bad.txt", "# head\nfill 8 0123\n");
  expect_refused("verify ", {{"--operation transfer/scren", 2, "the nearest is \"transfer/screen\""},
                             {"--manifest bad.txt", 2, "line 2: not an operation, a depth"},
                             {"--manifest none.txt", 3, "cannot be read"},
                             {std::string("--write bad.txt") + kQuick, 3, "--force replaces it"},
                             {"--threads 0", 2, "--threads"},
                             {"--cpu mmx", 2, "--cpu"}});
}

TEST_F(Verify, WhatIsWrittenIsWhatIsCompared) {
  const std::string file = folder / "m.txt";
  EXPECT_EQ(verify("--write " + file + kQuick), 0) << err;
  EXPECT_THAT(out, HasSubstr("6 operations agree: scalar; threads 1, 2"));
  const Manifest written = load_manifest(file), whole = parse_manifest(embedded_manifest(), "built in");
  EXPECT_EQ(written.size(), 6u);
  for (const auto& [key, hash] : written) EXPECT_EQ(hash, whole.at(key)) << key.first;
}

}  // namespace
}  // namespace zr::tool
