// Mask buffers: made, freed and filled.
#include <ZR/mask_buffer.h>

#include <algorithm>
#include <new>

#include "mask/mask_values.h"

namespace zr {
namespace {

const char* memory_label() { return HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_MaskMemory, 0, 0); }

// Null when memory is short, which is reported; negative sides and sizes beyond all memory are too.
void** new_values(i32 width, i32 height, i32 value_bytes) {
  constexpr u64 too_many = u64{1} << 60;
  u64 bytes = too_many;
  if (width >= 0 && height >= 0)
    bytes = std::min(static_cast<u64>(width) * static_cast<u64>(height), too_many / 8) * static_cast<u64>(value_bytes);
  return HB_AllocateHandleClear(bytes, memory_label(), ZR_ModuleCode | ZR_Site_MaskNew);
}

// For records that come from the C interface, which knows no throwing constructor.
i32 new_buffer(i32 width, i32 height, i32 depth, ZR_UnoBuffer** out) {
  if (out == nullptr) return damaged_mask(ZR_Site_MaskNew);
  *out = nullptr;
  void* const record = HB_AllocatePtr(sizeof(ZR_UnoBuffer), memory_label(), ZR_ModuleCode | ZR_Site_MaskNew);
  if (record == nullptr) return ZR_Err_OutOfMemory;
  try {
    *out = ::new (record) ZR_UnoBuffer(width, height, depth);
  } catch (const i32 error) {
    HB_FreePtr(record);
    return error;
  }
  return ZR_Err_None;
}

template <class C>
void fill_values(C value, i64 count, C* values) {
  std::fill_n(values, count, value);
}

template <class C>
i32 fill_all(C value, ZR_UnoBuffer* buffer) {
  if (!is_alive(buffer)) return damaged_mask(ZR_Site_MaskFill);
  if (buffer->depth != MaskDepth<C>::bits)
    return failed_verification(ZR_Site_MaskFill, "a mask buffer is filled with values of another depth");
  const MaskView<C> view(*buffer);
  fill_values(value, view.count(), view.values);
  return ZR_Err_None;
}

template <class C>
i32 fill_part(C value, const GX_LRect* rect, ZR_UnoBuffer* buffer) {
  if (rect == nullptr) return fill_all(value, buffer);
  if (!is_alive(buffer)) return damaged_mask(ZR_Site_MaskFill);
  if (buffer->depth != MaskDepth<C>::bits)
    return failed_verification(ZR_Site_MaskFill, "a mask buffer is filled with values of another depth");
  if (rect->right <= rect->left || rect->bottom <= rect->top) return ZR_Err_None;
  if (rect->left < 0 || rect->top < 0 || rect->right > buffer->width || rect->bottom > buffer->height)
    return failed_verification(ZR_Site_MaskFill, "a rectangle to fill leaves its mask buffer");
  const MaskView<C> view(*buffer);
  const i32 width = rect->right - rect->left, height = rect->bottom - rect->top;
  if (width == view.width) {
    fill_values(value, i64{width} * height, view.at(0, rect->top));
    return ZR_Err_None;
  }
  for (i32 y = rect->top; y < rect->bottom; ++y) fill_values(value, i64{width}, view.at(rect->left, y));
  return ZR_Err_None;
}

}  // namespace
}  // namespace zr

ZR_UnoBuffer::ZR_UnoBuffer(i32 width_, i32 height_, i32 depth_)
    : magic(ZR_UnoMagic), width(width_), height(height_), data(nullptr), depth(depth_) {
  if (depth == 0 || depth == 1) depth = depth == 1 ? 8 : 16;
  data = zr::new_values(width, height, depth > 0 ? depth / 8 : 0);
  if (data == nullptr) zr::fail(ZR_Err_OutOfMemory);
}

ZR_UnoBuffer::~ZR_UnoBuffer() {
  if (magic != ZR_UnoMagic) {
    zr::damaged_mask(ZR_Site_MaskDispose);
    return;
  }
  HB_FreeHandle(data);
  // Volatile: a plain store to an object that dies may be dropped, and later users are to be told.
  *static_cast<volatile u32*>(&magic) = 0;
}

void* ZR_UnoBuffer::operator new(size_t bytes) noexcept { return HB_MemTrackedObject::operator new(bytes); }
void ZR_UnoBuffer::operator delete(void* record) noexcept { HB_MemTrackedObject::operator delete(record); }

i32 ZR_NewUnoBuffer(i32 width, i32 height, ZR_UnoBuffer** out) { return zr::new_buffer(width, height, 8, out); }
i32 ZR_NewDeepUnoBuffer(i32 width, i32 height, ZR_UnoBuffer** out) { return zr::new_buffer(width, height, 16, out); }

i32 ZR_DisposeUnoBuffer(ZR_UnoBuffer* buffer) {
  if (buffer == nullptr) return ZR_Err_None;
  const bool ours = buffer->magic == ZR_UnoMagic;
  delete buffer;  // reports another magic
  return ours ? ZR_Err_None : ZR_Err_Internal;
}

i32 ZR_FillUnoBuffer(u8 value, ZR_UnoBuffer* buffer) {
  if (!zr::is_alive(buffer)) return zr::damaged_mask(ZR_Site_MaskFill);
  return zr::on_mask_depth(*buffer, ZR_Site_MaskFill, [&]<class C>() -> i32 {
    const zr::MaskView<C> view(*buffer);
    std::memset(view.values, value, static_cast<std::size_t>(view.count()) * sizeof(C));
    return ZR_Err_None;
  });
}
i32 ZR_FillDeepUnoBuffer(u16 value, ZR_UnoBuffer* buffer) { return zr::fill_all(value, buffer); }
i32 ZR_FillFloatUnoBuffer(f32 value, ZR_UnoBuffer* buffer) { return zr::fill_all(value, buffer); }
i32 ZR_FillUnoBuffer(u8 value, const GX_LRect* rect, ZR_UnoBuffer* buffer) {
  return zr::fill_part(value, rect, buffer);
}
i32 ZR_FillDeepUnoBuffer(u16 value, const GX_LRect* rect, ZR_UnoBuffer* buffer) {
  return zr::fill_part(value, rect, buffer);
}
