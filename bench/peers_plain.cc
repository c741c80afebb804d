// The plain loops beside ours, after a look whether they compute the same.
#include "peers_plain.h"

#include <optional>

#include "composites.h"
#include "peer_check.h"

namespace bench {
namespace {

template <class T>
using Plain = plain::Pixel<zr::Channel<T>>;
// Worlds here have no row padding: their widths are multiples of 64.
template <class T>
Plain<T>* pixels_of(ZR_WorldX<T>& world) {
  return static_cast<Plain<T>*>(world.data);
}
size_t count_of(Size size) { return static_cast<size_t>(size.width) * static_cast<size_t>(size.height); }

std::optional<plain::Mode> mode_of(i32 xfer) {
  switch (xfer) {
    case XferInFront: return plain::Mode::in_front;
    case XferMultiply: return plain::Mode::multiply;
    case XferScreen: return plain::Mode::screen;
    case XferOverlay: return plain::Mode::overlay;
    case XferSoftLight: return plain::Mode::soft_light;
    case XferHardLight: return plain::Mode::hard_light;
    case XferDifference: return plain::Mode::difference;
    case XferColorDodge: return plain::Mode::color_dodge;
    default: return std::nullopt;
  }
}

template <class T>
void blend(benchmark::State& state, Size size, const Composite& work) {
  CompositePictures<T> ours(work, size), theirs(work, size);
  const auto run = [&] {
    plain::blend(*mode_of(work.xfer), count_of(size), pixels_of<T>(*theirs.src),
                 work.masked ? pixels_of<T>(*theirs.mask_world) : nullptr, pixels_of<T>(*theirs.dst));
  };
  run_ours(work, ours);
  run();
  if (!agrees(*ours.dst, *theirs.dst)) return state.SkipWithError("the peer's picture is not ours");
  for (auto _ : state) {
    put_back(state, *theirs.dst, *theirs.kept);
    run();
  }
  count_bytes<T>(state, size, 3);
}

template <class T>
void premultiply(benchmark::State& state, Size size, Layer layer, bool forward) {
  const auto kept = make_world<T>(size, layer), ours = make_world<T>(size, layer), theirs = make_world<T>(size, layer);
  if (!forward) {
    ZR_Premul(nullptr, 1, kept.get());
    ours->CopyWorld(kept.get());
    theirs->CopyWorld(kept.get());
  }
  const auto run = [&] {
    forward ? plain::premultiply(count_of(size), pixels_of<T>(*theirs))
            : plain::unmultiply(count_of(size), pixels_of<T>(*theirs));
  };
  ZR_Premul(nullptr, forward, ours.get());
  run();
  if (!agrees(*ours, *theirs)) return state.SkipWithError("the peer's picture is not ours");
  for (auto _ : state) {
    put_back(state, *theirs, *kept);
    run();
  }
  count_bytes<T>(state, size, 2);
}

template <class From, class To>
void convert(benchmark::State& state, Size size) {
  const auto src = make_world<From>(size, Layer::translucent);
  const auto ours = make_world<To>(size, Layer::opaque), theirs = make_world<To>(size, Layer::opaque);
  const auto run = [&] { plain::convert(count_of(size), pixels_of<From>(*src), pixels_of<To>(*theirs)); };
  ours->CopyRectPossiblyDifferentBitdepth(src.get(), {0, 0, size.width, size.height}, false, 0, 0, nullptr);
  run();
  if (!agrees(*ours, *theirs)) return state.SkipWithError("the peer's picture is not ours");
  for (auto _ : state) run();
  count_bytes<From>(state, size, 1);
}

void look_up(benchmark::State& state, Size size) {
  const auto src = make_world<ZR_Pixel8>(size, Layer::translucent), dst = make_world<ZR_Pixel8>(size, Layer::opaque);
  u8 tables[4][256];
  for (i32 i = 0; i < 256; ++i) tables[0][i] = tables[1][i] = tables[2][i] = tables[3][i] = static_cast<u8>(255 - i);
  for (auto _ : state) {
    plain::look_up(count_of(size), pixels_of<ZR_Pixel8>(*src), tables, pixels_of<ZR_Pixel8>(*dst));
    benchmark::ClobberMemory();
  }
  count_bytes<ZR_Pixel8>(state, size, 2);
}

// A cleared frame from the C library: large ones are fresh pages each time.
template <class T>
void allocate(benchmark::State& state, Size size) {
  const size_t bytes = count_of(size) * sizeof(T);
  for (auto _ : state) {
    void* const frame = std::aligned_alloc(64, bytes);
    benchmark::DoNotOptimize(std::memset(frame, 0, bytes));
    benchmark::ClobberMemory();
    std::free(frame);
  }
  count_bytes<T>(state, size, 1);
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  for (const Size size : sizes) {
    add("look-up/8/plain", size, look_up);
    each_depth([&]<class T>() {
      each_composite([&](const Composite& work) {
        if (mode_of(work.xfer).has_value())
          add(work.name<T>() + "/plain", size, [=](benchmark::State& state, Size s) { blend<T>(state, s, work); });
      });
      for (const Layer layer : layers)
        for (const bool forward : {true, false})
          add(std::string(forward ? "premul/" : "unmul/") + depth_name<T>() + "/" + name_of(layer) + "/plain", size,
              [=](benchmark::State& state, Size s) { premultiply<T>(state, s, layer, forward); });
      add(std::string("allocate/") + depth_name<T>() + "/plain", size, allocate<T>);
      each_depth([&]<class To>() {
        if constexpr (!std::is_same_v<T, To>)
          add(std::string("convert/") + depth_name<T>() + "-to-" + depth_name<To>() + "/plain", size, convert<T, To>);
      });
    });
  }
  return true;
}();

}  // namespace
}  // namespace bench
