// The routines that stand in the slot table after birth.
#pragma once

namespace zr {

// Writes every slot whose routine the library has; the others are left alone (null at birth).
void fill_default_slots();
// Those of the samplers; called by fill_default_slots.
void fill_sampler_slots();
// Those of mask buffers; the same.
void fill_mask_slots();

}  // namespace zr
