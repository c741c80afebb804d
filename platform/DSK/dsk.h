// DSK: which file extension means which file type. Main thread only.
#pragma once

#include <ZR/zr.h>

// `extension` with its dot, at most 15 bytes, compared without regard to case; the first of a name wins.
// 0, 4, or 516 for an empty or longer one.
i32 DSK_AddExtensionMap(const char* extension, u32 type, i32 reserved);
// The type of a path's extension, or 0. A leading dot begins a hidden name and not an extension.
u32 DSK_TypeOfPath(const char* path);
// Forgets all; ZR_Death calls it.
void DSK_ClearExtensionMap();
