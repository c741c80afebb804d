// Plain loops over straight ARGB pixels as anyone writes them who has no library: no vector types, nothing of ours.
// They are compiled by themselves for the machine they run on, and include nothing that others share.
#pragma once

#include <cstddef>
#include <cstdint>

namespace plain {

template <class C>
struct Pixel {
  C a, r, g, b;
};

enum class Mode { in_front, multiply, screen, overlay, soft_light, hard_light, difference, color_dodge };

// C is uint8_t (white 255), uint16_t (white 32768) or float (1).
template <class C>
void premultiply(size_t n, Pixel<C>* pixels);
template <class C>
void unmultiply(size_t n, Pixel<C>* pixels);
// src over dst by a mode; `mask` may be null, else its alpha counts.
template <class C>
void blend(Mode mode, size_t n, const Pixel<C>* src, const Pixel<C>* mask, Pixel<C>* dst);
template <class From, class To>
void convert(size_t n, const Pixel<From>* src, Pixel<To>* dst);
void look_up(size_t n, const Pixel<uint8_t>* src, const uint8_t (&tables)[4][256], Pixel<uint8_t>* dst);

}  // namespace plain
