// OpenColorIO's processor on packed RGBA pixels, from the published curves and primaries of the same spaces.
#include <OpenColorIO/OpenColorIO.h>
#include <ZR/colour_transform.h>

#include <algorithm>

#include "peer_check.h"

namespace OCIO = OCIO_NAMESPACE;

namespace bench {
namespace {

// A curve is ((v + offset) / (1 + offset)) ^ gamma above a straight foot; without an offset it is a power alone.
struct Curve {
  f64 gamma, offset;
};
constexpr Curve srgb = {2.4, 0.055}, adobe = {2.19921875, 0.0}, straight = {1.0, 0.0};

struct Pair {
  const char* name;
  PRISMA_ProfileCode from, to;
  Curve decode, encode;
  f64 matrix[9];  // of linear colours; row after row
};
constexpr Pair pairs[] = {
    {"srgb-to-p3",
     PRISMA_Profile_sRGB,
     PRISMA_Profile_DisplayP3,
     srgb,
     srgb,
     {0.8224621, 0.1775380, 0, 0.0331941, 0.9668058, 0, 0.0170827, 0.0723974, 0.9105199}},
    {"adobe-to-srgb",
     PRISMA_Profile_AdobeRGB,
     PRISMA_Profile_sRGB,
     adobe,
     srgb,
     {1.3983557, -0.3983557, 0, 0, 1, 0, 0, -0.0429290, 1.0429290}},
    {"srgb-to-linear", PRISMA_Profile_sRGB, PRISMA_Profile_LinearSRGB, srgb, straight, {1, 0, 0, 0, 1, 0, 0, 0, 1}}};

OCIO::TransformRcPtr curve_of(const Curve& curve, OCIO::TransformDirection direction) {
  if (curve.offset == 0.0) {
    const auto power = OCIO::ExponentTransform::Create();
    power->setValue({curve.gamma, curve.gamma, curve.gamma, 1.0});
    power->setDirection(direction);
    return power;
  }
  const auto power = OCIO::ExponentWithLinearTransform::Create();
  power->setGamma({curve.gamma, curve.gamma, curve.gamma, 1.0});
  power->setOffset({curve.offset, curve.offset, curve.offset, 0.0});
  power->setDirection(direction);
  return power;
}

OCIO::ConstCPUProcessorRcPtr processor_of(const Pair& pair, OCIO::BitDepth depth) {
  const auto matrix = OCIO::MatrixTransform::Create();
  f64 of_rgba[16] = {0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 1};
  for (size_t i = 0; i < 9; ++i) of_rgba[i / 3 * 4 + i % 3] = pair.matrix[i];
  matrix->setMatrix(of_rgba);
  const auto group = OCIO::GroupTransform::Create();
  group->appendTransform(curve_of(pair.decode, OCIO::TRANSFORM_DIR_FORWARD));
  group->appendTransform(matrix);
  group->appendTransform(curve_of(pair.encode, OCIO::TRANSFORM_DIR_INVERSE));
  return OCIO::Config::CreateRaw()->getProcessor(group)->getOptimizedCPUProcessor(depth, depth,
                                                                                  OCIO::OPTIMIZATION_DEFAULT);
}

// Ours into RGBA with a white of all bits, or back.
struct Rgba {
  template <class T>
  void operator()(ZR_WorldX<T>& world, bool back) const {
    constexpr bool wide = sizeof(zr::Channel<T>) == 2;
    for (i32 y = 0; y < world.height; ++y)
      for (i32 x = 0; x < world.width; ++x) {
        auto* const c = reinterpret_cast<zr::Channel<T>*>(world.At(x, y));
        std::rotate(c, c + (back ? 3 : 1), c + 4);
        if constexpr (wide)
          for (i32 i = 0; i < 4; ++i)
            c[i] = static_cast<u16>(back ? (c[i] * 32768u + 32767) / 65535 : (c[i] * 65535u + 16384) / 32768);
      }
  }
};

template <class T>
void convert(benchmark::State& state, Size size, const Pair& pair) {
  const auto depth = sizeof(T) == 4   ? OCIO::BIT_DEPTH_UINT8
                     : sizeof(T) == 8 ? OCIO::BIT_DEPTH_UINT16
                                      : OCIO::BIT_DEPTH_F32;
  const auto processor = processor_of(pair, depth);
  const TON_PRISMA_Transform t(TON_PRISMA_Profile(pair.from), TON_PRISMA_Profile(pair.to), 1,
                               TON_GetDefaultPRISMAOptions());
  constexpr ptrdiff_t channel = sizeof(zr::Channel<T>), pixel = sizeof(T);
  const auto ours = [&](ZR_WorldX<T>& src, ZR_WorldX<T>& dst) {
    ZR_PRISMAApplyTransform(t.Get(), &src, &dst, false, nullptr);
  };
  const auto theirs = [&](ZR_WorldX<T>& src, ZR_WorldX<T>& dst) {
    const auto image = [&](ZR_WorldX<T>& world) {
      return OCIO::PackedImageDesc(world.data, world.width, world.height, OCIO::CHANNEL_ORDERING_RGBA, depth, channel,
                                   pixel, world.row_bytes);
    };
    const OCIO::PackedImageDesc from = image(src);
    OCIO::PackedImageDesc to = image(dst);
    processor->apply(from, to);
  };
  time_peer<T>(state, size, size, ours, theirs, Rgba());
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  each_depth([&]<class T>() {
    for (const Pair& pair : pairs)
      add(std::string("colour/") + depth_name<T>() + "/" + pair.name + "/ocio", sizes[0],
          [&pair](benchmark::State& state, Size s) { convert<T>(state, s, pair); });
  });
  return true;
}();

}  // namespace
}  // namespace bench
