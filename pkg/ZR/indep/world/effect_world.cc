// Worlds as plug-ins ask for them: a plain record in front of a ZR_WorldX on the heap.
#include "world/effect_world.h"

#include <ZR/errors.h>
#include <ZR/world.h>

#include <cstring>

#include "world/guard.h"
#include "world/world_memory.h"

namespace zr {
namespace {

i32 new_effect_world(i32 width, i32 height, i32 depth, i32 flags, ZR_LayerDef* out) {
  return guarded([&] {
    if (out == nullptr) return static_cast<i32>(ZR_Err_None);
    if (depth != static_cast<i16>(depth)) fail(ZR_Err_Internal);
    ZR_World* const world = ZR_World::New(width, height, static_cast<i16>(depth), flags);
    if (world == nullptr) return static_cast<i32>(ZR_Err_OutOfMemory);
    world->FillOutEffectWorld(out);
    out->dispose_tag = ZR_DisposeTag;
    return static_cast<i32>(ZR_Err_None);
  });
}

template <class T>
i32 get_pixel_data(const char* null_text, ZR_LayerDef* world, void* pixels, void** out) {
  *out = nullptr;
  if (world == nullptr) {
    HBp_ReportErrString(ZR_ModuleCode | ZR_Site_GetPixelData, ZR_ReportSeverity, null_text);
    return ZR_Err_BadParam;
  }
  if (ZRp_WorldDepth(world) == Depth<T>::bits) *out = pixels != nullptr ? pixels : world->data;
  return ZR_Err_None;
}

}  // namespace

i32 new_world_from_flags(void* /*ref*/, i32 width, i32 height, i32 flags, ZR_LayerDef* out) {
  const i32 depth = 8 + (flags & ZR_WorldFlag_Deep) * 4;
  ZR_G_LastWorldStatus = new_effect_world(width, height, depth, flags & (ZR_WorldFlag_Clear | ZR_WorldFlag_Deep), out);
  return ZR_G_LastWorldStatus;
}

i32 open_destination(void* first, void* record) {
  close_destination(first, record);
  std::memcpy(record, &first, sizeof first);
  return ZR_Err_None;
}

i32 close_destination(void* /*first*/, void* record) {
  constexpr std::size_t record_bytes = 32;
  std::memset(record, 0, record_bytes);
  return ZR_Err_None;
}

}  // namespace zr

extern "C" {

i32 ZR_NewEffectWorld(void* /*ref*/, i32 width, i32 height, i32 depth, bool clear, bool raster, ZR_LayerDef* out) {
  const i32 flags = (depth == zr::Depth<ZR_Pixel16>::bits ? ZR_WorldFlag_Deep : 0) | (clear ? ZR_WorldFlag_Clear : 0) |
                    (raster ? ZR_WorldFlag_RasterFrame : 0);
  return zr::new_effect_world(width, height, depth, flags, out);
}

i32 ZR_DisposeEffectWorld(void* /*ref*/, ZR_LayerDef* world) {
  return zr::guarded([&] {
    const bool disposable = world != nullptr && world->dispose_tag == ZR_DisposeTag && world->owner != nullptr;
    if (!disposable) {
      const ZR_StringIndex index = world == nullptr ? ZR_Str_InvalidParameter : ZR_Str_DisposeForeignWorld;
      if (HB_ZLookupLStrCache(ZR_G_zref, index, 0, 0) != nullptr) {
        zr::report_string(index, ZR_Site_DisposeEffectWorld);
        return static_cast<i32>(ZR_Err_BadParam);
      }
    }
    if (world != nullptr) {  // also a record that could not be refused, for want of a text
      delete world->owner;
      *world = ZR_LayerDef{};
    }
    return static_cast<i32>(ZR_Err_None);
  });
}

i32 ZR_GetEffectWorldDepth(void* /*ref*/, const ZR_LayerDef* world, i32* depth) {
  *depth = ZRp_WorldDepth(world);
  return ZR_Err_None;
}

i32 ZR_EffectWorldFromRSWorld(RS_World** raster, ZR_LayerDef* out) {
  return zr::guarded([&] {
    // The extent stays zero: users of a frame's record go by width and height.
    const auto fill_out = [&]<class T> {
      const RS_World& frame = **raster;
      *out = ZR_LayerDef{};
      out->flags = zr::Depth<T>::layer_flags;
      out->data = zr::raster_pixels(raster);
      out->row_bytes = frame.row_bytes;
      out->width = frame.width;
      out->height = frame.height;
      out->raster = raster;
      return static_cast<i32>(ZR_Err_None);
    };
    const i32 bits = (*raster)->bits_per_pixel;
    return zr::on_depth(bits % 4 == 0 ? bits / 4 : 0, "ZR_Worlds can only be 128, 64 or 32 bits per pixel", fill_out,
                        ZR_Site_RSWorldDepth);
  });
}

i16 ZR_DepthOfRSWorld(RS_World** raster) { return static_cast<i16>((*raster)->bits_per_pixel / 4); }

i32 ZR_GetPixelData8(ZR_LayerDef* world, void* pixels, void** out) {
  return zr::get_pixel_data<ZR_Pixel8>("bad parameter passed to ZR_GetPixelData8", world, pixels, out);
}
i32 ZR_GetPixelData16(ZR_LayerDef* world, void* pixels, void** out) {  // the text is the 8-bit form's
  return zr::get_pixel_data<ZR_Pixel16>("bad parameter passed to ZR_GetPixelData8", world, pixels, out);
}
i32 ZR_GetPixelDataFloat(ZR_LayerDef* world, void* pixels, void** out) {
  return zr::get_pixel_data<ZR_PixelFloat>("bad parameter passed to ZR_GetPixelDataFloat", world, pixels, out);
}

}  // extern "C"
