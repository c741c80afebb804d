// Worlds of the library that the tool owns, and calls into the library.
#include "owned_world.h"

#include "library_messages_state.h"
#include "tool_error.h"

namespace zr::tool {

void check(i32 code, const std::string& what) {
  if (code == ZR_Err_None) return;
  if (code == ZR_Err_UserAbort) throw ToolError(kExitInterrupted, "interrupted");
  const std::string message = take_last_message();
  const std::string reason = message.empty() ? "error " + std::to_string(code) + " of the library" : message;
  if (code == ZR_Err_OutOfMemory) throw ToolError(kExitMemory, what + ": out of memory");
  throw ToolError(kExitFailure, what + ": " + reason);
}

OwnedWorld::OwnedWorld(i32 width, i32 height, i32 depth) : depth_(depth) {
  check(ZR_NewEffectWorld(nullptr, width, height, depth, true, false, &layer_),
        "allocating " + std::to_string(width) + " x " + std::to_string(height) + " pixels");
}

OwnedWorld::~OwnedWorld() {
  if (layer_.data != nullptr) ZR_DisposeEffectWorld(nullptr, &layer_);
}

}  // namespace zr::tool
