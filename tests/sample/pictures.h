// What the samplers are tried on: small worlds of every kind, and positions that meet all their borders.
#pragma once

#include <ZR/sample.h>

#include <array>
#include <memory>
#include <string>

#include "support/worlds.h"

template <class Body>
void each_depth(Body&& body) {
  body.template operator()<ZR_Pixel8>();
  body.template operator()<ZR_Pixel16>();
  body.template operator()<ZR_PixelFloat>();
}

enum class Alpha { random, opaque, clear, equal, flat_halves };

// A world with guard bytes around it; `upside_down` reads it through a negative row stride.
template <class T>
struct Picture {
  std::string name;
  TestWorld<T> world;
  ZR_LayerDef layer;
  ZR_SampPB params{};

  Picture(i32 width, i32 height, Alpha alpha, bool upside_down, u32 seed)
      : name(std::to_string(width) + 'x' + std::to_string(height) + " alpha " +
             std::to_string(static_cast<int>(alpha))),
        world(width, height, 3),
        layer(*world.layer()) {
    constexpr auto white = static_cast<zr::Channel<T>>(zr::Depth<T>::white);
    world.randomise(seed);
    for (i32 y = 0; y < height; ++y)
      for (i32 x = 0; x < width; ++x) {
        T& p = world.at(x, y);
        if (alpha == Alpha::opaque) p.alpha = white;
        if (alpha == Alpha::clear) p.alpha = 0;
        if (alpha == Alpha::equal) p.alpha = static_cast<zr::Channel<T>>(static_cast<f32>(white) * 0.3f);
        if (alpha == Alpha::flat_halves) p = x < width / 2 ? T{white, white, 0, white} : T{0, white, 0, 0};
        if constexpr (std::is_same_v<T, ZR_PixelFloat>)
          if (alpha == Alpha::random && (x + y) % 3 == 0) p.red = 4 - 8 * p.red, p.alpha *= 1.5f;  // outside 0..1
      }
    if (upside_down) {
      layer.data = &world.at(0, height - 1);
      layer.row_bytes = -layer.row_bytes;
    }
    params.src = &layer;
  }
  Picture(const Picture&) = delete;
  T at(i64 x, i64 y) const {  // 0 outside
    if (x < 0 || y < 0 || x >= layer.width || y >= layer.height) return T{};
    return *reinterpret_cast<const T*>(static_cast<const u8*>(layer.data) + y * layer.row_bytes +
                                       x * static_cast<i64>(sizeof(T)));
  }
};

template <class T>
std::vector<std::unique_ptr<Picture<T>>> pictures() {
  std::vector<std::unique_ptr<Picture<T>>> all;
  const auto add = [&](i32 width, i32 height, Alpha alpha, bool upside_down) {
    all.push_back(std::make_unique<Picture<T>>(width, height, alpha, upside_down, static_cast<u32>(all.size()) + 7));
  };
  for (const Alpha alpha : {Alpha::random, Alpha::opaque, Alpha::clear, Alpha::equal, Alpha::flat_halves})
    add(9, 7, alpha, alpha == Alpha::opaque);
  add(1, 1, Alpha::random, false);
  add(2, 5, Alpha::random, true);
  add(5, 2, Alpha::opaque, false);
  add(17, 13, Alpha::random, true);
  return all;
}

// 16.16 positions up to four pixels outside, a third of them whole and a third on halves along an axis, and far away.
inline std::vector<std::array<i32, 2>> positions(const ZR_LayerDef& layer, size_t count, u32 seed) {
  std::mt19937 random(seed);
  const auto along = [&](i32 size) {
    const i32 at = static_cast<i32>(random() % static_cast<u32>((size + 8) << 16)) - (4 << 16);
    const u32 kind = static_cast<u32>(random()) % 3;
    return kind == 0 ? at & ~0xffff : kind == 1 ? at & ~0x7fff : at;
  };
  std::vector<std::array<i32, 2>> all;
  for (const i32 x : {INT32_MIN, INT32_MIN + 1, -0x10001, -1, 0, 1, (layer.width - 1) << 16, INT32_MAX - 1, INT32_MAX})
    for (const i32 y : {INT32_MIN, -0x8000, 0, 0x8000, ((layer.height - 1) << 16) + 1, INT32_MAX})
      all.push_back({x, y});
  while (all.size() < count) all.push_back({along(layer.width), along(layer.height)});
  return all;
}

// Bit for bit; `what` is printed.
template <class T>
testing::AssertionResult same_pixel(const T& got, const T& expected) {
  const auto same = [](auto a, auto b) { return a == b || (a != a && b != b); };
  if (same(got.alpha, expected.alpha) && same(got.red, expected.red) && same(got.green, expected.green) &&
      same(got.blue, expected.blue))
    return testing::AssertionSuccess();
  auto failure = testing::AssertionFailure();
  for (const T* p : {&got, &expected})
    failure << (p == &got ? "got " : ", expected ") << +p->alpha << ' ' << +p->red << ' ' << +p->green << ' '
            << +p->blue;
  return failure;
}
