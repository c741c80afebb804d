// The draft copy on chunks: pixels are so many bytes, whatever they mean.
#include <ZR/copy_bits.h>
#include <ZR/errors.h>

#include <cstring>

#include "copy/copy_scaled.h"
#include "world/chunk.h"

namespace zr {
namespace {

constexpr OverflowTexts overflow_texts = {ZR_Site_ChannelCopy, "ZR_ChannelCopy x overflow detected",
                                          "ZRp_CopyBitsUniversal y underflow detected"};

// 0 for a chunk without pixels.
i64 pixel_bytes(const ZR_Chunk* chunk) {
  if (chunk == nullptr || chunk->data == nullptr || chunk->channels < 1) return 0;
  return i64{chunk->channels} * chunk_element_bytes(chunk->type);
}

CopyPlane plane_of(const ZR_Chunk& chunk, i64 bytes) {
  return {chunk.data, chunk.row_bytes, chunk.width, chunk.height, static_cast<i32>(bytes)};
}

void copy_all(const CopyPlane& src, const CopyPlane& dst) {
  if (src.width <= 0 || src.height <= 0) return;
  const std::size_t bytes = static_cast<std::size_t>(src.width) * static_cast<std::size_t>(src.pixel_bytes);
  const bool packed = src.row_bytes == dst.row_bytes && static_cast<i64>(bytes) == src.row_bytes;
  if (packed && !src.may_overlap(dst)) {
    std::memcpy(dst.data, src.data, bytes * static_cast<std::size_t>(src.height));
    return;
  }
  for (i32 y = 0; y < src.height; ++y) std::memmove(dst.at(0, y), src.at(0, y), bytes);
}

// With a size that the compiler knows, where it is a usual one.
template <std::size_t known>
void emit_row(std::size_t size, i32 n, const i32* columns, const char* src_row, char* dst_pixels) {
  const std::size_t bytes = known != 0 ? known : size;
  for (i32 k = 0; k < n; ++k)
    std::memmove(dst_pixels + static_cast<std::size_t>(k) * bytes,
                 src_row + columns[k] * static_cast<std::ptrdiff_t>(bytes), bytes);
}

using EmitRow = void(std::size_t size, i32 n, const i32* columns, const char* src_row, char* dst_pixels);

EmitRow* emit_row_of(i64 bytes) {
  switch (bytes) {
    case 1: return &emit_row<1>;
    case 2: return &emit_row<2>;
    case 4: return &emit_row<4>;
    case 8: return &emit_row<8>;
    case 16: return &emit_row<16>;
    default: return &emit_row<0>;
  }
}

}  // namespace
}  // namespace zr

i32 ZR_ChannelCopy(const ZR_ProgressInfo* /*progress*/, ZR_Chunk* src, ZR_Chunk* dst, const GX_LRect* src_rect,
                   const GX_LRect* dst_rect) {
  return zr::guarded([&]() -> i32 {
    const i64 bytes = zr::pixel_bytes(src);
    if (bytes == 0 || bytes != zr::pixel_bytes(dst) || bytes > std::numeric_limits<i32>::max())
      return ZR_ReportBadCallbackParam(ZR_Site_ChannelCopy);
    const zr::CopyPlane in = zr::plane_of(*src, bytes), out = zr::plane_of(*dst, bytes);
    zr::CopySide from, to;
    if (!zr::take_rect(src_rect, in.width, in.height, &from) || !zr::take_rect(dst_rect, out.width, out.height, &to))
      return ZR_Err_None;
    if (from.full && to.full && zr::same_rect(from.rect, to.rect)) {
      zr::copy_all(in, out);
      return ZR_Err_None;
    }
    zr::EmitRow* const emit = zr::emit_row_of(bytes);
    return zr::copy_scaled(in, from, out, to, {}, zr::overflow_texts,
                           [&](i32 n, const i32* columns, const char* src_row, char* dst_pixels, bool) {
                             emit(static_cast<std::size_t>(bytes), n, columns, src_row, dst_pixels);
                           });
  });
}
