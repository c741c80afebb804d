// Summed-area tables that threads fill in bands of blocks, beside those that single numbers fill row by row.
#include <ZR/hostkit.h>
#include <ZR/slots.h>
#include <ZR/summed_area.h>

#include <algorithm>
#include <random>
#include <vector>

#include "support/born_library.h"
#include "support/edge_rows.h"
#include "support/table_numbers.h"
#include "support/worlds.h"

namespace {

class BandsOfBlocks : public testing::TestWithParam<int> {
 protected:
  zr::Hostkit host{{.threads = GetParam()}};
};
INSTANTIATE_TEST_SUITE_P(Threads, BandsOfBlocks, testing::Values(1, 2, 3, 7));

template <class T>
void expect_same(std::mt19937& random) {
  const i32 width = 1 + static_cast<i32>(random() % 900), height = 1 + static_cast<i32>(random() % 300);
  TestWorld<T> world(width, height);
  world.randomise(static_cast<u32>(random()));
  // Opaque above and on the left, but for a few pixels, and in groups of rows below.
  const i32 opaque_columns = random() % 2 == 0 ? width : static_cast<i32>(random() % 900);
  for (i32 y = 0; y < height; ++y)
    for (i32 x = 0; x < std::min(width, opaque_columns); ++x)
      if (y < height / 2 ? random() % 20000 != 0 : y / 8 % 3 != 0)
        world.at(x, y).alpha = static_cast<zr::Channel<T>>(zr::Depth<T>::white);
  const ZR_WorldX<T> source(world.layer(), true);
  const bool use_double = random() % 2 == 0;
  std::vector<f64> expected;
  for (int level = 0; level < 4 && Instructions::has(level); ++level) {
    const Instructions instructions(level);
    const std::vector<f64> got = numbers_of(ZR_SummedAreaTable(&source, use_double), width * height);
    if (level == 0) expected = got;
    ASSERT_EQ(std::memcmp(got.data(), expected.data(), got.size() * sizeof(f64)), 0)
        << Instructions::names[level] << ", " << width << "x" << height << ", " << zr::Depth<T>::bits << " bits";
  }
}

TEST_P(BandsOfBlocks, FillTheTableOfOneThread) {
  std::mt19937 random(41);
  for (int round = 0; round < 6; ++round) {
    expect_same<ZR_Pixel8>(random);
    expect_same<ZR_Pixel16>(random);
    expect_same<ZR_PixelFloat>(random);
  }
  const SlotOverride order(ZR_Slot_iterate_generic, reinterpret_cast<void*>(&iterate_backwards));
  expect_same<ZR_Pixel8>(random);
}

// A body that fails leaves no table and no frame behind.
TEST_P(BandsOfBlocks, FailLikeTheIterator) {
  const SlotOverride fails(ZR_Slot_iterate_generic,
                           reinterpret_cast<void*>(+[](i32, void*, ZR_GenericFunc) -> i32 { return 4711; }));
  TestWorld<ZR_Pixel16> world(700, 200);
  const ZR_WorldX<ZR_Pixel16> source(world.layer(), true);
  if (GetParam() > 1)
    EXPECT_THROW(ZR_SummedAreaTable(&source, false), i32);
  else
    EXPECT_NO_THROW(ZR_SummedAreaTable(&source, false));
}

}  // namespace
