// What a viewer shows: rows of a world over a background, divided among threads.
#include <ZR/viewer_blit.h>

#include <algorithm>
#include <cstddef>

#include "copy/viewer_rows.h"
#include "world/guard.h"

namespace zr {
namespace {

template <class T>
struct ViewerJob {
  ViewerRow<T> row;
  ViewerGround ground;  // of the topmost row
  const char* src;
  char* dst;
  std::ptrdiff_t src_row_bytes, dst_row_bytes;
  i32 width, height;
};

// The rows of one thread of `threads`.
template <class T>
i32 show_slice(void* refcon, i32, i32 thread, i32 threads) {
  const ViewerJob<T>& job = *static_cast<const ViewerJob<T>*>(refcon);
  const i32 rows = job.height / threads;
  const i32 bottom = thread == threads - 1 ? job.height : (thread + 1) * rows;
  for (i32 y = thread * rows; y < bottom; ++y) {
    ViewerGround ground = job.ground;
    ground.check_y += static_cast<u32>(y);
    job.row(job.width, ground, reinterpret_cast<const T*>(job.src + y * job.src_row_bytes),
            reinterpret_cast<ZR_Pixel8*>(job.dst + y * job.dst_row_bytes));
  }
  return ZR_Err_None;
}

ViewerStyle style_of(ZR_SpecialCaseBlitStyle style, const ZR_Pixel8& first) {
  if (style == ZR_BlitStyle_Checker) return ViewerStyle::checker;
  if (style == ZR_BlitStyle_Tint) return ViewerStyle::tint;
  const bool black = first.red == 0 && first.green == 0 && first.blue == 0;
  return black ? ViewerStyle::flat_black : ViewerStyle::flat;
}

// Truncated and no more, alpha and colours alike.
ZR_Pixel8 quantised(const ZR_PixelFloat& c) {
  const auto one = narrow_float_alpha<ZR_Pixel8>;
  return {one(c.alpha), one(c.red), one(c.green), one(c.blue)};
}

// The output pixels that both worlds hold, counted from the rectangle's corner.
GX_LRect common_part(const ZR_World& src, const GX_LPoint& position, const GX_LRect& rect, const ZR_World& dst) {
  const auto side = [](i64 low, i64 high, i64 at, i64 src_size, i64 dst_size, i32* first, i32* last) {
    const i64 from = std::max<i64>(0, -low), to = std::min({high - low, dst_size - low, src_size - at});
    *first = static_cast<i32>(std::min(from, to));  // nothing where they are one
    *last = static_cast<i32>(to);
  };
  GX_LRect part;
  side(rect.left, rect.right, position.x, src.width, dst.width, &part.left, &part.right);
  side(rect.top, rect.bottom, position.y, src.height, dst.height, &part.top, &part.bottom);
  return part;
}

}  // namespace
}  // namespace zr

void ZR_SpecialCasePixelBlit(const ZR_World* src, const GX_LPoint& position, ZR_SpecialCaseBlitStyle style,
                             bool reverse, const GX_LPoint& check_origin, const ZR_PixelFloat& first,
                             const ZR_PixelFloat& second, const GX_LRect& rect, ZR_WorldX<ZR_Pixel8>* dst) {
  zr::guarded([&] {
    if (src == nullptr || dst == nullptr || src->data == nullptr || dst->data == nullptr) return i32{ZR_Err_None};
    if (rect.right <= rect.left || rect.bottom <= rect.top || position.x < 0 || position.y < 0) return i32{ZR_Err_None};
    const GX_LRect part = zr::common_part(*src, position, rect, *dst);
    if (part.right <= part.left || part.bottom <= part.top) return i32{ZR_Err_None};
    const ZR_Pixel8 one = zr::quantised(first), other = zr::quantised(second);
    const zr::ViewerGround ground = {one, other, static_cast<u32>(check_origin.x) + static_cast<u32>(part.left),
                                     static_cast<u32>(check_origin.y) + static_cast<u32>(part.top)};
    return zr::on_depth(src->GetBitDepth(), zr::unknown_depth_text, [&]<class T>() -> i32 {
      const auto at = [](const ZR_World& world, i32 x, i32 y, size_t pixel_bytes) {
        return static_cast<char*>(world.data) + std::ptrdiff_t{y} * world.row_bytes +
               std::ptrdiff_t{x} * static_cast<std::ptrdiff_t>(pixel_bytes);
      };
      zr::ViewerJob<T> job = {zr::viewer_row<T>(zr::style_of(style, one), reverse),
                              ground,
                              at(*src, position.x + part.left, position.y + part.top, sizeof(T)),
                              at(*dst, rect.left + part.left, rect.top + part.top, sizeof(ZR_Pixel8)),
                              src->row_bytes,
                              dst->row_bytes,
                              part.right - part.left,
                              part.bottom - part.top};
      return ZR_IterateGeneric(-1, &job, &zr::show_slice<T>);
    });
  });
}
