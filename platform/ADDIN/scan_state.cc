// The installed scans, the folders they walk, and the report of the last walk.
#include <ADDIN/addin_files.h>
#include <DSK/dsk.h>
#include <HB/allocator.h>
#include <JRN/jrn.h>
#include <OPT/opt.h>

#include <algorithm>
#include <filesystem>
#include <set>

namespace fs = std::filesystem;

namespace {

struct Scan {
  u32 kind, file_type;
  ADDIN_ScanFunc scan;
  ADDIN_DoneFunc done;
};
struct Label {
  static constexpr const char* text = "list of plug-in scans";
};
using Scans = std::vector<Scan, HB_Allocator<Scan, Label>>;

// Main thread only, all three.
constinit Scans installed;
constinit std::vector<std::string> host_folders;  // empty: the preference counts
constinit std::vector<ADDIN_ScanEntry> report;

std::vector<std::string> folders() {
  if (!host_folders.empty()) return host_folders;
  std::vector<std::string> list;
  const std::string all = OPT_GetString("modules.folders", "");
  for (std::size_t start = 0; start <= all.size();) {
    const std::size_t end = std::min(all.find(':', start), all.size());
    if (end > start) list.push_back(all.substr(start, end - start));
    start = end + 1;
  }
  return list;
}

// The files of a type in a folder, by name; a folder that cannot be read has none.
std::vector<fs::path> files_in(const std::string& folder, u32 file_type) {
  std::vector<fs::path> files;
  std::error_code error;
  for (fs::directory_iterator at(folder, error), end; !error && at != end; at.increment(error)) {
    std::error_code not_readable;
    if (DSK_TypeOfPath(at->path().c_str()) == file_type && !at->is_directory(not_readable)) files.push_back(at->path());
  }
  if (error) JRN_Log(30, "ADDIN", folder.c_str(), error.message().c_str());
  std::sort(files.begin(), files.end());
  return files;
}

// Accepted when a routine of the file stays registered.
ADDIN_ScanEntry visit(const Scan& scan, const fs::path& path) {
  ADDIN_ScanEntry entry{path.string(), false, true, {}};
  ADDIN_File* const file = ADDINp_OpenFile(path.c_str(), &entry.reason);
  if (file == nullptr) return entry;
  entry.faulty = false;
  if (!ADDINp_HasRoutineOfKind(file, scan.kind)) {
    entry.reason = "it has no routine of the wanted kind";
  } else if (const i32 code = scan.scan(file); code != 0) {
    entry.reason = "loading it gave error " + std::to_string(code);
    entry.faulty = true;
  } else if (file->users == 1) {
    entry.reason = "none of its routines was taken";
  } else {
    entry.accepted = true;
  }
  ADDINp_LeaveFile(file);
  return entry;
}

void walk(const Scan& scan) {
  std::set<fs::path> seen;  // a folder may be named twice, or be a link to another
  for (const std::string& folder : folders())
    for (const fs::path& path : files_in(folder, scan.file_type)) {
      std::error_code error;
      const fs::path place = fs::canonical(path, error);
      if (!seen.insert(error ? path : place).second) continue;
      const ADDIN_ScanEntry& entry = report.emplace_back(visit(scan, path));
      JRN_Log(entry.accepted ? 10 : 30, "ADDIN", path.c_str(), entry.accepted ? "loaded" : entry.reason.c_str());
    }
}

}  // namespace

i32 ADDIN_InstallScan(i32, i32 type_count, const u32* types, ADDIN_ScanFunc scan, ADDIN_DoneFunc done, i32) {
  if (type_count < 2 || types == nullptr || scan == nullptr) return ZR_Err_BadParam;
  try {
    installed.push_back({types[0], types[1], scan, done});
    return ZR_Err_None;
  } catch (const std::bad_alloc&) {
    return ZR_Err_OutOfMemory;  // told by the allocator
  }
}

i32 ADDIN_RunScans() {
  Scans scans;
  scans.swap(installed);
  report.clear();
  i32 result = ZR_Err_None;
  for (const Scan& scan : scans) {
    i32 error = ZR_Err_None;
    try {
      walk(scan);
    } catch (const std::exception& caught) {
      error = HB_TranslateAndReportException(caught);
    }
    if (scan.done != nullptr)
      if (const i32 code = scan.done(); error == 0) error = code;
    if (result == 0) result = error;
  }
  return result;
}

void ADDIN_SetFolders(std::vector<std::string> list) { host_folders = std::move(list); }

const std::vector<ADDIN_ScanEntry>& ADDIN_GetScanReport() { return report; }
