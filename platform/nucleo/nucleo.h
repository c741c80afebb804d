// nucleo: a 128-bit mixing hash.
#pragma once

#include <ZR/guid.h>

namespace nucleo::utility {

// The digest depends on the bytes only, not on how they were cut into calls. No allocation.
class MixHash {
 public:
  MixHash();
  void Mix(const void* data, size_t size);
  void Mix(bool value);  // one byte, 0 or 1
  void Mix(u32 value);   // four bytes, the lowest first
  Guid Digest() const;

 private:
  alignas(64) unsigned char state_[640];
};

}  // namespace nucleo::utility
