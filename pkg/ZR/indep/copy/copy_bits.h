// The draft copy between typed worlds, as the other copies use it.
#pragma once

#include <ZR/copy_bits.h>

#include "copy/copy_rects.h"

namespace zr {

// Nine depth pairs: moves rows, or converts them, or scales by nearest neighbour. Both worlds have pixels.
i32 copy_bits_any_depths(ZR_LayerDef* src, ZR_LayerDef* dst, const GX_LRect* src_rect, const GX_LRect* dst_rect,
                         const CopyRows& rows = {});

}  // namespace zr
