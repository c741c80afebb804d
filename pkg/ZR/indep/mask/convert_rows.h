// Rows of deep mask values over a divisor.
#pragma once

#include <ZR/zr.h>

namespace zr {

// (v + divisor / 2) / divisor, the low bits of it that the target holds; for floats v * (1 / divisor), both steps in
// single precision. To is u8, u16 or f32, divisor not 0. src may be dst. Returns 0.
template <class To>
i32 divide_mask_row(i32 n, i32 divisor, const u16* src, To* dst);

}  // namespace zr
