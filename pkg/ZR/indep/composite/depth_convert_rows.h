// Rows between depths where floats are linear and integers stored.
#pragma once

#include <ZR/zr.h>

namespace zr {

// n pixels of two different depths; the rows do not overlap. Colours cross into or out of linear light by the tables
// on the way to or from floats, and keep their coding between integers; float alpha wraps.
template <class To, class From>
void depth_convert_row(i32 n, const From* src, To* dst, const ZR_LinearBlendingTables& tables);

}  // namespace zr
