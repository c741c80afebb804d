// The plain loops over masks beside ours, after a look whether they compute the same.
#include "peers_plain_mask.h"

#include <ZR/mask_alpha.h>

#include "masks.h"

namespace bench {
namespace {

template <class C>
C* values_of(const ZR_UnoBuffer& mask) {
  return static_cast<C*>(*mask.data);
}
size_t count_of(Size size) { return static_cast<size_t>(size.width) * static_cast<size_t>(size.height); }

// Runs `theirs` for the time, after it and `ours` were found equal on the same mask.
template <class C, class Ours, class Theirs>
void beside(benchmark::State& state, Size size, int passes, Ours ours, Theirs theirs) {
  const auto one = make_mask<C>(size, 2), other = make_mask<C>(size, 2);
  ours(*one);
  theirs(values_of<C>(*other));
  if (std::memcmp(values_of<C>(*one), values_of<C>(*other), count_of(size) * sizeof(C)) != 0) {
    state.SkipWithError("the plain loop computes something else");
    return;
  }
  for (auto _ : state) theirs(values_of<C>(*other));
  count_values<C>(state, size, passes);
}

template <class C, class T>
void add_depth(Size size, i32 (*scan)(i32, i32, i32, i32, i32, const C*, C*)) {
  const std::string depth = value_name<C>();
  add("mask-accumulate-screen/" + depth + "/whole/plain", size, [](benchmark::State& state, Size s) {
    const auto src = make_mask<C>(s, 1);
    beside<C>(
        state, s, 3, [&](ZR_UnoBuffer& m) { ZR_AccumulateUnoBuffers(nullptr, src.get(), 0, nullptr, &m); },
        [&](C* v) { plain::screen(count_of(s), values_of<C>(*src), v); });
  });
  add("mask-invert/" + depth + "/plain", size, [](benchmark::State& state, Size s) {
    beside<C>(
        state, s, 2, [](ZR_UnoBuffer& m) { ZR_InvertUnoBuffer(nullptr, &m); },
        [&](C* v) { plain::invert(count_of(s), v); });
  });
  add("mask-fade/" + depth + "/plain", size, [](benchmark::State& state, Size s) {
    constexpr C factor = sizeof(C) == 1 ? 255 : 32735;
    beside<C>(
        state, s, 2, [](ZR_UnoBuffer& m) { ZR_FadeUnoBuffer(0.999f, &m); },
        [&](C* v) { plain::fade(count_of(s), factor, v); });
  });
  add("mask-merge/" + depth + "/mask-of-the-depth/plain", size, [](benchmark::State& state, Size s) {
    const auto mask = make_mask<C>(s, 1);
    const auto ours = make_world<T>(s, Layer::translucent), theirs = make_world<T>(s, Layer::translucent);
    const auto run = [&] { plain::merge(count_of(s), values_of<C>(*mask), static_cast<C*>(theirs->data)); };
    ZR_MergeMaskAlpha(nullptr, 0, 0, nullptr, mask.get(), nullptr, ours.get());
    run();
    if (std::memcmp(ours->data, theirs->data, count_of(s) * sizeof(T)) != 0) {
      state.SkipWithError("the plain loop computes something else");
      return;
    }
    for (auto _ : state) run();
    state.SetBytesProcessed(static_cast<i64>(state.iterations()) * s.width * s.height *
                            static_cast<i64>(sizeof(C) + 2 * sizeof(T)));
  });
  for (const i32 radius : {10, 100})
    add("mask-box-scan/" + depth + "/radius-" + std::to_string(radius) + "/plain", size,
        [scan, radius](benchmark::State& state, Size s) {
          const auto src = make_mask<C>(s, 1);
          const auto width = static_cast<size_t>(s.width);
          const auto line = [&](C* v, size_t y) { return v + y * width; };
          beside<C>(
              state, s, 2,
              [&](ZR_UnoBuffer& m) {
                for (size_t y = 0; y < static_cast<size_t>(s.height); ++y)
                  scan(0, radius << 16, 0, s.width - 1, s.width, line(values_of<C>(*src), y), line(values_of<C>(m), y));
              },
              [&](C* v) {
                for (size_t y = 0; y < static_cast<size_t>(s.height); ++y)
                  plain::box(width, static_cast<size_t>(radius), line(values_of<C>(*src), y), line(v, y));
              });
        });
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  for (const Size size : sizes) {
    add_depth<u8, ZR_Pixel8>(size, ZR_BoxBlurUnoScan);
    add_depth<u16, ZR_Pixel16>(size, ZR_BoxBlurDeepUnoScan);
  }
  return true;
}();

}  // namespace
}  // namespace bench
