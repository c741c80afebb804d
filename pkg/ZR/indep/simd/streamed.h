// Destinations that are written past the caches.
#pragma once

#include <ZR/types.h>

namespace zr {

// Above this a destination does not stay in the caches: what is written to it need not come there, nor be read first.
inline constexpr i64 streamed_bytes = i64{4} << 20;

}  // namespace zr
