// What acceleration modules did to the slots, and the host's check of it.
#pragma once

#include <ZR/module.h>

namespace zr {

// Looks at every slot that differs from `before`, asks the host's check as the preference "module.check" says, and
// puts back what is not to stay. `routine` lives until it is forgotten.
void review_slots(const char* routine, const ZR_SlotFunc (&before)[ZR_SlotCount]);
void forget_slot_review();
// For a routine that is refused after its review: what was found since there were `count` slots.
size_t slot_review_count();
void forget_slot_review_from(size_t count);

}  // namespace zr
