// Ctrl-C and its kin: a signal only sets a flag, which the work polls.
#include "interrupt_state.h"

#include <csignal>

#include "tool_error.h"

namespace zr::tool {
namespace {

constinit volatile std::sig_atomic_t interrupt_flag = 0;

extern "C" void zr_tool_on_signal(int) { interrupt_flag = 1; }

i32 ask_for_abort(void*) { return interrupted() ? ZR_Err_UserAbort : ZR_Err_None; }

constexpr ZR_ProgressInfo kAbortOnInterrupt{nullptr, &ask_for_abort, nullptr};

void handle(int signal_number) {
  struct sigaction action = {};
  action.sa_handler = &zr_tool_on_signal;
  sigemptyset(&action.sa_mask);
  action.sa_flags = SA_RESTART;
  sigaction(signal_number, &action, nullptr);
}

}  // namespace

void install_interrupt_handlers() {
  // A shell script starts background jobs with SIGINT ignored, but a signal sent to such a job on
  // purpose still means stop.
  handle(SIGINT);
  handle(SIGTERM);
  struct sigaction before = {};
  sigaction(SIGHUP, nullptr, &before);
  if (before.sa_handler != SIG_IGN) handle(SIGHUP);
}

bool interrupted() { return interrupt_flag != 0; }
void clear_interrupt() { interrupt_flag = 0; }

void stop_if_interrupted() {
  if (interrupted()) throw ToolError(kExitInterrupted, "interrupted");
}

const ZR_ProgressInfo& abort_on_interrupt() { return kAbortOnInterrupt; }

}  // namespace zr::tool
