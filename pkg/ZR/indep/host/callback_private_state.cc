// Contents of the private table. A routine that joins the library comes alive by one line here.
#include "host/callback_private_state.h"

#include <array>
#include <mutex>

#include "host/ansi_functions.h"
#include "host/host_services.h"
#include "world/effect_world.h"

namespace zr {
namespace {

constinit std::array<void*, static_cast<size_t>(PrivateRoutine::count)> G_private{};
constinit std::once_flag G_private_filled;

static_assert(static_cast<int>(PrivateRoutine::ansi_last) - static_cast<int>(PrivateRoutine::ansi_first) + 1 ==
              ansi_function_count);

template <class Function>
void put(PrivateRoutine routine, Function* function) {
  G_private[static_cast<size_t>(routine)] = reinterpret_cast<void*>(function);
}

// In the order of the callback block.
void fill_colour_functions() {
  const auto put_pair = [](int index, auto* straight, auto* premul) {
    put(static_cast<PrivateRoutine>(static_cast<int>(PrivateRoutine::colour_straight_first) + index), straight);
    put(static_cast<PrivateRoutine>(static_cast<int>(PrivateRoutine::colour_premul_first) + index), premul);
  };
  put_pair(0, &ZR_RGBtoHLS_Straight, &ZR_RGBtoHLS_Premul);
  put_pair(1, &ZR_HLStoRGB_Straight, &ZR_HLStoRGB_Premul);
  put_pair(2, &ZR_RGBtoYIQ_Straight, &ZR_RGBtoYIQ_Premul);
  put_pair(3, &ZR_YIQtoRGB_Straight, &ZR_YIQtoRGB_Premul);
  put_pair(4, &ZR_Luminance_Straight, &ZR_Luminance_Premul);
  put_pair(5, &ZR_Hue_Straight, &ZR_Hue_Premul);
  put_pair(6, &ZR_Lightness_Straight, &ZR_Lightness_Premul);
  put_pair(7, &ZR_Saturation_Straight, &ZR_Saturation_Premul);
}

// In the order of the private table.
void fill() {
  using P = PrivateRoutine;
  put(P::batch_sampling, &batch_sampling_ended);
  put(P::blend_straight, &ZR_Blend_Straight);
  put(P::blend_premul, &ZR_Blend_Premul);
  put(P::fill8, &ZR_Fill);
  put(P::fill16, &ZR_Fill16);
  put(P::gaussian_kernel, &ZR_GaussianKernel);
  put(P::gaussian_value, &ZRp_GaussianValue);
  put(P::premul, &ZR_Premul);
  put(P::premul_color, &ZR_PremulColor);
  put(P::premul_color16, &ZR_PremulColor16);
  put(P::new_world, &new_world_from_flags);
  put(P::dispose_world, &ZR_DisposeEffectWorld);
  put(P::transfer_rect_adapter, &::transfer_rect_adapter);
  put(P::transform_world_adapter, &::transform_world_adapter);
  put(P::handle_new, &host_handle_new);
  put(P::handle_lock, &host_handle_lock);
  put(P::handle_unlock, &host_handle_unlock);
  put(P::handle_dispose, &host_handle_dispose);
  put(P::handle_size, &host_handle_size);
  put(P::handle_resize, &host_handle_resize);
  put(P::get_callback_addr, &ZR_GetCallbackAddr);
  put(P::app_callback, &ZR_AppCallback);
  put(P::platform_query, &platform_query);
  put(P::get_pixel_data8, &ZR_GetPixelData8);
  put(P::get_pixel_data16, &ZR_GetPixelData16);
  put(P::extract_planes, &ZR_ExtractPlanes);
  put(P::insert_planes, &ZR_InsertPlanes);
  put(P::paint_spot, &ZR_PaintSpot);
  fill_colour_functions();
  fill_ansi_functions(&G_private[static_cast<size_t>(P::ansi_first)]);
}

}  // namespace

void fill_private_routines() { std::call_once(G_private_filled, fill); }

void* private_routine(PrivateRoutine routine) { return G_private[static_cast<size_t>(routine)]; }

}  // namespace zr
