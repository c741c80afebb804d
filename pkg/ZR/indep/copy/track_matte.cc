// Preparation of mask rows, told once for three depths, and its export for the integer ones.
#include "copy/track_matte.h"

#include <algorithm>

#include "world/alpha_rows.h"

namespace zr {

template <class T>
void prepare_mask_row(u32 count, const T* src, i64 offset, i64 row_length, u32 kind, T* out) {
  i64 skipped = 0;
  if (offset < 0) {
    skipped = -offset;
    row_length -= skipped;
    offset = 0;
  }
  const i64 before = std::min<i64>(offset, count);
  const i64 inside = std::clamp<i64>(row_length, 0, count - before);
  const bool inverted = (kind & mask_inverted) != 0;
  const Channel<T> outside = inverted ? static_cast<Channel<T>>(Depth<T>::white) : Channel<T>{0};
  fill_alpha_row<T>(out, before, outside);
  if (inside > 0) {
    constexpr MaskValue values[] = {MaskValue::alpha, MaskValue::inverted, MaskValue::luma, MaskValue::luma_inverted};
    mask_value_row<T>(values[kind & mask_kinds], inside, src + skipped, out + before);
  }
  fill_alpha_row<T>(out + before + inside, count - before - inside, outside);
}

template <class T>
const T* mask_row(const ZR_MaskWorld& mask, i32 x, i32 y, i32 count, T* scratch) {
  const ZR_LayerDef& world = mask.world;
  const i64 column = static_cast<i64>(x) - mask.offset_x, row = static_cast<i64>(y) - mask.offset_y;
  if (world.data == nullptr || row < 0 || row >= world.height) {
    fill_alpha_row<T>(scratch, count, static_cast<Channel<T>>(Depth<T>::white));
    return scratch;
  }
  const T* const pixels = reinterpret_cast<const T*>(static_cast<const char*>(world.data) + row * world.row_bytes);
  if ((mask.kind & mask_kinds) == 0) return pixels + column;
  prepare_mask_row<T>(static_cast<u32>(count), pixels, -column, world.width, mask.kind, scratch);
  return scratch;
}

#define ZR_MASK_ROWS(T)                                                \
  template void prepare_mask_row<T>(u32, const T*, i64, i64, u32, T*); \
  template const T* mask_row<T>(const ZR_MaskWorld&, i32, i32, i32, T*);
ZR_MASK_ROWS(ZR_Pixel8)
ZR_MASK_ROWS(ZR_Pixel16)
ZR_MASK_ROWS(ZR_PixelFloat)
#undef ZR_MASK_ROWS

}  // namespace zr

i32 ZR_PrepTrackMatteUniv(u32 count, const void* src_row, i32 offset, i32 row_length, u32 flags, bool deep,
                          void* out_row) {
  if (deep)
    zr::prepare_mask_row(count, static_cast<const ZR_Pixel16*>(src_row), offset, row_length, flags,
                         static_cast<ZR_Pixel16*>(out_row));
  else
    zr::prepare_mask_row(count, static_cast<const ZR_Pixel8*>(src_row), offset, row_length, flags,
                         static_cast<ZR_Pixel8*>(out_row));
  return ZR_Err_None;
}
