// Row functions of 8-bit pixels.
#include "composite/inner_blend_impl.h"

// Linear light works at 16 bits, whose rows have a file of their own.
extern template const zr::InnerRows<ZR_Pixel16>& zr::inner_rows<ZR_Pixel16, false>();
extern template const zr::InnerRows<ZR_Pixel16>& zr::inner_rows<ZR_Pixel16, true>();

ZR_INSTANTIATE_INNER_BLENDS(ZR_Pixel8)
