// The mixing hash, on the 128-bit form of xxHash.
#define XXH_INLINE_ALL
#include <xxhash.h>

#include <nucleo/nucleo.h>

#include <cstdio>
#include <new>

namespace nucleo::utility {

static_assert(sizeof(XXH3_state_t) <= 640 && alignof(XXH3_state_t) <= 64);

MixHash::MixHash() { XXH3_128bits_reset(new (state_) XXH3_state_t); }

void MixHash::Mix(const void* data, size_t size) {
  XXH3_128bits_update(std::launder(reinterpret_cast<XXH3_state_t*>(state_)), data, size);
}

void MixHash::Mix(bool value) {
  const u8 byte = value ? 1 : 0;
  Mix(&byte, 1);
}

void MixHash::Mix(u32 value) {
  const u8 bytes[4] = {static_cast<u8>(value), static_cast<u8>(value >> 8), static_cast<u8>(value >> 16),
                       static_cast<u8>(value >> 24)};
  Mix(bytes, sizeof bytes);
}

Guid MixHash::Digest() const {
  XXH128_canonical_t bytes;
  XXH128_canonicalFromHash(&bytes, XXH3_128bits_digest(std::launder(reinterpret_cast<const XXH3_state_t*>(state_))));
  return Guid(bytes.digest);
}

std::string Guid::ToString() const {
  char text[40];
  char* at = text;
  for (int i = 0; i < 16; ++i) {
    if (i == 4 || i == 6 || i == 8 || i == 10) *at++ = '-';
    at += std::snprintf(at, 3, "%02x", bytes_[i]);
  }
  return text;
}

}  // namespace nucleo::utility
