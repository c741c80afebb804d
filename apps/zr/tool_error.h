// What ends a run early: one line for the user and the exit code that goes with it.
#pragma once

#include <stdexcept>
#include <string>

namespace zr::tool {

// Told to the user in `zr --help`; scripts rely on the numbers.
enum ExitCode : int {
  kExitOk = 0,
  kExitFailure = 1,
  kExitBadInput = 2,
  kExitFile = 3,
  kExitMemory = 4,
  kExitDifference = 5,
  kExitInterrupted = 130,
};

// The text names the thing, the value and what would be right; no "zr:" in front, no line break.
class ToolError : public std::runtime_error {
 public:
  ToolError(ExitCode code, const std::string& text) : std::runtime_error(text), code_(code) {}
  ExitCode code() const { return code_; }

 private:
  ExitCode code_;
};

inline ToolError bad_input(const std::string& text) { return {kExitBadInput, text}; }
inline ToolError file_error(const std::string& text) { return {kExitFile, text}; }

}  // namespace zr::tool
