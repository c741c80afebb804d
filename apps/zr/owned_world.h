// Worlds of the library that the tool owns, and calls into the library.
#pragma once

#include <ZR/depth.h>
#include <ZR/zr.h>

#include <string>
#include <utility>

namespace zr::tool {

// Throws a ToolError for a code of the library that is not 0: out of memory, interrupted, or failed.
// `what` begins the message ("compositing layers[1]").
void check(i32 code, const std::string& what);

// Pixels of one depth; alive between the host's birth and death.
class OwnedWorld {
 public:
  OwnedWorld(i32 width, i32 height, i32 depth);  // transparent black
  ~OwnedWorld();
  OwnedWorld(OwnedWorld&& other) noexcept : layer_(std::exchange(other.layer_, {})), depth_(other.depth_) {}
  OwnedWorld(const OwnedWorld&) = delete;
  OwnedWorld& operator=(const OwnedWorld&) = delete;
  OwnedWorld& operator=(OwnedWorld&& other) noexcept {
    std::swap(layer_, other.layer_);
    std::swap(depth_, other.depth_);
    return *this;
  }

  ZR_LayerDef* layer() { return &layer_; }
  const ZR_LayerDef* layer() const { return &layer_; }
  i32 width() const { return layer_.width; }
  i32 height() const { return layer_.height; }
  i32 depth() const { return depth_; }
  GX_LRect bounds() const { return {0, 0, layer_.width, layer_.height}; }
  // Pixel fits the depth; y is 0..height-1.
  template <class Pixel>
  Pixel* row(i32 y) const {
    return reinterpret_cast<Pixel*>(static_cast<char*>(layer_.data) + static_cast<ptrdiff_t>(y) * layer_.row_bytes);
  }

 private:
  ZR_LayerDef layer_{};
  i32 depth_;
};

// Calls body.template operator()<Pixel>() for the pixel record of a depth, 8, 16 or 32.
template <class Body>
decltype(auto) with_pixel_of(i32 depth, Body&& body) {
  if (depth == 8) return body.template operator()<ZR_Pixel8>();
  if (depth == 16) return body.template operator()<ZR_Pixel16>();
  return body.template operator()<ZR_PixelFloat>();
}

// Calls body(y) for every row 0..rows-1, in bands, on the host's threads. body does not throw.
template <class Body>
void for_each_row(i32 rows, Body&& body) {
  static constexpr i32 kBand = 16;  // rows; large enough to hide the call
  struct Call {
    Body& body;
    i32 rows;
  } call{body, rows};
  const auto band = [](void* refcon, i32, i32 index, i32) -> i32 {
    const Call& self = *static_cast<const Call*>(refcon);
    for (i32 y = index * kBand; y < self.rows && y < (index + 1) * kBand; ++y) self.body(y);
    return 0;
  };
  check(ZR_IterateGeneric((rows + kBand - 1) / kBand, &call, band), "converting pixels");
}

}  // namespace zr::tool
