// What a viewer shows: a world of any depth drawn into 8 bits, its transparency over a background.
#pragma once

#include <ZR/world.h>

enum ZR_SpecialCaseBlitStyle : i32 {
  ZR_BlitStyle_Flat = 0,     // over the first colour; so does every value that is not named here
  ZR_BlitStyle_Checker = 1,  // over squares of 8 pixels of the two colours
  ZR_BlitStyle_Tint = 2,     // transparency is mixed with the first colour, as strongly as that colour's alpha says
};

// Draws src, from `position` on, into `rect` of dst. Source pixels are straight. Nothing is scaled. A negative position
// or an empty rectangle draws nothing, nor do null worlds; a rectangle is cut to what both worlds hold.
//
// Colours   are converted to 8 bits first, at every depth: times 255, plus a half, truncated; above 1 they wrap.
// Squares   pixel (x, y), counted from the rectangle's corner, has the first colour where bit 3 of
//           (check_origin.x + x) ^ (check_origin.y + y) is set, else the second.
// Alpha     an opaque pixel is copied, with alpha 255; where checker or flat shows the bare background the colour's own
//           alpha is stored; a mixed pixel leaves the destination's alpha byte as it is.
// Reverse   bytes of a destination pixel are blue, green, red, alpha; then opaque pixels leave the alpha byte too.
// Floats    are clamped to 0..255; NaN gives 0, and so does what times 255 exceeds 32 bits. A NaN alpha mixes.
//
// Rows are divided among the threads of ZR_IterateGeneric. src and dst may not overlap.
ZR_API void ZR_SpecialCasePixelBlit(const ZR_World* src, const GX_LPoint& position, ZR_SpecialCaseBlitStyle style,
                                    bool reverse, const GX_LPoint& check_origin, const ZR_PixelFloat& first,
                                    const ZR_PixelFloat& second, const GX_LRect& rect, ZR_WorldX<ZR_Pixel8>* dst);
