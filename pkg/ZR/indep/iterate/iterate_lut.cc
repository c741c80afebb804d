// Byte tables over an 8-bit world.
#include <ZR/errors.h>
#include <ZR/world.h>

#include "iterate/iterate.h"
#include "iterate/iterate_area.h"
#include "iterate/lane_lut_rows.h"
#include "world/guard.h"

namespace zr {
namespace {

// Refused: no pixels, and 16-bit pixels. A float world is not; its rows are walked as bytes.
bool refused(const ZR_LayerDef* world) { return world == nullptr || world->data == nullptr || (world->flags & 1) != 0; }

}  // namespace

i32 iterate_lut_body(ZR_InData* in_data, i32 progress_base, i32 progress_final, ZR_LayerDef* src, const GX_LRect* area,
                     const u8* a_lut, const u8* r_lut, const u8* g_lut, const u8* b_lut, ZR_LayerDef* dst) {
  return guarded([&] {
    if (refused(dst) || (src != nullptr && refused(src))) return ZR_ReportBadCallbackParam(ZR_Site_Iterate);
    const ZR_WorldX<ZR_Pixel8> out_world(dst, true);
    const ZR_WorldX<ZR_Pixel8> in_world(src != nullptr ? src : dst, true);
    if (area != nullptr && (lies_off(*area, out_world) || lies_behind(*area, in_world.width, in_world.height)))
      return static_cast<i32>(ZR_Err_None);
    WalkArea walk = area_of(area, out_world);
    walk.cut(0, 0, in_world.width, in_world.height);
    if (walk.columns() == 0 || walk.rows() == 0) return static_cast<i32>(ZR_Err_None);

    const ByteTables tables(a_lut, r_lut, g_lut, b_lut);
    RowProgress progress(in_data, progress_base, progress_final);
    for (i64 y = walk.top; y < walk.bottom; ++y) {
      const ZR_Pixel8* const in = in_world.At(static_cast<i32>(walk.left), static_cast<i32>(y));
      ZR_Pixel8* const out = out_world.At(static_cast<i32>(walk.left), static_cast<i32>(y));
      tables.row(walk.columns(), in, out);
      if (progress.row_done(y - walk.top)) break;
    }
    return progress.result();
  });
}

}  // namespace zr
