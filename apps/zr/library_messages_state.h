// The last message that the library reported, for the tool's one error line.
//
// Written by the host's message sinks on any thread, read where an error is told; guarded by a lock.
#pragma once

#include <string>

namespace zr::tool {

void keep_message(const std::string& text);
// The last message, "" if there was none since the call before.
std::string take_last_message();

}  // namespace zr::tool
