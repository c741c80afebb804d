// The matte families: rows on and off black, and worlds moved between black and another matte.
#include <ZR/alpha_guess.h>
#include <ZR/depth.h>

#include "filter/matte_rows.h"
#include "world/guard.h"
#include "world/premul_rows.h"

namespace zr {
namespace {

using RowBody = i32 (*)(i32, const ZR_Pixel8*, ZR_Pixel8*);

i32 matte_row(RowBody body, i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  return guarded([&] {
    if (dst == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_MatteRow);
    return n > 0 ? body(n, src, dst) : i32{ZR_Err_None};
  });
}

i32 move_matte(ZR_LayerDef* layer, const ZR_Pixel8* colour, i32 direction, AlphaPlace place, const char* wrong_depth) {
  return guarded([&]() -> i32 {
    if (layer == nullptr || colour == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_MatteColour);
    if (ZRp_WorldDepth(layer) != Depth<ZR_Pixel8>::bits) return failed_verification(ZR_Site_MatteColour, wrong_depth);
    const ZR_Pixel8 c = *colour;
    if (c.red == 0 && c.green == 0 && c.blue == 0) return ZR_Err_None;
    if (layer->data == nullptr) return ZR_ReportBadCallbackParam(ZR_Site_MatteColour);
    const ZR_Pixel8 matte = place == AlphaPlace::first ? c : ZR_Pixel8{c.blue, c.green, c.red, c.alpha};
    const MatteRows& rows = matte_rows(place);
    const auto row = direction != 0 ? rows.add_matte : rows.take_matte;
    const ZR_WorldX<ZR_Pixel8> world(layer, false);
    for (i32 y = 0; y < world.height; ++y) row(world.width, matte, world.Row(y));
    return ZR_Err_None;
  });
}

}  // namespace
}  // namespace zr

extern "C" {

i32 ZR_BlackMatte(void*, i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  return zr::matte_row(&zr::premul_row<ZR_Pixel8>, n, src, dst);
}
i32 ZR_DeBlackMatte(void*, i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst) {
  return zr::matte_row(&zr::unmul_row<ZR_Pixel8>, n, src, dst);
}
i32 ZR_BlackMatteARGB(void*, i32 n, ZR_Pixel8* row) {
  return zr::matte_row(&zr::premul_row<ZR_Pixel8>, n, nullptr, row);
}
i32 ZR_DeBlackMatteARGB(void*, i32 n, ZR_Pixel8* row) {
  return zr::matte_row(zr::matte_rows(zr::AlphaPlace::first).off_black, n, nullptr, row);
}
i32 ZR_BlackMatteBGRA(void*, i32 n, ZR_Pixel8* row) {
  return zr::matte_row(zr::matte_rows(zr::AlphaPlace::last).onto_black, n, nullptr, row);
}
i32 ZR_DeBlackMatteBGRA(void*, i32 n, ZR_Pixel8* row) {
  return zr::matte_row(zr::matte_rows(zr::AlphaPlace::last).off_black, n, nullptr, row);
}

i32 ZR_MatteBlackToMatteColorARGB(ZR_LayerDef* world, const ZR_Pixel8* colour, i32 direction) {
  return zr::move_matte(world, colour, direction, zr::AlphaPlace::first,
                        "ZR_MatteBlackToMatteColorARGB only works on 8bpc ZR_EffectWorlds");
}
i32 ZR_MatteBlackToMatteColorBGRA(ZR_LayerDef* world, const ZR_Pixel8* colour, i32 direction) {
  return zr::move_matte(world, colour, direction, zr::AlphaPlace::last,
                        "ZR_MatteBlackToMatteColorBGRA only works on 8bpc ZR_EffectWorlds");
}

}  // extern "C"
