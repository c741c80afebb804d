// What this life of the library holds and has to give back.
#pragma once

namespace zr {

struct LifeState {
  bool has_multiply_tables = false;  // one GX_PrepareFCMD of ours is to be paid back
};

// Written by birth and death only, which run alone.
extern constinit LifeState G_life;

}  // namespace zr
