// Scaled copies between worlds, copies of channels, and copies through a matrix.
#include "verify/operation.h"

namespace zr::tool {
namespace {

constexpr i32 kHeight = 31;

struct Scale {
  GX_LRect from, to;
};
// Equal, enlarged, reduced, both at once, to and from outside of the worlds.
constexpr Scale kScales[] = {{{0, 0, 131, 31}, {0, 0, 131, 31}},   {{3, 2, 40, 15}, {1, 1, 75, 27}},
                             {{0, 0, 131, 31}, {2, 3, 50, 14}},    {{5, 1, 90, 12}, {0, 0, 60, 30}},
                             {{-7, -3, 50, 20}, {10, 4, 120, 29}}, {{20, 5, 84, 21}, {-9, -4, 140, 40}},
                             {{0, 0, 66, 30}, {4, 6, 37, 21}},     {{10, 10, 11, 11}, {100, 2, 130, 7}}};

using CopyFunc = i32 (*)(const ZR_ProgressInfo*, ZR_LayerDef*, ZR_LayerDef*, const GX_LRect*, const GX_LRect*);
template <class From, class To>
void copies(Digest& digest, CopyFunc function, Content content, std::span<const Scale> scales) {
  Canvas<From> src(odd_width, kHeight, content, 50);
  for (const Scale& scale : scales) {
    Canvas<To> dst(odd_width, kHeight, Content::untouched);
    digest.number(function(nullptr, &src, &dst, &scale.from, &scale.to));
    dst.digest(digest);
  }
}

void channel_copy(Digest& digest, i32 type, i32 channels) {
  ZR_Chunk src{}, dst{};
  const i32 width = 37, height = 11;
  digest.number(ZR_NewChunk(width, height, channels, type, &src));
  digest.number(ZR_NewChunk(width, height, channels, type, &dst));
  if (src.data != nullptr && dst.data != nullptr) {
    Random random(51);
    for (i32 i = 0; i < src.row_bytes * height; ++i) static_cast<u8*>(src.data)[i] = static_cast<u8>(random.below(256));
    for (const Scale& scale : {Scale{{0, 0, 37, 11}, {0, 0, 37, 11}}, Scale{{2, 1, 20, 9}, {1, 0, 36, 11}},
                               Scale{{0, 0, 37, 11}, {5, 2, 20, 7}}}) {
      digest.number(ZR_ChannelCopy(nullptr, &src, &dst, &scale.from, &scale.to));
      digest.bytes(dst.data, static_cast<size_t>(dst.row_bytes) * static_cast<size_t>(height));
    }
  }
  ZR_DisposeChunk(&src);
  ZR_DisposeChunk(&dst);
}

constexpr i32 four(const char (&name)[5]) { return (name[0] << 24) | (name[1] << 16) | (name[2] << 8) | name[3]; }

constexpr GX_Matrix3 kMatrices[] = {
    {{{1, 0, 7}, {0, 1, -3}, {0, 0, 1}}},
    {{{1.25, 0, 3.5}, {0, 0.75, 2.25}, {0, 0, 1}}},
    {{{0.8660254037844387, -0.5, 30}, {0.5, 0.8660254037844387, -20.25}, {0, 0, 1}}},
    {{{0.9, 0.1, 5}, {-0.05, 1.1, 2}, {0.001, 0.002, 1}}},
};

}  // namespace

void add_copy_operations(Operations& list) {
  static constexpr std::span<const Scale> all = kScales;
  add_all_with_hostile(list, "copy-draft-to-8", []<class T>(Digest& digest, Content content) {
    copies<T, ZR_Pixel8>(digest, &ZR_CopyBits_Draft, content, all);
  });
  add_all_with_hostile(list, "copy-draft-to-16", []<class T>(Digest& digest, Content content) {
    copies<T, ZR_Pixel16>(digest, &ZR_CopyBits_Draft, content, all);
  });
  add_all_with_hostile(list, "copy-draft-to-float", []<class T>(Digest& digest, Content content) {
    copies<T, ZR_PixelFloat>(digest, &ZR_CopyBits_Draft, content, all);
  });
  add_all_with_hostile(list, "copy-high-quality", []<class T>(Digest& digest, Content content) {
    copies<T, T>(digest, &ZR_CopyBits_HQ_Straight, content, all);
  });
  add_for<ZR_Pixel8>(list, "copy-high-quality-premul", []<class T>(Digest& digest) {
    copies<T, T>(digest, &ZR_CopyBits_HQ_Premul, Content::premul, all);
  });
  add_all_with_hostile(list, "copy-high-quality-to-8", []<class T>(Digest& digest, Content content) {  // of equal size
    copies<T, ZR_Pixel8>(digest, &ZR_CopyBits_HQ_Straight, content, all.first(1));
  });
  add_all_with_hostile(list, "matrix-copy", []<class T>(Digest& digest, Content content) {
    Canvas<T> src(odd_width, kHeight, content, 52);
    const GX_LRect clip{9, 3, 90, 28};
    for (const GX_Matrix3& matrix : kMatrices)
      for (const bool src2dst : {false, true}) {
        Canvas<T> dst(odd_width, kHeight, Content::untouched);
        digest.number(ZR_CopyBits3_LO_Straight(nullptr, &src, &matrix, src2dst, src2dst ? nullptr : &clip, &dst));
        dst.digest(digest);
      }
  });
  add_for<ZR_Pixel8>(list, "channel-copy", []<class>(Digest& digest) {
    channel_copy(digest, four("UBT1"), 3);
    channel_copy(digest, four("UBT1"), 4);
  });
  add_for<ZR_Pixel16>(list, "channel-copy", []<class>(Digest& digest) { channel_copy(digest, four("SHT2"), 4); });
  add_for<ZR_PixelFloat>(list, "channel-copy", []<class>(Digest& digest) { channel_copy(digest, four("FLT4"), 3); });
}

}  // namespace zr::tool
