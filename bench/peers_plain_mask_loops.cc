// The plain loops over masks; see peers_plain_mask.h.
#include "peers_plain_mask.h"

namespace plain {
namespace {

template <class C>
constexpr uint32_t white = sizeof(C) == 1 ? 255 : 32768;

template <class C>
inline C product(uint32_t a, uint32_t b) {
  if constexpr (sizeof(C) == 1)
    return static_cast<C>((a * b + 127) / 255);
  else
    return static_cast<C>((a * b + 16383) >> 15);
}

}  // namespace

template <class C>
void screen(size_t n, const C* src, C* dst) {
  for (size_t i = 0; i < n; ++i) dst[i] = static_cast<C>(white<C> - product<C>(white<C> - src[i], white<C> - dst[i]));
}

template <class C>
void invert(size_t n, C* values) {
  for (size_t i = 0; i < n; ++i) values[i] = static_cast<C>(white<C> - values[i]);
}

template <class C>
void fade(size_t n, C factor, C* values) {
  for (size_t i = 0; i < n; ++i) values[i] = product<C>(values[i], factor);
}

template <class C>
void merge(size_t n, const C* mask, C* pixels) {
  for (size_t i = 0; i < n; ++i) pixels[4 * i] = product<C>(pixels[4 * i], mask[i]);
}

template <class C>
void box(size_t n, size_t radius, const C* src, C* dst) {
  const uint32_t width = static_cast<uint32_t>(2 * radius + 1);
  uint32_t sum = 0;
  for (size_t i = 0; i < radius && i < n; ++i) sum += src[i];
  for (size_t i = 0; i < n; ++i) {
    if (i + radius < n) sum += src[i + radius];
    dst[i] = static_cast<C>((sum + width / 2) / width);
    if (i >= radius) sum -= src[i - radius];
  }
}

#define ZR_PLAIN_MASKS(C)                     \
  template void screen(size_t, const C*, C*); \
  template void invert(size_t, C*);           \
  template void fade(size_t, C, C*);          \
  template void merge(size_t, const C*, C*);  \
  template void box(size_t, size_t, const C*, C*);
ZR_PLAIN_MASKS(uint8_t)
ZR_PLAIN_MASKS(uint16_t)
#undef ZR_PLAIN_MASKS

}  // namespace plain
