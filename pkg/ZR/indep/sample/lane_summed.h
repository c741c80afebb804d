// Summed-area tables on lanes, equal to those of single pixels bit for bit.
#pragma once

#include <ZR/summed_area.h>

namespace zr {

// Fills a table of the world's size, aligned to 64 bytes; `above` are four zeros for each column, and are written.
template <class Entry>
using SumWorldFunc = void(const ZR_World& world, f64* above, Entry* table);
// The fastest that this processor has, or null.
template <class T, class Entry>
SumWorldFunc<Entry>* lane_world_sums();

}  // namespace zr
