// What an X11 desktop states about the colours of its monitors.
#pragma once

#include "TON/lcms_engine.h"

namespace zr::prisma {

// The content of the root window's property _ICC_PROFILE (_ICC_PROFILE_n for the n-th monitor, the one under
// the window's centre); empty without a display, without the X11 library, or without the property.
Counted<u8> profile_of_x11_display(const void* window);

}  // namespace zr::prisma
