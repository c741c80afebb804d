// SHM: the host's main window, and the mode in which raster frames are made without one.
#pragma once

// The handle that the host has set, else null.
void* SHM_GetMainWindow();
void SHM_SetMainWindow(void* window);

// Calls nest, per thread. Code that makes raster frames runs inside.
void SHM_BeginGdiMinimalisticWindowCreationMode();
void SHM_EndGdiMinimalisticWindowCreationMode();
bool SHM_InGdiMinimalisticWindowCreationMode();
