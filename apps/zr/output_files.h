// Files that the tool writes: checked before any work, written beside their place, then renamed.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace zr::tool {

// What must hold before work begins: no file stands where one is to be written (unless `force`), none
// would replace an input, and the folders can be written to. Throws ToolError.
void check_outputs(const std::vector<std::string>& files, const std::vector<std::string>& inputs, bool force);

// Folders that a run had to make; those that are still empty go when it fails.
class OutputFolders {
 public:
  OutputFolders() = default;
  ~OutputFolders();
  OutputFolders(const OutputFolders&) = delete;
  OutputFolders& operator=(const OutputFolders&) = delete;
  // Makes the folder of a file, with those above it. Throws ToolError.
  void make_for(const std::string& file);

 private:
  std::vector<std::string> made_;  // outermost first
};

// Calls `write` with the name of a file beside `file` (".zrpart" added), then renames it. Nothing is
// left behind when `write` throws.
void write_then_rename(const std::string& file, const std::function<void(const std::string& part)>& write);

}  // namespace zr::tool
