// The suites that the library publishes: their tables, and what of them no other file has.
#pragma once

#include <ZR/zr.h>

namespace zr {

// Fills the tables from the slots as they are now and registers all of them, in their fixed order. The first failure
// stops the rest and is returned. For the end of the module scan.
i32 register_suites();

}  // namespace zr
