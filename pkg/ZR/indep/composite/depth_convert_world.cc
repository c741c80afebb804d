// Worlds between depths, floats linear and integers stored.
#include <ZR/linear_tables.h>

#include <cstring>

#include "composite/depth_convert_rows.h"
#include "world/guard.h"
#include "world/row_bands.h"

namespace zr {
namespace {

constexpr const char* unknown_text = "Unknown bit depth attempting to depth convert.";

template <class To, class From>
void convert_row(i32 n, const From* src, To* dst, const ZR_LinearBlendingTables& tables) {
  if constexpr (std::is_same_v<To, From>)
    std::memmove(dst, src, static_cast<size_t>(n) * sizeof(To));
  else
    depth_convert_row(n, src, dst, tables);
}

template <class To, class From>
void convert(const u16* tables, const ZR_World* src, ZR_World* dst) {
  const auto& both = *reinterpret_cast<const ZR_LinearBlendingTables*>(tables);
  const auto row = [](const ZR_World* world, i32 y) {
    return static_cast<char*>(world->data) + static_cast<ptrdiff_t>(y) * world->row_bytes;
  };
  const i64 row_bytes = i64{src->width} * static_cast<i64>(sizeof(From) + sizeof(To));
  const i32 error = for_bands(src->height, row_bytes, band_of_work, [&](i32 top, i32 bottom) -> i32 {
    for (i32 y = top; y < bottom; ++y)
      convert_row(src->width, reinterpret_cast<const From*>(row(src, y)), reinterpret_cast<To*>(row(dst, y)), both);
    return ZR_Err_None;
  });
  if (error != ZR_Err_None) fail(error);
}

}  // namespace
}  // namespace zr

void ZR_DepthConvertWorld(const u16* tables, const ZR_World* src, ZR_World* dst) {
  if (src->width != dst->width || src->height != dst->height) return;
  const i32 error = zr::on_depth(
      src->GetBitDepth(), zr::unknown_text,
      [&]<class From>() {
        return zr::on_depth(
            dst->GetBitDepth(), zr::unknown_text,
            [&]<class To>() {
              if (src->width > 0 && src->height > 0) zr::convert<To, From>(tables, src, dst);
              return i32{ZR_Err_None};
            },
            ZR_Site_DepthConvert);
      },
      ZR_Site_DepthConvert);
  if (error != ZR_Err_None) zr::fail(error);
}
