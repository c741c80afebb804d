// Random pixels for compositing tests: legal channels, with the values where something changes among them.
#pragma once

#include <ZR/depth.h>

#include <random>
#include <type_traits>

template <class T>
struct RandomPixels {
  using Channel = zr::Channel<T>;
  std::mt19937 random{4711};

  Channel channel() {
    const u32 word = static_cast<u32>(random());
    if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
      static constexpr f32 edges[] = {0, 1, 0.5f, 0.25f, 0.75f, 1e-40f, -0.0f, -0.25f, 1.5f, 2, 1e-6f, 0.99999994f};
      return (word & 3) == 0 ? edges[(word >> 2) % 12] : static_cast<f32>(word >> 8) * 0x1p-24f;
    } else {
      constexpr u32 white = static_cast<u32>(zr::Depth<T>::white), half = static_cast<u32>(zr::Depth<T>::half);
      const u32 edges[] = {0, 1, half - 1, half, half + 1, white - 1, white, white / 4, 3 * white / 4};
      return static_cast<Channel>((word & 3) == 0 ? edges[(word >> 2) % 9] : (word >> 2) % (white + 1));
    }
  }
  Channel alpha() {  // a float alpha below 0 or denormal has no meaning to hold on to
    const Channel a = channel();
    return a < Channel(1e-30) ? Channel(0) : a;
  }
  T pixel() {
    T p{alpha(), channel(), channel(), channel()};
    if (random() % 8 == 0) p.green = p.red;
    if (random() % 8 == 0) p.blue = p.red;
    return p;
  }
};
