// Operations repeated under every instruction set and thread count.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "verify/manifest.h"
#include "verify/operation.h"

namespace zr::tool {

// One birth of the library.
struct Setting {
  std::string instruction_set;  // "scalar", "sse4", "avx2", "avx512"
  int threads;
};

// Those that this processor has, lesser first. Begins and ends a life of the library.
std::vector<std::string> processor_sets();
const std::vector<std::string>& known_sets();

// What does not agree.
struct Difference {
  const Operation* operation;
  std::string instruction_set;
  std::vector<int> threads;     // that gave `found`
  std::string expected, found;  // hashes; expected is empty where there is no line for the operation
};

using Chosen = std::vector<const Operation*>;
using Told = std::function<void(const Setting& setting, size_t done, size_t total)>;  // before each operation

// Runs the operations under each setting and compares. Where `expected` has no line, the first setting's
// answer is what the others are compared with, and is put in. Throws ToolError.
std::vector<Difference> compare_runs(const Chosen& operations, const std::vector<Setting>& settings, Manifest& expected,
                                     bool may_add, const Told& told);

}  // namespace zr::tool
