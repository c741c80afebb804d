// The private table: routines of the callback surface that nobody can replace. Its entries are null until
// the first ZR_GetCallbackBlock of the process fills them, and so are the selectors that lead to it.
#pragma once

#include <ZR/zr.h>

namespace zr {

inline constexpr int colour_function_count = 8;

enum class PrivateRoutine : u8 {
  batch_sampling,
  blend_straight,
  blend_premul,
  fill8,
  fill16,
  gaussian_kernel,
  gaussian_value,
  premul,
  premul_color,
  premul_color16,
  new_world,
  dispose_world,
  transfer_rect_adapter,
  transform_world_adapter,
  handle_new,
  handle_lock,
  handle_unlock,
  handle_dispose,
  handle_size,
  handle_resize,
  get_callback_addr,
  app_callback,
  platform_query,
  get_pixel_data8,
  get_pixel_data16,
  extract_planes,
  insert_planes,
  paint_spot,
  ansi_first,  // 19 in their order
  ansi_last = ansi_first + 18,
  colour_straight_first,  // RGB to HLS, back, RGB to YIQ, back, luminance, hue, lightness, saturation
  colour_straight_last = colour_straight_first + colour_function_count - 1,
  colour_premul_first,
  colour_premul_last = colour_premul_first + colour_function_count - 1,
  count
};

// Fills the table, once in the life of the process; later calls do nothing. The first is to come from one
// thread while no other reads the table.
void fill_private_routines();

// Null before the table is filled, and for a routine that the library does not have yet.
void* private_routine(PrivateRoutine routine);

}  // namespace zr
