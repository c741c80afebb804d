// Files that the tool writes: checked before any work, written beside their place, then renamed.
#include "output_files.h"

#include <unistd.h>

#include <filesystem>
#include <set>
#include <system_error>

#include "interrupt_state.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

namespace fs = std::filesystem;

fs::path folder_of(const std::string& file) {
  const fs::path folder = fs::path(file).parent_path();
  return folder.empty() ? fs::path(".") : folder;
}

void check_folder(const fs::path& folder) {
  fs::path existing = folder;
  std::error_code error;
  while (!fs::exists(existing, error)) {
    const fs::path above = existing.parent_path();
    existing = above.empty() ? fs::path(".") : above;
  }
  if (!fs::is_directory(existing, error))
    throw file_error("output folder " + folder.string() + ": " + existing.string() + " is a file, not a folder");
  if (access(existing.c_str(), W_OK | X_OK) != 0)
    throw file_error("output folder " + existing.string() +
                     " cannot be written to: " + std::generic_category().message(errno));
}

}  // namespace

void check_outputs(const std::vector<std::string>& files, const std::vector<std::string>& inputs, bool force) {
  std::set<fs::path> read, folders;
  std::error_code error;
  for (const std::string& input : inputs) read.insert(fs::weakly_canonical(input, error));
  for (const std::string& file : files) {
    stop_if_interrupted();
    if (folders.insert(folder_of(file)).second) check_folder(folder_of(file));
    const fs::file_status status = fs::status(file, error);
    if (!fs::exists(status)) continue;
    if (fs::is_directory(status)) throw file_error("output " + file + " is a folder");
    if (read.count(fs::weakly_canonical(file, error)) != 0)
      throw file_error("output " + file + " is one of the files that are read");
    if (!force) throw file_error("output " + file + " exists already; --force replaces it");
  }
}

OutputFolders::~OutputFolders() {
  std::error_code error;
  for (auto folder = made_.rbegin(); folder != made_.rend(); ++folder)
    if (fs::is_empty(*folder, error) && !error) fs::remove(*folder, error);
}

void OutputFolders::make_for(const std::string& file) {
  std::vector<fs::path> missing;
  std::error_code error;
  for (fs::path folder = folder_of(file); !folder.empty() && !fs::exists(folder, error); folder = folder.parent_path())
    missing.push_back(folder);
  for (auto folder = missing.rbegin(); folder != missing.rend(); ++folder) {
    if (fs::create_directory(*folder, error)) made_.push_back(folder->string());
    if (error) throw file_error("output folder " + folder->string() + " cannot be made: " + error.message());
  }
}

void write_then_rename(const std::string& file, const std::function<void(const std::string& part)>& write) {
  const std::string part = file + ".zrpart";
  struct Remover {
    const std::string& name;
    ~Remover() {
      std::error_code ignored;
      fs::remove(name, ignored);
    }
  } const remover{part};  // finds nothing once the file has its name
  write(part);
  std::error_code error;
  fs::rename(part, file, error);
  if (error) throw file_error(file + " cannot be written: " + error.message());
}

}  // namespace zr::tool
