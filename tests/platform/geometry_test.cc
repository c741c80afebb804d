// Rectangles at the ends of their range, matrices, rounding, and the shared tables.
#include <GX/gx.h>
#include <HB/hb.h>

#include <cmath>
#include <limits>
#include <ostream>
#include <random>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

static bool operator==(const GX_LRect& a, const GX_LRect& b) {
  return a.left == b.left && a.top == b.top && a.right == b.right && a.bottom == b.bottom;
}
static std::ostream& operator<<(std::ostream& out, const GX_LRect& r) {
  return out << "(" << r.left << ", " << r.top << ", " << r.right << ", " << r.bottom << ")";
}

namespace {

constexpr i32 lowest = std::numeric_limits<i32>::min(), highest = std::numeric_limits<i32>::max();
constexpr GX_LRect nothing{0, 0, 0, 0}, all{lowest, lowest, highest, highest};

TEST(Rects, SectionAndUnion) {
  const struct {
    GX_LRect a, b, section, both;
  } cases[] = {
      {{0, 0, 10, 10}, {5, 6, 20, 21}, {5, 6, 10, 10}, {0, 0, 20, 21}},
      {{0, 0, 10, 10}, {10, 0, 20, 10}, nothing, {0, 0, 20, 10}},  // they only touch
      {{0, 0, 10, 10}, {2, 3, 4, 5}, {2, 3, 4, 5}, {0, 0, 10, 10}},
      {{0, 0, 10, 10}, {30, 30, 30, 40}, nothing, {0, 0, 10, 10}},  // the second is empty
      {{9, 9, 1, 1}, {2, 2, 3, 3}, nothing, {2, 2, 3, 3}},          // the first is inverted
      {{9, 9, 1, 1}, {7, 7, 2, 2}, nothing, nothing},
      {all, {-3, -3, 3, 3}, {-3, -3, 3, 3}, all},
      {{lowest, 0, lowest + 1, 1}, {highest - 1, 0, highest, 1}, nothing, {lowest, 0, highest, 1}},
  };
  for (const auto& one : cases)
    for (const bool swapped : {false, true}) {
      const GX_LRect &a = swapped ? one.b : one.a, &b = swapped ? one.a : one.b;
      GX_LRect out = a;
      EXPECT_EQ(GX_SectLRect(&out, &b, &out), !(one.section == nothing)) << one.a << one.b;
      EXPECT_EQ(out, one.section) << one.a << one.b;
      out = b;
      GX_UnionLRect(&a, &out, &out);
      EXPECT_EQ(out, one.both) << one.a << one.b;
    }
}

TEST(Rects, InsetStopsAtTheEndsOfTheRange) {
  const struct {
    GX_LRect rect;
    i32 dx, dy;
    GX_LRect result;
  } cases[] = {
      {{0, 0, 10, 20}, 1, 2, {1, 2, 9, 18}},
      {{0, 0, 10, 20}, -1, -2, {-1, -2, 11, 22}},
      {{0, 0, 10, 20}, 6, 0, {6, 0, 4, 20}},
      {{lowest, lowest + 3, highest, highest - 3}, -5, -3, {lowest, lowest, highest, highest}},
      {{5, 5, -5, -5}, lowest, lowest, {lowest + 5, lowest + 5, highest - 4, highest - 4}},
      {{5, -5, -6, -5}, highest, highest, {highest, highest - 5, lowest, lowest}},
  };
  for (const auto& one : cases) {
    GX_LRect rect = one.rect;
    GX_InsetLRect(&rect, one.dx, one.dy);
    EXPECT_EQ(rect, one.result) << one.rect << " by " << one.dx << ", " << one.dy;
  }
}

TEST(Numbers, RoundingGoesAwayFromZeroAtTies) {
  const f64 nan = std::numeric_limits<f64>::quiet_NaN();
  const struct {
    f64 value;
    i32 result;
  } cases[] = {{0.5, 1},
               {-0.5, -1},
               {1.5, 2},
               {2.5, 3},
               {0.49999999999999994, 0},
               {-2.5, -3},
               {2147483647.4, highest},
               {2147483647.5, lowest},
               {-2147483648.4, lowest},
               {1e300, lowest},
               {-1e300, lowest},
               {nan, lowest}};
  for (const auto& one : cases) EXPECT_EQ(GX_RoundDouble(one.value), one.result) << one.value;
  EXPECT_EQ(GX_fmod(-7.5, 2), -1.5);
}

GX_Matrix3 matrix(f64 a, f64 b, f64 c, f64 d, f64 e, f64 f, f64 g = 0, f64 h = 0, f64 i = 1) {
  return {{{a, b, c}, {d, e, f}, {g, h, i}}};
}

TEST(Matrices, KindsAreTold) {
  const struct {
    GX_Matrix3 matrix;
    i32 kind;
  } cases[] = {{matrix(1, 0, 0, 0, 1, 0), GX_MatrixType_Identity},
               {matrix(1, 0, 0, 0, 1, -2), GX_MatrixType_Translation},
               {matrix(1, 0, 5, 0, 2, 0), GX_MatrixType_Scale},
               {matrix(-1, 0, 0, 0, 1, 0), GX_MatrixType_Scale},
               {matrix(1, 0, 0, 0.1, 1, 0), GX_MatrixType_Affine},
               {matrix(1, 0, 0, 0, 1, 0, 0, 1e-9), GX_MatrixType_Perspective},
               {matrix(1, 0, 0, 0, 1, 0, 0, 0, 2), GX_MatrixType_Perspective},
               {matrix(1, 0, 0, 0, 1, 0, 0, 0, NAN), GX_MatrixType_Perspective}};
  for (const auto& one : cases) EXPECT_EQ(GX_GetMatrixType(&one.matrix), one.kind);
}

TEST(Matrices, ConcatAppliesTheFirstFirst) {
  const GX_Matrix3 scale = matrix(2, 0, 0, 0, 3, 0), move = matrix(1, 0, 10, 0, 1, 20);
  GX_Matrix3 both = scale;
  GX_ConcatMatrix(&both, &move, &both);
  GX_FloatPoint point{1, 1};
  GX_TransformFloatPoints(&both, &point, 1);
  EXPECT_EQ(point.x, 12);
  EXPECT_EQ(point.y, 23);
}

TEST(Matrices, TheInverseLeadsBack) {
  std::mt19937 random(4);
  std::uniform_real_distribution<f64> any(-3, 3);
  GX_Matrix3 identity;
  GX_IdentityMatrix(&identity);
  for (i32 round = 0; round < 200; ++round) {
    GX_Matrix3 m;
    for (auto& row : m.m)
      for (f64& element : row) element = any(random);
    for (i32 i = 0; i < 3; ++i) m.m[i][i] += m.m[i][i] < 0 ? -7 : 7;  // far from singular
    GX_Matrix3 inverse = m, product;
    ASSERT_EQ(GX_InverseMatrixQuiet(&inverse, &inverse), 0);
    GX_ConcatMatrix(&m, &inverse, &product);
    EXPECT_TRUE(GX_EqualMatrixWithinEpsilon(&product, &identity, 1e-12));
    EXPECT_FALSE(GX_EqualMatrixWithinEpsilon(&m, &identity, 1e-12));
  }
}

TEST(Matrices, SingularOnesAreLeftAlone) {
  const f64 infinity = std::numeric_limits<f64>::infinity();
  const GX_Matrix3 cases[] = {matrix(0, 0, 0, 0, 1, 0),          matrix(1, 2, 3, 2, 4, 6),
                              matrix(1, 0, 0, 0, 1, 0, 0, 0, 0), matrix(infinity, 0, 0, 0, 1, 0),
                              matrix(NAN, 0, 0, 0, 1, 0),        matrix(1e200, 0, 0, 0, 1e200, 0)};
  for (const GX_Matrix3& one : cases) {
    GX_Matrix3 out = matrix(1, 2, 3, 4, 5, 6);
    EXPECT_NE(GX_InverseMatrixQuiet(&one, &out), 0);
    EXPECT_EQ(out.m[1][2], 6);
  }
  GX_Matrix3 out;
  const GX_Matrix3 tiny = matrix(1e-150, 0, 0, 0, 1e-150, 0);
  EXPECT_EQ(GX_InverseMatrixQuiet(&tiny, &out), 0) << "small is not singular";
  EXPECT_DOUBLE_EQ(out.m[0][0], 1e150);
}

TEST(Matrices, PointsVectorsAndBoxes) {
  const GX_Matrix3 turned = matrix(0, -2, 10, 3, 0, 20);
  const GX_FloatRect rect{1, 2, 5, 4};
  GX_FloatRect box = rect;
  GX_TransformFloatRect(&turned, &box, &box);
  EXPECT_EQ(box.left, 2);
  EXPECT_EQ(box.right, 6);
  EXPECT_EQ(box.top, 23);
  EXPECT_EQ(box.bottom, 35);
  f64 vector[3] = {1, 2, 0};
  GX_TransformVector3(&turned, vector, vector);
  EXPECT_EQ(vector[0], -4);
  EXPECT_EQ(vector[1], 3) << "no translation";
  EXPECT_EQ(vector[2], 0);
  const GX_Matrix3 halved = matrix(1, 0, 4, 0, 1, 8, 0, 0, 2);
  GX_FloatPoint points[2] = {{2, 4}, {0, 0}}, divided;
  GX_Matrix3_TransformPointAndDivide(&halved, &points[0], &divided);
  GX_TransformFloatPoints(&halved, points, 2);
  EXPECT_EQ(points[0].x, 3);
  EXPECT_EQ(points[0].y, 6);
  EXPECT_EQ(divided.x, 3);
  EXPECT_EQ(points[1].y, 4);
}

TEST(ByteTables, HoldTheirFormulasForEveryPair) {
  const u8 *multiply = nullptr, *divide = nullptr;
  ASSERT_EQ(GX_PrepareFCMD(1, 0, 0, &multiply, &divide), 0);
  for (u32 row = 0; row <= 255; ++row)
    for (u32 column = 0; column <= 255; ++column) {
      const u32 at = row * 256 + column;
      ASSERT_EQ(multiply[at], (2 * row * column + 255) / 510) << row << " * " << column;
      ASSERT_EQ(divide[at], column >= row ? 255 : (510 * column + row) / (2 * row)) << column << " / " << row;
    }
  const struct {
    const u8* table;
    u32 row, column, result;
  } by_hand[] = {{multiply, 255, 255, 255}, {multiply, 128, 128, 64}, {multiply, 1, 127, 0}, {multiply, 1, 128, 1},
                 {divide, 0, 0, 255},       {divide, 1, 0, 0},        {divide, 127, 1, 2},   {divide, 254, 253, 254},
                 {divide, 2, 1, 128},       {divide, 255, 77, 77}};
  for (const auto& one : by_hand) EXPECT_EQ(one.table[one.row * 256 + one.column], one.result);
  EXPECT_EQ(GX_UnprepareFCMD(), 0);
}

TEST(TrigTable, HoldsTheSine) {
  const void* table = nullptr;
  ASSERT_EQ(GX_PrepareFTrig(1, 0, 0, &table), 0);
  const f64* const sine = static_cast<const f64*>(table);
  for (i32 i = 0; i <= GX_FTrigSteps; ++i) {
    ASSERT_NEAR(sine[i], std::sin(2 * M_PI * i / GX_FTrigSteps), 1e-15) << i;
    ASSERT_EQ(sine[i], -sine[GX_FTrigSteps - i]) << i;
  }
  EXPECT_EQ(GX_UnprepareFTrig(), 0);
}

TEST(SharedTables, LiveWhileSomebodyHasThem) {
  const auto live = [] {
    HB_MemoryStats now;
    HB_GetMemoryStats(&now);
    return now.live_blocks;
  };
  const u64 before = live();
  EXPECT_EQ(GX_UnprepareFCMD(), 0);  // nobody has prepared
  EXPECT_EQ(GX_UnprepareFTrig(), 0);
  const u8 *first = nullptr, *second = nullptr, *divide = nullptr;
  ASSERT_EQ(GX_PrepareFCMD(1, 0, 0, &first, nullptr), 0);
  ASSERT_EQ(GX_PrepareFCMD(1, 0, 0, &second, &divide), 0);
  EXPECT_EQ(first, second);
  GX_UnprepareFCMD();
  EXPECT_EQ(first[65535], 255) << "one holder is left";
  EXPECT_EQ(live(), before + 1);
  GX_UnprepareFCMD();
  EXPECT_EQ(live(), before);
  std::vector<std::thread> threads;
  for (i32 t = 0; t < 4; ++t)
    threads.emplace_back([] {
      for (i32 i = 0; i < 50; ++i) {
        const u8* multiply = nullptr;
        ASSERT_EQ(GX_PrepareFCMD(1, 0, 0, &multiply, nullptr), 0);
        ASSERT_EQ(multiply[65535], 255);
        GX_UnprepareFCMD();
      }
    });
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(live(), before);
}

}  // namespace
