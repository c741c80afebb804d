// The rows of a layer placed by matrices: default bodies of the slots behind ZR_TransformWorld.
#pragma once

#include "world/slot_table.h"

namespace zr {

// TransformRowsFunc<T>. `matrices` holds `count` (at least 1) matrices, first to last of the shutter.
// scratch[2] holds a row of pixels of the drawn width, scratch[0] is read where alpha is kept, scratch[1]
// where mask rows are prepared, and 8 and 9, in the sizes of ZR_AllocateMotionBlurScratch, under motion. The
// mask has the destination's depth, else 3. An unknown mode returns 5. Where nothing is left to draw, 0.
// Throws nothing.
template <class T>
i32 transform_rows(const ZR_ProgressInfo* progress, i32 quality, i32 field, const ZR_WorldX<T>* src,
                   const ZR_BlendingMode<T>* mode, const ZR_LinearBlendingTables* tables, const ZR_MaskWorld* mask,
                   const GX_Matrix3* matrices, i32 count, bool src2dst, void* const scratch[10], const GX_LRect* rect,
                   ZR_WorldX<T>* dst);

// Only the rows of `band`, of a layer whose extent is of kind ZR_Transform_Rows; alpha outside the bounds stays.
struct RowBand {
  i32 first, end;
};
template <class T>
using TransformBandFunc = i32(const ZR_ProgressInfo*, i32 quality, i32 field, const ZR_WorldX<T>* src,
                              const ZR_BlendingMode<T>*, const ZR_LinearBlendingTables*, const ZR_MaskWorld*,
                              const GX_Matrix3*, i32 count, bool src2dst, void* const scratch[10], const GX_LRect*,
                              RowBand, ZR_WorldX<T>* dst);
template <class T>
TransformBandFunc<T> transform_band;

}  // namespace zr
