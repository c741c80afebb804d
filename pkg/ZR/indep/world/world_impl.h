// Bodies of ZR_WorldX<T>: construction, clearing, filling, alpha, ownership. Included by world.cc alone.
#pragma once

#include <ZR/world.h>

#include <algorithm>
#include <cstring>

#include "world/guard.h"
#include "world/alpha_rows.h"
#include "world/pixel_rows.h"
#include "world/row_bands.h"
#include "world/world_memory.h"

namespace zr {

// Makes `out` the part `rect` of `parent`, which may be the same record. The rectangle is not checked, so the
// address may be anywhere: it is worked out as a number. The extent may come out empty or inverted.
inline void take_part(const ZR_LayerDef& parent, const GX_LRect& rect, i32 pixel_bytes, ZR_LayerDef* out) {
  const GX_LRect& extent = parent.extent;
  const i64 bytes = i64{rect.left} * pixel_bytes + i64{rect.top} * parent.row_bytes;
  out->data = reinterpret_cast<void*>(reinterpret_cast<u64>(parent.data) + static_cast<u64>(bytes));
  out->row_bytes = parent.row_bytes;
  out->flags = parent.flags;
  out->host_word = parent.host_word;
  out->extent = {wrap_sub(std::max(extent.left, rect.left), rect.left),
                 wrap_sub(std::max(extent.top, rect.top), rect.top),
                 wrap_sub(std::min(extent.right, rect.right), rect.left),
                 wrap_sub(std::min(extent.bottom, rect.bottom), rect.top)};
  out->width = wrap_sub(rect.right, rect.left);
  out->height = wrap_sub(rect.bottom, rect.top);
}

// Makes `out`, all zero so far, a view of whole foreign pixels.
template <class T>
void take_pixels(void* data, i32 width, i32 height, i32 row_bytes, ZR_LayerDef* out) {
  out->data = data;
  out->width = width;
  out->height = height;
  out->row_bytes = row_bytes;
  out->extent = {0, 0, width, height};
  out->flags = Depth<T>::layer_flags;
}

// What lies inside the world; null means all of it. right <= left or bottom <= top when nothing does.
inline GX_LRect clip_to_world(const GX_LRect* rect, const ZR_LayerDef& world) {
  if (rect == nullptr) return {0, 0, world.width, world.height};
  return {std::max(rect->left, 0), std::max(rect->top, 0), std::min(rect->right, world.width),
          std::min(rect->bottom, world.height)};
}
inline bool is_empty(const GX_LRect& rect) { return rect.right <= rect.left || rect.bottom <= rect.top; }

}  // namespace zr

// ------------------------------------------------------------------------------ construction

template <class T>
ZR_WorldX<T>::ZR_WorldX(i32 width_, i32 height_, i32 flags_) {
  constexpr i32 pixel_bytes = sizeof(T);
  zr::check_world_size(width_, height_);
  if ((flags_ & ZR_WorldFlag_RasterFrame) != 0) {
    raster = zr::make_raster_frame(width_, height_, pixel_bytes * 8);
    allocation = 1;
    zr::take_pixels<T>(zr::raster_pixels(raster), width_, height_, (*raster)->row_bytes, this);
  } else {
    const zr::FrameShape shape = {width_, height_, zr::padded_row_bytes(width_, pixel_bytes), pixel_bytes};
    allocation = zr::allocate_frame(shape);
    zr::take_pixels<T>(zr::frame_pixels(allocation), width_, height_, shape.row_bytes, this);
  }
  alloc_width = static_cast<u16>(width_);
  alloc_height = static_cast<u16>(height_);
  if ((flags_ & ZR_WorldFlag_Clear) != 0) {  // the tail padding of rows stays as it is
    if (row_bytes == width_ * pixel_bytes)
      zr::clear_row(Row(0), std::ptrdiff_t{width_} * height_);
    else
      for (i32 y = 0; y < height_; ++y) zr::clear_row(Row(y), width_);
  }
  owner = this;
  zr::count_live(ZR_G_LiveWorlds, 1);
}

template <class T>
ZR_WorldX<T>::ZR_WorldX(ZR_WorldX* parent, const GX_LRect& rect) {
  zr::take_part(*parent, rect, sizeof(T), this);
  owner = this;
}

template <class T>
ZR_WorldX<T>::ZR_WorldX(RS_World** frame, const GX_Rect* rect) {
  const RS_World& record = **frame;
  char* const base = static_cast<char*>(zr::raster_pixels(frame));
  if (rect != nullptr) {  // a part does not count as having a frame
    const std::ptrdiff_t start = std::ptrdiff_t{rect->top} * record.row_bytes +
                                 std::ptrdiff_t{rect->left} * static_cast<std::ptrdiff_t>(sizeof(T));
    zr::take_pixels<T>(base + start, static_cast<i16>(rect->right - rect->left),
                       static_cast<i16>(rect->bottom - rect->top), record.row_bytes, this);
  } else {
    zr::take_pixels<T>(base, record.width, record.height, record.row_bytes, this);
    raster = frame;
  }
  owner = this;
}

template <class T>
ZR_WorldX<T>::ZR_WorldX(void* data_, i32 width_, i32 height_, i32 row_bytes_) {
  zr::take_pixels<T>(data_, width_, height_, row_bytes_, this);
  owner = this;
}

template <class T>
ZR_WorldX<T>::ZR_WorldX(ZR_LayerDef* layer, bool /*keep_layer: this record starts zeroed either way*/) {
  width = layer->width;
  height = layer->height;
  row_bytes = layer->row_bytes;
  data = layer->data;
  flags = layer->flags;
  extent = layer->extent;
  owner = this;
}

