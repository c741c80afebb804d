// Colour transforms, conversion between depths with linear floats, and blending in linear light.
#include <ZR/colour_transform.h>
#include <ZR/linear_tables.h>
#include <ZR/transfer_mode.h>

#include "divided.h"
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

template <class T>
void transform(benchmark::State& state, Size size, const Pair& pair, bool copy_alpha) {
  const auto src = make_world<T>(size, Layer::opaque, 1);
  const auto dst = make_world<T>(size, Layer::opaque, 2);
  const TON_PRISMA_Transform t(TON_PRISMA_Profile(pair.from), TON_PRISMA_Profile(pair.to), 1,
                               TON_GetDefaultPRISMAOptions());
  ZR_PRISMAApplyTransform(t.Get(), src.get(), dst.get(), copy_alpha, nullptr);  // makes the tables
  for (auto _ : state) ZR_PRISMAApplyTransform(t.Get(), src.get(), dst.get(), copy_alpha, nullptr);
  count_bytes<T>(state, size, 2);
}

template <class From, class To>
void depth_convert(benchmark::State& state, Size size) {
  const auto src = make_world<From>(size, Layer::opaque, 1);
  const auto dst = make_world<To>(size, Layer::opaque, 2);
  const auto tables = ZR_MakeLinearizationTables({});
  for (auto _ : state) ZR_DepthConvertWorld(tables->to_linear, src.get(), dst.get());
  state.SetBytesProcessed(static_cast<i64>(state.iterations()) * size.width * size.height *
                          static_cast<i64>(sizeof(From) + sizeof(To)));
}

template <class T>
void linear_in_front(benchmark::State& state, Size size) {
  const auto src = make_world<T>(size, Layer::translucent, 1);
  const auto dst = make_world<T>(size, Layer::opaque, 2);
  const auto tables = ZR_MakeLinearizationTables({});
  const GX_LRect all{0, 0, size.width, size.height};
  const ZR_CompositeModePlus mode(XferInFront, 1.0f, tables.get(), false, 0);
  for (auto _ : state)
    if (transfer_rect(nullptr, 0, 0, 0, &all, src.get(), &mode, tables.get(), nullptr, 0, 0, dst.get()) != 0)
      state.SkipWithError("ZR_TransferRect failed");
  count_bytes<T>(state, size, 3);
}

template <class T>
std::string colour_name(const char* work, const Pair& pair) {
  return std::string(work) + "/" + depth_name<T>() + "/" + pair.name;
}

const bool registered = [] {
  const Size size = sizes[0];
  each_depth([&]<class T>() {
    for (const Pair& pair : pairs) {
      add(colour_name<T>("colour", pair), size,
          [&pair](benchmark::State& state, Size s) { transform<T>(state, s, pair, false); });
      if (&pair != pairs) continue;
      add(colour_name<T>("colour-with-alpha", pair), size,
          [&pair](benchmark::State& state, Size s) { transform<T>(state, s, pair, true); });
    }
    add(std::string("linear-in-front/") + depth_name<T>() + "/translucent-over-opaque", size,
        [](benchmark::State& state, Size s) { linear_in_front<T>(state, s); });
    each_depth([&]<class To>() {
      if constexpr (!std::is_same_v<T, To>)
        add(std::string("depth-convert/") + depth_name<T>() + "-to-" + depth_name<To>(), size,
            [](benchmark::State& state, Size s) { depth_convert<T, To>(state, s); });
    });
  });
  return true;
}();

}  // namespace
}  // namespace bench
