// Mask rows against a model that decides each cell by itself.
#include "copy/track_matte.h"

#include <gtest/gtest.h>

#include <limits>
#include <random>
#include <vector>

#include "support/mask_model.h"
#include "support/worlds.h"

namespace {

constexpr i32 lowest = std::numeric_limits<i32>::min(), highest = std::numeric_limits<i32>::max();

template <class T>
class MaskRows : public testing::Test {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(MaskRows, Depths);

// The integer depths by their export, float by the function behind it.
template <class T>
void prepare(u32 count, const T* src, i32 offset, i32 length, u32 kind, T* out) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    zr::prepare_mask_row<T>(count, src, offset, length, kind, out);
  else
    EXPECT_EQ(ZR_PrepTrackMatteUniv(count, src, offset, length, kind, std::is_same_v<T, ZR_Pixel16>, out), 0);
}

TYPED_TEST(MaskRows, EveryOffsetAndLength) {
  using T = TypeParam;
  constexpr i32 longest = 19;
  TestWorld<T> source(longest, 1);
  source.randomise(7);
  for (u32 kind = 0; kind < 4; ++kind)
    for (i32 count : {0, 1, 2, 9, 17})
      for (i32 length : {-3, 0, 1, 8, longest})
        for (i32 offset : {lowest, -longest - 1, -longest, -8, -1, 0, 1, 7, 16, 17, 18, highest}) {
          TestWorld<T> out(count, 1);
          out.randomise(3);
          TestWorld<T> expected = out;
          for (i32 i = 0; i < count; ++i) {
            const i64 column = static_cast<i64>(i) - offset;
            const zr::Channel<T> outside =
                (kind & 1) != 0 ? static_cast<zr::Channel<T>>(zr::Depth<T>::white) : zr::Channel<T>{0};
            expected.at(i, 0).alpha =
                column >= 0 && column < length ? mask_value(source.at(static_cast<i32>(column), 0), kind) : outside;
          }
          prepare<T>(static_cast<u32>(count), &source.at(0, 0), offset, length, kind, &out.at(0, 0));
          ASSERT_TRUE(out == expected && out.guards_intact())
              << "kind " << kind << " count " << count << " length " << length << " offset " << offset;
        }
}

TYPED_TEST(MaskRows, RowsOfAMaskWorld) {
  using T = TypeParam;
  TestWorld<T> world(4, 3);
  world.randomise(11);
  for (u32 kind = 0; kind < 4; ++kind) {
    const ZR_MaskWorld mask = {*world.layer(), 10, 20, kind | 0x40};  // only the low two bits count
    std::vector<T> cells(6);
    EXPECT_EQ(zr::mask_row<T>(mask, 12, 21, 2, cells.data()) == &world.at(2, 1), kind == 0);
    for (i32 y : {lowest, 19, 23, highest}) {
      const T* const row = zr::mask_row<T>(mask, 8, y, 6, cells.data());
      for (i32 i = 0; i < 6; ++i) EXPECT_EQ(row[i].alpha, zr::Depth<T>::white) << "kind " << kind << " row " << y;
    }
    if (kind == 0) continue;
    const T* const row = zr::mask_row<T>(mask, 9, 22, 6, cells.data());
    EXPECT_EQ(row[0].alpha, (kind & 1) != 0 ? zr::Depth<T>::white : 0);
    EXPECT_EQ(row[1].alpha, mask_value(world.at(0, 2), kind));
    EXPECT_EQ(row[4].alpha, mask_value(world.at(3, 2), kind));
    EXPECT_EQ(row[5].alpha, row[0].alpha);
  }
}

TEST(MaskRowValues, KnownCells) {
  const struct {
    ZR_Pixel16 cell;
    u32 kind;
    u16 expected;
  } table[] = {{{32768, 0, 0, 0}, 1, 0},
               {{40000, 0, 0, 0}, 1, 58304},  // out of range wraps
               {{32768, 32768, 32768, 32768}, 2, 32768},
               {{32768, 32768, 32768, 32768}, 3, 0}};
  for (const auto& row : table) {
    ZR_Pixel16 out{};
    ZR_PrepTrackMatteUniv(1, &row.cell, 0, 1, row.kind, true, &out);
    EXPECT_EQ(out.alpha, row.expected) << row.cell.alpha << " kind " << row.kind;
  }
}

}  // namespace
