// Masks: combining, inverting, fading, merging into alpha, and lines of blurs, beside memcpy over one channel.
#include <ZR/mask_alpha.h>

#include <algorithm>

#include "divided.h"
#include "masks.h"

namespace bench {
namespace {

template <class C>
void accumulate(benchmark::State& state, Size size, i32 mode, f32 opacity) {
  const auto src = make_mask<C>(size, 1), dst = make_mask<C>(size, 2);
  for (auto _ : state) ZR_AccumulateUnoBuffers(nullptr, src.get(), mode, opacity, opacity, nullptr, nullptr, dst.get());
  count_values<C>(state, size, 3);
}

template <class T, class C>
void merge(benchmark::State& state, Size size) {
  // White: alphas that fade from pass to pass would end as denormal numbers, which processors are slow on.
  const auto mask = make_mask<C>(size, 1);
  std::fill_n(static_cast<C*>(*mask->data), i64{size.width} * size.height,
              static_cast<C>(sizeof(C) == 1 ? 255 : 32768));
  const auto world = make_world<T>(size, Layer::translucent);
  for (auto _ : state) ZR_MergeMaskAlpha(nullptr, 0, 0, nullptr, mask.get(), nullptr, world.get());
  state.SetBytesProcessed(static_cast<i64>(state.iterations()) * size.width * size.height *
                          static_cast<i64>(sizeof(C) + 2 * sizeof(T)));
}

template <class C>
void blur(benchmark::State& state, Size size, i32 (*scan)(i32, i32, i32, i32, i32, const C*, C*), i32 radius) {
  const auto src = make_mask<C>(size, 1), dst = make_mask<C>(size, 2);
  const C* const from = static_cast<C*>(*src->data);
  C* const to = static_cast<C*>(*dst->data);
  for (auto _ : state)
    each_line(size.height, [&](i64 y) {
      scan(ZR_UnoScan_Plain, radius << 16, 0, size.width - 1, size.width, from + y * size.width, to + y * size.width);
    });
  count_values<C>(state, size, 2);
}

template <class C, class T, class Boxes>
void add_depth(Size size, Boxes box, Boxes bell) {
  const std::string depth = value_name<C>();
  add("mask-memcpy/" + depth, size, [](benchmark::State& state, Size s) {
    const auto src = make_mask<C>(s, 1), dst = make_mask<C>(s, 2);
    for (auto _ : state) {
      std::memcpy(*dst->data, *src->data, static_cast<size_t>(s.width) * static_cast<size_t>(s.height) * sizeof(C));
      benchmark::ClobberMemory();
    }
    count_values<C>(state, s, 2);
  });
  constexpr struct {
    const char* name;
    i32 mode;
  } modes[] = {{"screen", 0}, {"screen-dithered", -1}, {"erase", 2}, {"intersect", 3}, {"darken", 5}, {"add", 7}};
  for (const auto& one : modes) {
    const i32 mode = one.mode;
    add("mask-accumulate-" + std::string(one.name) + "/" + depth + "/whole", size,
        [mode](benchmark::State& state, Size s) { accumulate<C>(state, s, mode, 1.0f); });
  }
  add("mask-accumulate-screen/" + depth + "/half-opacity", size,
      [](benchmark::State& state, Size s) { accumulate<C>(state, s, 0, 0.5f); });
  add("mask-invert/" + depth, size, [](benchmark::State& state, Size s) {
    const auto mask = make_mask<C>(s, 1);
    for (auto _ : state) ZR_InvertUnoBuffer(nullptr, mask.get());
    count_values<C>(state, s, 2);
  });
  add("mask-fade/" + depth, size, [](benchmark::State& state, Size s) {
    const auto mask = make_mask<C>(s, 1);
    for (auto _ : state) ZR_FadeUnoBuffer(0.999f, mask.get());
    count_values<C>(state, s, 2);
  });
  add("mask-merge/" + depth + "/mask-of-the-depth", size, merge<T, C>);
  add("mask-merge/float/mask-of-" + depth, size, merge<ZR_PixelFloat, C>);
  for (const i32 radius : {10, 100}) {
    const std::string of = "/radius-" + std::to_string(radius);
    add("mask-box-scan/" + depth + of, size,
        [box, radius](benchmark::State& state, Size s) { blur<C>(state, s, box, radius); });
    add("mask-bell-scan/" + depth + of, size,
        [bell, radius](benchmark::State& state, Size s) { blur<C>(state, s, bell, radius); });
  }
}

const bool registered = [] {
  for (const Size size : sizes) {
    add_depth<u8, ZR_Pixel8>(size, ZR_BoxBlurUnoScan, ZR_GBlurUnoScan);
    add_depth<u16, ZR_Pixel16>(size, ZR_BoxBlurDeepUnoScan, ZR_GBlurDeepUnoScan);
  }
  return true;
}();

}  // namespace
}  // namespace bench
