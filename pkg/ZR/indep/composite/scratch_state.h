// The library's shared scratch: three rows that grow with the widest rectangle, and seven blocks of fixed
// size for the sampling loops. Not locked: one user at a time.
#pragma once

namespace zr {

// Gives everything back; the next ZRp_ReallocScratch starts anew. At death.
void free_scratch();
// Whether a record is the shared set, rather than a caller's own. Any thread, between birth and death.
bool is_shared_scratch(void* const record[10]);

}  // namespace zr
