// Ctrl-C and its kin: a signal only sets a flag, which the work polls.
//
// The flag is the tool's one mutable process-wide variable: written by the signal handler and by
// clear_interrupt, read on any thread.
#pragma once

#include <ZR/zr.h>

namespace zr::tool {

// SIGINT and SIGTERM, and SIGHUP unless the caller had it ignored (nohup).
void install_interrupt_handlers();
bool interrupted();
void clear_interrupt();
// Throws the error that ends an interrupted run.
void stop_if_interrupted();
// For long operations of the library: answers ZR_Err_UserAbort once a signal has come.
const ZR_ProgressInfo& abort_on_interrupt();

}  // namespace zr::tool
