// The scan for plug-in files, their routines, and the registry of suites.
#include <ADDIN/addin.h>
#include <DSK/dsk.h>
#include <HB/hb.h>
#include <OPT/opt.h>

#include <dlfcn.h>

#include "support/temporary_folder.h"
#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace {

namespace fs = std::filesystem;
using testing::HasSubstr;

constexpr u32 file_type = 0x2e5a4e58;
constexpr u32 types[] = {ZR_ModuleKind, file_type};

// What the scan function of the running test does, and what has happened; reset by the fixture.
struct Course {
  i32 scanned = 0, done = 0;
  i32 scan_result = 0, done_result = 0;
  bool keep = false;
  ADDIN_Routine* kept = nullptr;
} course;

i32 scan(ADDIN_File* file) {
  ++course.scanned;
  if (course.keep) {
    EXPECT_EQ(ADDIN_RegisterRoutine(file, 0, &course.kept), 0);
  }
  return course.scan_result;
}
i32 done() {
  ++course.done;
  return course.done_result;
}

class Modules : public testing::Test {
 protected:
  void SetUp() override {
    course = {};
    DSK_ClearExtensionMap();
    ASSERT_EQ(DSK_AddExtensionMap(".ZNX", file_type, -1), 0);
    ADDIN_SetFolders({folder.path()});
    HB_GetMemoryStats(&before_);
  }
  void TearDown() override {
    HB_MemoryStats now;
    HB_GetMemoryStats(&now);
    EXPECT_EQ(now.live_blocks, before_.live_blocks);
    ADDIN_SetFolders({});
    DSK_ClearExtensionMap();
  }
  std::string copy(const char* module, const std::string& name) {
    fs::copy_file(fs::path(ZR_TEST_MODULES) / module, folder / name);
    return folder / name;
  }
  static bool loaded(const std::string& path) {
    void* const library = dlopen(path.c_str(), RTLD_NOW | RTLD_NOLOAD);
    if (library != nullptr) dlclose(library);
    return library != nullptr;
  }
  static i32 run(ADDIN_ScanFunc function = scan) {
    EXPECT_EQ(ADDIN_InstallScan(0, 2, types, function, done, 0), 0);
    return ADDIN_RunScans();
  }
  TemporaryFolder folder;

 private:
  EnvironmentVariable log_{"ZR_LOG_FILE", folder / "log.txt"};
  HB_MemoryStats before_{};
};

TEST_F(Modules, WhatIsNoModuleIsRefusedWithItsReason) {
  copy("stranger.ZNX", "d_stranger.ZNX");
  folder.write("a_text.ZNX", std::string(5000, 'x'));
  folder.write("b_empty.znx", "");
  copy("later.ZNX", "c_later.ZNX");
  folder.write("e_other.txt", "not looked at");
  fs::create_directory(folder / "f_folder.ZNX");
  fs::create_symlink(folder / "nowhere", folder / "g_dangling.ZNX");
  EXPECT_EQ(run(), 0);
  const auto& report = ADDIN_GetScanReport();
  const struct {
    const char *name, *reason;
  } expected[] = {{"a_text.ZNX", "invalid ELF header"},
                  {"b_empty.znx", "file too short"},
                  {"c_later.ZNX", "version 2 and not 1"},
                  {"d_stranger.ZNX", "no ZR_Module"},
                  {"g_dangling.ZNX", "No such file"}};
  ASSERT_EQ(report.size(), std::size(expected));
  for (std::size_t i = 0; i < report.size(); ++i) {
    EXPECT_EQ(report[i].path, folder / expected[i].name);
    EXPECT_FALSE(report[i].accepted);
    EXPECT_THAT(report[i].reason, HasSubstr(expected[i].reason));
    EXPECT_FALSE(loaded(report[i].path));
  }
  EXPECT_EQ(course.scanned, 0);
  EXPECT_EQ(course.done, 1);
  EXPECT_THAT(slurp(folder / "log.txt"), HasSubstr("b_empty.znx"));
}

