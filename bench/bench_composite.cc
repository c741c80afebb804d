// ZR_TransferRect over an opaque and a translucent frame, for three kinds of layers.
#include "composites.h"

namespace bench {
namespace {

template <class T>
void transfer(benchmark::State& state, Size size, const Composite& work) {
  CompositePictures<T> pictures(work, size);
  for (auto _ : state) {
    if (!run_ours(work, pictures)) {
      state.SkipWithError("ZR_TransferRect failed");
      break;
    }
    put_back(state, *pictures.dst, *pictures.kept);
  }
  count_bytes<T>(state, size, 3);
}

const bool registered = [] {
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      each_composite([&](const Composite& work) {
        add(work.name<T>(), size, [=](benchmark::State& state, Size s) { transfer<T>(state, s, work); });
      });
    });
  return true;
}();

}  // namespace
}  // namespace bench
