// The program run in a folder of its own, by a line of arguments.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "temporary_folder.h"

namespace zr::tool {

inline std::string slurp(const std::string& file) {
  std::ifstream stream(file, std::ios::binary);
  return {std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
}

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
  TemporaryFolder folder, streams;
  std::string out, err;
};

}  // namespace zr::tool
