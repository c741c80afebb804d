// Byte tables over rows of 8-bit pixels by vectors.
#pragma once

#include <ZR/zr.h>

namespace zr {

// Four tables of 256 entries, for alpha, red, green and blue; null changes nothing. They outlive the object.
class ByteTables {
 public:
  ByteTables(const u8* alpha, const u8* red, const u8* green, const u8* blue);
  // n pixels, one after the other; `in` may be `out`.
  void row(i64 n, const ZR_Pixel8* in, ZR_Pixel8* out) const;

  // How vectors look up: 16 entries at a time. A byte's entry is the exclusive or of its place in all steps from the
  // first to the one it lies in; `steps` are told for the lower half of the table, then for the upper.
  struct Steps {
    bool changes;
    alignas(16) u8 steps[2][8][16];
  };

 private:
  const u8* tables_[4];
  Steps steps_[4];
};

}  // namespace zr
