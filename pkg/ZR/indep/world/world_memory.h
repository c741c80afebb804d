// The memory behind worlds that own their pixels: sizes, plain frames with their gutter, raster frames.
#pragma once

#include <ZR/world.h>

#include <cstddef>

namespace zr {

// Layout of a plain frame. Behind the last pixel of the last row stands the gutter, as long as a row less one
// pixel, filled with a pattern; 8 more bytes pay for the alignment of the first pixel.
struct FrameShape {
  i32 width, height, row_bytes, pixel_bytes;

  std::size_t pixels_end() const {
    return static_cast<std::size_t>(height - 1) * static_cast<std::size_t>(row_bytes) +
           static_cast<std::size_t>(width) * static_cast<std::size_t>(pixel_bytes);
  }
  std::size_t gutter() const { return static_cast<std::size_t>(row_bytes - pixel_bytes); }
  std::size_t bytes() const { return pixels_end() + gutter() + 8; }
};

// Rows of plain frames are padded to 16 bytes, so that vector loops may run on full rows.
inline i32 padded_row_bytes(i32 width, i32 pixel_bytes) { return (width * pixel_bytes + 15) & ~15; }

// Reports "invalid image buffer size (WxH)." and throws ZR_Err_BadParam outside 1..30000.
void check_world_size(i32 width, i32 height);

// The frame's address, gutter written, pixels not. Reports and throws ZR_Err_OutOfMemory when memory is short.
u64 allocate_frame(const FrameShape& shape);
void free_frame(u64 allocation, const FrameShape& shape);
// Where the first pixel of a frame is: its address, or 8 more, so that it is a multiple of 16 wherever
// frames are multiples of 8.
void* frame_pixels(u64 allocation);
bool gutter_overwritten(u64 allocation, const FrameShape& shape);

// A raster frame with its pixels locked; throws what its library returns.
RS_World** make_raster_frame(i32 width, i32 height, i32 bits_per_pixel);
// Top left pixel of a raster frame, made present if it is not.
void* raster_pixels(RS_World** raster);

// One more or fewer in the live counts. Relaxed: they only inform.
void count_live(i32& counter, i32 change);

}  // namespace zr
