// libvips on four-band pictures from memory, on one thread, its result written into memory that is there already.
// Declared as premultiplied, so that no band is weighted.
#include <vips/vips.h>

#include "peer_check.h"

namespace bench {
namespace {

template <class T>
VipsImage* picture_of(ZR_WorldX<T>& world) {
  constexpr VipsBandFormat format = sizeof(T) == 4   ? VIPS_FORMAT_UCHAR
                                    : sizeof(T) == 8 ? VIPS_FORMAT_USHORT
                                                     : VIPS_FORMAT_FLOAT;
  const size_t bytes = static_cast<size_t>(world.width) * static_cast<size_t>(world.height) * sizeof(T);
  return vips_image_new_from_memory(world.data, bytes, world.width, world.height, 4, format);
}

// `build(src, &out)` makes the lazy picture; writing it does the work.
template <class T, class Build>
void evaluate(ZR_WorldX<T>& src, ZR_WorldX<T>& dst, Build build) {
  VipsImage* const from = picture_of<T>(src);
  VipsImage* const to = picture_of<T>(dst);
  VipsImage* made = nullptr;
  // Where the sizes differ by a rounding, the picture is not written and the check says so.
  if (build(from, &made) == 0 && made->Xsize == dst.width && made->Ysize == dst.height) vips_image_write(made, to);
  if (made != nullptr) g_object_unref(made);
  g_object_unref(to);
  g_object_unref(from);
}

template <class T>
void add_affine(const Placement& work, Size size, const char* kernel) {
  add_placed_peer<T>(work, "vips-warp-only", size, [=](auto& src, auto& dst, const GX_Matrix3& m) {
    evaluate<T>(src, dst, [&](VipsImage* from, VipsImage** made) {
      VipsInterpolate* const interpolate = vips_interpolate_new(kernel);
      VipsArrayInt* const area = vips_array_int_newv(4, 0, 0, dst.width, dst.height);
      // Pixel centres are whole numbers there.
      const auto start = [&](int i) { return m.m[i][2] + (m.m[i][0] + m.m[i][1] - 1) / 2; };
      const int failed = vips_affine(from, made, m.m[0][0], m.m[0][1], m.m[1][0], m.m[1][1], "interpolate", interpolate,
                                     "oarea", area, "odx", start(0), "ody", start(1), "premultiplied", TRUE, nullptr);
      vips_area_unref(VIPS_AREA(area));
      g_object_unref(interpolate);
      return failed;
    });
  });
}

template <class T, class Build>
void add_resize(const Resize& work, Size size, const char* name, Build build) {
  add_resize_peer<T>(work, name, size, [=](auto& src, auto& dst) { evaluate<T>(src, dst, build); });
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  if (VIPS_INIT("zr_bench") != 0) return false;
  vips_concurrency_set(1);
  vips_cache_set_max(0);
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      add_affine<T>(turned_draft, size, "nearest");
      add_affine<T>(turned_bilinear, size, "bilinear");
      add_affine<T>(turned_bicubic, size, "bicubic");
      add_affine<T>(moved_half_pixel, size, "bilinear");
      add_resize<T>(nearest_half, size, "vips-subsample",
                    [](VipsImage* from, VipsImage** made) { return vips_subsample(from, made, 2, 2, nullptr); });
      add_resize<T>(nearest_double, size, "vips-zoom",
                    [](VipsImage* from, VipsImage** made) { return vips_zoom(from, made, 2, 2, nullptr); });
      add_resize<T>(area_half, size, "vips-shrink",
                    [](VipsImage* from, VipsImage** made) { return vips_shrink(from, made, 2, 2, nullptr); });
      add_resize<T>(area_third, size, "vips-shrink", [](VipsImage* from, VipsImage** made) {
        return vips_shrink(from, made, 1 / reduced, 1 / reduced, nullptr);
      });
      add_resize<T>(area_third, size, "vips-reduce", [](VipsImage* from, VipsImage** made) {
        return vips_reduce(from, made, 1 / reduced, 1 / reduced, "kernel", VIPS_KERNEL_LINEAR, nullptr);
      });
      add_resize<T>(bilinear_larger, size, "vips-resize", [](VipsImage* from, VipsImage** made) {
        return vips_resize(from, made, 1.5, "kernel", VIPS_KERNEL_LINEAR, nullptr);
      });
    });
  return true;
}();

}  // namespace
}  // namespace bench
