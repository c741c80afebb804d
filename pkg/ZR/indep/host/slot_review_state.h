// What acceleration modules did to the slots, and the host's check of it.
#pragma once

#include <ZR/module.h>

namespace zr {

// Looks at every slot that differs from `before`, asks the host's check as the preference "module.check" says, and
// puts back what is not to stay. `routine` lives until it is forgotten.
void review_slots(const char* routine, const ZR_SlotFunc (&before)[ZR_SlotCount]);
void forget_slot_review();
void forget_slot_review_of(const char* routine);  // the last that was reviewed

}  // namespace zr
