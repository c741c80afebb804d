// Acceleration modules: found at birth, given the slot table, called a last time at death.
#pragma once

#include <ADDIN/addin.h>

namespace zr {

// Makes the list of loaded modules and installs the scan for files of extension .ZNX. 0 or an error.
i32 install_module_scan();

// Runs the scan over a filled slot table. A module that fails is reported, its changes of the table are
// taken back, and the others are kept; the result is that of the work after the scan.
i32 run_module_scan();

// Calls every module with ZR_ModuleCommand_Unload in the order of loading and lets go of it. After the
// first error, which is the result, the rest are let go of without that call. Harmless without modules.
i32 unload_modules();

// How many modules are loaded now.
i32 loaded_module_count();

// The suite through which others are looked up; null outside a life.
const ADDIN_BasicSuite* basic_suite();

}  // namespace zr
