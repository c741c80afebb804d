// DIE: the table of random words behind dither.
#pragma once

#include <ZR/zr.h>

// The same table at every call and in every run: 32-bit words from a fixed seed; their number is prime.
// Cannot fail. Any thread.
void DIE_GetPrimeSizedTable(const u32** start, i32* count);