template <class T>
ZR_WorldX<T>::~ZR_WorldX() {
  if (allocation != 0) {
    if (raster != nullptr) {
      RS_UnlockPixels(raster);
      RS_DisposeWorld(raster);
    } else {
      zr::free_frame(allocation, {alloc_width, alloc_height, row_bytes, sizeof(T)});
    }
    zr::count_live(ZR_G_LiveWorlds, -1);
  }
  // Volatile: the compiler may drop plain stores to an object that dies, and this one is for later readers.
  *static_cast<volatile u32*>(&dispose_tag) = ZR_DeadTag;
}

// -------------------------------------------------------------------------- clearing and filling

template <class T>
void ZR_WorldX<T>::Clear(const GX_LRect* rect) {
  const GX_LRect part = zr::clip_to_world(rect, *this);
  if (zr::is_empty(part)) return;
  const std::ptrdiff_t columns = part.right - part.left;
  if (columns * static_cast<std::ptrdiff_t>(sizeof(T)) == row_bytes) {
    // Kept so on purpose: rows below the rectangle go too. Never more than this world holds.
    zr::each_band(part.top, height, columns, sizeof(T),
                  [&](i32 top, i32 bottom) { zr::clear_row(Row(top), columns * (bottom - top)); });
    return;
  }
  zr::each_row(part.top, part.bottom, columns, sizeof(T), [&](i32 y) { zr::clear_row(At(part.left, y), columns); });
}

template <class T>
void ZR_WorldX<T>::ClearExceptRect(const GX_LRect& rect) {
  const GX_LRect kept = zr::clip_to_world(&rect, *this);
  if (zr::is_empty(kept)) return Clear(nullptr);
  for (i32 y = 0; y < height; ++y) {
    if (y < kept.top || y >= kept.bottom) {
      zr::clear_row(Row(y), width);
    } else {
      zr::clear_row(Row(y), kept.left);
      zr::clear_row(At(kept.right, y), width - kept.right);
    }
  }
}

template <class T>
static void fill_part(ZR_WorldX<T>& world, const T& pixel, const GX_LRect* rect) {
  const GX_LRect part = zr::clip_to_world(rect, world);
  if (zr::is_empty(part)) return;
  const std::ptrdiff_t columns = part.right - part.left;
  zr::each_row(part.top, part.bottom, columns, sizeof(T),
               [&](i32 y) { zr::fill_row(world.At(part.left, y), columns, pixel); });
}

template <class T>
void ZR_WorldX<T>::Fill(const ZR_PixelFloat& colour, const GX_LRect* rect) {
  fill_part(*this, zr::convert_colour<T>(colour), rect);
}

template <class T>
void ZR_WorldX<T>::Fill(const ZR_Pixel16& colour, const GX_LRect* rect) {
  fill_part(*this, zr::convert_colour<T>(colour), rect);
}

// -------------------------------------------------------------------------------------- alpha

template <class T>
void ZR_WorldX<T>::FillAlpha() {
  constexpr auto white = static_cast<zr::Channel<T>>(zr::Depth<T>::white);
  zr::each_row(0, height, width, sizeof(T), [&](i32 y) { zr::fill_alpha_row(Row(y), width, white); });
}

template <class T>
void ZR_WorldX<T>::InvertAlpha() {
  zr::each_row(0, height, width, sizeof(T), [&](i32 y) { zr::invert_alpha_row(Row(y), width); });
}

template <class T>
static void premul_world(ZR_WorldX<T>* world, i32 forward) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) zr::fail(ZR_Err_Internal);  // float worlds go through ZR_Premul
  if (const i32 error = ZR_Premul(nullptr, forward, world); error != 0) zr::fail(error);
}

template <class T>
static void premul_world_against(ZR_WorldX<T>* world, const ZR_Pixel16& colour, i32 forward) {
  i32 error = ZR_Err_Internal;  // of a float world
  if constexpr (std::is_same_v<T, ZR_Pixel8>) {
    const ZR_Pixel8 matte = zr::convert_colour<ZR_Pixel8>(colour);
    error = ZR_PremulColor(nullptr, world, &matte, forward, world);
  } else if constexpr (std::is_same_v<T, ZR_Pixel16>) {
    error = ZR_PremulColor16(nullptr, world, &colour, forward, world);
  }
  if (error != 0) zr::fail(error);
}

template <class T>
void ZR_WorldX<T>::Premultiply() {
  premul_world(this, 1);
}
template <class T>
void ZR_WorldX<T>::Unmultiply() {
  premul_world(this, 0);
}
template <class T>
void ZR_WorldX<T>::PremulColor(const ZR_Pixel16& colour) {
  premul_world_against(this, colour, 1);
}
template <class T>
void ZR_WorldX<T>::UnmulColor(const ZR_Pixel16& colour) {
  premul_world_against(this, colour, 0);
}

// ---------------------------------------------------------------------------------- ownership

template <class T>
bool ZR_WorldX<T>::SubWorldSafetyGutterHasBeenOverWritten() const {
  if (allocation == 0 || raster != nullptr) return false;  // only plain frames have a gutter
  return zr::gutter_overwritten(allocation, {alloc_width, alloc_height, row_bytes, sizeof(T)});
}

template <class T>
void ZR_WorldX<T>::ReleaseOwnership() {
  if (allocation == 0) return;
  zr::count_live(ZR_G_LiveWorlds, -1);
  allocation = 0;
}
