// Owner of the suites' tables: 18 records of functions, written while the library is born and only read afterwards.
#include "host/suites_state.h"

#include <ADDIN/addin.h>
#include <ZR/suites.h>
#include <ZR/summed_area.h>

#include <cstring>

#include "host/ansi_functions.h"
#include "host/host_services.h"
#include "sample/sample_functions.h"
#include "world/effect_world.h"
#include "world/guard.h"
#include "world/slot_table.h"

namespace zr {
namespace {

template <int word>
i32 has_cpu_word(bool* out) {
  if (out != nullptr) *out = HB_G_CPU_DataP[word] != 0;
  return ZR_Err_None;
}

i32 new_world_of_format(void* ref, i32 width, i32 height, bool clear, u32 format, ZR_LayerDef* out) {
  i32 depth = 0;
  switch (format) {
    case ZR_PixelFormat_ARGB8: depth = 8; break;
    case ZR_PixelFormat_ARGB16: depth = 16; break;
    case ZR_PixelFormat_ARGBFloat: depth = 32; break;
    default: return failed_verification(ZR_Site_WorldSuite, "Unsupported ZR_PixelFormat");
  }
  return ZR_NewEffectWorld(ref, width, height, depth, clear, false, out);
}

i32 get_pixel_format(ZR_LayerDef* world, u32* format) {
  if (world == nullptr || format == nullptr)
    return failed_verification(ZR_Site_WorldSuite, "Bad parameter to ZRp_GetPixelFormat()");
  if (world->owner == nullptr && world->flags >> 24 > 2)
    return failed_verification(ZR_Site_WorldSuite, "Unsupported pixel depth in ZRp_GetPixelFormat()");
  const i32 depth = ZRp_WorldDepth(world);
  *format = depth == 8 ? ZR_PixelFormat_ARGB8 : depth == 16 ? ZR_PixelFormat_ARGB16 : ZR_PixelFormat_ARGBFloat;
  return ZR_Err_None;
}

// In the order in which they are registered.
struct Tables {
  ZR_CPUDataSuite1 cpu;
  ZR_ANSISuite1 ansi;
  ZR_HandleSuite2 handle;
  ZR_ColorSuite1 color;
  ZR_Color16Suite1 color16;
  ZR_ColorFloatSuite1 color_float;
  ZR_BatchSamplingSuite1 batch_sampling;
  ZR_Sampling8Suite1 sampling8;
  ZR_Sampling16Suite1 sampling16;
  ZR_SamplingFloatSuite1 sampling_float;
  ZR_WorldSuite1 world1;
  ZR_Iterate8Suite1 iterate8;
  ZR_IterateDeepSuite1 iterate16, iterate_float;
  ZR_WorldTransformSuite1 world_transform;
  ZR_FillMatteSuite2 fill_matte;
  ZR_PixelDataSuite1 pixel_data;
  ZR_WorldSuite2 world2;
};
constinit Tables G_tables{};

void fill_tables(Tables& t) {
  t.cpu = {has_cpu_word<0>, has_cpu_word<1>, has_cpu_word<2>, has_cpu_word<3>};
  void* ansi[ansi_function_count];
  fill_ansi_functions(ansi);
  static_assert(sizeof ansi == sizeof t.ansi);
  std::memcpy(&t.ansi, ansi, sizeof ansi);
  t.handle = {host_handle_new,     host_handle_lock, host_handle_unlock,
              host_handle_dispose, host_handle_size, host_handle_resize};
  t.color = {ZR_RGBtoHLS_Straight,  ZR_HLStoRGB_Straight, ZR_RGBtoYIQ_Straight,  ZR_YIQtoRGB_Straight,
             ZR_Luminance_Straight, ZR_Hue_Straight,      ZR_Lightness_Straight, ZR_Saturation_Straight};
  t.color16 = {ZR_RGBtoHLS_Straight16,  ZR_HLStoRGB_Straight16, ZR_RGBtoYIQ_Straight16,  ZR_YIQtoRGB_Straight16,
               ZR_Luminance_Straight16, ZR_Hue_Straight16,      ZR_Lightness_Straight16, ZR_Saturation_Straight16};
  t.color_float = {ZR_RGBtoHLS_StraightFloat,  ZR_HLStoRGB_StraightFloat,  ZR_RGBtoYIQ_StraightFloat,
                   ZR_YIQtoRGB_StraightFloat,  ZR_Luminance_StraightFloat, ZR_Hue_StraightFloat,
                   ZR_Lightness_StraightFloat, ZR_Saturation_StraightFloat};
  t.batch_sampling = {};
  t.sampling8 = {slot<ZR_Slot_nn_sample8>(), slot<ZR_Slot_bilinear_straight8>(), slot<ZR_Slot_area_straight8>()};
  t.sampling16 = {slot<ZR_Slot_nn_sample16>(), slot<ZR_Slot_bilinear_straight16>(), slot<ZR_Slot_area_straight16>()};
  t.sampling_float = {ZR_NNSampleFloat, ZR_SubpixelBilinearFloat, ZR_AreaSample_CPlusPlus<ZR_PixelFloat, 1>};
  t.world1 = {new_world_from_flags, ZR_DisposeEffectWorld};
  t.iterate8 = {slot<ZR_Slot_iterate>(), slot<ZR_Slot_iterate_origin>(), slot<ZR_Slot_iterate_lut>(),
                slot<ZR_Slot_iterate_origin_no_clip>(), slot<ZR_Slot_iterate_generic>()};
  t.iterate16 = {slot<ZR_Slot_iterate>(), slot<ZR_Slot_iterate_origin>(), slot<ZR_Slot_iterate_origin_no_clip>()};
  t.iterate_float = t.iterate16;
  t.world_transform = {slot<ZR_Slot_composite_rect_best_straight>(),
                       ZR_Blend_Straight,
                       slot<ZR_Slot_convolve>(),
                       slot<ZR_Slot_copy_bits_draft>(),
                       slot<ZR_Slot_copy_bits_hq_straight>(),
                       transfer_rect_adapter,
                       transform_world_adapter};
  t.fill_matte = {ZR_Fill, ZR_Fill16, ZR_FillFloat, ZR_Premul, ZR_PremulColor, ZR_PremulColor16, ZR_PremulColorFloat};
  t.pixel_data = {ZR_GetPixelData8, ZR_GetPixelData16, ZR_GetPixelDataFloat};
  t.world2 = {new_world_of_format, ZR_DisposeEffectWorld, get_pixel_format};
}

template <class Table>
i32 add(const char* name, i32 version_a, i32 version_b, const Table& table) {
  constexpr i32 count = sizeof(Table) / sizeof(void*);
  return ADDIN_AddTWSuite(0, 0, name, version_a, version_b, count, reinterpret_cast<void* const*>(&table));
}

}  // namespace

i32 register_suites() {
  fill_tables(G_tables);
  const Tables& t = G_tables;
  i32 result = ZR_Err_None;
  const auto each = [&](const char* name, i32 version_a, i32 version_b, const auto& table) {
    if (result == ZR_Err_None) result = add(name, version_a, version_b, table);
  };
  each(ZR_CPUDataSuite_Name, 1, 1, t.cpu);
  each(ZR_ANSISuite_Name, 1, 1, t.ansi);
  each(ZR_HandleSuite_Name, 2, 1, t.handle);
  each(ZR_ColorSuite_Name, 1, 1, t.color);
  each(ZR_Color16Suite_Name, 1, 1, t.color16);
  each(ZR_ColorFloatSuite_Name, 1, 1, t.color_float);
  each(ZR_BatchSamplingSuite_Name, 1, 1, t.batch_sampling);
  each(ZR_Sampling8Suite_Name, 1, 1, t.sampling8);
  each(ZR_Sampling16Suite_Name, 1, 1, t.sampling16);
  each(ZR_SamplingFloatSuite_Name, 1, 1, t.sampling_float);
  each(ZR_WorldSuite_Name, 1, 1, t.world1);
  each(ZR_Iterate8Suite_Name, 1, 1, t.iterate8);
  each(ZR_Iterate16Suite_Name, 1, 1, t.iterate16);
  each(ZR_IterateFloatSuite_Name, 1, 1, t.iterate_float);
  each(ZR_WorldTransformSuite_Name, 1, 1, t.world_transform);
  each(ZR_FillMatteSuite_Name, 2, 2, t.fill_matte);
  each(ZR_PixelDataSuite_Name, 1, 1, t.pixel_data);
  each(ZR_WorldSuite_Name, 2, 2, t.world2);
  return result;
}

}  // namespace zr

extern "C" i32 ZR_GetBasicSuite(const ZR_BasicSuite** out) { return ADDIN_GetTWBasicSuite(out); }
