// Mask rows on lanes against single values, for every instruction set that this processor has: all values, all lengths
// from 1 to 130, beside pages that cannot be read.
#include <numeric>

#include "mask/convert_rows.h"
#include "mask/mask_noise.h"
#include "mask/mask_rows.h"
#include "mask/masks.h"
#include "support/edge_rows.h"

namespace {

constexpr i32 longest = 130;

template <class C>
class MaskLanes : public BornLibrary {
 protected:
  using T = zr::MaskPixel<C>;
  // Any bits; of floats any values.
  void fill(i32 n, C* row) {
    std::vector<T> pixels(static_cast<size_t>(n));
    fill_edgy(random_, n, pixels.data());
    for (i32 i = 0; i < n; ++i) {
      row[i] = pixels[static_cast<size_t>(i)].red;
      if constexpr (sizeof(C) == 2)
        if (i % 7 == 0) row[i] = static_cast<u16>(random_());
    }
  }
  // body(n, src, under, dst, pixels) by single values and by each instruction set.
  template <class Body>
  void compare(const char* what, Body&& body) {
    for (i32 n = 1; n <= longest; ++n) {
      const bool at_end = n % 2 == 0;
      C *const src = rows_[0].at<C>(n, at_end), *const under = rows_[1].at<C>(n, !at_end);
      C* const dst = rows_[2].at<C>(n, at_end);
      T* const pixels = rows_[3].at<T>(n, at_end);
      fill(n, src);
      fill(n, under);
      std::vector<C> before(static_cast<size_t>(n)), expected;
      std::vector<T> pixels_before(before.size()), pixels_expected;
      fill(n, before.data());
      fill_edgy(random_, n, pixels_before.data());
      for (int level = 0; level < 4 && Instructions::has(level); ++level) {
        std::copy(before.begin(), before.end(), dst);
        std::copy(pixels_before.begin(), pixels_before.end(), pixels);
        {
          const Instructions instructions(level);
          body(n, src, under, dst, pixels);
        }
        if (level == 0) expected.assign(dst, dst + n), pixels_expected.assign(pixels, pixels + n);
        for (i32 i = 0; level > 0 && i < n; ++i) {
          const auto at = static_cast<size_t>(i);
          const bool same = dst[i] == expected[at] || (dst[i] != dst[i] && expected[at] != expected[at]);
          ASSERT_TRUE(same && same_pixel(pixels[i], pixels_expected[at]))
              << what << " by " << Instructions::names[level] << ", " << i << " of " << n;
        }
      }
    }
  }
  EdgeRow rows_[4];
  std::mt19937 random_{78};
};
using Values = testing::Types<u8, u16, f32>;
TYPED_TEST_SUITE(MaskLanes, Values);

TYPED_TEST(MaskLanes, EqualSingleValues) {
  using C = TypeParam;
  using Pixel = zr::MaskPixel<C>;
  for (i32 mode = 0; mode <= 7; ++mode) {
    const std::string name = "mode " + std::to_string(mode);
    this->compare(name.c_str(), [mode](i32 n, C* s, C* u, C* d, Pixel*) { zr::mask_mode_row(n, mode, s, u, d); });
    this->compare(name.c_str(), [mode](i32 n, C* s, C*, C* d, Pixel*) { zr::mask_mode_row(n, mode, s, d, d); });
  }
  for (const f32 part : {0.0f, 0.37f, 1.0f, 1.3f, -0.5f}) {
    const auto factor = static_cast<zr::Factor<C>>(part * static_cast<f32>(zr::MaskDepth<C>::white));
    this->compare("fade", [=](i32 n, C*, C*, C* d, Pixel*) { zr::mask_fade_row(n, factor, d); });
    this->compare("invert", [=](i32 n, C*, C*, C* d, Pixel*) { zr::mask_invert_row(n, factor, d); });
    this->compare("rise", [=](i32 n, C* s, C* u, C* d, Pixel*) { zr::mask_rise_row(n, factor, s, u, d); });
  }
  this->compare("merge", [](i32 n, C* s, C*, C*, Pixel* p) { zr::merge_alpha_row(n, s, p); });
  if constexpr (sizeof(C) < 4) {
    using Other = std::conditional_t<sizeof(C) == 1, u16, u8>;
    std::vector<u16> noise(longest);
    std::iota(noise.begin(), noise.end(), static_cast<u16>(sizeof(C) == 1 ? 130 : 32700));
    for (u16& r : noise) r = static_cast<u16>(r & (sizeof(C) == 1 ? 255 : 32767));
    this->compare("dither", [&](i32 n, C* s, C* u, C* d, Pixel*) {
      const auto* const lanes = zr::lane_mask_rows<C>();
      (lanes != nullptr ? *lanes : zr::single_mask_rows<C>()).dithered(n, noise.data(), s, u, d);
    });
    this->compare("conversions", [](i32 n, C* s, C*, C* d, Pixel* p) {
      Other other[longest];
      f32 real[longest];
      zr::convert_mask_row(n, s, other);
      zr::convert_mask_row(n, other, d);
      zr::convert_mask_row(n, s, real);
      for (i32 i = 0; i < n; ++i) p[i].red = static_cast<C>(real[i] * static_cast<f32>(zr::MaskDepth<C>::white));
    });
  }
}

class MaskNoises : public BornLibrary {};

TEST_F(MaskNoises, AreTheNumbersOfOneStepAfterTheOther) {
  constexpr u64 modulus = 0x7fffffff;
  EdgeRow memory;
  for (int level = 1; level < 4 && Instructions::has(level); ++level)
    for (const u64 start : {u64{1}, u64{48271}, modulus - 1, u64{0x40000001}})
      for (i32 n = 1; n <= 150; ++n) {
        const Instructions instructions(level);
        u16* const noise = memory.at<u16>(n, true);
        const u16 bits = n % 2 != 0 ? 255 : 32767;
        const u32 end = zr::lane_noise()(static_cast<u32>(start), n, bits, noise);
        u64 number = start;
        for (i32 i = 0; i < n; ++i) {
          number = number * 48271 % modulus;
          ASSERT_EQ(noise[i], number & bits) << i << " of " << n << " by " << Instructions::names[level];
        }
        ASSERT_EQ(end, number) << n << " by " << Instructions::names[level];
      }
}

}  // namespace
