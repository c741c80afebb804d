// The noise of the dithered screen of masks: one generator for the whole process.
//
// Shared and unlocked: rows on several threads at once may draw the same numbers, which changes the pattern of the
// noise and nothing else.
#pragma once

#include <ZR/zr.h>

namespace zr {

// The numbers of one row: takes the generator's state when it is made and puts it back when it goes.
class MaskNoise {
 public:
  MaskNoise();
  ~MaskNoise();
  MaskNoise(const MaskNoise&) = delete;
  MaskNoise& operator=(const MaskNoise&) = delete;

  // The low `bits` (a mask) of the next `count` numbers.
  void draw(i32 count, u16 bits, u16* noise);

 private:
  u32 state_;
};

}  // namespace zr
