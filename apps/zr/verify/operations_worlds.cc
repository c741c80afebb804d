// Fill, clear, copies and conversions of whole worlds.
#include <ZR/linear_tables.h>

#include "verify/depth_calls.h"
#include "verify/operation.h"

namespace zr::tool {
namespace {

// Short and long, at every place within a vector, and some that reach outside.
constexpr GX_LRect kRects[] = {{0, 0, 1, 1},   {1, 1, 4, 2},    {3, 2, 11, 4},      {5, 4, 22, 6},    {7, 6, 71, 8},
                               {2, 8, 131, 9}, {-5, 9, 40, 11}, {100, 10, 150, 12}, {64, 12, 65, 30}, {9, 13, 9, 15}};

template <class T>
T half_orange() {
  return convert_colour<T>(ZR_PixelFloat{0.5f, 0.9f, 0.4f, 0.1f});
}

// A picture whose rows begin `shift` channels behind a multiple of 16 bytes, or of the size of a pixel.
template <class T>
class Shifted {
 public:
  Shifted(Canvas<T>& picture, size_t shift)
      : memory_(static_cast<size_t>(stride(picture)) * static_cast<size_t>(picture.height()) * 4 + 32),
        world_(start(shift), picture.width(), picture.height(), stride(picture) * static_cast<i32>(sizeof(T))) {
    world_.CopyWorld(&picture);
  }
  ZR_WorldX<T>* operator&() { return &world_; }

