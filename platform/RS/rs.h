// RS: frame memory from a recycling pool, and raster worlds behind handles.
// The part that hosts see stands in <ZR/platform.h>.
#pragma once

#include <ZR/platform.h>

#include <cstddef>

// A frame of at least `bytes`, aligned to 64, not zeroed; recycled from the pool where one of the size
// waits. Null without a message when memory is short, once the waiting frames have been given back. Any
// thread.
void* RS_AllocateFrameQuiet(std::size_t bytes);
// `bytes` is what the frame was allocated with.
void RS_FreeFrame(void* frame, std::size_t bytes);
// Reports in one message that an image of this size could not be allocated; `code` is the error.
void RS_ReportWorldAllocationFailure(i32 code, i32 row_bytes, i32 width, i32 height, i32 bits_per_pixel);
// Where the pixels of a frame are whose record has no base address yet; null when it has no memory.
void* RSp_GetPixBaseAddr(RS_World** raster);
// The byte order of a 32-bit raster: 0 alpha first, 1 blue first.
i32 RS_GetChannelOrder(RS_World** raster);
