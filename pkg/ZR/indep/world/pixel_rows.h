// Loops over the pixels of one row that stay at one depth.
#pragma once

#include <ZR/depth.h>

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace zr {

// The processor's own string store, which memset uses too: it takes lines into the cache without reading them first.
// The sanitizers do not see it.
#if defined(__x86_64__) && defined(__GNUC__) && !defined(ZR_SANITIZED)
constexpr bool has_string_store = true;
inline void string_store(void* at, std::uint64_t word, std::size_t count) {
  asm volatile("rep stosq" : "+D"(at), "+c"(count) : "a"(word) : "memory");
}
#else
constexpr bool has_string_store = false;
inline void string_store(void*, std::uint64_t, std::size_t) {}
#endif

// Stores `pixel` n times. Runs of 64 bytes are one copy of fixed size, which compiles to wide stores.
template <class T>
void fill_row(T* row, std::ptrdiff_t n, const T& pixel) {
  constexpr std::ptrdiff_t least_bytes = 2048;  // below, its start costs more than it wins
  if constexpr (has_string_store && sizeof(T) <= sizeof(std::uint64_t)) {
    constexpr std::ptrdiff_t in_word = sizeof(std::uint64_t) / sizeof(T);
    if (n * static_cast<std::ptrdiff_t>(sizeof(T)) >= least_bytes) {
      const T pair[2] = {pixel, pixel};
      std::uint64_t word;
      std::memcpy(&word, pair, sizeof word);
      string_store(row, word, static_cast<std::size_t>(n / in_word));
      if (n % in_word != 0) row[n - 1] = pixel;
      return;
    }
  }
  constexpr std::ptrdiff_t block = 64 / sizeof(T);
  T pattern[block];
  for (T& each : pattern) each = pixel;
  std::ptrdiff_t i = 0;
  for (; i <= n - block; i += block) std::memcpy(row + i, pattern, sizeof pattern);
  if (n > i) std::memcpy(row + i, pattern, static_cast<std::size_t>(n - i) * sizeof(T));
}

template <class T>
void clear_row(T* row, std::ptrdiff_t n) {
  if (n > 0) std::memset(static_cast<void*>(row), 0, static_cast<std::size_t>(n) * sizeof(T));
}

}  // namespace zr
