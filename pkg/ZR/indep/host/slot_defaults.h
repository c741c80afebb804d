// The routines that stand in the slot table after birth.
#pragma once

namespace zr {

// Writes every slot whose routine the library has; the others are left alone (null at birth).
void fill_default_slots();

}  // namespace zr
