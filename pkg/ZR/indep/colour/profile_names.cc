// Names and exponents of profiles, for panels.
#include <HB/hb.h>
#include <ZR/colour_transform.h>

#include <new>

#include "world/guard.h"

namespace zr {
namespace {

enum { working_space, none };
constexpr const char* strings[] = {
    "$$$/ZN/ZR/ZR_ColorManagement/ColorProfile/PWS=Working Space - ",
    "$$$/ZN/ZR/ZR_ColorManagement/ColorProfile/None=None",
};
constexpr HB_StringTable table = {"ZR", 2, strings};

std::u16string text(i32 index) {
  const char* const ascii = HB_ZLookupLStrCache(&table, index, 0, 0);
  return std::u16string(ascii, ascii + std::char_traits<char>::length(ascii));
}

}  // namespace
}  // namespace zr

std::u16string ZR_GetWorkingSpaceProfileName(const ZR_ColorSettings* settings) {
  try {
    std::u16string name = zr::text(zr::working_space);
    if (settings == nullptr || !settings->IsValid()) return name + zr::text(zr::none);
    ZR_ColorSettings own(*settings);  // asking fills caches
    return name + TON_PRISMA_Profile_GetName(*own.GetAdjustedProfile());
  } catch (const std::bad_alloc&) {
    zr::fail(ZR_Err_OutOfMemory);
  }
}

void ZR_GetCalRGBGammas(const TON_PRISMA_Profile* profile, f32* r, f32* g, f32* b) {
  const PRISMA_CalRGB record = TON_PRISMA_GetCalRGB(profile != nullptr ? *profile : *TON_PRISMA_GetDefaultProfile());
  f32* const out[3] = {r, g, b};
  for (int c = 0; c < 3; ++c)
    if (out[c] != nullptr) *out[c] = static_cast<f32>(record.gamma[c]);
}
