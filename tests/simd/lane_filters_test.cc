// Filters of small worlds between pages that cannot be read, on every instruction set: all widths from 1 to 130, rows
// with padding and rows from the bottom up.
#include <ZR/blur.h>

#include <functional>
#include <vector>

#include "support/born_library.h"
#include "support/edge_rows.h"

namespace {

constexpr i32 widest = 130, height = 9;

template <class T>
class LaneFilters : public BornLibrary {
 protected:
  // Rows of a world at an edge; without padding behind the last one.
  struct Place {
    const char* name;
    i32 padding;  // pixels
    bool upward, at_end;
  };
  static ZR_WorldX<T> world(EdgeRow& memory, i32 width, const Place& place) {
    const i32 row = width + place.padding, bytes = row * static_cast<i32>(sizeof(T));
    T* const first = memory.at<T>(row * (height - 1) + width, place.at_end);
    return {place.upward ? first + row * (height - 1) : first, width, height, place.upward ? -bytes : bytes};
  }

  EdgeRow src_{16}, dst_{16};
  std::mt19937 random_{6};
};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(LaneFilters, Depths);

TYPED_TEST(LaneFilters, StayInTheirWorlds) {
  using T = TypeParam;
  using World = ZR_WorldX<T>;
  const typename TestFixture::Place places[] = {{"at the end", 0, false, true},
                                                {"padded, at the start", 3, false, false},
                                                {"upward, at the end", 0, true, true},
                                                {"upward, padded, at the start", 5, true, false}};
  const std::vector<i32> even(25, 3), deep(25, 70000),
      ramp = {1, -2, 30, -2, 1, 0, 9, 0, 5, 2, 0, 0, 1, 7, -8, 2, 2, 4, 2, 2, 1, 1, 3, 1, 1};
  const auto box = [](f32 radius, u32 iterations, bool down) {
    return [=](World& s, World& d) {
      ZR_BoxBlur1D(nullptr, &s, radius, iterations, 15, down, true, down, true, false, &d);
    };
  };
  const auto bell = [](f32 radius, bool down) {
    return [=](World& s, World& d) { ZR_GaussianBlur1D(nullptr, &s, radius, 15, down, true, down, true, false, &d); };
  };
  const auto convolve = [](const std::vector<i32>& taps, i32 size) {
    return [&taps, size](World& s, World& d) {
      const i32* const k = taps.data();
      ASSERT_EQ(ZR_Convolve(nullptr, &s, nullptr, 2, size, k, k, k, k, &d), 0);
    };
  };
  struct Filter {
    const char* name;
    std::function<void(World&, World&)> run;
  };
  const Filter filters[] = {{"box of rows", box(2, 1, false)},           {"box of columns", box(3, 1, true)},
                            {"part of a box", box(1.3f, 2, true)},       {"bell of rows", bell(2, false)},
                            {"bell of columns", bell(1.5f, true)},       {"even kernel", convolve(even, 3)},
                            {"kernel of many kinds", convolve(ramp, 5)}, {"kernel beyond 16 bits", convolve(deep, 5)}};
  for (i32 width = 1; width <= widest; ++width) {
    const auto& place = places[width % 4];
    World src = this->world(this->src_, width, place), dst = this->world(this->dst_, width, place);
    const bool whole = width % 8 < 4;  // samples that floats sum exactly
    for (i32 y = 0; y < height; ++y) {
      fill_edgy(this->random_, width, src.At(0, y));
      if constexpr (sizeof(T) == 16)
        for (i32 x = 0; whole && x < width; ++x) *src.At(x, y) = {1, 0.5f, static_cast<f32>(x) / 256, 0.25f};
    }
    for (const Filter& filter : filters) {
      std::vector<T> expected;
      for (int level = 0; level < 4 && Instructions::has(level); ++level) {
        std::vector<T> made;
        {
          const Instructions instructions(level);
          filter.run(src, dst);
        }
        for (i32 y = 0; y < height; ++y) made.insert(made.end(), dst.At(0, y), dst.At(0, y) + width);
        if (level == 0) expected = made;
        for (std::size_t i = 0; i < made.size(); ++i)
          ASSERT_TRUE(same_pixel(made[i], expected[i]))
              << filter.name << " " << place.name << " by " << Instructions::names[level] << ", width " << width
              << ", pixel " << i;
      }
    }
  }
}

}  // namespace
