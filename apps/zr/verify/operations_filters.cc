// Blurs, convolution and the tables of the bell curve.
#include <ZR/blur.h>

#include <array>

#include "verify/operation.h"

namespace zr::tool {
namespace {

constexpr i32 kHeight = 61;

// Every direction and alpha on both sides, with the places of both worlds apart.
template <class T>
void blurs(Digest& digest, f32 radius, u32 iterations, Content content) {
  for (u32 form = 0; form < 16; ++form) {
    const u32 flags = form % 5 == 4 ? 14 : form % 3 == 1 ? 31 : form % 7 == 5 ? 1 : 15;
    const bool down = (form & 1) != 0, premultiplied = (form & 2) != 0;
    Canvas<T> src(odd_width, kHeight, premultiplied ? premul_of(content) : content, 70);
    Canvas<T> dst(odd_width - 4, kHeight + 3, Content::untouched);
    src->origin = {2, -1};
    i32 error = 0;
    try {
      if (iterations == 0)
        ZR_GaussianBlur1D(nullptr, &src, radius, flags, down, premultiplied, (form & 4) != 0, (form & 8) != 0, false,
                          &dst);
      else
        ZR_BoxBlur1D(nullptr, &src, radius, iterations, flags, down, premultiplied, (form & 4) != 0, (form & 8) != 0,
                     false, &dst);
    } catch (const i32 code) {
      error = code;
    }
    digest.number(error);
    dst.digest(digest);
  }
}

std::vector<i32> noise_taps(i32 count, i32 limit, u64 seed) {
  Random random(seed);
  std::vector<i32> taps(static_cast<size_t>(count));
  for (i32& tap : taps) tap = static_cast<i32>(random.below(static_cast<u32>(2 * limit + 1))) - limit;
  return taps;
}

template <class T>
void convolve(Digest& digest, i32 size, u32 flags, i32 limit, Content content) {
  Canvas<T> src(odd_width, kHeight, content, 71), dst(odd_width, kHeight, Content::untouched);
  const i32 count = (flags & ZR_ConvolveFlag_1D) != 0 ? size : size * size;
  std::array<std::vector<i32>, 4> kernels;
  for (u32 k = 0; k < 4; ++k) kernels[k] = noise_taps(count, limit, 72 + k);
  digest.number(ZR_Convolve(nullptr, &src, nullptr, flags, size, kernels[0].data(), kernels[1].data(),
                            kernels[2].data(), kernels[3].data(), &dst));
  dst.digest(digest);
}

}  // namespace

void add_filter_operations(Operations& list) {
  add_all_with_hostile(list, "blur/box", []<class T>(Digest& digest, Content content) {
    for (const f32 radius : {1.0f, 5.25f, 40.0f}) blurs<T>(digest, radius, 1, content);
  });
  add_all_with_hostile(list, "blur/box-thrice", []<class T>(Digest& digest, Content content) {
    for (const f32 radius : {2.0f, 9.7f}) blurs<T>(digest, radius, 3, content);
  });
  add_all_with_hostile(list, "blur/gaussian", []<class T>(Digest& digest, Content content) {
    for (const f32 radius : {0.5f, 6.0f, 31.5f}) blurs<T>(digest, radius, 0, content);
  });
  add_all_with_hostile(list, "convolve", []<class T>(Digest& digest, Content content) {
    for (const u32 flags : {0u, 2u, 6u, 3u, 35u})
      for (const i32 size : {1, 3, 7, 15}) {
        convolve<T>(digest, size, flags, 60, content);
        convolve<T>(digest, size, flags, 100000, content);  // beyond 16 bits
      }
  });
  add_for<ZR_Pixel8>(list, "gaussian-kernel", []<class>(Digest& digest) {
    for (const f64 radius : {0.0, 0.5, 3.0, 7.25})
      for (const u8 flags : {u8{0}, u8{1}, u8{2}, u8{3}}) {
        std::array<i32, 17 * 17> kernel{};
        u32 diameter = 0;
        digest.number(ZR_GaussianKernel(nullptr, radius, flags, 0.75, &diameter, kernel.data()));
        digest.number(static_cast<i32>(diameter));
        digest.bytes(kernel.data(), sizeof kernel);
      }
  });
}

}  // namespace zr::tool
