// The masks that are measured.
#pragma once

#include <ZR/mask_buffer.h>

#include "workloads.h"

namespace bench {

template <class C>
constexpr const char* value_name() {
  return sizeof(C) == 1 ? "8" : "16";
}

template <class C>
std::unique_ptr<ZR_UnoBuffer> make_mask(Size size, u32 seed) {
  auto mask = std::make_unique<ZR_UnoBuffer>(size.width, size.height, static_cast<i32>(8 * sizeof(C)));
  u32 random = seed;
  C* const values = static_cast<C*>(*mask->data);
  for (i64 i = 0; i < i64{size.width} * size.height; ++i) {
    random = random * 1664525u + 1013904223u;
    values[i] = static_cast<C>(sizeof(C) == 1 ? random >> 24 : (random >> 16) % 32769);
  }
  return mask;
}

template <class C>
void count_values(benchmark::State& state, Size size, int passes) {
  state.SetBytesProcessed(static_cast<i64>(state.iterations()) * size.width * size.height *
                          static_cast<i64>(sizeof(C)) * passes);
}

}  // namespace bench
