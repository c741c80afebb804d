// What viewers show, alpha guesses, mattes, planes, outlines, and measures pixel by pixel.
#include <ZR/callback_block.h>
#include <ZR/viewer_blit.h>

#include "divided.h"
#include "workloads.h"

namespace bench {
namespace {

struct Style {
  const char* name;
  ZR_SpecialCaseBlitStyle style;
  bool reverse;
};
constexpr Style styles[] = {{"viewer-blit-checker", ZR_BlitStyle_Checker, false},
                            {"viewer-blit-checker-bgra", ZR_BlitStyle_Checker, true},
                            {"viewer-blit-tint", ZR_BlitStyle_Tint, false},
                            {"viewer-blit-flat", ZR_BlitStyle_Flat, false}};

template <class T>
void view(benchmark::State& state, Size size, Layer layer, const Style& style) {
  const auto src = make_world<T>(size, layer);
  const auto dst = make_world<ZR_Pixel8>(size, Layer::opaque);
  const ZR_PixelFloat dark = {1, 0.4f, 0.4f, 0.4f}, light = {1, 0.6f, 0.6f, 0.6f};
  for (auto _ : state)
    ZR_SpecialCasePixelBlit(src.get(), {0, 0}, style.style, style.reverse, {0, 0}, dark, light,
                            {0, 0, size.width, size.height}, dst.get());
  state.SetBytesProcessed(static_cast<i64>(state.iterations()) * size.width * size.height *
                          static_cast<i64>(sizeof(T) + sizeof(ZR_Pixel8)));
}

void guess(benchmark::State& state, Size size, Layer layer) {
  const auto src = make_world<ZR_Pixel8>(size, layer);
  i32 code = 0;
  ZR_Pixel8 matte;
  for (auto _ : state) ZR_GuessAlpha(nullptr, src.get(), nullptr, &code, &matte);
  count_bytes<ZR_Pixel8>(state, size, 1);
}

void matte_rows(benchmark::State& state, Size size, Layer layer, decltype(&ZR_BlackMatte) row) {
  const auto src = make_world<ZR_Pixel8>(size, layer), dst = make_world<ZR_Pixel8>(size, Layer::opaque);
  for (auto _ : state)
    for (i32 y = 0; y < size.height; ++y) row(nullptr, size.width, src->Row(y), dst->Row(y));
  count_bytes<ZR_Pixel8>(state, size, 2);
}

void matte_colour(benchmark::State& state, Size size, Layer layer) {
  const auto world = make_world<ZR_Pixel8>(size, layer);
  const ZR_Pixel8 colour = {255, 200, 31, 128};
  i32 direction = 0;
  for (auto _ : state) ZR_MatteBlackToMatteColorARGB(world.get(), &colour, direction ^= 1);
  count_bytes<ZR_Pixel8>(state, size, 2);
}

void extract_planes(benchmark::State& state, Size size, u32 planes) {
  void* block[ZR_CallbackEntryCount];
  ZR_GetCallbackBlock(ZR_Quality_Best, 0, block);
  const auto dispose = reinterpret_cast<ZR_HandleDisposeFunc>(block[ZR_Entry_handle_dispose]);
  const auto src = make_world<ZR_Pixel8>(size, Layer::translucent);
  for (auto _ : state) {
    void** handle = nullptr;
    i32 row_bytes = 0;
    if (ZR_ExtractPlanes(nullptr, src.get(), planes, &handle, &row_bytes) != 0) {
      state.SkipWithError("no memory");
      break;
    }
    dispose(handle);
  }
  count_bytes<ZR_Pixel8>(state, size, 1);
}

void insert_planes(benchmark::State& state, Size size, u32 planes) {
  const auto dst = make_world<ZR_Pixel8>(size, Layer::translucent);
  const i32 row_bytes = size.width * 4;
  const std::vector<u8> packed(static_cast<size_t>(row_bytes) * static_cast<size_t>(size.height), 99);
  for (auto _ : state) ZR_InsertPlanes(nullptr, packed.data(), row_bytes, planes, dst.get());
  count_bytes<ZR_Pixel8>(state, size, 2);
}

template <class T>
void outline(benchmark::State& state, Size size, Layer layer) {
  const auto src = make_world<T>(size, layer);
  for (auto _ : state) {
    ZR_Wireframe frame;
    if (ZR_GenerateWireframe(nullptr, src.get(), nullptr, 1, 0, 0, &frame) != 0) state.SkipWithError("no memory");
    ZR_DisposeWireframe(&frame);
  }
  count_bytes<T>(state, size, 1);
}

void to_hls(benchmark::State& state, Size size) {
  const auto src = make_world<ZR_Pixel8>(size, Layer::opaque);
  for (auto _ : state)
    each_line(size.height, [&](i32 y) {
      i32 hls[3];
      for (i32 x = 0; x < size.width; ++x) {
        ZR_RGBtoHLS_Straight(nullptr, src->At(x, y), hls);
        benchmark::DoNotOptimize(hls);
      }
    });
  count_bytes<ZR_Pixel8>(state, size, 1);
}

const bool registered = [] {
  for (const Size size : sizes) {
    each_depth([&]<class T>() {
      for (const Layer layer : layers) {
        const std::string detail = std::string("/") + depth_name<T>() + "/" + name_of(layer);
        for (const Style& style : styles)
          add(style.name + detail, size,
              [layer, &style](benchmark::State& state, Size s) { view<T>(state, s, layer, style); });
      }
      add(std::string("outline/") + depth_name<T>() + "/cut-out", size,
          [](benchmark::State& state, Size s) { outline<T>(state, s, Layer::cut_out); });
    });
    for (const Layer layer : layers) {
      const std::string detail = std::string("/8/") + name_of(layer);
      add("guess-alpha" + detail, size, [layer](benchmark::State& state, Size s) { guess(state, s, layer); });
      add("black-matte" + detail, size,
          [layer](benchmark::State& state, Size s) { matte_rows(state, s, layer, &ZR_BlackMatte); });
      add("black-matte-off" + detail, size,
          [layer](benchmark::State& state, Size s) { matte_rows(state, s, layer, &ZR_DeBlackMatte); });
      add("matte-colour" + detail, size, [layer](benchmark::State& state, Size s) { matte_colour(state, s, layer); });
    }
    for (const u32 planes : {1u, 14u, 15u}) {
      const std::string detail = planes == 1 ? "/8/alpha" : planes == 14 ? "/8/colours" : "/8/all";
      add("extract-planes" + detail, size,
          [planes](benchmark::State& state, Size s) { extract_planes(state, s, planes); });
      add("insert-planes" + detail, size,
          [planes](benchmark::State& state, Size s) { insert_planes(state, s, planes); });
    }
    add("rgb-to-hls/8/opaque", size, to_hls);
  }
  return true;
}();

}  // namespace
}  // namespace bench
