// The record of what birth took.
#include "host/life_state.h"

namespace zr {

constinit LifeState G_life;

}  // namespace zr
