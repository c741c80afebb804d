// The pictures that are measured, and how a workload is registered for each of them.
#pragma once

#include <ZR/world.h>
#include <benchmark/benchmark.h>

#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

namespace bench {

struct Size {
  i32 width, height;
};
// ZR_BENCH_SIZE=2048x1024 measures one size in place of the usual two. Widths are multiples of 16: no row padding.
inline const std::vector<Size> sizes = [] {
  Size size{};
  const char* const wanted = std::getenv("ZR_BENCH_SIZE");
  if (wanted != nullptr && std::sscanf(wanted, "%dx%d", &size.width, &size.height) == 2) return std::vector<Size>{size};
  return std::vector<Size>{{1920, 1080}, {256, 256}};
}();
// ZR_BENCH_PEERS=0 leaves the peers out: runs with more threads do not need them again.
inline bool peers_wanted() {
  const char* const wanted = std::getenv("ZR_BENCH_PEERS");
  return wanted == nullptr || std::strcmp(wanted, "0") != 0;
}

enum class Layer {
  opaque,       // alpha white everywhere
  cut_out,      // a disc: opaque inside, clear outside, a soft edge
  translucent,  // random alpha
};
inline constexpr Layer layers[] = {Layer::opaque, Layer::cut_out, Layer::translucent};
inline const char* name_of(Layer layer) {
  return layer == Layer::opaque ? "opaque" : layer == Layer::cut_out ? "cut-out" : "translucent";
}

template <class T>
constexpr const char* depth_name() {
  return sizeof(T) == 4 ? "8" : sizeof(T) == 8 ? "16" : "float";
}

template <class T>
std::unique_ptr<ZR_WorldX<T>> make_world(Size size, Layer layer, u32 seed = 1) {
  auto world = std::make_unique<ZR_WorldX<T>>(size.width, size.height, 0);
  u64 random = seed;
  const auto channel = [](f32 v) {
    if constexpr (std::is_same_v<T, ZR_PixelFloat>)
      return v;
    else
      return static_cast<zr::Channel<T>>(v * static_cast<f32>(zr::Depth<T>::white) + 0.5f);
  };
  const f32 radius = 0.4f * static_cast<f32>(size.height);
  for (i32 y = 0; y < size.height; ++y)
    for (i32 x = 0; x < size.width; ++x) {
      // One mixed counter gives the four channels of a pixel: peers and sizes take many pictures.
      u64 bits = random += 0x9e3779b97f4a7c15;
      bits = (bits ^ bits >> 30) * 0xbf58476d1ce4e5b9;
      bits = (bits ^ bits >> 27) * 0x94d049bb133111eb;
      const auto unit = [&] {
        const f32 v = static_cast<f32>(bits & 0xffff) * 0x1p-16f;
        bits >>= 16;
        return v;
      };
      f32 alpha = 1.0f;
      if (layer == Layer::translucent) alpha = unit();
      if (layer == Layer::cut_out) {
        const auto dx = static_cast<f32>(x - size.width / 2), dy = static_cast<f32>(y - size.height / 2);
        const f32 distance = std::sqrt(dx * dx + dy * dy);
        alpha = std::fmin(1.0f, std::fmax(0.0f, (radius - distance) / 8.0f + 0.5f));
      }
      *world->At(x, y) = T{channel(alpha), channel(unit()), channel(unit()), channel(unit())};
    }
  return world;
}

// What one pass over a world of this size and pixel moves, for the bytes per second in the report.
template <class T>
void count_bytes(benchmark::State& state, Size size, int passes) {
  state.SetBytesProcessed(static_cast<i64>(state.iterations()) * size.width * size.height *
                          static_cast<i64>(sizeof(T)) * passes);
}

// Registers work/depth/detail/size; `body` is called with (state, size).
template <class Body>
void add(const std::string& name, Size size, Body body) {
  const std::string full = name + "/" + std::to_string(size.width) + "x" + std::to_string(size.height);
  benchmark::RegisterBenchmark(full.c_str(), [body, size](benchmark::State& state) { body(state, size); })
      ->Unit(benchmark::kMillisecond)
      ->UseRealTime();
}

// Runs `body.template operator()<T>()` for the three depths.
template <class Body>
void each_depth(Body&& body) {
  body.template operator()<ZR_Pixel8>();
  body.template operator()<ZR_Pixel16>();
  body.template operator()<ZR_PixelFloat>();
}

}  // namespace bench
