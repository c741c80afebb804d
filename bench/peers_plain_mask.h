// Plain loops over masks as anyone writes them who has no library; C is uint8_t (white 255) or uint16_t (white 32768).
#pragma once

#include <cstddef>
#include <cstdint>

namespace plain {

template <class C>
void screen(size_t n, const C* src, C* dst);
template <class C>
void invert(size_t n, C* values);
template <class C>
void fade(size_t n, C factor, C* values);
// The first channel of four-channel pixels.
template <class C>
void merge(size_t n, const C* mask, C* pixels);
// The mean of 2 * radius + 1 values around each, 0 beyond the ends.
template <class C>
void box(size_t n, size_t radius, const C* src, C* dst);

}  // namespace plain
