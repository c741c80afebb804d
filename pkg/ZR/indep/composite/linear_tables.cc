// The tables of linear light of a profile.
#include <ZR/linear_tables.h>

#include <HB/allocator.h>
#include <ZR/colour_transform.h>

#include <boost/make_shared.hpp>

#include "world/guard.h"

namespace zr {
namespace {

struct TablesLabel {
  static constexpr const char* text = "linear blending tables";
};

// Stored values of 256 greys, through the engine and back as linear ones.
void fill_to_linear(PRISMATransform* transform, u16 (&to_linear)[256]) {
  ZR_Pixel16 greys[256];
  for (u32 i = 0; i < 256; ++i) {
    const u16 stored = widen_8_to_16(static_cast<u8>(i));
    greys[i] = {Depth<ZR_Pixel16>::white, stored, stored, stored};
  }
  TON_PRISMA_ETX(TON_PRISMA_Apply(transform, PRISMA_Layout_RGB16, greys, PRISMA_Layout_RGB16, greys, 256, nullptr));
  for (u32 i = 0; i < 256; ++i) to_linear[i] = greys[i].red;
}

// The inverse on a grid of eighths: a walk along the forward table, taken between its entries.
void fill_from_linear(const u16 (&to_linear)[256], u16 (&from_linear)[4097]) {
  i32 forward[4097];
  for (i32 k = 0; k < 4096; ++k) {
    const i32 t = 8 * k * 255, i = t >> 15, between = t & 0x7fff;
    forward[k] = to_linear[i] + ((between * (to_linear[i + 1] - to_linear[i]) + 16384) >> 15);
  }
  forward[4096] = to_linear[255];
  for (i32 k = 0; k < 4096; ++k)  // a curve that falls has no inverse
    if (forward[k + 1] < forward[k]) forward[k + 1] = forward[k];

  i32 at = 0;
  for (i32 k = 0; k <= 4096; ++k) {
    const i32 linear = 8 * k;
    while (at < 4095 && linear >= forward[at + 1]) ++at;
    const i32 low = forward[at], high = forward[at + 1], stored = 8 * at;
    i32 value = stored + 8;
    if (high > linear)
      value = linear < low ? stored : (((high - low) >> 1) + (linear - low) * 8) / (high - low) + stored;
    from_linear[k] = static_cast<u16>(value);
  }
}

}  // namespace
}  // namespace zr

boost::shared_ptr<ZR_LinearBlendingTables> ZR_MakeLinearizationTables(boost::shared_ptr<TON_PRISMA_Profile> profile) {
  const TON_PRISMA_Transform transform = ZR_GetLinearizeTransform(profile, profile, true);
  boost::shared_ptr<ZR_LinearBlendingTables> tables;
  try {
    tables = boost::allocate_shared<ZR_LinearBlendingTables>(HB_Allocator<ZR_LinearBlendingTables, zr::TablesLabel>());
  } catch (const std::bad_alloc&) {
    zr::fail(ZR_Err_OutOfMemory);
  }
  zr::fill_to_linear(transform.Get(), tables->to_linear);
  zr::fill_from_linear(tables->to_linear, tables->from_linear);
  ZR_GetCalRGBGammas(profile.get(), nullptr, &tables->to_linear_gamma, nullptr);
  tables->from_linear_gamma = static_cast<f32>(1.0 / tables->to_linear_gamma);
  return tables;
}
