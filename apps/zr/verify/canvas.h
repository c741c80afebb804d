// The fixed inputs of `zr verify`: pictures that bring every road through an operation into play.
//
// A change here changes every line of the manifest.
#pragma once

#include <ZR/world.h>

#include <vector>

#include "verify/digest.h"

namespace zr::tool {

// The same numbers everywhere (a 64-bit counter, mixed); distributions of the standard library differ.
class Random {
 public:
  explicit Random(u64 seed) : state_(seed * 0x9e3779b97f4a7c15u) {}
  u32 next();
  u32 below(u32 limit) { return static_cast<u32>((static_cast<u64>(next()) * limit) >> 32); }

 private:
  u64 state_;
};

enum class Content {
  mixed,      // runs of every kind below, some as short as a pixel
  opaque,     // alpha white, any colour
  noise,      // any alpha, any colour
  premul,     // colour at most alpha
  hostile,    // runs of legal pixels and of those with some or all channels illegal: above white, or NaN, infinite...
  untouched,  // what results are written onto: one pixel everywhere
};
// What an operation on premultiplied pixels reads in place of mixed ones.
constexpr Content premul_of(Content content) { return content == Content::mixed ? Content::premul : content; }

// A world over memory of our own, with guard pixels between and behind the rows. Rows begin at all
// places that their pixels allow within 16 bytes, since alignment may choose the code.
template <class T>
class Canvas {
 public:
  Canvas(i32 width, i32 height, Content content, u64 seed = 1);
  ZR_WorldX<T>* operator&() { return &world_; }
  ZR_WorldX<T>* operator->() { return &world_; }
  i32 width() const { return world_.width; }
  i32 height() const { return world_.height; }
  GX_LRect all() const { return {0, 0, world_.width, world_.height}; }

  // Pixels and guard, so that a write beside the picture shows.
  void digest(Digest& digest) const { digest.pixels(std::span<const T>(first_, count_)); }

 private:
  std::vector<T> memory_;
  T* first_;  // at a multiple of 64 bytes
  size_t count_;
  ZR_WorldX<T> world_;
};

// Width of most pictures: no multiple of any vector's length.
inline constexpr i32 odd_width = 131;

extern template class Canvas<ZR_Pixel8>;
extern template class Canvas<ZR_Pixel16>;
extern template class Canvas<ZR_PixelFloat>;

// Tables of linear light for a gamma of 2, without any function of the C library.
const ZR_LinearBlendingTables& square_tables();

}  // namespace zr::tool
