// Test worlds over foreign memory, with guard bytes before, behind and between the rows.
#pragma once

#include <ZR/depth.h>
#include <ZR/zr.h>
#include <gtest/gtest.h>

#include <cstring>
#include <random>
#include <vector>

template <class T>
class TestWorld {
 public:
  // `padding` pixels of guard stand behind each row.
  TestWorld(i32 width, i32 height, i32 padding = 3) : width_(width), height_(height), stride_(width + padding) {
    bytes_.assign((static_cast<size_t>(stride_) * static_cast<size_t>(height) + 2 * margin) * sizeof(T), guard);
    std::memset(&layer_, 0, sizeof layer_);
    layer_.flags = zr::Depth<T>::layer_flags;
    layer_.data = bytes_.data() + margin * sizeof(T);
    layer_.row_bytes = stride_ * static_cast<i32>(sizeof(T));
    layer_.width = width;
    layer_.height = height;
    layer_.extent = {0, 0, width, height};
    clear();
  }
  ZR_LayerDef* layer() { return &layer_; }
  operator ZR_LayerDef*() { return &layer_; }
  i32 width() const { return width_; }
  i32 height() const { return height_; }
  T& at(i32 x, i32 y) {
    return reinterpret_cast<T*>(static_cast<u8*>(layer_.data) + static_cast<ptrdiff_t>(y) * layer_.row_bytes)[x];
  }
  const T& at(i32 x, i32 y) const { return const_cast<TestWorld*>(this)->at(x, y); }
  // Rows run from the bottom up from now on.
  void turn_over() {
    layer_.data = &at(0, height_ - 1);
    layer_.row_bytes = -layer_.row_bytes;
  }
  void fill(const T& pixel) {
    each([&](i32 x, i32 y) { at(x, y) = pixel; });
  }
  void clear() {
    each([&](i32 x, i32 y) { std::memset(&at(x, y), 0, sizeof(T)); });
  }
  // Legal random channels; about a quarter of them at 0 and a quarter at white.
  void randomise(u32 seed) {
    std::mt19937 random(seed);
    const auto channel = [&]() -> zr::Channel<T> {
      const u32 word = static_cast<u32>(random());
      if ((word & 3) == 0) return 0;
      if ((word & 3) == 1) return static_cast<zr::Channel<T>>(zr::Depth<T>::white);
      if constexpr (std::is_same_v<T, ZR_PixelFloat>)
        return static_cast<f32>(word >> 8) * 0x1p-24f;
      else
        return static_cast<zr::Channel<T>>((word >> 2) % (static_cast<u32>(zr::Depth<T>::white) + 1));
    };
    each([&](i32 x, i32 y) { at(x, y) = T{channel(), channel(), channel(), channel()}; });
  }
  // Every byte outside the pixels is as it was made.
  testing::AssertionResult guards_intact() const {
    std::vector<u8> copy = bytes_;
    for (i32 y = 0; y < height_; ++y)
      std::memset(copy.data() + (margin + static_cast<size_t>(y) * static_cast<size_t>(stride_)) * sizeof(T), guard,
                  static_cast<size_t>(width_) * sizeof(T));
    for (size_t i = 0; i < copy.size(); ++i)
      if (copy[i] != guard) return testing::AssertionFailure() << "byte " << i << " outside the pixels was written";
    return testing::AssertionSuccess();
  }
  // Bit for bit, padding not counted.
  bool operator==(const TestWorld& other) const {
    for (i32 y = 0; y < height_; ++y)
      if (std::memcmp(&at(0, y), &other.at(0, y), static_cast<size_t>(width_) * sizeof(T)) != 0) return false;
    return width_ == other.width_ && height_ == other.height_;
  }
  TestWorld(const TestWorld& other) : TestWorld(other.width_, other.height_, other.stride_ - other.width_) {
    each([&](i32 x, i32 y) { at(x, y) = other.at(x, y); });
  }
  TestWorld& operator=(const TestWorld&) = delete;

 private:
  template <class Body>
  void each(Body&& body) {
    for (i32 y = 0; y < height_; ++y)
      for (i32 x = 0; x < width_; ++x) body(x, y);
  }
  static constexpr size_t margin = 16;  // pixels
  static constexpr u8 guard = 0x5a;
  i32 width_, height_, stride_;
  std::vector<u8> bytes_;
  ZR_LayerDef layer_;
};