TEST_F(Modules, AFileStaysLoadedWhileARoutineIsRegistered) {
  const std::string path = copy("good.ZNX", "good.ZNX");
  course.keep = true;
  ASSERT_EQ(run(), 0);
  ASSERT_EQ(ADDIN_GetScanReport().size(), 1u);
  EXPECT_TRUE(ADDIN_GetScanReport()[0].accepted) << ADDIN_GetScanReport()[0].reason;
  ASSERT_NE(course.kept, nullptr);
  EXPECT_TRUE(loaded(path));
  ZR_ModuleEntry entry = nullptr;
  EXPECT_EQ(ADDIN_UnprepRoutine(course.kept), ZR_Err_BadParam);
  ASSERT_EQ(ADDIN_PrepRoutine(course.kept, &entry), 0);
  EXPECT_EQ(entry(1, nullptr, nullptr, nullptr), 41);
  EXPECT_EQ(ADDIN_UnregisterRoutine(course.kept), ZR_Err_Internal);
  EXPECT_EQ(ADDIN_UnprepRoutine(course.kept), 0);
  EXPECT_EQ(ADDIN_UnregisterRoutine(course.kept), 0);
  EXPECT_FALSE(loaded(path));
}

TEST_F(Modules, WhatTheScanReturnsDecides) {
  const std::string path = copy("good.ZNX", "good.ZNX");
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(ADDIN_GetScanReport()[0].reason, "none of its routines was taken");
  EXPECT_FALSE(loaded(path));
  course.scan_result = 77;
  course.done_result = 9;
  EXPECT_EQ(run(), 9);
  EXPECT_FALSE(ADDIN_GetScanReport()[0].accepted);
  EXPECT_THAT(ADDIN_GetScanReport()[0].reason, HasSubstr("77"));
  EXPECT_FALSE(loaded(path));
  EXPECT_EQ(course.scanned, 2);
  EXPECT_EQ(ADDIN_RunScans(), 0) << "a scan runs once";
  EXPECT_EQ(course.done, 2);
  const u32 other_kind[] = {0x7a7a7a7a, file_type};
  ASSERT_EQ(ADDIN_InstallScan(0, 2, other_kind, scan, nullptr, 0), 0);
  EXPECT_EQ(ADDIN_RunScans(), 0);
  EXPECT_THAT(ADDIN_GetScanReport()[0].reason, HasSubstr("kind"));
  EXPECT_EQ(course.scanned, 2);
}

TEST_F(Modules, RoutinesTellOfThemselves) {
  copy("good.ZNX", "good.ZNX");
  const auto look = [](ADDIN_File* file) -> i32 {
    i32 count = 0;
    EXPECT_EQ(ADDIN_GetRoutineCount(file, &count), 0);
    EXPECT_EQ(count, 3);
    ADDIN_RoutineInfo info;
    EXPECT_EQ(ADDIN_GetRoutineInfo(file, 0, &info), 0);
    EXPECT_STREQ(info.name, "first");
    EXPECT_EQ(info.kind, ZR_ModuleKind);
    EXPECT_EQ(info.flags, ZR_ModuleFlag_Acceleration);
    EXPECT_EQ(ADDIN_GetRoutineInfo(file, 2, &info), 0);
    EXPECT_STREQ(info.name, "");
    for (const i32 outside : {-1, 3}) EXPECT_EQ(ADDIN_GetRoutineInfo(file, outside, &info), ZR_Err_BadParam);
    ADDIN_Manifest* manifest = nullptr;
    u32 version = 0;
    EXPECT_EQ(ADDIN_GetManifest(file, 0, &manifest), 0);
    EXPECT_EQ(ADDIN_GetManifestProp(manifest, ZR_ModuleProp_Version, &version, 4), 0);
    EXPECT_EQ(version, 2u);
    EXPECT_EQ(ADDIN_GetManifestProp(manifest, ZR_ModuleProp_Version, &version, 2), ZR_Err_BadParam);
    EXPECT_EQ(ADDIN_GetManifestProp(manifest, 0x7a7a7a7a, &version, 4), ZR_Err_BadParam);
    ADDIN_DisposeManifest(manifest);
    EXPECT_EQ(ADDIN_GetManifest(file, 2, &manifest), 0);  // its property count has no properties behind it
    EXPECT_EQ(ADDIN_GetManifestProp(manifest, ZR_ModuleProp_Version, &version, 4), ZR_Err_BadParam);
    ADDIN_DisposeManifest(manifest);
    ADDIN_Routine* routine = nullptr;
    ZR_ModuleEntry entry = nullptr;
    EXPECT_EQ(ADDIN_RegisterRoutine(file, 2, &routine), 0);
    EXPECT_EQ(ADDIN_PrepRoutine(routine, &entry), ZR_Err_BadParam) << "it has no entry";
    EXPECT_EQ(ADDIN_UnregisterRoutine(routine), 0);
    ++course.scanned;
    return 0;
  };
  EXPECT_EQ(run(look), 0);
  EXPECT_EQ(course.scanned, 1);
}

