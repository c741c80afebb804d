// Element types of chunks.
#pragma once

#include <ZR/zr.h>

namespace zr {

// Four characters as a big-endian word.
constexpr i32 chunk_type(const char (&name)[5]) {
  u32 word = 0;
  for (i32 i = 0; i < 4; ++i) word = word << 8 | static_cast<u8>(name[i]);
  return static_cast<i32>(word);
}

// Bytes of one element; 1 for a type that is not known.
u16 chunk_element_bytes(i32 type);

}  // namespace zr
