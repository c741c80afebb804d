// The library's constants that birth sets: vector constants, the float ramp, the byte tables' addresses.
//
// Written by birth alone, on one thread; read by any. All zero before.
#pragma once

#include <ZR/depth.h>
#include <ZR/vec_pixel.h>

namespace zr {

void set_vector_constants();
void fill_float_ramp();

}  // namespace zr
