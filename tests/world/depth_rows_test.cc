// Rows between depths: the choice between the two float rules, and where dither words come from.
#include <DIE/die.h>
#include <ZR/depth.h>

#include <algorithm>
#include <cstring>
#include <random>
#include <vector>

#include "support/born_library.h"
#include "support/edge_rows.h"
#include "world/depth_rows.h"

namespace {

template <class T>
T random_pixel(std::mt19937& random) {
  const auto channel = [&]() -> zr::Channel<T> {
    const u32 word = static_cast<u32>(random());
    if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
      constexpr f32 odd[] = {-0.5f, 1.5f, 2.5f / 255.0f, 1e9f, -1e9f, std::numeric_limits<f32>::quiet_NaN(),
                             -0.0f, 4.0f};
      return word % 3 == 0 ? odd[(word >> 4) % std::size(odd)] : static_cast<f32>(word >> 8) * 0x1p-24f;
    } else {
      return static_cast<zr::Channel<T>>(word % 5 == 0 ? 0u : word >> 8);  // illegal ones too
    }
  };
  return {channel(), channel(), channel(), channel()};
}

// Pixels that begin `shift` bytes off alignment to 64.
template <class T>
class Row {
 public:
  Row(i32 n, std::size_t shift, u32 seed) : bytes_(static_cast<std::size_t>(n) * sizeof(T) + 192) {
    start_ = 64 - reinterpret_cast<std::uintptr_t>(bytes_.data()) % 64 + shift;
    std::mt19937 random(seed);
    for (i32 i = 0; i < n; ++i) data()[i] = random_pixel<T>(random);
  }
  T* data() { return reinterpret_cast<T*>(bytes_.data() + start_); }
  const T& get(i32 i) { return data()[i]; }

 private:
  std::size_t start_;
  std::vector<u8> bytes_;
};

template <class T>
bool same_bits(const T& a, const T& b) {
  return std::memcmp(&a, &b, sizeof a) == 0;
}

class DepthRows : public BornLibrary {
 protected:
  // Rows of floats to 8 bits: nearest even on aligned rows where there are vectors, else the rule of one channel.
  void compare(bool sse2) {
    for (i32 n = 0; n <= 70; ++n)
      for (const std::size_t shift : {std::size_t{0}, std::size_t{8}, std::size_t{4}}) {
        Row<ZR_PixelFloat> src(n, shift, static_cast<u32>(n));
        Row<ZR_Pixel8> dst(n, 1, 0);
        zr::convert_row(n, src.data(), dst.data(), false);
        const bool vector = sse2 && shift == 0;
        const auto alpha = vector ? zr::narrow_float_to_8_nearest : zr::narrow_float_alpha<ZR_Pixel8>;
        const auto colour = vector ? zr::narrow_float_to_8_nearest : zr::narrow_float_colour<ZR_Pixel8>;
        for (i32 i = 0; i < n; ++i) {
          const ZR_PixelFloat p = src.get(i);
          const ZR_Pixel8 expected = {alpha(p.alpha), colour(p.red), colour(p.green), colour(p.blue)};
          ASSERT_TRUE(same_bits(dst.get(i), expected)) << "pixel " << i << " of " << n << ", shift " << shift;
        }
      }
  }
};

TEST_F(DepthRows, FloatsNarrowByTheirPlaceAndProcessor) {
  compare(HB_G_CPU_DataP[2] != 0);
  const Instructions plain(0);
  compare(false);
}

// The words as they are told: one for each channel, the first after a reset is entry 1.
class WordModel {
 public:
  WordModel() { DIE_GetPrimeSizedTable(&start_, &count_); }
  u32 next() { return start_[at_ = (at_ + 1) % count_]; }
  i32 count() const { return count_; }

 private:
  const u32* start_ = nullptr;
  i32 count_ = 0, at_ = 0;
};

TEST_F(DepthRows, DitherDrawsInMemoryOrderFor16BitsAndWrapsPastTheEndOfTheTable) {
  WordModel words;
  ZR_ResetDitherRandomIndex();
  i64 drawn = 0;
  for (i32 n = 1; drawn < 2 * i64{words.count()} + 100; n = n * 3 / 2 + 1) {
    Row<ZR_Pixel16> src(n, 0, static_cast<u32>(n));
    Row<ZR_Pixel8> dst(n, 4, 0);
    zr::convert_row(n, src.data(), dst.data(), true);
    for (i32 i = 0; i < n; ++i) {
      const ZR_Pixel16 p = src.get(i);
      ZR_Pixel8 expected;
      expected.alpha = zr::narrow_16_to_8_dither(p.alpha, words.next());
      expected.red = zr::narrow_16_to_8_dither(p.red, words.next());
      expected.green = zr::narrow_16_to_8_dither(p.green, words.next());
      expected.blue = zr::narrow_16_to_8_dither(p.blue, words.next());
      ASSERT_TRUE(same_bits(dst.get(i), expected)) << "pixel " << i << " of " << n;
    }
    drawn += 4 * n;
  }
}

}  // namespace
