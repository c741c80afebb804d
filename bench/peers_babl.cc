// babl between the same depths. Its 16-bit white is 65535, so 16-bit pictures are spread before and after.
#include <babl/babl.h>

#include "peer_check.h"

namespace bench {
namespace {

// No channel changes place and alpha stays as it is, so that the order of channels does not matter.
template <class T>
const Babl* format() {
  return babl_format(sizeof(T) == 4 ? "R'G'B'A u8" : sizeof(T) == 8 ? "R'G'B'A u16" : "R'G'B'A float");
}

template <class T>
void spread(ZR_WorldX<T>& world, [[maybe_unused]] f64 factor) {
  if constexpr (sizeof(T) == 8)
    for (i32 y = 0; y < world.height; ++y)
      for (i32 i = 0; i < world.width * 4; ++i) {
        u16& v = reinterpret_cast<u16*>(world.Row(y))[i];
        v = static_cast<u16>(v * factor + 0.5);
      }
}

template <class From, class To>
void convert(benchmark::State& state, Size size) {
  babl_init();
  const auto src = make_world<From>(size, Layer::translucent);
  const auto ours = make_world<To>(size, Layer::opaque), theirs = make_world<To>(size, Layer::opaque);
  ours->CopyRectPossiblyDifferentBitdepth(src.get(), {0, 0, size.width, size.height}, false, 0, 0, nullptr);
  spread(*src, 65535.0 / 32768);
  const Babl* const fish = babl_fish(format<From>(), format<To>());
  const auto run = [&] { babl_process(fish, src->data, theirs->data, i64{size.width} * size.height); };
  run();
  spread(*theirs, 32768.0 / 65535);
  if (!agrees(*ours, *theirs)) return state.SkipWithError("the peer's picture is not ours");
  for (auto _ : state) run();
  state.SetBytesProcessed(static_cast<i64>(state.iterations()) * size.width * size.height *
                          static_cast<i64>(sizeof(From) + sizeof(To)));
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  for (const Size size : sizes)
    each_depth([&]<class From>() {
      each_depth([&]<class To>() {
        if constexpr (!std::is_same_v<From, To>)
          add(std::string("convert/") + depth_name<From>() + "-to-" + depth_name<To>() + "/babl", size,
              convert<From, To>);
      });
    });
  return true;
}();

}  // namespace
}  // namespace bench
