// ADDIN: finding plug-in files, loading their routines, and the registry of suites.
//
// Folders are set by the host (ADDIN_SetFolders) or by the preference "modules.folders", a list
// separated by colons. A file counts when its extension is .ZNX; it is opened with RTLD_LOCAL | RTLD_NOW and must
// export a ZR_ModuleDescriptor (<ZR/module.h>). What is refused is logged with its reason and kept for
// ADDIN_GetScanReport. Folders are visited in their order, the files of each in the order of their names, a
// file that is met twice only once. A folder that cannot be read is logged and is no error. Main thread only,
// except for the two functions of the basic suite.
//
// Functions return 0, 4 when memory is short, 516 for a null or an index outside, and what is said at each.
#pragma once

#include <ZR/module.h>
#include <ZR/suites.h>

#include <string>
#include <vector>

struct ADDIN_File;      // one plug-in file during a scan
struct ADDIN_Manifest;  // the properties of one routine
struct ADDIN_Routine;   // a registered routine; keeps its file loaded

struct ADDIN_RoutineInfo {
  const char* name;  // never null; lives as long as the file is loaded
  u32 kind, flags;
};

using ADDIN_ScanFunc = i32 (*)(ADDIN_File* file);
using ADDIN_DoneFunc = i32 (*)();

// Installs a scan, to run with ADDIN_RunScans: `scan` for each file with a routine of kind types[0] and
// of the file type types[1] (DSK), then `done`, which may be null. The other numbers are not read.
i32 ADDIN_InstallScan(i32, i32 type_count, const u32* types, ADDIN_ScanFunc scan, ADDIN_DoneFunc done, i32);
// Runs the installed scans once and forgets them. A file for which `scan` gives a code is refused with
// that code and the walk goes on; the result is that of the first failing `done`, else 0. A file is closed
// again unless a routine of it stays registered, whatever `scan` returned.
i32 ADDIN_RunScans();

i32 ADDIN_GetRoutineCount(ADDIN_File* file, i32* count);
i32 ADDIN_GetRoutineInfo(ADDIN_File* file, i32 index, ADDIN_RoutineInfo* info);
// Valid only while its file is: until the scan is over, or longer if a routine stays registered.
i32 ADDIN_GetManifest(ADDIN_File* file, i32 index, ADDIN_Manifest** out);
i32 ADDIN_GetManifestProp(ADDIN_Manifest* manifest, u32 key, void* out, u32 size);  // 516 if absent or of another size
void ADDIN_DisposeManifest(ADDIN_Manifest* manifest);
// Between register and unregister the file stays loaded, between prepare and unprepare the entry may be called.
i32 ADDIN_RegisterRoutine(ADDIN_File* file, i32 index, ADDIN_Routine** out);
i32 ADDIN_UnregisterRoutine(ADDIN_Routine* routine);  // 3 while it is prepared
i32 ADDIN_PrepRoutine(ADDIN_Routine* routine, ZR_ModuleEntry* entry);
i32 ADDIN_UnprepRoutine(ADDIN_Routine* routine);  // 516 if it is not prepared

// Suites: a name, two versions and a table of functions; name and table are kept as addresses and must live
// until ADDIN_ClearTWSuites. Registering a name and both versions again is 516.
i32 ADDIN_AddTWSuite(i32, i32, const char* name, i32 version_a, i32 version_b, i32 count, void* const* table);
using ADDIN_BasicSuite = ZR_BasicSuite;  // the suite through which others are looked up
i32 ADDIN_GetTWBasicSuite(const ADDIN_BasicSuite** out);
void ADDIN_ClearTWSuites();  // ZR_Death calls it

void ADDIN_SetFolders(std::vector<std::string> folders);  // none: the preference counts again
struct ADDIN_ScanEntry {
  std::string path;
  bool accepted;
  bool faulty;         // refused for a fault, and not because nothing in it was wanted
  std::string reason;  // why it was refused
};
// Of the last ADDIN_RunScans; valid until the next.
const std::vector<ADDIN_ScanEntry>& ADDIN_GetScanReport();
