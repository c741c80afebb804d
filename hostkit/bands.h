// One drawing cut into bands of rows, which the Hostkit's threads take one after the other.
#pragma once

#include <ZR/zr.h>

namespace zr {

struct Rows {
  i32 first, end;
};

// Destination rows of a drawing as bands. All but the first begin on an even row, so that a band alone has the
// parity of the whole.
class Bands {
 public:
  // Not cut when a band would have fewer than `least_pixels`, or there is nobody to share with.
  Bands(const GX_LRect& bounds, i32 threads, i32 least_pixels);

  i32 count() const { return count_; }
  i32 rows() const { return bottom_ - top_; }
  Rows operator[](i32 i) const;

 private:
  i32 top_, bottom_, height_, count_ = 1;
};

// Threads that a call from here may spread over; 1 without a Hostkit and inside a callback of its threads.
i32 threads_from_here();

// Draws one band with the scratch of `worker`; any thread.
using DrawBand = i32 (*)(void* refcon, i32 worker, Rows band);
// Draws all bands on up to threads_from_here() workers. The calling thread polls before the first one and before
// each that it takes itself, with the rows that are done; no other does. After a refusal or a failure no further
// band is begun; those that are under way are finished. Returns the code of the topmost band that has one. Throws
// nothing.
i32 draw_bands(const Bands& bands, const ZR_ProgressInfo* progress, void* refcon, DrawBand draw);

}  // namespace zr
