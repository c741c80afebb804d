// The program run in a folder of its own, by a line of arguments, and what it leaves there.
#pragma once

#include <gmock/gmock.h>

#include <cstdlib>

#include <ZR/hostkit.h>

#include "image_files.h"
#include "support/temporary_folder.h"

namespace zr::tool {

class ToolRun : public testing::Test {
 protected:
  // For the shell; the exit code.
  int run(const std::string& arguments) {
    const std::string line = "cd " + folder.path() + " && " ZR_TOOL_PROGRAM " " + arguments + " >" + (streams / "out") +
                             " 2>" + (streams / "err");
    const int status = std::system(line.c_str());
    out = slurp(streams / "out");
    err = slurp(streams / "err");
    return WEXITSTATUS(status);
  }
  // Every call ends with the code and one line that holds the message, and leaves no file.
  struct BadCall {
    std::string arguments;
    int code;
    const char* message;
  };
  void expect_refused(const std::string& command, const std::vector<BadCall>& calls) {
    const std::vector<std::string> before = folder.files();
    for (const BadCall& call : calls) {
      EXPECT_EQ(run(command + call.arguments), call.code) << call.arguments;
      EXPECT_THAT(err, testing::HasSubstr(call.message)) << call.arguments;
      EXPECT_EQ(std::count(err.begin(), err.end(), '\n'), 1) << err;
      EXPECT_EQ(out, "") << call.arguments;
      EXPECT_EQ(folder.files(), before) << call.arguments;
    }
  }
  // A channel of all pixels; 'a', 'r', 'g' or 'b'.
  std::vector<int> channel_of(const std::string& name, char channel) const {
    const Hostkit host;
    const OwnedWorld world = load_image(folder / name, 8, "test");
    std::vector<int> values;
    for (i32 y = 0; y < world.height(); ++y)
      for (i32 x = 0; x < world.width(); ++x) {
        const ZR_Pixel8 p = world.row<ZR_Pixel8>(y)[x];
        values.push_back(channel == 'a' ? p.alpha : channel == 'r' ? p.red : channel == 'g' ? p.green : p.blue);
      }
    return values;
  }
  TemporaryFolder folder, streams;
  std::string out, err;
};

}  // namespace zr::tool
