// Premultiplication, blends, copies behind, and walks over pixels.
#include "verify/depth_calls.h"
#include "verify/operation.h"

namespace zr::tool {
namespace {

constexpr i32 kForward = 1, kBack = 0;
// High enough for several bands of rows: they go to threads.
constexpr i32 kBandedHeight = 300;

template <class T>
const T kMattes[] = {convert_colour<T>(ZR_PixelFloat{1, 0, 0, 0}), convert_colour<T>(ZR_PixelFloat{1, 1, 1, 1}),
                     convert_colour<T>(ZR_PixelFloat{1, 0.5f, 0.25f, 0.875f})};

template <class T>
void premul_colour(Digest& digest, i32 forward, Content content) {
  Canvas<T> src(odd_width, 25, content, 4);
  const GX_LRect part{5, 3, 99, 20};
  for (const T& colour : kMattes<T>) {
    Canvas<T> dst(odd_width, 25, Content::untouched);
    digest.number(
        pick<T>(&ZR_PremulColor, &ZR_PremulColor16, &ZR_PremulColorFloat)(nullptr, &src, &colour, forward, &dst));
    if constexpr (std::is_same_v<T, ZR_Pixel16>)
      (forward != 0 ? dst->PremulColor(colour) : dst->UnmulColor(colour));
    else
      digest.number(
          pick<T>(&ZR_PremulColorRect, 0, &ZR_PremulColorRectFloat)(nullptr, &src, &colour, forward, &part, &dst));
    dst.digest(digest);
  }
}

using BlendFunc = i32 (*)(const ZR_ProgressInfo*, ZR_LayerDef*, ZR_LayerDef*, i32, ZR_LayerDef*);
template <class T>
void blend(Digest& digest, BlendFunc function, Content content) {
  Canvas<T> one(odd_width, 17, content, 5), other(odd_width, 17, content, 6), dst(odd_width, 17, Content::untouched);
  for (const i32 ratio : {0, 1, 0x5555, 0x8000, 0xc123, 0xffff, 0x10000}) {
    digest.number(function(nullptr, &one, &other, ratio, &dst));
    dst.digest(digest);
  }
}

using CompositeFunc = decltype(&ZR_CompositeRectDraft_Straight);
void composite_behind(Digest& digest, CompositeFunc function, Content content) {
  Canvas<ZR_Pixel8> src(odd_width, 21, content, 7);
  for (const u8 opacity : {u8{255}, u8{254}, u8{100}, u8{0}}) {
    Canvas<ZR_Pixel8> dst(odd_width + 9, 29, content, 8);
    const GX_LRect part{3, 2, 120, 17};
    for (const i32 field : {0, 1, 2}) {
      digest.number(function(nullptr, nullptr, opacity, &src, 5, 4, field, 0, &dst));
      digest.number(function(nullptr, &part, opacity, &src, 1, 1, field, 0, &dst));
    }
    dst.digest(digest);
  }
}

// Depends on place and pixel, so that a pixel left out or visited twice shows.
template <class T>
i32 weave(void* refcon, i32 x, i32 y, const void* in, void* out) {
  const T src = *static_cast<const T*>(in);
  T* const dst = static_cast<T*>(out);
  u32& calls = *static_cast<u32*>(refcon);
  ++calls;
  dst->alpha = static_cast<Channel<T>>(x & 63);
  dst->red = src.blue;
  dst->green = static_cast<Channel<T>>(dst->green + static_cast<Channel<T>>(1));
  dst->blue = static_cast<Channel<T>>(y & 63);
  return ZR_Err_None;
}

void byte_tables(Digest& digest) {
  Random random(9);
  u8 tables[4][256];
  for (auto& table : tables)
    for (u8& entry : table) entry = static_cast<u8>(random.below(256));
  Canvas<ZR_Pixel8> src(odd_width, 43, Content::mixed, 9), dst(odd_width, 43, Content::untouched);
  const GX_LRect part{3, 2, 100, 40};
  const auto walk = [&](ZR_LayerDef* from, const GX_LRect* area, int without) {
    const u8* used[4];
    for (int i = 0; i < 4; ++i) used[i] = i == without ? nullptr : tables[i];
    digest.number(ZR_IterateLUT(nullptr, 0, 0, from, area, used[0], used[1], used[2], used[3], &dst));
    dst.digest(digest);
  };
  walk(&src, nullptr, -1);
  walk(nullptr, &part, -1);
  for (int without = 0; without < 4; ++without) walk(&src, &part, without);
}

template <class T>
void matte_rows(Digest& digest, Content content) {
  Canvas<T> src(odd_width, 4, content, 10);
  std::vector<T> out(96);
  for (u32 kind = 0; kind < 4; ++kind)
    for (const i32 offset : {-40, -1, 0, 7, 95, 200}) {
      std::fill(out.begin(), out.end(), T{});
      digest.number(ZR_PrepTrackMatteUniv(90, src->Row(static_cast<i32>(kind)), offset, odd_width, kind,
                                          std::is_same_v<T, ZR_Pixel16>, out.data()));
      for (const T& pixel : out) digest.number(pixel.alpha);  // the other channels mean nothing
    }
}

}  // namespace

void add_row_operations(Operations& list) {
  add_all_with_hostile(list, "premultiply", []<class T>(Digest& digest, Content content) {
    Canvas<T> world(odd_width, kBandedHeight, content, 4);
    const GX_LRect part{3, 20, 90, 25};
    digest.number(ZR_Premul(nullptr, kForward, &world));
    digest.number(ZR_PremulRect(nullptr, kForward, &part, &world));
    world.digest(digest);
  });
  add_all_with_hostile(list, "unmultiply", []<class T>(Digest& digest, Content content) {
    Canvas<T> world(odd_width, kBandedHeight, content, 5), premul(odd_width, 30, premul_of(content), 6);
    digest.number(ZR_Premul(nullptr, kBack, &world));
    world.digest(digest);
    const GX_LRect part{3, 20, 90, 25};
    digest.number(ZR_PremulRect(nullptr, kBack, &part, &premul));
    premul.digest(digest);
    digest.number(ZR_Premul(nullptr, kBack, &premul));
    premul.digest(digest);
  });
  add_with_hostile<ZR_Pixel8, ZR_Pixel16>(list, "premultiply-world", []<class T>(Digest& digest, Content content) {
    Canvas<T> world(odd_width, 25, content, 4);
    world->Premultiply();
    world.digest(digest);
    world->Unmultiply();
    world.digest(digest);
  });
  add_all_with_hostile(list, "premultiply-colour",
                       []<class T>(Digest& digest, Content content) { premul_colour<T>(digest, kForward, content); });
  add_all_with_hostile(list, "unmultiply-colour",
                       []<class T>(Digest& digest, Content content) { premul_colour<T>(digest, kBack, content); });
  add_all_with_hostile(list, "blend",
                       []<class T>(Digest& digest, Content content) { blend<T>(digest, &ZR_Blend, content); });
  add_all_with_hostile(list, "blend-premul", []<class T>(Digest& digest, Content content) {
    blend<T>(digest, &ZR_Blend_Premul, premul_of(content));
  });
  add_for<ZR_Pixel8>(list, "composite-rect", []<class>(Digest& digest) {
    composite_behind(digest, &ZR_CompositeRectDraft_Straight, Content::mixed);
    composite_behind(digest, &ZR_CompositeRectBest_Straight, Content::mixed);
  });
  add_for<ZR_Pixel8>(list, "composite-rect-premul", []<class>(Digest& digest) {
    composite_behind(digest, &ZR_CompositeRectDraft_Premul, Content::premul);
    composite_behind(digest, &ZR_CompositeRectBest_Premul, Content::premul);
  });
  add_all(list, "iterate", []<class T>(Digest& digest) {
    Canvas<T> src(odd_width, 25, Content::mixed, 7), dst(odd_width, 25, Content::noise, 8);
    const GX_LRect part{-3, 4, 77, 19};
    u32 calls = 0;
    digest.number(ZR_Iterate(nullptr, 0, 0, &src, nullptr, &calls, &weave<T>, &dst));
    digest.number(ZR_Iterate(nullptr, 0, 0, nullptr, &part, &calls, &weave<T>, &dst));
    digest.number(calls);
    dst.digest(digest);
  });
  add_all(list, "iterate-origin", []<class T>(Digest& digest) {
    Canvas<T> src(odd_width, 25, Content::mixed, 7), dst(odd_width, 25, Content::noise, 8);
    u32 calls = 0;
    for (const GX_LPoint origin : {GX_LPoint{0, 0}, GX_LPoint{7, 3}, GX_LPoint{-9, -5}})
      digest.number(ZR_IterateOrigin(nullptr, 0, 0, &src, nullptr, &origin, &calls, &weave<T>, &dst));
    digest.number(calls);
    dst.digest(digest);
  });
  add_for<ZR_Pixel8>(list, "iterate-lut", []<class>(Digest& digest) { byte_tables(digest); });
  add_with_hostile<ZR_Pixel8, ZR_Pixel16>(
      list, "matte-rows", []<class T>(Digest& digest, Content content) { matte_rows<T>(digest, content); });
}

}  // namespace zr::tool
