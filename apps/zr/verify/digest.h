// A 128-bit fingerprint of results, the same on every processor that stores the low byte first.
#pragma once

#include <ZR/world.h>

#include <memory>
#include <span>
#include <string>

namespace zr::tool {

class Digest {
 public:
  Digest();
  ~Digest();
  Digest(const Digest&) = delete;
  Digest& operator=(const Digest&) = delete;

  void bytes(const void* data, size_t size);
  void number(i64 value) { bytes(&value, sizeof value); }
  // Every NaN counts as one: its sign and payload are no part of a result.
  void floats(std::span<const f32> values);
  void doubles(std::span<const f64> values);
  template <class T>
  void pixels(std::span<const T> values) {
    if constexpr (std::is_same_v<T, ZR_PixelFloat>)
      floats({&values.data()->alpha, values.size() * 4});
    else
      bytes(values.data(), values.size_bytes());
  }
  // 32 hexadecimal digits.
  std::string text() const;

 private:
  struct State;
  std::unique_ptr<State> state_;
};

}  // namespace zr::tool
