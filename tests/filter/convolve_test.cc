// Convolution and the bell curve's tables against plain models, on every instruction set.
#include <ZR/blur.h>
#include <ZR/callback_block.h>
#include <ZR/filter.h>

#include <cmath>
#include <limits>
#include <numeric>
#include <vector>

#include "support/born_library.h"
#include "support/edge_rows.h"
#include "support/worlds.h"

namespace {

using Taps = std::vector<i32>;

// Kernel k of the four belongs to channel k.
template <class T>
void model_convolve(const TestWorld<T>& src, u32 flags, i32 size, const Taps* kernels, TestWorld<T>& dst) {
  const bool one = (flags & 1) != 0, down = (flags & 32) != 0;
  const i32 width = one && down ? 1 : size, height = one && !down ? 1 : size;
  for (i32 y = 0; y < dst.height(); ++y)
    for (i32 x = 0; x < dst.width(); ++x)
      for (int k = 0; k < 4; ++k) {
        std::conditional_t<sizeof(T) == 16, f64, i64> sum = 0;
        for (i32 v = 0; v < height; ++v)
          for (i32 u = 0; u < width; ++u) {
            const i32 sx = x + u - width / 2, sy = y + v - height / 2;
            if (sx < 0 || sy < 0 || sx >= src.width() || sy >= src.height()) continue;
            const T& p = src.at(sx, sy);
            const auto c = k == 0 ? p.alpha : k == 1 ? p.red : k == 2 ? p.green : p.blue;
            const i32 tap = kernels[k][static_cast<size_t>(v * width + u)];
            if constexpr (sizeof(T) == 16)
              sum += static_cast<f64>(c * static_cast<f32>(tap));
            else
              sum += i64{c} * tap;
          }
        i64 divisor = i64{256} * width * height;
        if ((flags & 2) != 0) divisor = std::accumulate(kernels[k].begin(), kernels[k].end(), i64{0});
        if (divisor == 0) divisor = 1;
        T& out = dst.at(x, y);
        auto& channel = k == 0 ? out.alpha : k == 1 ? out.red : k == 2 ? out.green : out.blue;
        if constexpr (sizeof(T) == 16) {
          channel = static_cast<f32>(sum) / static_cast<f32>(divisor);
        } else {
          i64 v = sum / divisor;
          if (sizeof(T) == 4 && (flags & 4) != 0) v = static_cast<i16>(static_cast<u64>(v) & 65535);
          channel = static_cast<zr::Channel<T>>(std::clamp<i64>(v, 0, sizeof(T) == 4 ? 255 : 32768));
        }
      }
}

Taps taps_of(i32 count, i32 low, i32 high, u32 seed) {
  std::mt19937 random(seed);
  Taps taps(static_cast<size_t>(count));
  for (i32& t : taps) t = static_cast<i32>(low + static_cast<i64>(random() % (static_cast<u64>(i64{high} - low) + 1)));
  return taps;
}

template <class T>
class Convolutions : public BornLibrary {};
using Filters = BornLibrary;
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(Convolutions, Depths);

TYPED_TEST(Convolutions, EqualTheModel) {
  using T = TypeParam;
  constexpr i32 most = std::numeric_limits<i32>::max();
  struct Range {
    i32 low, high;
    bool alike;  // one kernel for all channels
  };
  constexpr Range ranges[] = {{0, 255, true},     {-9, 9, true},   {0, 0, true},          {1, 1, true},
                              {-255, 255, false}, {0, 128, false}, {-40000, 70000, true}, {-most - 1, most, false},
                              {most, most, true}};
  for (int level = 0; level < 4 && Instructions::has(level); ++level) {
    const Instructions instructions(level);
    u32 turn = 0;
    for (const i32 size : {1, 3, 5, 15, 41})
      for (const u32 flags : {0u, 2u, 6u, 3u, 35u, 39u, 34u})
        for (const Range& range : ranges) {
          // 41 is wider than the narrow worlds; every third one has pixels inside for the vectors.
          const i32 width = turn % 3 == 0 ? 75 : turn % 3 == 1 ? 19 : 6, height = size > 15 ? 9 : 21;
          ++turn;
          if (size > 15 && (flags & 1) == 0 && turn % 4 != 0) continue;
          TestWorld<T> src(width, height), made(width + 2, height - 1), expected(width + 2, height - 1);
          src.randomise(turn);
          const i32 count = (flags & 1) != 0 ? size : size * size;
          Taps kernels[4];
          for (u32 k = 0; k < 4; ++k) kernels[k] = taps_of(count, range.low, range.high, range.alike ? turn : turn + k);
          ASSERT_EQ(ZR_Convolve(nullptr, src, nullptr, flags, size, kernels[0].data(), kernels[1].data(),
                                range.alike ? kernels[1].data() : kernels[2].data(), kernels[3].data(), made),
                    0);
          model_convolve(src, flags, size, kernels, expected);
          ASSERT_TRUE(made == expected) << Instructions::names[level] << " size " << size << " flags " << flags
                                        << " taps " << range.low << " to " << range.high << " width " << width;
          ASSERT_TRUE(made.guards_intact());
        }
  }
}

// The tables of the bell curve, which separate into nothing, and real outer products, which do.
TYPED_TEST(Convolutions, TablesAndOuterProducts) {
  using T = TypeParam;
  for (int level = 0; level < 4 && Instructions::has(level); ++level) {
    const Instructions instructions(level);
    for (const i32 size : {3, 5, 9, 15}) {
      const Taps row = taps_of(size, -3, 20, static_cast<u32>(size)), column = taps_of(size, 0, 12, 7);
      Taps product, table(static_cast<size_t>(size * size));
      for (const i32 c : column)
        for (const i32 r : row) product.push_back(2 * c * r);
      u32 diameter = 0;
      ASSERT_EQ(ZR_GaussianKernel(nullptr, size / 2, 0, 1.0, &diameter, table.data()), 0);
      ASSERT_EQ(diameter, static_cast<u32>(size));
      for (const Taps& taps : {product, table}) {
        const Taps kernels[] = {taps, taps, taps, taps};
        TestWorld<T> src(150, 33), made(150, 33), expected(150, 33);
        src.randomise(5);
        ASSERT_EQ(ZR_Convolve(nullptr, src, nullptr, 2, size, taps.data(), taps.data(), taps.data(), taps.data(), made),
                  0);
        model_convolve(src, 2, size, kernels, expected);
        ASSERT_TRUE(made == expected) << Instructions::names[level] << " size " << size;
      }
    }
  }
}

// Floats that are multiples of a quantum have exact sums, found in other ways: of few bits, as those from 16 bits are,
// and of many, as those from bytes and most random ones. Single pixels that are none, and other levels, change that
// from one part of a picture to the next.
TEST_F(Filters, ConvolutionsOfMultiples) {
  constexpr f32 nan = std::numeric_limits<f32>::quiet_NaN();
  struct Spot {
    i32 x, y;
    f32 value;
  };
  const std::vector<Spot> spots[] = {{},
                                     {{140, 20, 0.1f}},
                                     {{0, 0, nan}, {299, 69, 0.7f}},
                                     {{5, 30, 1000.0f}, {200, 2, -0.0f}},
                                     {{5, 5, 1.25f}, {6, 50, 0x1p-40f}, {150, 68, INFINITY}}};
  struct Kernel {
    i32 size, low, high;
    u32 flags;
    enum { no, sideways, both_ways } mirrored;
  };
  // Divisors are small, have more than 20 bits, and are negative.
  const Kernel kernels[] = {{3, 0, 255, 2, Kernel::both_ways},
                            {5, -60, 90, 2, Kernel::sideways},
                            {5, 1, 255, 2, Kernel::both_ways},
                            {7, 0, 31, 0, Kernel::no},
                            {15, 0, 255, 2, Kernel::sideways},
                            {9, -128, 127, 3, Kernel::sideways},
                            {9, 0, 128, 35, Kernel::no},
                            {3, -255, 255, 0, Kernel::both_ways},
                            {3, 131000, 131072, 2, Kernel::both_ways},
                            {5, -4, -1, 2, Kernel::no}};
  struct Samples {
    u32 count;
    f32 unit;
    i32 darker;  // by so many halves from row to row, in turn
  };
  const Samples samples[] = {{65537, 0x1p-16f, 1}, {256, 1 / 255.0f, 1}, {~0u, 0x1p-32f, 1}, {~0u, 0x1p-32f, 12}};
  for (int level = 0; level < 4 && Instructions::has(level); ++level) {
    const Instructions instructions(level);
    for (const Kernel& kernel : kernels) {
      const i32 side = kernel.size, rows = (kernel.flags & 1) != 0 ? 1 : side;
      Taps taps[4];
      for (u32 k = 0; k < 4; ++k) {
        taps[k] = taps_of(side * rows, kernel.low, kernel.high, 3 + k);
        for (i32 i = 0; kernel.mirrored != Kernel::no && i < side * rows; ++i) {
          taps[k][static_cast<size_t>(i)] = taps[k][static_cast<size_t>(i / side * side + side - 1 - i % side)];
          if (kernel.mirrored == Kernel::both_ways)
            taps[k][static_cast<size_t>(i)] = taps[k][static_cast<size_t>((rows - 1 - i / side) * side + i % side)];
        }
      }
      // All spots in small multiples, some in the others, which larger kernels do not tell apart.
      const size_t turns = std::size(spots) + (side > 7 ? 0 : 2 * std::size(samples) - 2);
      for (size_t turn = 0; turn < turns; ++turn) {
        const bool small = turn < std::size(spots);
        const Samples& of = samples[small ? 0 : 1 + (turn - std::size(spots)) / 2];
        const auto& places = spots[small ? turn : 2 * ((turn - std::size(spots)) % 2)];
        TestWorld<ZR_PixelFloat> src(300, 70), made(302, 71), expected(302, 71);
        std::mt19937 random(8);
        for (i32 y = 0; y < 70; ++y) {
          const auto channel = [&] {
            return std::ldexp(static_cast<f32>(random() % of.count) * of.unit, -(y % of.darker));
          };
          for (i32 x = 0; x < 300; ++x) src.at(x, y) = {channel(), channel(), channel(), y < 40 ? 0 : -channel()};
        }
        for (const Spot& spot : places) src.at(spot.x, spot.y).green = spot.value;
        // A host that is asked after each row gets rows that were made before.
        ZR_ProgressInfo asking{};
        asking.progress = [](void*, i32, i32) -> i32 { return 0; };
        ASSERT_EQ(ZR_Convolve(turn % 2 == 0 ? nullptr : &asking, src, nullptr, kernel.flags, side, taps[0].data(),
                              taps[1].data(), taps[2].data(), taps[3].data(), made),
                  0);
        model_convolve(src, kernel.flags, side, taps, expected);
        ASSERT_TRUE(made == expected) << Instructions::names[level] << " size " << side << " taps from " << kernel.low
                                      << ", " << places.size() << " spots, multiples of " << of.unit;
      }
    }
  }
}

TYPED_TEST(Convolutions, ProgressIsToldAfterEnoughTaps) {
  using T = TypeParam;
  struct Host {
    std::vector<i32> rows;
    i32 stop_at;
    static i32 progress(void* self, i32 done, i32 total) {
      auto& host = *static_cast<Host*>(self);
      EXPECT_EQ(total, 12);
      host.rows.push_back(done);
      return done == host.stop_at ? 55 : 0;
    }
    static i32 abort(void*) { return 99; }  // never called
  };
  struct Case {
    i32 width, size, stop_at;
    std::vector<i32> rows;
  };
  const Case cases[] = {{76, 3, 0, {3, 6, 9, 12}},  // 684 taps a row
                        {228, 3, 0, {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12}},
                        {76, 1, 0, {}},
                        {76, 3, 6, {3, 6}}};
  for (const Case& c : cases) {
    TestWorld<T> src(c.width, 12), dst(c.width, 12), expected(c.width, 12);
    src.randomise(2);
    const Taps taps(static_cast<size_t>(c.size * c.size), 1), kernels[] = {taps, taps, taps, taps};
    const i32* const k = taps.data();
    model_convolve(src, 2, c.size, kernels, expected);
    Host host{{}, c.stop_at};
    const ZR_ProgressInfo info = {&host, Host::abort, Host::progress};
    EXPECT_EQ(ZR_Convolve(&info, src, nullptr, 2, c.size, k, k, k, k, dst), c.stop_at != 0 ? 55 : 0);
    EXPECT_EQ(host.rows, c.rows);
    const i32 done = c.stop_at != 0 ? c.stop_at : 12;
    EXPECT_TRUE(same_pixel(dst.at(4, done - 1), expected.at(4, done - 1)));
    if (done < 12) {
      EXPECT_TRUE(same_pixel(dst.at(4, done), T{}));
    }
  }
}

TEST_F(Filters, ConvolveRefuses) {
  TestWorld<ZR_Pixel8> src(4, 4), dst(4, 4);
  TestWorld<ZR_Pixel16> deep(4, 4);
  ZR_LayerDef nothing = *src.layer();
  nothing.data = nullptr;
  const Taps one{1};
  const Taps great(65535, std::numeric_limits<i32>::max());
  const i32* const k = one.data();
  struct Case {
    ZR_LayerDef *src, *dst;
    i32 size;
    const i32* kernel;
    u32 code;  // of the report
    bool is_message;
  };
  const Case cases[] = {{nullptr, dst, 1, k, 0x250008, true},
                        {src, nullptr, 1, k, 0x250008, true},
                        {&nothing, dst, 1, k, 0x250008, true},
                        {src, &nothing, 1, k, 0x250008, true},
                        {src, dst, 1, nullptr, 0x250008, true},
                        {src, dst, 2, k, 0x250008, true},
                        {src, dst, 0, k, 0x250008, true},
                        {src, dst, -3, k, 0x250008, true},
                        {src, dst, std::numeric_limits<i32>::min(), k, 0x250008, true},
                        {src, dst, std::numeric_limits<i32>::max(), k, 0x250008, false},
                        {src, deep, 1, k, 0x250008, false}};
  for (const Case& c : cases) {
    EXPECT_EQ(ZR_Convolve(nullptr, c.src, nullptr, 1, c.size, k, k, c.kernel, k, c.dst), 3);
    const auto& reports = c.is_message ? caught.messages() : caught.verifications();
    ASSERT_EQ(reports.size(), 1u) << c.size;
    EXPECT_EQ(reports[0].code, c.code);
    caught.clear();
  }
  EXPECT_EQ(ZR_Convolve(nullptr, src, nullptr, 1, 1, k, k, k, k, deep), 3);
  EXPECT_EQ(caught.take_verification(), "ZR_Convolve requires source and dst worlds to be same depth");
  // The longest row of the greatest taps still fits 64 bits.
  TestWorld<ZR_Pixel16> white(4, 1), made(4, 1);
  white.fill({32768, 32768, 32768, 32768});
  const i32* const g = great.data();
  EXPECT_EQ(ZR_Convolve(nullptr, white, nullptr, 1, 65535, g, g, g, g, made), 0);
  EXPECT_EQ(made.at(0, 0).red, 32768) << "4 * 32768 * (2^31 - 1) / (65535 * 256), kept to white";
}

TEST_F(Filters, GaussianTables) {
  EXPECT_EQ(ZRp_GaussianValue(0), 1.0);
  EXPECT_NEAR(ZRp_GaussianValue(1), 0.000187, 1e-5);
  EXPECT_EQ(ZRp_GaussianValue(1.0000001), 0.0);
  Taps made(26, -77);
  u32 told = 0;
  ASSERT_EQ(ZR_GaussianKernel(nullptr, 2, 0, 1, &told, made.data()), 0);
  EXPECT_EQ(told, 5u);
  EXPECT_EQ(made[12], 255);
  EXPECT_EQ(made[25], -77) << "nothing is written behind the table";
  i32 entry = 5;
  u32 diameter = 6;
  constexpr f64 nan = std::numeric_limits<f64>::quiet_NaN();
  for (const f64 radius : {-1.0, -1e-9, nan, 1e9, 32767.5}) {
    EXPECT_EQ(ZR_GaussianKernel(nullptr, radius, 1, 1, &diameter, &entry), 3) << radius;
    EXPECT_EQ(caught.messages().back().code, 0x25000au);
  }
  EXPECT_EQ(ZR_GaussianKernel(nullptr, 0, 1, 1, nullptr, &entry), 3);
  EXPECT_EQ(ZR_GaussianKernel(nullptr, 0, 1, 1, &diameter, nullptr), 3);
  EXPECT_EQ(entry, 5);
  EXPECT_EQ(diameter, 6u);
}

}  // namespace
