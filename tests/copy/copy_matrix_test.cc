// Copies through a matrix against the exact position of every pixel.
#include <GX/gx.h>
#include <ZR/copy_bits.h>
#include <gtest/gtest.h>

#include <array>
#include <limits>
#include <tuple>

#include "copy/copy_model.h"
#include "support/born_library.h"
#include "support/worlds.h"

namespace {

constexpr f64 nan = std::numeric_limits<f64>::quiet_NaN(), inf = std::numeric_limits<f64>::infinity();

struct Row {
  const char* name;
  GX_Matrix3 forward;
  enum { drawn, cleared, anything } result = drawn;  // cleared: the clip and no more
};
const Row rows[] = {
    {"identity", {{{1, 0, 0}, {0, 1, 0}, {0, 0, 1}}}},
    {"moved", {{{1, 0, 3}, {0, 1, -2}, {0, 0, 1}}}},
    {"moved by a fraction", {{{1, 0, 0.7}, {0, 1, 1.2}, {0, 0, 1}}}},
    {"enlarged", {{{2.31, 0, -1.13}, {0, 1.91, 0.33}, {0, 0, 1}}}},
    {"reduced", {{{0.37, 0, 2}, {0, 0.6, 1}, {0, 0, 1}}}},
    {"mirrored", {{{-1, 0, 11.25}, {0, 1, 1}, {0, 0, 1}}}},
    {"rotated", {{{0.866, -0.5, 5.1}, {0.5, 0.866, -2.3}, {0, 0, 1}}}},
    {"upright", {{{0, -1, 9.1}, {1, 0, 2.2}, {0, 0, 1}}}},
    {"skewed", {{{1.01, 0.83, -1.13}, {0.107, 1.21, 0.23}, {0, 0, 1}}}},
    {"far away", {{{1, 0, 5000}, {0, 1, 0}, {0, 0, 1}}}, Row::cleared},
    {"singular", {{{1, 2, 0}, {2, 4, 0}, {0, 0, 1}}}, Row::cleared},
    {"zero", {{{0, 0, 0}, {0, 0, 0}, {0, 0, 0}}}, Row::cleared},
    {"no number", {{{nan, 0, 0}, {0, 1, 0}, {0, 0, 1}}}, Row::cleared},
    {"infinite", {{{inf, 0, 0}, {0, 1, 0}, {0, 0, 1}}}, Row::cleared},
    {"collapsed", {{{1e-6, 0, 4}, {0, 1, 0}, {0, 0, 1}}}, Row::cleared},
    {"tiny", {{{1e-4, 0, 4}, {0, 2e-5, 4}, {0, 0, 1}}}, Row::anything},  // positions wrap along a row
    {"huge", {{{1e12, 0, 4}, {0, 1e300, 4}, {0, 0, 1}}}, Row::anything},
    {"perspective", {{{1, 0, 1}, {0, 1, 1}, {0.05, -0.02, 1}}}, Row::anything},
};

template <class To, class From>
void check(const Row& row, bool src2dst, const GX_LRect* clip, CaughtMessages& caught) {
  TestWorld<From> src(8, 7, 1);
  TestWorld<To> dst(12, 10, clip != nullptr ? 0 : 2);
  src.randomise(1);
  dst.randomise(2);
  TestWorld<To> expected = dst;
  GX_Matrix3 inverse{};
  GX_InverseMatrixQuiet(&row.forward, &inverse);
  const GX_LRect all = {0, 0, 12, 10};
  GX_LRect area = all;
  if (clip != nullptr) GX_SectLRect(&all, clip, &area);
  i32 doubtful = 0;
  for (i32 y = 0; y < 10; ++y)
    for (i32 x = 0; x < 12; ++x) {
      const bool clipped = x < area.left || x >= area.right || y < area.top || y >= area.bottom;
      if (clipped && (row.result == Row::cleared || GX_EmptyLRect(&area))) continue;
      To& out = expected.at(x, y) = To{};
      if (clipped || row.result == Row::cleared) continue;
      const auto position = [&](int i) {
        return inverse.m[i][0] * (x + 0.5) + inverse.m[i][1] * (y + 0.5) + inverse.m[i][2];
      };
      const f64 sx = position(0), sy = position(1);  // pixel n is seen from n up to n + 1
      constexpr f64 rounding = 12 * 2.0 / 65536;
      const auto near_edge = [&](f64 v) { return std::abs(v - std::round(v)) < rounding; };
      if (near_edge(sx) || near_edge(sy)) {
        ++doubtful;
        out = dst.at(x, y);  // either side will do: taken over below
      } else if (sx >= 0 && sx < 8 && sy >= 0 && sy < 7) {
        out = copy_model::convert<To>(src.at(static_cast<i32>(sx), static_cast<i32>(sy)));
      }
    }
  const GX_Matrix3& given = src2dst ? row.forward : inverse;
  ASSERT_EQ(ZR_CopyBits3_LO_Straight(nullptr, src, src2dst || row.result != Row::drawn ? &row.forward : &given,
                                     src2dst || row.result != Row::drawn, clip, dst),
            0)
      << row.name;
  ASSERT_TRUE(dst.guards_intact()) << row.name;
  ASSERT_TRUE(caught.quiet()) << row.name;
  if (row.result == Row::anything) return;
  ASSERT_LT(doubtful, 2) << row.name;
  i32 wrong = 0;
  for (i32 y = 0; y < 10; ++y)
    for (i32 x = 0; x < 12; ++x) wrong += std::memcmp(&dst.at(x, y), &expected.at(x, y), sizeof(To)) != 0;
  ASSERT_LE(wrong, doubtful) << row.name << (src2dst ? " forward" : " inverse") << (clip != nullptr ? " clipped" : "");
}

TEST_F(BornLibrary, MatrixCopy) {
  const GX_LRect full_rows = {0, 2, 12, 7}, part = {-3, 1, 9, 20}, empty = {5, 5, 5, 9}, outside = {12, 0, 20, 10};
  for (const Row& row : rows)
    for (const bool src2dst : {true, false})
      for (const GX_LRect* clip : {static_cast<const GX_LRect*>(nullptr), &full_rows, &part, &empty, &outside}) {
        check<ZR_Pixel8, ZR_Pixel8>(row, src2dst, clip, caught);
        check<ZR_Pixel8, ZR_Pixel16>(row, src2dst, clip, caught);
        check<ZR_Pixel8, ZR_PixelFloat>(row, src2dst, clip, caught);
        check<ZR_Pixel16, ZR_Pixel8>(row, src2dst, clip, caught);
        check<ZR_Pixel16, ZR_Pixel16>(row, src2dst, clip, caught);
        check<ZR_Pixel16, ZR_PixelFloat>(row, src2dst, clip, caught);
        check<ZR_PixelFloat, ZR_Pixel8>(row, src2dst, clip, caught);
        check<ZR_PixelFloat, ZR_Pixel16>(row, src2dst, clip, caught);
        check<ZR_PixelFloat, ZR_PixelFloat>(row, src2dst, clip, caught);
      }
}

}  // namespace
