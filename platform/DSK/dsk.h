// DSK: which file extension means which file type.
#pragma once

#include <ZR/zr.h>

// `extension` with its dot, compared without regard to case; the first of a name wins. 0 or 4.
i32 DSK_AddExtensionMap(const char* extension, u32 type, i32 reserved);
// The type of a path's extension, or 0.
u32 DSK_TypeOfPath(const char* path);
// Forgets all; ZR_Death calls it.
void DSK_ClearExtensionMap();
