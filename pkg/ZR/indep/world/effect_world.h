// Routines behind the callback block that make effect worlds and open destinations; no exports of their own.
#pragma once

#include <ZR/zr.h>

namespace zr {

// A new world of 16 bits where bit 1 of flags is set, else of 8, zeroed where bit 0 is. Its result also goes
// to ZR_G_LastWorldStatus.
i32 new_world_from_flags(void* ref, i32 width, i32 height, i32 flags, ZR_LayerDef* out);

// Clears a record of 32 bytes; opening also stores `first` at its start. Both return 0.
i32 open_destination(void* first, void* record);
i32 close_destination(void* first, void* record);

}  // namespace zr
