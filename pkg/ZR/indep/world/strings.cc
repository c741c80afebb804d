// The library's texts: key, '=', default text. The order is that of ZR_StringIndex.
#include <HB/hb.h>
#include <ZR/errors.h>

#include <iterator>

namespace {

constexpr const char* strings[] = {
    "$$$/ZN/ZR/LStr/0000=invalid callback selector",
    "$$$/ZN/ZR/LStr/0001=invalid parameter",
    "$$$/ZN/ZR/LStr/0002=effects modules should only dispose worlds they have allocated",
    "$$$/ZN/ZR/LStr/0003=image plane buffer",
    "$$$/ZN/ZR/LStr/0004=bad parameter passed to effect callback",
    "$$$/ZN/ZR/LStr/0005=problem opening plug-in acceleration module.",
    "$$$/ZN/ZR/LStr/0006=unimplemented blending mode.",
    "$$$/ZN/ZR/LStr/0007=noise table.",
    "$$$/ZN/ZR/LStr/0008=Unable to guess alpha channel.",
    "$$$/ZN/ZR/LStr/0009=Obsolete routine",
    "$$$/ZN/ZR/LStr/0010=memory for blurring",
    "$$$/ZN/ZR/LStr/0011=memory for mask buffer",
    "$$$/ZN/ZR/LStr/0012=damaged mask buffer",
    "$$$/ZN/ZR/LStr/0013=can#{rsquo}t unlock ZR Mask Buffer",
    "$$$/ZN/ZR/LStr/0014=gaussian weight array",
    "$$$/ZN/ZR/LStr/0015=blending scratch buffer",
    "$$$/ZN/ZR/LStr/0016=can#{rsquo}t copy different channel worlds",
    "$$$/ZN/ZR/LStr/0017=out of memory for channel chunk",
    "$$$/ZN/ZR/LStr/0018=image buffer",
    "$$$/ZN/ZR/LStr/0019=effect plug-in passed invalid world to get_platform_refs",
    nullptr,  // counted, without a text
};
constexpr HB_StringTable table = {"ZR", static_cast<i32>(std::size(strings)), strings};
static_assert(std::size(strings) == 21);

}  // namespace

extern "C" const HB_StringTable* const ZR_G_zref = &table;
