// Rows between depths: every length and place against the rule of one channel, the choice
// between the two float rules, and the order of dither words.
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

template <class To, class From>
zr::Channel<To> plain_rule(zr::Channel<From> v, bool alpha, bool vector) {
  if constexpr (std::is_same_v<From, ZR_Pixel8> && std::is_same_v<To, ZR_Pixel16>)
    return zr::widen_8_to_16(v);
  else if constexpr (std::is_same_v<From, ZR_Pixel8>)
    return zr::widen_8_to_float(v);
  else if constexpr (std::is_same_v<From, ZR_Pixel16> && std::is_same_v<To, ZR_Pixel8>)
    return zr::narrow_16_to_8(v);
  else if constexpr (std::is_same_v<From, ZR_Pixel16>)
    return zr::widen_16_to_float(v);
  else if constexpr (std::is_same_v<To, ZR_Pixel8>)
    return vector  ? zr::narrow_float_to_8_nearest(v)
           : alpha ? zr::narrow_float_alpha<To>(v)
                   : zr::narrow_float_colour<To>(v);
  else
    return alpha ? zr::narrow_float_alpha<To>(v) : zr::narrow_float_colour<To>(v);
}

class DepthRows : public BornLibrary {
 protected:
  template <class To, class From>
  void compare(bool sse2) {
    for (i32 n = 0; n <= 70; ++n)
      for (const std::size_t shift : {std::size_t{0}, std::size_t{8}, sizeof(zr::Channel<From>)}) {
        if (shift % alignof(From) != 0) continue;
        Row<From> src(n, shift, static_cast<u32>(n));
        Row<To> dst(n, alignof(To), 0);
        zr::convert_row(n, src.data(), dst.data(), false);
        const bool vector = sse2 && reinterpret_cast<std::uintptr_t>(src.data()) % 16 == 0;
        for (i32 i = 0; i < n; ++i) {
          const From p = src.get(i);
          const To expected = {plain_rule<To, From>(p.alpha, true, vector), plain_rule<To, From>(p.red, false, vector),
                               plain_rule<To, From>(p.green, false, vector),
                               plain_rule<To, From>(p.blue, false, vector)};
          ASSERT_TRUE(same_bits(dst.get(i), expected)) << "pixel " << i << " of " << n << ", shift " << shift;
        }
      }
  }
  void compare_all(bool sse2) {
    compare<ZR_Pixel16, ZR_Pixel8>(sse2);
    compare<ZR_PixelFloat, ZR_Pixel8>(sse2);
    compare<ZR_Pixel8, ZR_Pixel16>(sse2);
    compare<ZR_PixelFloat, ZR_Pixel16>(sse2);
    compare<ZR_Pixel8, ZR_PixelFloat>(sse2);
    compare<ZR_Pixel16, ZR_PixelFloat>(sse2);
  }
};

TEST_F(DepthRows, EveryLengthAndPlaceIsTheRuleOfOneChannel) { compare_all(HB_G_CPU_DataP[2] != 0); }

TEST_F(DepthRows, WithoutSse2FloatsNarrowByTheScalarRuleEverywhere) {
  const Instructions plain(0);
  compare_all(false);
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

TEST_F(DepthRows, DitherDrawsBlueBeforeGreenForFloatsAndClampsAlphaOnBothPaths) {
  for (const bool vector : {true, false}) {
    if (vector && HB_G_CPU_DataP[2] == 0) continue;
    WordModel words;
    ZR_ResetDitherRandomIndex();
    for (i32 n = 1; n <= 70; ++n) {
      Row<ZR_PixelFloat> src(n, vector ? 0 : 4, static_cast<u32>(n));
      Row<ZR_Pixel8> dst(n, 4, 0);
      zr::convert_row(n, src.data(), dst.data(), true);
      const auto narrow = [&](f32 c, u32 word) {
        c += zr::dither_offset(word);
        return vector ? zr::narrow_float_to_8_nearest(c) : zr::narrow_float_colour<ZR_Pixel8>(c);
      };
      for (i32 i = 0; i < n; ++i) {
        const ZR_PixelFloat p = src.get(i);
        ZR_Pixel8 expected;
        expected.alpha = narrow(p.alpha, words.next());
        expected.red = narrow(p.red, words.next());
        expected.blue = narrow(p.blue, words.next());
        expected.green = narrow(p.green, words.next());
        ASSERT_TRUE(same_bits(dst.get(i), expected)) << "pixel " << i << " of " << n << ", vector " << vector;
      }
    }
  }
}

}  // namespace
