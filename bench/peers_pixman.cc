// pixman on premultiplied pixels of the same pictures, composites and OVER through a matrix: less work than straight
// alpha, named so.
#include <pixman.h>

#include <algorithm>

#include "composites.h"
#include "peer_check.h"

namespace bench {
namespace {

// The orders of channels that pixman is fastest in: blue, green, red, alpha in bytes; red, green, blue, alpha in float.
struct TheirOrder {
  void operator()(ZR_WorldX<ZR_PixelFloat>& world, bool back) const {
    each_pixel(world, [=](f32* p) { back ? std::rotate(p, p + 3, p + 4) : std::rotate(p, p + 1, p + 4); });
  }
  void operator()(ZR_WorldX<ZR_Pixel8>& world, bool) const {
    each_pixel(world, [](u8* p) { std::reverse(p, p + 4); });
  }

 private:
  template <class T, class Body>
  static void each_pixel(ZR_WorldX<T>& world, Body body) {
    for (i32 y = 0; y < world.height; ++y)
      for (i32 x = 0; x < world.width; ++x) body(&world.At(x, y)->alpha);
  }
};
constexpr TheirOrder turn;

template <class T>
pixman_image_t* image_of(ZR_WorldX<T>& world) {
  return pixman_image_create_bits(sizeof(T) == 4 ? PIXMAN_a8r8g8b8 : PIXMAN_rgba_float, world.width, world.height,
                                  static_cast<u32*>(world.data), world.row_bytes);
}

pixman_op_t operator_of(i32 xfer) {
  switch (xfer) {
    case XferInFront: return PIXMAN_OP_OVER;
    case XferMultiply: return PIXMAN_OP_MULTIPLY;
    case XferScreen: return PIXMAN_OP_SCREEN;
    case XferOverlay: return PIXMAN_OP_OVERLAY;
    case XferSoftLight: return PIXMAN_OP_SOFT_LIGHT;
    case XferHardLight: return PIXMAN_OP_HARD_LIGHT;
    case XferHue: return PIXMAN_OP_HSL_HUE;
    case XferSaturation: return PIXMAN_OP_HSL_SATURATION;
    case XferColor: return PIXMAN_OP_HSL_COLOR;
    case XferLuminosity: return PIXMAN_OP_HSL_LUMINOSITY;
    default: return PIXMAN_OP_CLEAR;  // no such operator
  }
}

template <class T>
void composite(benchmark::State& state, Size size, const Composite& work) {
  CompositePictures<T> ours(work, size), theirs(work, size);
  run_ours(work, ours);
  ZR_Premul(nullptr, 1, ours.dst.get());
  for (const auto& world : {&theirs.src, &theirs.dst, &theirs.kept}) {
    ZR_Premul(nullptr, 1, world->get());
    turn(**world, false);
  }
  turn(*theirs.mask_world, false);
  pixman_image_t* const from = image_of(*theirs.src);
  pixman_image_t* const mask = work.masked ? image_of(*theirs.mask_world) : nullptr;
  pixman_image_t* const to = image_of(*theirs.dst);
  const auto run = [&] {
    pixman_image_composite32(operator_of(work.xfer), from, mask, to, 0, 0, 0, 0, 0, 0, size.width, size.height);
  };
  run();
  const auto seen = make_world<T>(size, Layer::opaque);
  seen->CopyWorld(theirs.dst.get());
  turn(*seen, true);
  if (agrees(*ours.dst, *seen)) {
    for (auto _ : state) {
      put_back(state, *theirs.dst, *theirs.kept);
      run();
    }
    count_bytes<T>(state, size, 3);
  } else {
    state.SkipWithError("the peer's picture is not ours");
  }
  if (mask != nullptr) pixman_image_unref(mask);
  pixman_image_unref(from);
  pixman_image_unref(to);
}

// Draws src through a matrix from source to destination.
void draw(ZR_WorldX<ZR_Pixel8>& src, ZR_WorldX<ZR_Pixel8>& dst, const GX_Matrix3& matrix, pixman_op_t op,
          pixman_filter_t filter) {
  pixman_image_t* const from = image_of(src);
  pixman_image_t* const to = image_of(dst);
  pixman_f_transform_t forward, back;
  std::memcpy(forward.m, matrix.m, sizeof forward.m);
  pixman_f_transform_invert(&back, &forward);
  pixman_transform_t fixed;
  pixman_transform_from_pixman_f_transform(&fixed, &back);
  pixman_image_set_transform(from, &fixed);
  pixman_image_set_filter(from, filter, nullptr, 0);
  pixman_image_composite32(op, from, nullptr, to, 0, 0, 0, 0, 0, 0, dst.width, dst.height);
  pixman_image_unref(from);
  pixman_image_unref(to);
}

void add_resize(const Resize& work, Size size, pixman_filter_t filter) {
  add_resize_peer<ZR_Pixel8>(work, "pixman", size, [=, &work](auto& src, auto& dst) {
    draw(src, dst, {{{work.scale, 0, 0}, {0, work.scale, 0}, {0, 0, 1}}}, PIXMAN_OP_SRC, filter);
  });
}
void add_placed(const Placement& work, Size size, pixman_filter_t filter) {
  for (const auto& [peer, op] :
       {std::pair{"pixman-premultiplied", PIXMAN_OP_OVER}, {"pixman-warp-only", PIXMAN_OP_SRC}})
    add_placed_peer<ZR_Pixel8>(
        work, peer, size,
        [=, op = op](auto& src, auto& dst, const GX_Matrix3& matrix) { draw(src, dst, matrix, op, filter); }, turn);
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  for (const Size size : sizes) {
    each_composite([&](const Composite& work) {
      if (operator_of(work.xfer) == PIXMAN_OP_CLEAR) return;
      add(work.name<ZR_Pixel8>() + "/pixman-premultiplied", size,
          [=](benchmark::State& state, Size s) { composite<ZR_Pixel8>(state, s, work); });
      add(work.name<ZR_PixelFloat>() + "/pixman-premultiplied", size,
          [=](benchmark::State& state, Size s) { composite<ZR_PixelFloat>(state, s, work); });
    });
    add_placed(turned_draft, size, PIXMAN_FILTER_NEAREST);
    add_placed(turned_bilinear, size, PIXMAN_FILTER_BILINEAR);
    add_placed(moved_half_pixel, size, PIXMAN_FILTER_BILINEAR);
    add_placed(moved_subpixel, size, PIXMAN_FILTER_BILINEAR);
    add_resize(nearest_half, size, PIXMAN_FILTER_NEAREST);
    add_resize(nearest_double, size, PIXMAN_FILTER_NEAREST);
    add_resize(bilinear_larger, size, PIXMAN_FILTER_BILINEAR);
  }
  return true;
}();

}  // namespace
}  // namespace bench
