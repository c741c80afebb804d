// libvips' filters on four-band pictures from memory, on one thread. Boxes are separable convolutions:
// its approximate one, of running sums, gives black pictures for masks of one height.
#include <vips/vips.h>

#include "filters.h"

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

VipsImage* mask_of(int width, int height, const std::vector<i32>& taps) {
  VipsImage* const mask = vips_image_new_matrix(width, height);
  f64 sum = 0;
  for (int i = 0; i < width * height; ++i) {
    *VIPS_MATRIX(mask, i % width, i / width) = taps[static_cast<size_t>(i)];
    sum += taps[static_cast<size_t>(i)];
  }
  vips_image_set_double(mask, "scale", sum);
  return mask;
}

// `build(src, mask, &out)` makes the lazy picture; writing it does the work.
template <class T, class Build>
void evaluate(ZR_WorldX<T>& src, VipsImage* mask, ZR_WorldX<T>& dst, Build build) {
  VipsImage* const from = picture_of<T>(src);
  VipsImage* const to = picture_of<T>(dst);
  VipsImage *made = nullptr, *whole = nullptr;
  if (build(from, mask, &made) == 0 && vips_cast(made, &whole, to->BandFmt, nullptr) == 0) vips_image_write(whole, to);
  if (whole != nullptr) g_object_unref(whole);
  if (made != nullptr) g_object_unref(made);
  g_object_unref(mask);
  g_object_unref(to);
  g_object_unref(from);
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  if (VIPS_INIT("zr_bench") != 0) return false;
  vips_concurrency_set(1);
  vips_cache_set_max(0);
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      for (const Blur* blur : {&box_10, &box_100})
        add_blur_peer<T>(*blur, "vips-convsep", size, [=](auto& src, auto& dst) {
          const int side = 2 * static_cast<int>(blur->radius) + 1;
          VipsImage* const mask = mask_of(side, 1, std::vector<i32>(static_cast<size_t>(side), 1));
          evaluate<T>(src, mask, dst, [](VipsImage* from, VipsImage* box, VipsImage** made) {
            return vips_convsep(from, made, box, "precision",
                                sizeof(T) == 16 ? VIPS_PRECISION_FLOAT : VIPS_PRECISION_INTEGER, nullptr);
          });
        });
      add_blur_peer<T>(gaussian_10, "vips-convsep", size, [](auto& src, auto& dst) {
        std::vector<i32> taps(21);
        u32 diameter = 0;
        ZR_GaussianKernel(nullptr, 10, ZR_KernelFlag_OneRow, 1.0, &diameter, taps.data());
        evaluate<T>(src, mask_of(21, 1, taps), dst, [](VipsImage* from, VipsImage* bell, VipsImage** made) {
          return vips_convsep(from, made, bell, "precision",
                              sizeof(T) == 16 ? VIPS_PRECISION_FLOAT : VIPS_PRECISION_INTEGER, nullptr);
        });
      });
      for (const Kernel* kernel : {&kernel_3, &kernel_5, &kernel_15})
        add_kernel_peer<T>(*kernel, "vips", size, [=](auto& src, const std::vector<i32>& taps, auto& dst) {
          evaluate<T>(src, mask_of(kernel->size, kernel->size, taps), dst,
                      [](VipsImage* from, VipsImage* table, VipsImage** made) {
                        return vips_conv(from, made, table, "precision",
                                         sizeof(T) == 16 ? VIPS_PRECISION_FLOAT : VIPS_PRECISION_INTEGER, nullptr);
                      });
        });
    });
  return true;
}();

}  // namespace
}  // namespace bench
