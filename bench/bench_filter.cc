// Blurs, whose time is not to depend on the radius or the direction, and convolutions.
#include "filters.h"

namespace bench {
namespace {

// Layers are made of 16 bits, whose products with whole numbers are exact; those of bytes and of most arithmetic are
// not.
void use_all_bits(ZR_WorldX<ZR_PixelFloat>& world) {
  for (i32 y = 0; y < world.height; ++y)
    for (i32 x = 0; x < world.width; ++x) {
      ZR_PixelFloat& p = *world.At(x, y);
      for (f32* const channel : {&p.alpha, &p.red, &p.green, &p.blue}) *channel *= 65536.0f / 65535;
    }
}

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
        for (const Layer layer : {Layer::opaque, Layer::translucent}) {
          if (layer == Layer::translucent && sizeof(T) != 16) continue;
          const std::string name = std::string(kernel->name) + "/" + depth_name<T>() + "/" + name_of(layer);
          add(name, size, [=](benchmark::State& state, Size s) {
            const auto src = make_world<T>(s, layer), dst = make_world<T>(s, Layer::opaque);
            if constexpr (sizeof(T) == 16)
              if (layer == Layer::translucent) use_all_bits(*src);
            const std::vector<i32> taps = kernel->taps();
            for (auto _ : state) (*kernel)(*src, taps, *dst);
            count_bytes<T>(state, s, 2);
          });
        }
    });
  return true;
}();

}  // namespace
}  // namespace bench
