// ADDIN: finding plug-in files, loading their routines, and the registry of suites.
//
// Folders are set by the host (ADDIN_SetFolders) or by the preference "modules.folders", a list
// separated by colons. A file counts when its extension is .ZNX; it is opened with RTLD_LOCAL | RTLD_NOW and must
// export a ZR_ModuleDescriptor (<ZR/module.h>). What is refused is logged with its reason and kept for
// ADDIN_GetScanReport. Files are visited in the order of their names. Main thread only.
#pragma once

#include <ZR/module.h>

#include <string>
#include <vector>

struct ADDIN_File;      // one plug-in file during a scan
struct ADDIN_Manifest;  // the properties of one routine
struct ADDIN_Routine;   // a registered routine; keeps its file loaded

struct ADDIN_RoutineInfo {
  const char* name;
  u32 kind, flags;
};

using ADDIN_ScanFunc = i32 (*)(ADDIN_File* file);
using ADDIN_DoneFunc = i32 (*)();

// Installs a scan, to run with ADDIN_RunScans: `scan` for each file with a routine of kind types[0] and
// of the file type types[1] (DSK), then `done`. 0 or 4.
i32 ADDIN_InstallScan(i32, i32 type_count, const u32* types, ADDIN_ScanFunc scan, ADDIN_DoneFunc done, i32);
// Runs the installed scans once and forgets them. A file for which `scan` gives a code is refused with
// that code and the walk goes on; the result is that of the first failing `done`, else 0.
i32 ADDIN_RunScans();

i32 ADDIN_GetRoutineCount(ADDIN_File* file, i32* count);
i32 ADDIN_GetRoutineInfo(ADDIN_File* file, i32 index, ADDIN_RoutineInfo* info);
i32 ADDIN_GetManifest(ADDIN_File* file, i32 index, ADDIN_Manifest** out);
i32 ADDIN_GetManifestProp(ADDIN_Manifest* manifest, u32 key, void* out, u32 size);  // 516 if absent or of another size
void ADDIN_DisposeManifest(ADDIN_Manifest* manifest);
i32 ADDIN_RegisterRoutine(ADDIN_File* file, i32 index, ADDIN_Routine** out);
i32 ADDIN_UnregisterRoutine(ADDIN_Routine* routine);
i32 ADDIN_PrepRoutine(ADDIN_Routine* routine, ZR_ModuleEntry* entry);  // the entry may be called from now on
i32 ADDIN_UnprepRoutine(ADDIN_Routine* routine);

// Suites: a name, two versions and a table of functions. Registering a name and versions again is 516.
i32 ADDIN_AddTWSuite(i32, i32, const char* name, i32 version_a, i32 version_b, i32 count, void* const* table);
// The suite through which others are looked up.
struct ADDIN_BasicSuite {
  i32 (*acquire)(const char* name, i32 version_a, const void** suite);  // 0, or 515 for one not there
  i32 (*release)(const char* name, i32 version_a);
};
i32 ADDIN_GetTWBasicSuite(const ADDIN_BasicSuite** out);
void ADDIN_ClearTWSuites();  // ZR_Death calls it

void ADDIN_SetFolders(std::vector<std::string> folders);
struct ADDIN_ScanEntry {
  std::string path;
  bool accepted;
  std::string reason;  // why it was refused
};
const std::vector<ADDIN_ScanEntry>& ADDIN_GetScanReport();
