// The rectangle composite: default bodies of the slots behind ZR_TransferRect, ZR_TransferRectPlus and the
// row drivers that layer transforms call.
#pragma once

#include "world/slot_table.h"

namespace zr {

// TransferRowsFunc<T>: clips `rect` to both worlds and the mask, then blends row by row. scratch[0] is read
// where alpha is kept, scratch[1] where mask rows are prepared; each holds the clipped width. The mask has the
// destination's depth, else 3. An unknown mode returns 5. Where nothing is left, 0. Throws nothing.
template <class T>
i32 transfer_rows(const ZR_ProgressInfo* progress, i32 quality, i32 field, const GX_LRect* rect,
                  const ZR_WorldX<T>* src, const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables,
                  const ZR_MaskWorld* mask, void* const scratch[10], i32 dest_x, i32 dest_y, ZR_WorldX<T>* dst);

TransferRectPlusFunc transfer_rect_plus_body;

}  // namespace zr
