// Plain Little CMS on the same pictures, in the packings it reads fastest, with its default options.
#include <ZR/colour_transform.h>
#include <lcms2.h>

#include <vector>

#include "workloads.h"

namespace bench {
namespace {

struct Pair {
  const char* name;
  PRISMA_ProfileCode from, to;
};
constexpr Pair pairs[] = {{"srgb-to-p3", PRISMA_Profile_sRGB, PRISMA_Profile_DisplayP3},
                          {"adobe-to-srgb", PRISMA_Profile_AdobeRGB, PRISMA_Profile_sRGB},
                          {"srgb-to-linear", PRISMA_Profile_sRGB, PRISMA_Profile_LinearSRGB}};

cmsHPROFILE open(PRISMA_ProfileCode code) {
  const TON_PRISMA_Profile profile(code);
  size_t size = 0;
  const void* const data = profile.GetData(&size);
  return cmsOpenProfileFromMem(data, static_cast<u32>(size));
}

// White is 65535 in lcms's own 16-bit packing.
template <class T>
void plain(benchmark::State& state, Size size, const Pair& pair, u32 format, size_t channels) {
  using C = zr::Channel<T>;
  const auto world = make_world<T>(size, Layer::opaque, 1);
  const size_t pixels = static_cast<size_t>(size.width) * static_cast<size_t>(size.height);
  std::vector<C> src(pixels * channels), dst(pixels * channels);
  const auto* const from = static_cast<const C*>(world->data);
  for (size_t i = 0; i < pixels; ++i)
    for (size_t c = 0; c < 3; ++c) {
      const C v = from[i * 4 + 1 + c];
      src[i * channels + c] = sizeof(C) == 2 ? static_cast<C>(static_cast<f32>(v) * 65535.0f / 32768.0f) : v;
    }
  cmsHPROFILE const a = open(pair.from), b = open(pair.to);
  cmsHTRANSFORM const transform = cmsCreateTransform(a, format, b, format, INTENT_RELATIVE_COLORIMETRIC, 0);
  for (auto _ : state) cmsDoTransform(transform, src.data(), dst.data(), static_cast<u32>(pixels));
  cmsDeleteTransform(transform);
  cmsCloseProfile(a);
  cmsCloseProfile(b);
  state.SetBytesProcessed(static_cast<i64>(state.iterations()) * static_cast<i64>(pixels * channels * sizeof(C) * 2));
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  each_depth([&]<class T>() {
    constexpr u32 bytes = sizeof(zr::Channel<T>), real = bytes == 4 ? FLOAT_SH(1) : 0;
    const struct {
      const char* name;
      u32 format;
      size_t channels;
    } packings[] = {{"lcms-rgb", real | COLORSPACE_SH(PT_RGB) | CHANNELS_SH(3) | BYTES_SH(bytes), 3},
                    {"lcms-rgba", real | COLORSPACE_SH(PT_RGB) | EXTRA_SH(1) | CHANNELS_SH(3) | BYTES_SH(bytes), 4}};
    for (const Pair& pair : pairs)
      for (const auto& packing : packings)
        add(std::string("colour/") + depth_name<T>() + "/" + pair.name + "/" + packing.name, sizes[0],
            [=, &pair](benchmark::State& state, Size s) {
              plain<T>(state, s, pair, packing.format, packing.channels);
            });
  });
  return true;
}();

}  // namespace
}  // namespace bench
