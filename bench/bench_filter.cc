// Blurs, whose time is not to depend on the radius or the direction, and convolutions.
#include "filters.h"

namespace bench {
namespace {

const bool registered = [] {
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      for (const Blur* blur : {&box_10, &box_100, &box_500, &box_10_thrice, &box_100_thrice, &box_fraction, &box_rows,
                               &box_columns, &gaussian_10})
        add(std::string(blur->name) + "/" + depth_name<T>() + "/opaque", size, [=](benchmark::State& state, Size s) {
          const auto src = make_world<T>(s, Layer::opaque), between = make_world<T>(s, Layer::opaque),
                     dst = make_world<T>(s, Layer::opaque);
          for (auto _ : state) (*blur)(*src, *between, *dst);
          count_bytes<T>(state, s, 2);
        });
      for (const Kernel* kernel : {&kernel_3, &kernel_5, &kernel_15})
        add(std::string(kernel->name) + "/" + depth_name<T>() + "/opaque", size, [=](benchmark::State& state, Size s) {
          const auto src = make_world<T>(s, Layer::opaque), dst = make_world<T>(s, Layer::opaque);
          const std::vector<i32> taps = kernel->taps();
          for (auto _ : state) (*kernel)(*src, taps, *dst);
          count_bytes<T>(state, s, 2);
        });
    });
  return true;
}();

}  // namespace
}  // namespace bench
