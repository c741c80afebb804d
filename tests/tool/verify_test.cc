// zr verify: what differs is named, and the exit code says so.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <array>
#include <cstdio>
#include <nlohmann/json.hpp>

#include "temporary_folder.h"
#include "verify/operation.h"
#include "verify/runs.h"

namespace zr::tool {
namespace {

using testing::HasSubstr;

struct Outcome {
  int code;
  std::string out;  // with what went to stderr
};
Outcome verify(const std::string& arguments) {
  FILE* const pipe = popen((std::string(ZR_TOOL_PROGRAM) + " verify " + arguments + " 2>&1").c_str(), "r");
  std::string text;
  std::array<char, 4096> block;
  while (const size_t count = fread(block.data(), 1, block.size(), pipe)) text.append(block.data(), count);
  const int status = pclose(pipe);
  return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, text};
}

// The built-in manifest with one line damaged.
Manifest damaged(const char* operation, i32 depth) {
  Manifest manifest = parse_manifest(embedded_manifest(), "built in");
  char& digit = manifest.at({operation, depth})[7];
  digit = digit == '0' ? '1' : '0';
  return manifest;
}

constexpr const char* kQuick = " --cpu scalar --threads 1,2 --operation fill --operation transfer/screen";

TEST(Verify, NamesADamagedLine) {
  TemporaryFolder folder;
  folder.write("m.txt", manifest_text(damaged("transfer/screen", 16)));
  const Outcome text = verify("--manifest " + (folder / "m.txt") + kQuick);
  EXPECT_EQ(text.code, 5) << text.out;
  EXPECT_THAT(text.out, HasSubstr("transfer/screen 16: scalar, threads 1, 2: "));
  EXPECT_THAT(text.out, testing::Not(HasSubstr("fill")));
  EXPECT_THAT(text.out, HasSubstr("zr: verify: 1 differences\n"));

  const Outcome machine = verify("--json --manifest " + (folder / "m.txt") + kQuick);
  EXPECT_EQ(machine.code, 5);
  // What went to stderr may stand before or behind it.
  const size_t begin = machine.out.find('{'), end = machine.out.rfind('}');
  ASSERT_LT(begin, end) << machine.out;
  const auto object = nlohmann::json::parse(machine.out.substr(begin, end - begin + 1));
  EXPECT_EQ(object.at("agree"), false);
  const auto& difference = object.at("differences").at(0);
  EXPECT_EQ(difference.at("operation"), "transfer/screen");
  EXPECT_EQ(difference.at("depth"), "16");
  EXPECT_EQ(difference.at("threads"), nlohmann::json({1, 2}));
  EXPECT_EQ(difference.at("expected").get<std::string>(), damaged("transfer/screen", 16).at({"transfer/screen", 16}));
}

TEST(Verify, AManifestThatIsShortIsADifference) {
  TemporaryFolder folder;
  Manifest manifest = parse_manifest(embedded_manifest(), "built in");
  manifest.erase({"fill", 32});
  folder.write("m.txt", manifest_text(manifest));
  const Outcome outcome = verify("--manifest " + (folder / "m.txt") + kQuick);
  EXPECT_EQ(outcome.code, 5);
  EXPECT_THAT(outcome.out, HasSubstr("fill float: scalar, threads 1, 2: "));
  EXPECT_THAT(outcome.out, HasSubstr("not in the manifest"));
}

TEST(Verify, BuiltInManifestHoldsEveryOperation) {
  const Manifest manifest = parse_manifest(embedded_manifest(), "built in");
  for (const Operation& one : all_operations()) EXPECT_TRUE(manifest.count({one.name, one.depth})) << one.name;
  EXPECT_EQ(manifest.size(), all_operations().size());
  const Outcome outcome = verify(kQuick);
  EXPECT_EQ(outcome.code, 0) << outcome.out;
  EXPECT_THAT(outcome.out, HasSubstr("6 operations agree: scalar; threads 1, 2"));
}

TEST(Verify, WrongCallsAndFiles) {
  TemporaryFolder folder;
  const std::string bad = folder / "bad.txt";
  folder.write("bad.txt", "# head\nfill 8 0123\n");
  struct Case {
    std::string arguments;
    int code;
    const char* message;
  };
  for (const Case& one : {
           Case{"--operation transfer/scren", 2, "the nearest is \"transfer/screen\""},
           Case{"--manifest " + bad, 2, "line 2: not an operation, a depth"},
           Case{"--manifest " + (folder / "none.txt"), 3, "cannot be read"},
           Case{"--write " + bad + kQuick, 3, "--force replaces it"},
           Case{"--threads 0", 2, "--threads"},
           Case{"--cpu mmx", 2, "--cpu"},
       }) {
    const Outcome outcome = verify(one.arguments);
    EXPECT_EQ(outcome.code, one.code) << one.arguments << '\n' << outcome.out;
    EXPECT_THAT(outcome.out, HasSubstr(one.message));
  }
}

TEST(Verify, WhatIsWrittenIsWhatIsCompared) {
  TemporaryFolder folder;
  const std::string file = folder / "m.txt";
  EXPECT_EQ(verify("--write " + file + kQuick).code, 0);
  const Manifest written = load_manifest(file), whole = parse_manifest(embedded_manifest(), "built in");
  EXPECT_EQ(written.size(), 6u);
  for (const auto& [key, hash] : written) EXPECT_EQ(hash, whole.at(key)) << key.first;
}

}  // namespace
}  // namespace zr::tool
