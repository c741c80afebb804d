// Rows of 8-bit pixels on and off a matte, in place, and the two orders of bytes that they come in.
#pragma once

#include <ZR/zr.h>

namespace zr {

// Where alpha stands. Last: the fields of ZR_Pixel8 hold blue, green, red, alpha.
enum class AlphaPlace : u8 { first, last };

struct MatteRows {
  i32 (*onto_black)(i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst);  // colour times alpha
  i32 (*off_black)(i32 n, const ZR_Pixel8* src, ZR_Pixel8* dst);   // colour over alpha; zero under alpha 0
  // Adds what the matte shows through, or takes it away; sums wrap. The order of `matte` is that of the row.
  void (*add_matte)(i32 n, const ZR_Pixel8& matte, ZR_Pixel8* row);
  void (*take_matte)(i32 n, const ZR_Pixel8& matte, ZR_Pixel8* row);
};
// The fastest that this processor has. src null or equal to dst works in place, other overlap is not allowed.
const MatteRows& matte_rows(AlphaPlace place);

// The bodies of single numbers, and of lanes (null where there are none).
const MatteRows& single_matte_rows(AlphaPlace place);
const MatteRows* lane_matte_rows(AlphaPlace place);

}  // namespace zr
