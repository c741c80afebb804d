// The filters that are measured: blurs in both directions, and convolutions by the library's own tables.
#pragma once

#include <ZR/blur.h>

#include "divided.h"
#include "peer_check.h"

namespace bench {

struct Blur {
  const char* name;
  f32 radius;
  u32 iterations;  // 0 is the Gaussian
  bool rows = true, columns = true;

  template <class T>
  void operator()(ZR_World& src, ZR_WorldX<T>& between, ZR_WorldX<T>& dst) const {
    const auto run = [&](ZR_World& from, ZR_World& to, bool vertical) {
      if (iterations == 0)
        ZR_GaussianBlur1D(nullptr, &from, radius, ZR_BlurFlag_AllChannels, vertical, true, vertical, true, false, &to);
      else
        ZR_BoxBlur1D(nullptr, &from, radius, iterations, ZR_BlurFlag_AllChannels, vertical, true, vertical, true, false,
                     &to);
    };
    if (rows) run(src, columns ? between : dst, false);
    if (columns) run(rows ? between : src, dst, true);
  }
};
inline constexpr Blur box_10{"box-blur-10", 10, 1}, box_100{"box-blur-100", 100, 1}, box_500{"box-blur-500", 500, 1},
    box_10_thrice{"box-blur-10-thrice", 10, 3}, box_100_thrice{"box-blur-100-thrice", 100, 3},
    box_fraction{"box-blur-10.3", 10.3f, 1}, box_rows{"box-blur-rows-100", 100, 1, true, false},
    box_columns{"box-blur-columns-100", 100, 1, false, true}, gaussian_10{"gaussian-blur-10", 10, 0};

struct Kernel {
  const char* name;
  i32 size;

  std::vector<i32> taps() const {
    std::vector<i32> made(static_cast<size_t>(size * size));
    u32 diameter = 0;
    ZR_GaussianKernel(nullptr, size / 2, 0, 1.0, &diameter, made.data());
    return made;
  }
  template <class T>
  void operator()(ZR_WorldX<T>& src, const std::vector<i32>& kernel, ZR_WorldX<T>& dst) const {
    const i32* const k = kernel.data();
    convolve(nullptr, &src, nullptr, ZR_ConvolveFlag_Normalised, size, k, k, k, k, &dst);
  }
};
inline constexpr Kernel kernel_3{"convolve-3x3", 3}, kernel_5{"convolve-5x5", 5}, kernel_15{"convolve-15x15", 15};

// Registers `body(src, dst)` as the peer of a filter, for opaque layers.
template <class T, class Body>
void add_blur_peer(const Blur& work, const char* peer, Size size, Body body) {
  add(std::string(work.name) + "/" + depth_name<T>() + "/opaque/" + peer, size,
      [=, &work](benchmark::State& state, Size s) {
        const auto ours = [&](ZR_WorldX<T>& src, ZR_WorldX<T>& dst) {
          ZR_WorldX<T> between(s.width, s.height, 0);
          work(src, between, dst);
        };
        time_peer<T>(state, s, s, ours, body);
      });
}
template <class T, class Body>
void add_kernel_peer(const Kernel& work, const char* peer, Size size, Body body) {
  add(std::string(work.name) + "/" + depth_name<T>() + "/opaque/" + peer, size,
      [=, &work](benchmark::State& state, Size s) {
        const std::vector<i32> taps = work.taps();
        time_peer<T>(
            state, s, s, [&](ZR_WorldX<T>& src, ZR_WorldX<T>& dst) { work(src, taps, dst); },
            [&](ZR_WorldX<T>& src, ZR_WorldX<T>& dst) { body(src, taps, dst); });
      });
}

}  // namespace bench
