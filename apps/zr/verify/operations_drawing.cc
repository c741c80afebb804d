// Pixel measures, alpha guesses and mattes, planes, drawing, and what a viewer shows.
#include <ZR/callback_block.h>
#include <ZR/viewer_blit.h>

#include <vector>

#include "verify/depth_calls.h"
#include "verify/operation.h"

namespace zr::tool {
namespace {

template <class T>
struct MeasureFuncs {
  i32 (*to_words[2])(void*, const T*, i32*);
  i32 (*from_words[2])(void*, const i32*, T*);
  i32 (*measures[4])(void*, const T*, std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, f32, i32>*);
};
constexpr MeasureFuncs<ZR_Pixel8> kMeasures8 = {
    {ZR_RGBtoHLS_Straight, ZR_RGBtoYIQ_Straight},
    {ZR_HLStoRGB_Straight, ZR_YIQtoRGB_Straight},
    {ZR_Luminance_Straight, ZR_Hue_Straight, ZR_Lightness_Straight, ZR_Saturation_Straight}};
constexpr MeasureFuncs<ZR_Pixel8> kMeasuresPremul = {
    {ZR_RGBtoHLS_Premul, ZR_RGBtoYIQ_Premul},
    {ZR_HLStoRGB_Premul, ZR_YIQtoRGB_Premul},
    {ZR_Luminance_Premul, ZR_Hue_Premul, ZR_Lightness_Premul, ZR_Saturation_Premul}};
constexpr MeasureFuncs<ZR_Pixel16> kMeasures16 = {
    {ZR_RGBtoHLS_Straight16, ZR_RGBtoYIQ_Straight16},
    {ZR_HLStoRGB_Straight16, ZR_YIQtoRGB_Straight16},
    {ZR_Luminance_Straight16, ZR_Hue_Straight16, ZR_Lightness_Straight16, ZR_Saturation_Straight16}};
constexpr MeasureFuncs<ZR_PixelFloat> kMeasuresFloat = {
    {ZR_RGBtoHLS_StraightFloat, ZR_RGBtoYIQ_StraightFloat},
    {ZR_HLStoRGB_StraightFloat, ZR_YIQtoRGB_StraightFloat},
    {ZR_Luminance_StraightFloat, ZR_Hue_StraightFloat, ZR_Lightness_StraightFloat, ZR_Saturation_StraightFloat}};

template <class T>
void measure(Digest& digest, const MeasureFuncs<T>& functions, Content content) {
  Canvas<T> src(odd_width, 9, content, 21), back(odd_width, 9, content, 22);
  for (i32 y = 0; y < 9; ++y)
    for (i32 x = 0; x < odd_width; ++x) {
      const T& pixel = *src->At(x, y);
      for (size_t kind = 0; kind < 2; ++kind) {
        i32 words[3];
        digest.number(functions.to_words[kind](nullptr, &pixel, words));
        for (const i32 word : words) digest.number(word);
        functions.from_words[kind](nullptr, words, back->At(x, y));
      }
      for (const auto measured : functions.measures) {
        std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, f32, i32> number;
        measured(nullptr, &pixel, &number);
        if constexpr (std::is_same_v<T, ZR_PixelFloat>)
          digest.number(number == number ? std::bit_cast<u32>(number) : 0x7fc00000u);
        else
          digest.number(number);
      }
    }
  back.digest(digest);
}

void guesses(Digest& digest) {
  for (const Content content : {Content::mixed, Content::opaque, Content::noise, Content::premul, Content::untouched})
    for (const i32 height : {1, 25}) {
      Canvas<ZR_Pixel8> world(odd_width, height, content, 23);
      i32 code = -1;
      ZR_Pixel8 matte{};
      digest.number(ZR_GuessAlpha(nullptr, &world, nullptr, &code, &matte));
      digest.number(code);
      digest.number(std::bit_cast<u32>(matte));
    }
}

void matte_family(Digest& digest) {
  for (i32 (*const row)(void*, i32, ZR_Pixel8*) :
       {ZR_BlackMatteARGB, ZR_DeBlackMatteARGB, ZR_BlackMatteBGRA, ZR_DeBlackMatteBGRA}) {
    Canvas<ZR_Pixel8> world(odd_width, 9, Content::mixed, 24);
    for (i32 y = 0; y < 9; ++y) digest.number(row(nullptr, odd_width, world->Row(y)));
    world.digest(digest);
  }
  Canvas<ZR_Pixel8> src(odd_width, 9, Content::mixed, 25), dst(odd_width, 9, Content::untouched);
  for (auto* const row : {ZR_BlackMatte, ZR_DeBlackMatte}) {
    for (i32 y = 0; y < 9; ++y) digest.number(row(nullptr, odd_width, src->Row(y), dst->Row(y)));
    dst.digest(digest);
  }
  const ZR_Pixel8 colour = {255, 200, 31, 128};
  for (auto* const move : {ZR_MatteBlackToMatteColorARGB, ZR_MatteBlackToMatteColorBGRA})
    for (const i32 direction : {1, 1, 0}) {
      digest.number(move(&src, &colour, direction));
      src.digest(digest);
    }
}

void planes(Digest& digest) {
  void* block[ZR_CallbackEntryCount];
  digest.number(ZR_GetCallbackBlock(ZR_Quality_Best, 0, block));
  const auto dispose = reinterpret_cast<ZR_HandleDisposeFunc>(block[ZR_Entry_handle_dispose]);
  Canvas<ZR_Pixel8> src(odd_width, 5, Content::noise, 26), dst(odd_width, 5, Content::untouched);
  for (u32 mask = 0; mask < 16; ++mask) {
    void** handle = nullptr;
    i32 row_bytes = 0;
    digest.number(ZR_ExtractPlanes(nullptr, &src, mask, &handle, &row_bytes));
    if (handle == nullptr) continue;
    digest.number(row_bytes);
    const u8* const packed = static_cast<const u8*>(*handle);
    for (i32 i = 0; i < 5 * row_bytes; ++i) digest.number(packed[i]);
    digest.number(ZR_InsertPlanes(nullptr, packed, row_bytes, mask, &dst));
    dispose(handle);
    dst.digest(digest);
  }
}

template <class T>
void lines_and_outlines(Digest& digest, Content content) {
  Canvas<T> world(odd_width, 43, content, 27);
  for (const i32 step : {1, 3}) {
    ZR_Wireframe frame{};
    digest.number(
        ZR_GenerateWireframe(nullptr, &world, nullptr, step, step == 1 ? 0 : ZR_Wireframe_AnyAlpha, 0, &frame));
    i32 count = 0;
    for (i32 loop = 0; const ZR_WireframePoint* const points = ZR_GetWireframeLoop(&frame, loop, &count); ++loop)
      for (i32 i = 0; i < count; ++i) {
        digest.number(points[i].x);
        digest.number(points[i].y);
      }
    ZR_DisposeWireframe(&frame);
  }
  Random random(28);
  for (i32 i = 0; i < 40; ++i) {
    const auto coordinate = [&] { return static_cast<f64>(random.below(20000)) / 128.0 - 20; };
    const f64 from[2] = {coordinate(), coordinate()}, to[2] = {coordinate(), coordinate()};
    const ZR_PixelFloat colour = {1, static_cast<f32>(i) / 64, 0.5f, 1.25f};
    digest.number(ZR_DrawLine(from, to, &colour, &world));
  }
  world.digest(digest);
}

void spots(Digest& digest) {
  Random random(29);
  std::vector<u32> weights(15 * 15);
  for (u32& weight : weights) weight = random.below(256);
  Canvas<ZR_Pixel8> world(odd_width, 25, Content::noise, 30);
  for (const u32 flags : {0u, 1u, 33u})
    for (i32 i = -6; i < 30; ++i)
      digest.number(ZR_PaintSpot(nullptr, i * 5, i, flags, 1 + 2 * (i & 7), weights.data(),
                                 {255, static_cast<u8>(i * 8), 200, 7}, &world));
  world.digest(digest);
}

template <class T>
void viewer(Digest& digest, Content content) {
  Canvas<T> src(odd_width, 43, content, 31);
  Canvas<ZR_Pixel8> dst(odd_width, 43, Content::untouched);
  const ZR_PixelFloat grey = {0.5f, 0.4f, 0.4f, 0.4f}, pale = {0.75f, 0.9f, 0.7f, 0.5f}, black = {1, 0, 0, 0};
  for (const ZR_SpecialCaseBlitStyle style : {ZR_BlitStyle_Flat, ZR_BlitStyle_Checker, ZR_BlitStyle_Tint})
    for (const bool reverse : {false, true})
      for (const ZR_PixelFloat& first : {grey, black}) {
        ZR_SpecialCasePixelBlit(&src, {3, 1}, style, reverse, {-5, 9}, first, pale, {2, 0, 130, 41}, &dst);
        dst.digest(digest);
      }
}

}  // namespace

void add_drawing_operations(Operations& list) {
  add_all_with_hostile(list, "measures", []<class T>(Digest& digest, Content content) {
    measure<T>(digest, pick<T>(kMeasures8, kMeasures16, kMeasuresFloat), content);
  });
  add_for<ZR_Pixel8>(list, "measures-premul",
                     []<class>(Digest& digest) { measure(digest, kMeasuresPremul, Content::premul); });
  add_for<ZR_Pixel8>(list, "guess-alpha", []<class>(Digest& digest) { guesses(digest); });
  add_for<ZR_Pixel8>(list, "black-mattes", []<class>(Digest& digest) { matte_family(digest); });
  add_for<ZR_Pixel8>(list, "planes", []<class>(Digest& digest) { planes(digest); });
  add_for<ZR_Pixel8>(list, "paint-spot", []<class>(Digest& digest) { spots(digest); });
  add_all_with_hostile(list, "outlines-and-lines",
                       []<class T>(Digest& digest, Content content) { lines_and_outlines<T>(digest, content); });
  add_all_with_hostile(list, "viewer-blit",
                       []<class T>(Digest& digest, Content content) { viewer<T>(digest, content); });
}

}  // namespace zr::tool
