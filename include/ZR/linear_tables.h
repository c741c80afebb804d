// Tables of linear light, and worlds between depths in which floats are linear and integers are not.
#pragma once

#include <ZR/prisma.h>
#include <ZR/world.h>

#include <boost/shared_ptr.hpp>

// The tables of a profile; empty is sRGB. Throws statuses of the colour engine. The result is immutable.
ZR_API boost::shared_ptr<ZR_LinearBlendingTables> ZR_MakeLinearizationTables(
    boost::shared_ptr<TON_PRISMA_Profile> profile);

// Copies src to dst at dst's depth. Between 8 and 16 bits values keep their coding; from and to floats they
// cross into linear light by `tables`, the to_linear array of a ZR_LinearBlendingTables. Colours on
// their way to integers are clamped, float alpha is not; NaN becomes 0. Worlds of unequal size: nothing is
// done. Rows go out through ZR_IterateGeneric. An unknown depth: a failed verification and 3 thrown.
ZR_API void ZR_DepthConvertWorld(const u16* tables, const ZR_World* src, ZR_World* dst);
