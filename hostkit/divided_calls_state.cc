// Definition of the divided calls' state.
#include "divided_calls_state.h"

namespace zr {

constinit std::atomic<ScratchRecords*> G_scratch_records = nullptr;

}  // namespace zr
