// What the tests of the block and of the selectors share: a slot table in which every slot can be told apart.
#pragma once

#include <ZR/callback_block.h>

#include "support/born_library.h"

inline void* slot_mark(int slot) {
  return slot < 0 ? nullptr : reinterpret_cast<void*>(static_cast<uintptr_t>(0x10000 + slot * 16));
}

template <class Function>
void* address_of(Function* function) {
  return reinterpret_cast<void*>(function);
}

// Slot numbers at draft straight, draft premultiplied, best straight, best premultiplied; -1 is null.
struct SlotChoice {
  i32 number;
  int slots[4];
};
struct Mode {
  i32 quality, flags;
};
inline constexpr Mode modes[4] = {{0, 1}, {0, 0}, {1, 1}, {1, 0}};

class CallbackSurface : public BornLibrary {
 protected:
  void SetUp() override {
    BornLibrary::SetUp();
    std::copy(std::begin(ZRp_G_OverFuncs), std::end(ZRp_G_OverFuncs), std::begin(before_));
  }
  void TearDown() override {
    std::copy(std::begin(before_), std::end(before_), std::begin(ZRp_G_OverFuncs));
    BornLibrary::TearDown();
  }
  void mark_slots() {
    for (int slot = 0; slot < ZR_SlotCount; ++slot)
      ZRp_G_OverFuncs[slot] = reinterpret_cast<ZR_SlotFunc>(slot_mark(slot));
  }

 private:
  ZR_SlotFunc before_[ZR_SlotCount];
};
