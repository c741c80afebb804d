// Mask buffers: modes, fades, conversions, scan blurs, and the alpha of worlds under them.
#include <ZR/mask_alpha.h>

#include "verify/operation.h"

namespace zr::tool {
namespace {

// High enough for several bands of rows.
constexpr i32 kHigh = 700;

// A mask with the alpha of a picture.
template <class T>
class MaskOf {
 public:
  MaskOf(i32 width, i32 height, Content content, u64 seed) : buffer_(width, height, static_cast<i32>(Depth<T>::bits)) {
    Canvas<T> picture(width, height, content, seed);
    for (i32 y = 0; y < height; ++y)
      for (i32 x = 0; x < width; ++x) values()[y * width + x] = picture->At(x, y)->alpha;
  }
  ZR_UnoBuffer* operator&() { return &buffer_; }
  Channel<T>* values() const { return static_cast<Channel<T>*>(*buffer_.data); }
  void digest(Digest& digest) const {
    const auto count = static_cast<size_t>(buffer_.width) * static_cast<size_t>(buffer_.height);
    if constexpr (std::is_same_v<T, ZR_PixelFloat>)
      digest.floats({values(), count});
    else
      digest.bytes(values(), count * sizeof(Channel<T>));
  }

 private:
  ZR_UnoBuffer buffer_;
};

template <class S, class D>
void accumulate(Digest& digest, Content content) {
  MaskOf<S> src(odd_width, kHigh, content, 21);
  const GX_LRect part = {3, 5, 120, 31};
  const GX_LPoint point = {-2, 9};
  for (i32 mode = 0; mode <= 7; ++mode) {
    MaskOf<D> dst(odd_width - 2, kHigh - 9, content, 22), other(odd_width, kHigh, content, 23);
    digest.number(ZR_AccumulateUnoBuffers(nullptr, &src, mode, nullptr, &dst));
    digest.number(ZR_AccumulateUnoBuffers(nullptr, &src, mode, &part, &point, &other));
    dst.digest(digest);
    other.digest(digest);
  }
  for (const i32 mode : {-1, 0, 2, 6})
    for (const f32 opacity : {1.0f, 0.4f}) {
      MaskOf<D> dst(odd_width, 40, content, 24);
      digest.number(ZR_AccumulateUnoBuffers(nullptr, &src, mode, opacity, 0.7f, &part, &point, &dst));
      dst.digest(digest);
    }
}

template <class T, class M>
void merge(Digest& digest, Content content) {
  MaskOf<M> mask(odd_width - 31, 300, content, 26);
  const GX_LRect clip = {4, 2, 90, 250}, area = {1, 3, 130, 200};
  Canvas<T> world(odd_width, 310, content, 27), clipped(odd_width, 310, content, 28);
  ZR_MergeMaskAlpha(nullptr, 7, -5, nullptr, &mask, nullptr, &world);
  ZR_MergeMaskAlpha(nullptr, -3, 20, &clip, &mask, &area, &clipped);
  world.digest(digest);
  clipped.digest(digest);
}

template <class T>
using Scan = i32 (*)(i32, i32, i32, i32, i32, const Channel<T>*, Channel<T>*);
template <class T>
void scan_lines(Digest& digest, Scan<T> scan, Content content) {
  for (const i32 length : {1, 9, 64, 700}) {
    MaskOf<T> line(length, 1, content, static_cast<u64>(length));
    for (const i32 radius : {0, 30000, 65536, 150001, 1000000, 100 << 16})
      for (const i32 flags : {ZR_UnoScan_Plain, ZR_UnoScan_Wide}) {
        MaskOf<T> made(length, 1, content, 3);
        digest.number(scan(flags, radius, 0, length, length, line.values(), made.values()));
        made.digest(digest);
      }
  }
}

}  // namespace

void add_mask_operations(Operations& list) {
  add_all_with_hostile(list, "mask-accumulate",
                       []<class T>(Digest& digest, Content content) { accumulate<T, T>(digest, content); });
  add_for<ZR_Pixel8>(list, "mask-accumulate-deep",
                     []<class>(Digest& digest) { accumulate<ZR_Pixel8, ZR_Pixel16>(digest, Content::mixed); });
  add_with_hostile<ZR_Pixel16>(list, "mask-accumulate-shallow", []<class>(Digest& digest, Content content) {
    accumulate<ZR_Pixel16, ZR_Pixel8>(digest, content);
  });
  add_all_with_hostile(list, "mask-transfer", []<class T>(Digest& digest, Content content) {
    MaskOf<T> one(odd_width, 50, content, 31), other(odd_width + 9, 44, content, 32);
    const GX_LPoint point = {6, 3};
    for (i32 mode = 0; mode <= 7; ++mode) {
      MaskOf<T> dst(odd_width + 5, 60, content, 33);
      digest.number(ZR_TransferUnoBuffers(nullptr, &one, &other, mode, nullptr, &point, &dst));
      dst.digest(digest);
    }
  });
  add_all_with_hostile(list, "mask-fade", []<class T>(Digest& digest, Content content) {
    MaskOf<T> mask(odd_width, kHigh, content, 34);
    for (const f32 fade : {1.0f, 0.9f, 0.37f, 1.5f}) {
      digest.number(ZR_FadeUnoBuffer(fade, &mask));
      mask.digest(digest);
      digest.number(ZR_InvertAndFadeUnoBuffer(nullptr, static_cast<i32>(fade * 65536), &mask));
      digest.number(ZR_InvertUnoBuffer(nullptr, &mask));
      mask.digest(digest);
    }
  });
  add_with_hostile<ZR_Pixel16>(list, "mask-convert", []<class>(Digest& digest, Content content) {
    MaskOf<ZR_Pixel16> src(odd_width, kHigh, content, 35);
    const auto to = [&]<class T>() {
      for (const i32 divisor : {1, 4, 8, 16, 129}) {
        MaskOf<T> dst(odd_width, kHigh, content, 36);
        digest.number(ZR_ConvertDeepUnoBuffer(nullptr, &src, nullptr, divisor, &dst));
        dst.digest(digest);
      }
    };
    to.template operator()<ZR_Pixel8>();
    to.template operator()<ZR_Pixel16>();
    to.template operator()<ZR_PixelFloat>();
  });
  add_all_with_hostile(list, "mask-merge", []<class T>(Digest& digest, Content content) {
    merge<T, ZR_Pixel8>(digest, content);
    merge<T, ZR_Pixel16>(digest, content);
  });
  add_all_with_hostile(list, "mask-blend", []<class T>(Digest& digest, Content content) {
    MaskOf<T> mask(odd_width, 1, content, 37);
    Canvas<T> row(odd_width, 1, content, 38);
    using C = Channel<T>;
    for (const f32 part : {0.0f, 0.3f, 1.0f}) {
      const C target = static_cast<C>(part * static_cast<f32>(Depth<T>::white));
      ZR_BlendSingleChannel<T, C>(odd_width, static_cast<C>(Depth<T>::half), target, mask.values(), row->Row(0));
      row.digest(digest);
    }
  });
  add_for<ZR_Pixel8>(list, "mask-box-scan",
                     []<class T>(Digest& digest) { scan_lines<T>(digest, ZR_BoxBlurUnoScan, Content::mixed); });
  add_with_hostile<ZR_Pixel16>(list, "mask-box-scan", []<class T>(Digest& digest, Content content) {
    scan_lines<T>(digest, ZR_BoxBlurDeepUnoScan, content);
  });
  add_for<ZR_Pixel8>(list, "mask-bell-scan",
                     []<class T>(Digest& digest) { scan_lines<T>(digest, ZR_GBlurUnoScan, Content::mixed); });
  add_with_hostile<ZR_Pixel16>(list, "mask-bell-scan", []<class T>(Digest& digest, Content content) {
    scan_lines<T>(digest, ZR_GBlurDeepUnoScan, content);
  });
}

}  // namespace zr::tool
