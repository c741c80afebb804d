// Operations repeated under every instruction set and thread count.
#include "verify/runs.h"

#include <ZR/platform.h>

#include <algorithm>
#include <cstdlib>
#include <optional>

#include "depths.h"
#include "interrupt_state.h"
#include "tool_error.h"
#include "tool_host.h"

namespace zr::tool {
namespace {

struct Level {
  const char* name;
  int word;  // of the processor record that says it is there; 0: always there
};
constexpr Level kLevels[] = {{"scalar", 0}, {"sse4", 6}, {"avx2", 7}, {"avx512", 8}};

// Birth reads the cap from the environment. Made and ended while no other thread runs.
class CpuCap {
 public:
  explicit CpuCap(const char* level) {
    if (const char* now = std::getenv(kName)) before_ = now;
    level != nullptr ? setenv(kName, level, 1) : unsetenv(kName);
  }
  ~CpuCap() { before_ ? setenv(kName, before_->c_str(), 1) : unsetenv(kName); }
  CpuCap(const CpuCap&) = delete;
  CpuCap& operator=(const CpuCap&) = delete;

 private:
  static constexpr const char* kName = "ZR_CPU";
  std::optional<std::string> before_;
};

std::string answer(const Operation& operation, const Setting& setting) {
  Digest digest;
  try {
    ZR_ResetDitherRandomIndex();
    operation.run(digest);
  } catch (const i32 error) {
    throw ToolError(kExitFailure, operation.name + ' ' + depth_name(operation.depth) + " fails with error " +
                                      std::to_string(error) + " (" + setting.instruction_set + ", " +
                                      std::to_string(setting.threads) + " threads)");
  }
  return digest.text();
}

// Adds a thread count to what is known, or something new.
void note(std::vector<Difference>& list, const Operation& operation, const Setting& setting,
          const std::string& expected, const std::string& found) {
  for (Difference& one : list)
    if (one.operation == &operation && one.instruction_set == setting.instruction_set && one.found == found) {
      one.threads.push_back(setting.threads);
      return;
    }
  list.push_back({&operation, setting.instruction_set, {setting.threads}, expected, found});
}

}  // namespace

const std::vector<std::string>& known_sets() {
  static const std::vector<std::string> names = [] {
    std::vector<std::string> list;
    for (const Level& level : kLevels) list.emplace_back(level.name);
    return list;
  }();
  return names;
}

std::vector<std::string> processor_sets() {
  const CpuCap none(nullptr);
  const ToolHost host(1);
  std::vector<std::string> sets;
  for (const Level& level : kLevels)
    if (level.word == 0 || HB_G_CPU_DataP[level.word] != 0) sets.emplace_back(level.name);
  return sets;
}

std::vector<Difference> compare_runs(const Chosen& operations, const std::vector<Setting>& settings, Manifest& expected,
                                     bool may_add, const Told& told) {
  std::vector<Difference> differences;
  const size_t total = operations.size() * settings.size();
  size_t done = 0;
  for (const Setting& setting : settings) {
    const CpuCap cap(setting.instruction_set.c_str());
    const ToolHost host(setting.threads);
    for (const Operation* operation : operations) {
      stop_if_interrupted();
      told(setting, done++, total);
      if (operation->vector_rule && setting.instruction_set == kLevels[0].name) continue;
      const std::string found = answer(*operation, setting);
      const std::pair key(operation->name, operation->depth);
      const auto line = expected.find(key);
      if (line != expected.end()) {
        if (line->second != found) note(differences, *operation, setting, line->second, found);
      } else if (may_add) {
        expected.emplace(key, found);
      } else {
        note(differences, *operation, setting, "", found);
      }
    }
  }
  std::stable_sort(differences.begin(), differences.end(),
                   [](const Difference& a, const Difference& b) { return a.operation < b.operation; });
  return differences;
}

}  // namespace zr::tool
