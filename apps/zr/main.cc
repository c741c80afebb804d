// zr: the command-line tool.
#include <cstdio>
#include <exception>
#include <new>
#include <string>

#include "commands.h"
#include "interrupt_state.h"
#include "tool_error.h"

namespace {

// One line whatever the text holds.
int tell(int code, std::string text) {
  for (char& c : text)
    if (static_cast<unsigned char>(c) < ' ') c = ' ';
  std::fprintf(stderr, "zr: %s\n", text.c_str());
  return code;
}

}  // namespace

int main(int argc, char** argv) {
  using namespace zr::tool;
  install_interrupt_handlers();
  try {
    run_command_line(argc, argv);
    return kExitOk;
  } catch (const ToolError& error) {
    return tell(error.code(), error.what());
  } catch (const std::bad_alloc&) {
    return tell(kExitMemory, "out of memory");
  } catch (const std::exception& error) {
    return tell(kExitFailure, error.what());
  }
}
