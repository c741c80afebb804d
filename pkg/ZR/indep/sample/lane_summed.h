// Summed-area tables on lanes, equal to those of single pixels bit for bit.
#pragma once

#include <ZR/summed_area.h>

namespace zr {

// Cells of a table. Columns begin at a multiple of 16; rows at a multiple of 4, and end at one or with the table.
struct SumBlock {
  i32 first_row, end_row, first_column, end_column;
  bool* has_fractions;  // of these columns, false at first: whether sums of the rows above may be no whole numbers
};
// What a row hands from block to block.
inline constexpr i64 carried_numbers = 9;

// Fills a block of a table of the world's size, aligned to 64 bytes, when those above and to the left of it are filled.
// `above` are four zeros for each column, `carried` carried_numbers for each row, and are written.
template <class Entry>
using SumBlockFunc = void(const ZR_World& world, const SumBlock& block, f64* above, f64* carried, Entry* table);
// The fastest that this processor has, or null.
template <class T, class Entry>
SumBlockFunc<Entry>* lane_block_sums();

}  // namespace zr
