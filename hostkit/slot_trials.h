// Trials of slot routines on a small fixed set: alphas at the ends and between, odd widths, edge values, both ways of
// calling. Two routines with equal outcomes do the same as far as a trial can tell.
#pragma once

#include <ZR/slots.h>

#include <vector>

namespace zr {

// Everything that a routine wrote and returned.
class Outcome {
 public:
  // NaNs of floats count as one.
  template <class T>
  void add(const T* values, size_t count);
  void add(i32 result) { add(&result, 1); }
  bool operator==(const Outcome&) const = default;

 private:
  std::vector<unsigned char> bytes_;
};

using SlotTrial = void(ZR_SlotFunc routine, Outcome& out);
// The trial of a slot, or null for one whose signature has none: mask rows, whole transfers, linear light.
SlotTrial* slot_trial(i32 slot);

// A ZR_SlotCheck: 1 where the outcomes differ or one throws, -1 without a trial. Memory and crashes of a routine are
// beyond it.
i32 check_slot(void*, i32 slot, ZR_SlotFunc before, ZR_SlotFunc now);

}  // namespace zr
