// What all of the mask code shares: buffers seen by the type of their values, and the checks before an operation.
#pragma once

#include <ZR/errors.h>
#include <ZR/mask_buffer.h>

#include <cstring>
#include <type_traits>

#include "world/guard.h"

namespace zr {

// The values of a mask are the channels of the pixel of its depth, and compute as they do.
template <class C>
using MaskPixel = std::conditional_t<std::is_same_v<C, u8>, ZR_Pixel8,
                                     std::conditional_t<std::is_same_v<C, u16>, ZR_Pixel16, ZR_PixelFloat>>;
template <class C>
using MaskDepth = Depth<MaskPixel<C>>;
// Factors of a depth, not held to its white.
template <class C>
using Factor = typename MaskDepth<C>::Wide;

// Values that pass through local memory together.
inline constexpr i32 mask_block = 512;

inline bool is_alive(const ZR_UnoBuffer* buffer) {
  return buffer != nullptr && buffer->magic == ZR_UnoMagic && buffer->data != nullptr && *buffer->data != nullptr;
}
inline i32 damaged_mask(ZR_CallSite site, i32 line = __builtin_LINE()) {
  return failed_verification(site, HB_ZLookupLStrCache(ZR_G_zref, ZR_Str_DamagedMask, 0, 0), line);
}

template <class C>
struct MaskView {
  explicit MaskView(const ZR_UnoBuffer& buffer)
      : values(static_cast<C*>(*buffer.data)), width(buffer.width), height(buffer.height) {}
  C* at(i64 x, i64 y) const { return values + y * width + x; }
  i64 count() const { return i64{width} * height; }

  C* values;
  i32 width, height;
};

// Calls body.template operator()<C>() for the depth of a buffer.
template <class Body>
i32 on_mask_depth(const ZR_UnoBuffer& buffer, ZR_CallSite site, Body&& body) {
  return on_depth(
      buffer.depth, "Unexpected bitdepth of a mask buffer",
      [&]<class T>() -> i32 { return body.template operator()<Channel<T>>(); }, site);
}

template <class C>
void clear_values(C* values, i64 count) {
  if (count > 0) std::memset(values, 0, static_cast<std::size_t>(count) * sizeof(C));
}

}  // namespace zr
