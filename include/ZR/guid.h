// A 128-bit identifier made of a hash.
#pragma once

#include <ZR/zr.h>

#include <cstring>
#include <string>

namespace nucleo::utility {

// Bytes in the order of the digest; the same in every process and on every machine.
class ZR_API Guid {
 public:
  constexpr Guid() = default;
  explicit Guid(const u8 (&bytes)[16]) { std::memcpy(bytes_, bytes, sizeof bytes_); }
  const u8* Bytes() const { return bytes_; }
  std::string ToString() const;  // 8-4-4-4-12 hexadecimal digits
  friend bool operator==(const Guid& a, const Guid& b) { return std::memcmp(a.bytes_, b.bytes_, 16) == 0; }
  friend bool operator<(const Guid& a, const Guid& b) { return std::memcmp(a.bytes_, b.bytes_, 16) < 0; }

 private:
  u8 bytes_[16] = {};
};

}  // namespace nucleo::utility
