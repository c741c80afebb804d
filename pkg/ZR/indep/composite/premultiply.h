// Premultiplying and unmultiplying whole worlds and rectangles, against black or a matte colour.
#pragma once

#include <ZR/zr.h>

namespace zr {

// ZR_PremulColorRect with a 16-bit colour; the export has no name for it.
i32 premul_color_rect16(const ZR_ProgressInfo* progress, ZR_LayerDef* src, const ZR_Pixel16* colour, i32 forward,
                        const GX_LRect* rect, ZR_LayerDef* dst);

}  // namespace zr
