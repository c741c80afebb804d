// Runs of like pixels in the scan that guesses alpha, found on lanes.
#pragma once

#include <ZR/zr.h>

namespace zr {

// Both look at pixels from `row` on, of which `n` are the row's, and at the one before; they return how many, in whole
// vectors, belong to the run.
struct GuessRuns {
  // Alphas of `least` (1 or more) or above. Sets what a colour unlike the one before it, or above its alpha, tells.
  i32 (*covered)(const ZR_Pixel8* row, i32 n, u8 least, bool* vary, bool* exceed);
  // Pixels equal to the one before.
  i32 (*same)(const ZR_Pixel8* row, i32 n);
};
const GuessRuns* lane_guess_runs();  // null where there are no lanes

}  // namespace zr
