// The host that the tool runs the library in.
#include "tool_host.h"

#include "image_files.h"
#include "library_messages_state.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

HostkitOptions options_for(int threads) {
  HostkitOptions options;
  options.threads = threads;
  options.message_sink = [](u32, i32, const std::string& text) { keep_message(text); };
  options.verification_sink = [](u32, i32, const std::string& text) { keep_message(text); };
  return options;
}

Hostkit started(int threads) try { return Hostkit(options_for(threads)); } catch (const std::runtime_error& error) {
  throw ToolError(kExitFailure, std::string("the library does not start: ") + error.what());
}

}  // namespace

ToolHost::ToolHost(int threads) : kit_(started(threads)) { set_image_threads(kit_.threads()); }

}  // namespace zr::tool
