// Row functions of float pixels.
#include "composite/inner_blend_impl.h"

ZR_INSTANTIATE_INNER_BLENDS(ZR_PixelFloat)
