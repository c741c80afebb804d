// The host's way to name the folders of acceleration modules.
#include <ADDIN/addin.h>
#include <ZR/platform.h>

#include <utility>

#include "world/guard.h"

extern "C" void ADDIN_SetModuleFolders(const char* const* folders, i32 count) {
  zr::guarded([&] {
    std::vector<std::string> list;
    for (i32 i = 0; folders != nullptr && i < count; ++i)
      if (folders[i] != nullptr) list.emplace_back(folders[i]);
    ADDIN_SetFolders(std::move(list));
    return i32{ZR_Err_None};
  });
}
