// OpenImageIO on the same pictures, on one thread: warps and resizes that weight no channel.
#include <OpenImageIO/imagebuf.h>
#include <OpenImageIO/imagebufalgo.h>

#include <array>

#include "peer_check.h"

namespace bench {
namespace {

template <class T>
OIIO::ImageBuf picture_of(ZR_WorldX<T>& world) {
  const OIIO::TypeDesc type(sizeof(T) == 4   ? OIIO::TypeDesc::UINT8
                            : sizeof(T) == 8 ? OIIO::TypeDesc::UINT16
                                             : OIIO::TypeDesc::FLOAT);
  return {OIIO::ImageSpec(world.width, world.height, 4, type), world.data};
}

// Regions are the whole destinations, so that nothing is allocated.
template <class T>
void add_warp(const Placement& work, Size size, const char* filter) {
  add_placed_peer<T>(work, "oiio-warp-only", size, [=](auto& src, auto& dst, const GX_Matrix3& m) {
    OIIO::ImageBuf to = picture_of<T>(dst);
    std::array<std::array<float, 3>, 3> matrix;  // row vectors
    for (size_t r = 0; r < 3; ++r)
      for (size_t c = 0; c < 3; ++c) matrix[c][r] = static_cast<float>(m.m[r][c]);
    OIIO::ImageBufAlgo::warp(to, picture_of<T>(src), matrix, filter, 0.0f, false, OIIO::ImageBuf::WrapBlack, to.roi(),
                             1);
  });
}

template <class T>
void add_filtered(const Resize& work, Size size, const char* filter) {
  add_resize_peer<T>(work, "oiio-resize", size, [=](auto& src, auto& dst) {
    OIIO::ImageBuf to = picture_of<T>(dst);
    OIIO::ImageBufAlgo::resize(to, picture_of<T>(src), filter, 0.0f, to.roi(), 1);
  });
}

template <class T>
void add_sampled(const Resize& work, Size size, bool interpolate) {
  add_resize_peer<T>(work, "oiio-resample", size, [=](auto& src, auto& dst) {
    OIIO::ImageBuf to = picture_of<T>(dst);
    OIIO::ImageBufAlgo::resample(to, picture_of<T>(src), interpolate, to.roi(), 1);
  });
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  OIIO::attribute("threads", 1);
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      add_warp<T>(turned_bilinear, size, "triangle");
      add_warp<T>(turned_bicubic, size, "catmull-rom");
      add_warp<T>(moved_half_pixel, size, "triangle");
      add_filtered<T>(area_third, size, "box");
      add_filtered<T>(area_half, size, "box");
      add_filtered<T>(bilinear_larger, size, "triangle");
      add_sampled<T>(bilinear_larger, size, true);
      add_sampled<T>(nearest_half, size, false);
      add_sampled<T>(nearest_double, size, false);
    });
  return true;
}();

}  // namespace
}  // namespace bench
