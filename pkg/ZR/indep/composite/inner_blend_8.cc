// Row functions of 8-bit pixels.
#include "composite/inner_blend_impl.h"

ZR_INSTANTIATE_INNER_BLENDS(ZR_Pixel8)
