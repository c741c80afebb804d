// Whole rows between the three depths, as worlds copied to worlds convert them.
#pragma once

#include <ZR/zr.h>

namespace zr {

class DitherRow;

// n pixels of src to another depth; the rows do not overlap. `dither` counts for rows to 8 bits only and
// draws four words a pixel. A float row narrows to 8 bits by the vector rule where the processor record
// says SSE2 and src is a multiple of 16, by the scalar rule elsewhere; one rule holds for the whole row.
template <class To, class From>
void convert_row(i32 n, const From* src, To* dst, bool dither);
// Dithered with these words, to 8 bits; four for each pixel.
template <class To, class From>
void convert_row(i32 n, const From* src, To* dst, DitherRow* words);

// The same without dither, past the caches where the processor can: for rows of worlds that do not fit there, as
// they would push out what is still to be read. finish_streamed_rows() after the last one, on the same thread, shows
// them to the others.
template <class To, class From>
void stream_row(i32 n, const From* src, To* dst);
void finish_streamed_rows();

// Float to an integer depth as scaled copies do it: the scalar rule, and alpha clamped like the colours.
template <class To>
void narrow_row(i32 n, const ZR_PixelFloat* src, To* dst);

}  // namespace zr
