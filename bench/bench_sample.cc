// Rows of samples: bilinear and bicubic along a slanted line and along a span, and boxes of a 2.7-fold reduction.
#include <vector>

#include "sample/sample_functions.h"
#include "workloads.h"

namespace bench {
namespace {

enum class Walk { no_clip, clip, span, area };

constexpr Size row = {1920, 1};

template <class T>
void sample_row(benchmark::State& state, Walk walk, i32 quality, Layer layer) {
  const auto world = make_world<T>({row.width * 27 / 10 + 16, 64}, layer);
  ZR_SampPB params{};
  params.src = world.get();
  params.x_radius = params.y_radius = static_cast<i32>(0.5 * 2.7 * 65536);
  const auto set = zr::sample_functions<T>(quality);
  auto* const sampler = walk == Walk::area ? set.area : walk == Walk::clip ? set.clipping : set.no_clipping;
  const i32 step_x = walk == Walk::area ? 176947 : 60000, step_y = walk == Walk::area ? 0 : 1500;
  std::vector<T> out(static_cast<size_t>(row.width));
  for (auto _ : state) {
    i32 x = (4 << 16) + 12345, y = (8 << 16) + 23456;
    if (walk == Walk::span) {
      zr::AlphaSum<T> sum = 0;
      set.span(nullptr, row.width, x, y, &params, &sum, out.data());
    } else {
      for (T& pixel : out) {
        sampler(nullptr, x, y, &params, &pixel);
        x += step_x, y += step_y;
      }
    }
    benchmark::DoNotOptimize(out.data());
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * row.width);
}

struct Operation {
  const char* name;
  Walk walk;
  i32 quality;
};
constexpr Operation operations[] = {{"sample-bilinear", Walk::no_clip, 1},   {"sample-bilinear-clip", Walk::clip, 1},
                                    {"sample-bilinear-span", Walk::span, 1}, {"sample-bicubic", Walk::no_clip, 2},
                                    {"sample-bicubic-span", Walk::span, 2},  {"sample-area-2.7", Walk::area, 1}};

const bool registered = [] {
  for (const Operation& one : operations)
    each_depth([&]<class T>() {
      for (const Layer layer : {Layer::opaque, Layer::translucent})
        add(std::string(one.name) + "/" + depth_name<T>() + "/" + name_of(layer), row,
            [=](benchmark::State& state, Size) { sample_row<T>(state, one.walk, one.quality, layer); });
    });
  return true;
}();

}  // namespace
}  // namespace bench