TEST_F(Modules, EachAttemptToAllocateMayFail) {
  const std::string path = copy("good.ZNX", "good.ZNX");
  course.keep = false;
  const auto take = [](ADDIN_File* file) -> i32 {
    ++course.scanned;
    ADDIN_Manifest* manifest = nullptr;
    i32 error = ADDIN_GetManifest(file, 0, &manifest);
    if (error == 0) error = ADDIN_RegisterRoutine(file, 0, &course.kept);
    ADDIN_DisposeManifest(manifest);
    return error;
  };
  HB_StartQuietErrorsOnCurrentThread();
  u64 n = 1;
  for (; course.kept == nullptr && n < 20; ++n) {
    ASSERT_EQ(ADDIN_InstallScan(0, 2, types, take, done, 0), 0);
    HB_FailNthAllocation(n);
    EXPECT_EQ(ADDIN_RunScans(), 0);
    HB_FailNthAllocation(0);
    EXPECT_EQ(loaded(path), course.kept != nullptr) << n;
    EXPECT_EQ(ADDIN_GetScanReport()[0].accepted, course.kept != nullptr) << n;
  }
  HB_EndQuietErrorsOnCurrentThread();
  EXPECT_EQ(n, 5u) << "file, manifest, routine, then success";
  EXPECT_EQ(ADDIN_UnregisterRoutine(course.kept), 0);
}

TEST_F(Modules, FoldersComeFromTheHostElseFromThePreference) {
  TemporaryFolder second;
  folder.write("b.ZNX", "x");
  folder.write("a.ZNX", "x");
  second.write("0.ZNX", "x");
  const std::string list = folder.path() + "::" + (folder / "missing") + ":" + second.path() + ":" + folder.path();
  const EnvironmentVariable preference("ZR_MODULES_FOLDERS", list);
  const auto names = [] {
    std::string all;
    for (const ADDIN_ScanEntry& entry : ADDIN_GetScanReport()) all += fs::path(entry.path).filename().string() + " ";
    return all;
  };
  ADDIN_SetFolders({});
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(names(), "a.ZNX b.ZNX 0.ZNX ");
  ADDIN_SetFolders({second.path()});
  EXPECT_EQ(run(), 0);
  EXPECT_EQ(names(), "0.ZNX ");
}

TEST(Suites, AreFoundByNameAndVersion) {
  static void* const tables[4][1] = {};
  ADDIN_ClearTWSuites();
  const struct {
    const char* name;
    i32 a, b, error;
  } added[] = {{"World", 1, 1, 0}, {"World", 2, 2, 0}, {"world", 1, 1, 0}, {"World", 1, 3, 0}};
  for (i32 i = 0; i < 4; ++i)
    EXPECT_EQ(ADDIN_AddTWSuite(0, 0, added[i].name, added[i].a, added[i].b, 1, tables[i]), 0) << i;
  EXPECT_EQ(ADDIN_AddTWSuite(0, 0, std::string("World").c_str(), 2, 2, 1, tables[0]), ZR_Err_BadParam) << "twice";
  const ADDIN_BasicSuite* basic = nullptr;
  ASSERT_EQ(ADDIN_GetTWBasicSuite(&basic), 0);
  const struct {
    const char* name;
    i32 version, error;
    const void* table;
  } asked[] = {{"World", 1, 0, tables[3]},
               {"World", 2, 0, tables[1]},
               {"world", 1, 0, tables[2]},
               {"World", 3, ZR_Err_BadSelector, nullptr},
               {"Worlds", 1, ZR_Err_BadSelector, nullptr}};
  for (const auto& one : asked) {
    const void* table = tables;
    EXPECT_EQ(basic->acquire(one.name, one.version, &table), one.error) << one.name << one.version;
    EXPECT_EQ(table, one.table) << one.name << one.version;
    EXPECT_EQ(basic->release(one.name, one.version), one.error);
    EXPECT_NE(basic->release(one.name, one.version), 0) << "not held any more";
  }
  ADDIN_ClearTWSuites();
  const void* table = nullptr;
  EXPECT_EQ(basic->acquire("World", 1, &table), ZR_Err_BadSelector);
}

}  // namespace
