// The registry of suites.
#include <ADDIN/addin.h>
#include <HB/allocator.h>

#include <cstring>
#include <mutex>

namespace {

struct Suite {
  const char* name;  // lives as long as the table
  i32 version_a, version_b;
  void* const* table;
  i32 held;  // acquired and not yet released
};
struct Label {
  static constexpr const char* text = "list of suites";
};
using Suites = std::vector<Suite, HB_Allocator<Suite, Label>>;

// Filled on the main thread; plug-ins acquire and release on any.
constinit std::mutex lock;
constinit Suites suites;

// Of several with the name and version the one with the highest second version; null if there is none.
Suite* find(const char* name, i32 version_a) {
  Suite* best = nullptr;
  for (Suite& suite : suites)
    if (suite.version_a == version_a && std::strcmp(suite.name, name) == 0)
      if (best == nullptr || suite.version_b > best->version_b) best = &suite;
  return best;
}

i32 acquire(const char* name, i32 version_a, const void** out) {
  if (out == nullptr) return ZR_Err_BadParam;
  *out = nullptr;
  if (name == nullptr) return ZR_Err_BadParam;
  const std::lock_guard hold(lock);
  Suite* const suite = find(name, version_a);
  if (suite == nullptr) return ZR_Err_BadSelector;
  ++suite->held;
  *out = suite->table;
  return ZR_Err_None;
}

i32 release(const char* name, i32 version_a) {
  if (name == nullptr) return ZR_Err_BadParam;
  const std::lock_guard hold(lock);
  Suite* const suite = find(name, version_a);
  if (suite == nullptr) return ZR_Err_BadSelector;
  if (suite->held == 0) return ZR_Err_BadParam;
  --suite->held;
  return ZR_Err_None;
}

constexpr ADDIN_BasicSuite basic_suite{acquire, release};

}  // namespace

i32 ADDIN_AddTWSuite(i32, i32, const char* name, i32 version_a, i32 version_b, i32 count, void* const* table) {
  if (name == nullptr || table == nullptr || count < 0) return ZR_Err_BadParam;
  const std::lock_guard hold(lock);
  for (const Suite& suite : suites)
    if (suite.version_a == version_a && suite.version_b == version_b && std::strcmp(suite.name, name) == 0)
      return ZR_Err_BadParam;
  try {
    suites.push_back({name, version_a, version_b, table, 0});
    return ZR_Err_None;
  } catch (const std::bad_alloc&) {
    return ZR_Err_OutOfMemory;  // told by the allocator
  }
}

i32 ADDIN_GetTWBasicSuite(const ADDIN_BasicSuite** out) {
  if (out == nullptr) return ZR_Err_BadParam;
  *out = &basic_suite;
  return ZR_Err_None;
}

void ADDIN_ClearTWSuites() {
  const std::lock_guard hold(lock);
  Suites().swap(suites);
}