 private:
  static i32 stride(Canvas<T>& picture) { return picture.width() + 2; }
  void* start(size_t shift) {
    const auto address = reinterpret_cast<uintptr_t>(memory_.data());
    return memory_.data() + (16 - address % 16) % 16 / sizeof(Channel<T>) + shift;
  }
  std::vector<Channel<T>> memory_;
  ZR_WorldX<T> world_;
};

struct Conversion {
  bool dither = false;
  std::vector<size_t> shifts = {0, 1};  // of the source rows
  bool vector_rule = false;
};
template <class From, class To>
void add_conversion(Operations& list, const char* name, const Conversion& how) {
  const size_t before = list.size();
  add_with_hostile<From>(list, name, [how]<class>(Digest& digest, Content content) {
    Canvas<From> picture(odd_width, 25, content, 11);
    for (const size_t shift : how.shifts) {
      Shifted<From> src(picture, shift);
      Canvas<To> dst(odd_width, 25, Content::untouched);
      dst->CopyRectPossiblyDifferentBitdepth(&src, picture.all(), how.dither, 0, 0, nullptr);
      for (const GX_LRect& rect : kRects)  // most of these begin where no vector does
        dst->CopyRectPossiblyDifferentBitdepth(&src, rect, how.dither, rect.top, rect.left / 5, nullptr);
      for (const i32 field : {0, 1, 2})
        if (how.dither) dst->CopyRectPossiblyDifferentBitdepthWithField(&src, kRects[4], field);
      dst.digest(digest);
    }
  });
  for (size_t i = before; i < list.size(); ++i) list[i].vector_rule = how.vector_rule;
}

template <class From, class To>
void add_linear_conversion(Operations& list, const char* name) {
  add_with_hostile<From>(list, name, []<class>(Digest& digest, Content content) {
    Canvas<From> src(odd_width, 43, content, 12);
    Canvas<To> dst(odd_width, 43, Content::untouched);
    ZR_DepthConvertWorld(square_tables().to_linear, &src, &dst);
    dst.digest(digest);
  });
}

template <class To>
void add_conversions_to(Operations& list, const char* plain, const char* linear) {
  // Float rows to 8 bits that begin at a multiple of 16 have a rule of their own, see below.
  if constexpr (std::is_same_v<To, ZR_Pixel8>)
    add_conversion<ZR_PixelFloat, To>(list, plain, {.shifts = {1}});
  else
    add_conversion<ZR_PixelFloat, To>(list, plain, {});
  add_conversion<ZR_Pixel8, To>(list, plain, {});
  add_conversion<ZR_Pixel16, To>(list, plain, {});
  add_linear_conversion<ZR_Pixel8, To>(list, linear);
  add_linear_conversion<ZR_Pixel16, To>(list, linear);
  add_linear_conversion<ZR_PixelFloat, To>(list, linear);
}

}  // namespace

void add_world_operations(Operations& list) {
  add_all(list, "fill", []<class T>(Digest& digest) {
    Canvas<T> world(odd_width, 25, Content::mixed);
    const T colour = half_orange<T>();
    for (const GX_LRect& rect : kRects)
      digest.number(pick<T>(&ZR_Fill, &ZR_Fill16, &ZR_FillFloat)(nullptr, &colour, &rect, &world));
    world->Fill(ZR_PixelFloat{1.0f, 0.25f, 0.75f, 2.0f}, &kRects[3]);
    world.digest(digest);
    digest.number(pick<T>(&ZR_Fill, &ZR_Fill16, &ZR_FillFloat)(nullptr, &colour, nullptr, &world));
    world.digest(digest);
  });
  add_all(list, "clear", []<class T>(Digest& digest) {
    Canvas<T> world(odd_width, 25, Content::noise);
    for (const GX_LRect& rect : kRects) world->Clear(&rect);
    world.digest(digest);
    world->Clear(nullptr);
    world.digest(digest);
  });
  add_all(list, "clear-outside", []<class T>(Digest& digest) {
    for (const GX_LRect& rect : kRects) {
      Canvas<T> world(odd_width, 25, Content::noise);
      world->ClearExceptRect(rect);
      world.digest(digest);
    }
  });
  add_all(list, "clear-alpha-outside", []<class T>(Digest& digest) {
    for (const GX_LRect& rect : kRects) {
      Canvas<T> world(odd_width, 25, Content::noise);
      digest.number(ZR_ClearAlphaExceptRect(nullptr, &rect, &world));
      world.digest(digest);
    }
  });
  add_all(list, "fill-alpha", []<class T>(Digest& digest) {
    Canvas<T> world(odd_width, 9, Content::mixed);
    world->FillAlpha();
    world.digest(digest);
  });
  add_all_with_hostile(list, "invert-alpha", []<class T>(Digest& digest, Content content) {
    Canvas<T> world(odd_width, 25, content);
    world->InvertAlpha();
    world.digest(digest);
  });
  add_all(list, "stores-in-bands", []<class T>(Digest& digest) {  // large enough for several bands
    using Other = std::conditional_t<std::is_same_v<T, ZR_Pixel16>, ZR_Pixel8, ZR_Pixel16>;
    Canvas<T> world(701, 400, Content::mixed, 13);
    Canvas<Other> converted(701, 400, Content::untouched);
    world->InvertAlpha();
    converted->CopyRectPossiblyDifferentBitdepth(&world, world.all(), false, 0, 0, nullptr);
    world.digest(digest);
    converted.digest(digest);
    const T colour = half_orange<T>();
    const GX_LRect part{3, 5, 690, 390};
    digest.number(pick<T>(&ZR_Fill, &ZR_Fill16, &ZR_FillFloat)(nullptr, &colour, &part, &world));
    world->FillAlpha();
    world.digest(digest);
    world->Clear(&part);
    world.digest(digest);
  });
  add_all(list, "copy", []<class T>(Digest& digest) {
    Canvas<T> src(odd_width, 25, Content::mixed, 2), dst(odd_width, 25, Content::noise, 3);
    for (const GX_LRect& rect : kRects) dst->CopyRect(&src, rect, rect.top, rect.left);
    for (const GX_LRect& rect : kRects) dst->CopyRect(&dst, rect, rect.left + 3, rect.top + 1);
    dst.digest(digest);
    dst->CopyWorld(&src);
    dst.digest(digest);
  });
  add_conversions_to<ZR_Pixel8>(list, "convert-to-8", "depth-convert-to-8");
  add_conversions_to<ZR_Pixel16>(list, "convert-to-16", "depth-convert-to-16");
  add_conversions_to<ZR_PixelFloat>(list, "convert-to-float", "depth-convert-to-float");
  add_conversion<ZR_Pixel16, ZR_Pixel8>(list, "convert-to-8-dithered", {.dither = true});
  add_conversion<ZR_PixelFloat, ZR_Pixel8>(list, "convert-to-8-dithered", {.dither = true, .shifts = {1}});
  for (const bool dither : {false, true})
    add_conversion<ZR_PixelFloat, ZR_Pixel8>(list, dither ? "convert-to-8-dithered-aligned" : "convert-to-8-aligned",
                                             {dither, {0}, true});
}

}  // namespace zr::tool
