// Definitions of the threaded iterate body's state.
#include "threaded_iterate_state.h"

namespace zr {

constinit std::atomic<WorkerPool*> G_iterate_workers = nullptr;
constinit thread_local i32 G_running_index = -1;
constinit std::atomic<u64> G_hand_over = 0;

}  // namespace zr
