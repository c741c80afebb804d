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

// Null so far: extract_planes, insert_planes, paint_spot and the sixteen colour functions.
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
  fill_ansi_functions(&G_private[static_cast<size_t>(P::ansi_first)]);
}

}  // namespace

void fill_private_routines() { std::call_once(G_private_filled, fill); }

void* private_routine(PrivateRoutine routine) { return G_private[static_cast<size_t>(routine)]; }

}  // namespace zr
