// pixman on premultiplied pixels of the same pictures, OVER and OVER through a matrix: less work than straight
// alpha, named so.
#include <pixman.h>

#include "placements.h"
#include "workloads.h"

namespace bench {
namespace {

// 8-bit pixels in memory order alpha, red, green, blue are big-endian ARGB words.
pixman_image_t* image_of(ZR_World& world) {
  return pixman_image_create_bits(PIXMAN_b8g8r8a8, world.width, world.height, static_cast<u32*>(world.data),
                                  world.row_bytes);
}

const bool registered = [] {
  for (const Size size : sizes)
    for (const Layer layer : layers)
      for (const Layer ground : {Layer::opaque, Layer::translucent})
        add(std::string("in-front/8/") + name_of(layer) + "-over-" + name_of(ground) + "/pixman-premultiplied", size,
            [=](benchmark::State& state, Size s) {
              const auto src = make_world<ZR_Pixel8>(s, layer, 1);
              const auto dst = make_world<ZR_Pixel8>(s, ground, 2);
              ZR_Premul(nullptr, 1, src.get());
              ZR_Premul(nullptr, 1, dst.get());
              pixman_image_t* const from = image_of(*src);
              pixman_image_t* const to = image_of(*dst);
              for (auto _ : state)
                pixman_image_composite32(PIXMAN_OP_OVER, from, nullptr, to, 0, 0, 0, 0, 0, 0, s.width, s.height);
              pixman_image_unref(from);
              pixman_image_unref(to);
              count_bytes<ZR_Pixel8>(state, s, 3);
            });
  for (const Size size : sizes)
    for (const Layer layer : {Layer::opaque, Layer::translucent})
      add(std::string("transform-turned-bilinear/8/") + name_of(layer) + "/pixman-premultiplied", size,
          [=](benchmark::State& state, Size s) {
            const auto src = make_world<ZR_Pixel8>(s, layer, 1);
            const auto dst = make_world<ZR_Pixel8>(s, Layer::opaque, 2);
            ZR_Premul(nullptr, 1, src.get());
            pixman_image_t* const from = image_of(*src);
            pixman_image_t* const to = image_of(*dst);
            const GX_Matrix3 m = placement(turned_degrees, enlarged, s.width, s.height);
            pixman_f_transform_t forward, back;
            std::memcpy(forward.m, m.m, sizeof forward.m);
            pixman_f_transform_invert(&back, &forward);
            pixman_transform_t fixed;
            pixman_transform_from_pixman_f_transform(&fixed, &back);
            pixman_image_set_transform(from, &fixed);
            pixman_image_set_filter(from, PIXMAN_FILTER_BILINEAR, nullptr, 0);
            for (auto _ : state)
              pixman_image_composite32(PIXMAN_OP_OVER, from, nullptr, to, 0, 0, 0, 0, 0, 0, s.width, s.height);
            pixman_image_unref(from);
            pixman_image_unref(to);
            count_bytes<ZR_Pixel8>(state, s, 3);
          });
  return true;
}();

}  // namespace
}  // namespace bench
