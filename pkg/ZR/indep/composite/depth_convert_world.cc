// Worlds between depths, floats linear and integers stored.
#include <ZR/linear_tables.h>

#include <algorithm>
#include <cstring>

#include "composite/depth_convert_rows.h"
#include "world/guard.h"

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

constexpr i32 band_rows = 16;

template <class To, class From>
void convert(const u16* tables, const ZR_World* src, ZR_World* dst) {
  struct Work {
    const ZR_LinearBlendingTables& tables;
    const ZR_World* src;
    ZR_World* dst;
  } work{*reinterpret_cast<const ZR_LinearBlendingTables*>(tables), src, dst};
  const i32 bands = (src->height + band_rows - 1) / band_rows;
  const i32 error = ZR_IterateGeneric(bands, &work, [](void* refcon, i32, i32 i, i32) -> i32 {
    const Work& all = *static_cast<const Work*>(refcon);
    const auto row = [](const ZR_World* world, i32 y) {
      return static_cast<char*>(world->data) + static_cast<ptrdiff_t>(y) * world->row_bytes;
    };
    for (i32 y = i * band_rows; y < std::min((i + 1) * band_rows, all.src->height); ++y)
      convert_row(all.src->width, reinterpret_cast<const From*>(row(all.src, y)),
                  reinterpret_cast<To*>(row(all.dst, y)), all.tables);
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
