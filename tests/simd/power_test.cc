// Powers of floats against the C library's in long double.
#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <random>

#include "composite/raised.h"

namespace {

// The nearest float but for a few, and never further off than the next one.
TEST(Power, NearestFloat) {
  std::mt19937 random(3);
  for (const f32 exponent : {2.2f, 1 / 2.2f, 2.4f, 1.0f, 3.0f, 0.1f, 100.0f, 1e-3f, 20000.0f}) {
    int other = 0;
    constexpr int count = 20000;
    for (int i = 0; i < count; ++i) {
      const u32 word = static_cast<u32>(random());
      const f32 x = i % 2 != 0 ? static_cast<f32>(word >> 8) * 0x1p-24f : std::bit_cast<f32>(word >> 1);
      const f32 nearest = static_cast<f32>(std::pow(static_cast<long double>(x), static_cast<long double>(exponent)));
      const f32 power = zr::raised(x, exponent);
      if (std::isnan(nearest)) {
        EXPECT_TRUE(std::isnan(power)) << x << " to " << exponent;
        continue;
      }
      if (power == nearest) continue;
      ++other;
      EXPECT_EQ(power, std::nextafter(nearest, power)) << x << " to " << exponent;
    }
    EXPECT_LE(other, 4) << "of " << count << " to " << exponent;
  }
}

TEST(Power, SignsAndSpecialValues) {
  constexpr f32 inf = INFINITY;
  for (const f32 exponent : {2.2f, 0.5f, 1.0f, 2.0f, 3.0f, 16777217.0f, 0.0f, -1.0f, -2.2f, inf, -inf, NAN})
    for (const f32 c : {0.0f, -0.0f, 1.0f, -1.0f, inf, -inf, NAN, 0x1p-149f, -0x1p-140f, 0.5f, -2.0f, 3e38f}) {
      const f32 expected = c < 0.0f ? -std::pow(-c, exponent) : std::pow(c, exponent);
      const f32 power = zr::raised(c, exponent);
      EXPECT_TRUE(std::isnan(expected) ? std::isnan(power)
                                       : power == expected && std::signbit(power) == std::signbit(expected))
          << c << " to " << exponent << " is " << power << ", not " << expected;
    }
}

}  // namespace
