// The iterate body that a Hostkit puts into its slot.
#pragma once

#include <ZR/zr.h>

namespace zr {

// As ZR_IterateGeneric, on the threads of the Hostkit that lives; see <ZR/hostkit.h> for the contract.
i32 threaded_iterate(i32 iterations, void* refcon, ZR_GenericFunc fn);

}  // namespace zr
