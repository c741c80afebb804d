// The taps of the bell that the scan blurs used last: one set for the whole process, kept until another radius comes.
#pragma once

#include <ZR/zr.h>

namespace zr {

// Taps of one side, the middle (255) first.
struct BellTaps {
  i32 users;    // the keeper is one
  u32 radius;   // 16.16
  i32 reach;    // taps beyond the middle
  i32 divisor;  // sum of all taps, both sides
  i32* weight() { return reinterpret_cast<i32*>(this + 1); }
  const i32* weight() const { return reinterpret_cast<const i32*>(this + 1); }
};

// Holds the taps for a radius of up to 32767 in 16.16 while it lives; made anew when they are of another radius. Any
// number of threads.
class BellInUse {
 public:
  explicit BellInUse(u32 radius);
  ~BellInUse();
  BellInUse(const BellInUse&) = delete;
  BellInUse& operator=(const BellInUse&) = delete;

  // Null when memory is short, which has been reported.
  const BellTaps* taps() const { return taps_; }

 private:
  BellTaps* taps_;
};

// Writes the taps 0..reach of a radius, which is 16.16, and returns the sum of both sides; blurs of worlds have the
// same.
i32 write_bell_taps(u32 radius, i32 reach, i32* weight);

// Lets the kept taps go; those in use live on until they are not.
void free_bell_taps();

}  // namespace zr
