// OpenImageIO's convolution, on one thread: its only filter of this kind. Boxes and the bell are two passes, one row
// and one column wide, which is the faster way; the wide box and the large table would take seconds and are left out.
#include <OpenImageIO/imagebuf.h>
#include <OpenImageIO/imagebufalgo.h>

#include "filters.h"

namespace bench {
namespace {

template <class T>
OIIO::ImageBuf picture_of(ZR_WorldX<T>& world) {
  const OIIO::TypeDesc type(sizeof(T) == 4   ? OIIO::TypeDesc::UINT8
                            : sizeof(T) == 8 ? OIIO::TypeDesc::UINT16
                                             : OIIO::TypeDesc::FLOAT);
  return {OIIO::ImageSpec(world.width, world.height, 4, type), world.data};
}

OIIO::ImageBuf mask_of(int width, int height, const std::vector<i32>& taps) {
  OIIO::ImageSpec layout(width, height, 1, OIIO::TypeDesc::FLOAT);
  layout.x = -(width / 2);
  layout.y = -(height / 2);
  layout.full_x = layout.x, layout.full_y = layout.y, layout.full_width = width, layout.full_height = height;
  OIIO::ImageBuf mask(layout);
  for (int i = 0; i < width * height; ++i) {
    const float tap = static_cast<float>(taps[static_cast<size_t>(i)]);
    mask.setpixel(layout.x + i % width, layout.y + i / width, &tap, 1);
  }
  return mask;
}

template <class T>
void convolve_twice(ZR_WorldX<T>& src, const std::vector<i32>& taps, ZR_WorldX<T>& dst) {
  const int n = static_cast<int>(taps.size());
  OIIO::ImageBuf to = picture_of<T>(dst);
  const OIIO::ImageBuf between =
      OIIO::ImageBufAlgo::convolve(picture_of<T>(src), mask_of(n, 1, taps), true, to.roi(), 1);
  OIIO::ImageBufAlgo::convolve(to, between, mask_of(1, n, taps), true, to.roi(), 1);
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  OIIO::attribute("threads", 1);
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      add_blur_peer<T>(box_10, "oiio-two-passes", size,
                       [](auto& src, auto& dst) { convolve_twice<T>(src, std::vector<i32>(21, 1), dst); });
      add_blur_peer<T>(gaussian_10, "oiio-two-passes", size, [](auto& src, auto& dst) {
        std::vector<i32> taps(21);
        u32 diameter = 0;
        ZR_GaussianKernel(nullptr, 10, ZR_KernelFlag_OneRow, 1.0, &diameter, taps.data());
        convolve_twice<T>(src, taps, dst);
      });
      for (const Kernel* kernel : {&kernel_3, &kernel_5})
        add_kernel_peer<T>(*kernel, "oiio", size, [=](auto& src, const std::vector<i32>& taps, auto& dst) {
          OIIO::ImageBuf to = picture_of<T>(dst);
          OIIO::ImageBufAlgo::convolve(to, picture_of<T>(src), mask_of(kernel->size, kernel->size, taps), true,
                                       to.roi(), 1);
        });
    });
  return true;
}();

}  // namespace
}  // namespace bench
