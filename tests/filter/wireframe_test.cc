// Wireframes: outlines that enclose exactly the pixels they were traced from, transforms, and failing memory.
#include <SEQ/seq.h>
#include <ZR/drawing.h>

#include <cmath>
#include <vector>

#include "support/born_library.h"
#include "support/worlds.h"

namespace {

class Wireframes : public BornLibrary {};

struct Traced {
  ZR_Wireframe frame{};
  ~Traced() { ZR_DisposeWireframe(&frame); }
  std::vector<std::vector<ZR_WireframePoint>> loops() const {
    std::vector<std::vector<ZR_WireframePoint>> all;
    i32 count = 0;
    for (i32 i = 0; const ZR_WireframePoint* const loop = ZR_GetWireframeLoop(&frame, i, &count); ++i)
      all.emplace_back(loop, loop + count);
    return all;
  }
};

// Whether a pixel's centre lies inside, by the crossings of a ray to its left with all loops.
bool encloses(const Traced& traced, i32 x, i32 y) {
  bool inside = false;
  for (const auto& loop : traced.loops())
    for (size_t i = 0; i < loop.size(); ++i) {
      const auto &a = loop[i], &b = loop[(i + 1) % loop.size()];
      if ((a.y <= y) == (b.y <= y)) continue;
      const f64 at = a.x + (y + 0.5 - a.y) * (b.x - a.x) / (b.y - a.y);
      inside ^= at < x + 0.5;
    }
  return inside;
}

template <class T>
void expect_exact(TestWorld<T>& world, const GX_LRect* rect, u32 flags) {
  Traced traced;
  ASSERT_EQ(ZR_GenerateWireframe(nullptr, world, rect, 1, flags, 5, &traced.frame), 0);
  EXPECT_EQ(traced.frame.kind, 5);
  EXPECT_EQ(traced.frame.point_count, SEQ_GetCount(traced.frame.points));
  for (i32 y = 0; y < world.height(); ++y)
    for (i32 x = 0; x < world.width(); ++x) {
      const auto alpha = world.at(x, y).alpha;
      const bool in_rect =
          rect == nullptr || (x >= rect->left && x < rect->right && y >= rect->top && y < rect->bottom);
      ASSERT_EQ(encloses(traced, x, y), in_rect && (flags != 0 ? alpha > 0 : alpha >= zr::Depth<T>::half))
          << x << "," << y;
    }
  for (const auto& loop : traced.loops())
    for (size_t i = 0; i < loop.size(); ++i) {
      const auto &a = loop[i], &b = loop[(i + 1) % loop.size()], &c = loop[(i + 2) % loop.size()];
      ASSERT_TRUE((a.x == b.x) != (a.y == b.y)) << "edges follow the edges of pixels";
      ASSERT_TRUE((a.x == b.x) != (b.x == c.x)) << "and turn at each point";
    }
}

TEST_F(Wireframes, EncloseThePixelsTheyWereTracedFrom) {
  const GX_LRect part = {-3, 2, 19, 100}, nothing = {5, 5, 5, 9};
  for (u32 seed = 0; seed < 12; ++seed) {
    TestWorld<ZR_Pixel8> eight(23, 14);
    TestWorld<ZR_Pixel16> sixteen(23, 14);
    TestWorld<ZR_PixelFloat> real(23, 14);
    eight.randomise(seed);
    sixteen.randomise(seed + 100);
    real.randomise(seed + 200);
    for (const u32 flags : {0u, 16u})
      for (const GX_LRect* const rect : {static_cast<const GX_LRect*>(nullptr), &part, &nothing}) {
        expect_exact(eight, rect, flags);
        expect_exact(sixteen, rect, flags);
        expect_exact(real, rect, flags);
      }
  }
}

TEST_F(Wireframes, OfARingWithGreaterSteps) {
  TestWorld<ZR_Pixel8> world(120, 90);
  const auto radius = [](i32 x, i32 y) { return std::hypot(x + 0.5 - 60, y + 0.5 - 45); };
  for (i32 y = 0; y < 90; ++y)
    for (i32 x = 0; x < 120; ++x)
      if (radius(x, y) < 40 && radius(x, y) > 15) world.at(x, y).alpha = 255;
  i32 points = INT32_MAX;
  for (const i32 step : {0, 1, 3, 7}) {
    Traced traced;
    ASSERT_EQ(ZR_GenerateWireframe(nullptr, world, nullptr, step, 0, 0, &traced.frame), 0);
    EXPECT_EQ(traced.loops().size(), 2u) << "the outline and the hole";
    EXPECT_TRUE(step <= 1 ? traced.frame.point_count <= points : traced.frame.point_count < points);
    points = traced.frame.point_count;
    for (i32 y = 0; y < 90; ++y)
      for (i32 x = 0; x < 120; ++x) {
        const f64 to_edge = std::min(std::abs(radius(x, y) - 40), std::abs(radius(x, y) - 15));
        if (to_edge > step + 1) {
          ASSERT_EQ(encloses(traced, x, y), world.at(x, y).alpha != 0) << x << "," << y;
        }
      }
  }
}

TEST_F(Wireframes, GoThroughMatrices) {
  TestWorld<ZR_Pixel8> world(4, 4);
  world.at(1, 1).alpha = world.at(2, 3).alpha = 255;
  Traced src, moved, flat, deep;
  ASSERT_EQ(ZR_GenerateWireframe(nullptr, world, nullptr, 1, 0, 8, &src.frame), 0);
  ASSERT_EQ(src.frame.point_count, 8);
  const GX_Matrix3 turn = {{{0, -2.5, 100}, {2.5, 0, -7}, {0, 0, 1}}}, away = {{{1, 0, 0}, {0, 1, 0}, {1, 0, -1}}};
  ASSERT_EQ(ZR_TransformWireframe2D(nullptr, &src.frame, nullptr, &turn, nullptr, &flat.frame), 0);
  ASSERT_EQ(ZR_TransformWireframe3D(nullptr, &src.frame, nullptr, &turn, nullptr, &deep.frame), 0);
  EXPECT_EQ(flat.frame.kind, 8);
  ASSERT_EQ(flat.loops().size(), 2u);
  EXPECT_EQ(deep.loops().size(), 2u);
  const auto p = src.loops()[1][2], q = flat.loops()[1][2], r = deep.loops()[1][2];
  EXPECT_EQ(q.x, std::lround(100 - 2.5 * p.y));
  EXPECT_EQ(q.y, std::lround(2.5 * p.x - 7));
  EXPECT_TRUE(r.x == q.x && r.y == q.y);
  // Onto the vanishing line: held to the range. In place, and null, which copies.
  EXPECT_EQ(ZR_TransformWireframe2D(nullptr, &src.frame, nullptr, &away, &deep.frame, nullptr), 0);
  EXPECT_EQ(deep.loops()[0][0].x, INT16_MAX) << "1 / 0";
  EXPECT_EQ(ZR_TransformWireframe3D(nullptr, &deep.frame, nullptr, nullptr, &flat.frame, nullptr), 0);
  EXPECT_EQ(flat.loops()[0][0].x, INT16_MAX);
  EXPECT_EQ(ZR_TransformWireframe2D(nullptr, &src.frame, nullptr, &turn, &src.frame, nullptr), 0);
  EXPECT_TRUE(src.loops()[1][2].x == q.x && src.loops()[1][2].y == q.y);

  ASSERT_EQ(ZR_AllocWireframe(7, 1, &moved.frame), 0);
  EXPECT_EQ(moved.loops().size(), 1u) << "without a list of loops there is one";
  EXPECT_EQ(ZR_TransformWireframe2D(nullptr, &src.frame, nullptr, &turn, &moved.frame, nullptr), 3) << "7 points for 8";
  EXPECT_EQ(ZR_TransformWireframe2D(nullptr, nullptr, nullptr, &turn, &moved.frame, nullptr), 3);
  EXPECT_EQ(ZR_TransformWireframe2D(nullptr, &src.frame, nullptr, &turn, nullptr, nullptr), 3);
}

TEST_F(Wireframes, FailingMemoryAndBadInput) {
  TestWorld<ZR_Pixel8> world(50, 40);
  world.randomise(2);
  i32 failures = 0, error = 4;
  Traced src;
  ASSERT_EQ(ZR_GenerateWireframe(nullptr, world, nullptr, 2, 0, 0, &src.frame), 0);
  for (u64 n = 1; error != 0; ++n, ++failures) {
    Traced traced, moved;
    HB_FailNthAllocation(n);
    error = ZR_GenerateWireframe(nullptr, world, nullptr, 2, 0, 0, &traced.frame);
    if (error == 0) error = ZR_TransformWireframe2D(nullptr, &src.frame, nullptr, nullptr, nullptr, &moved.frame);
    HB_FailNthAllocation(0);
    if (error == 0) break;
    ASSERT_EQ(error, 4);
    EXPECT_EQ(moved.frame.points, nullptr) << "cleared";
  }
  EXPECT_GT(failures, 10);
  caught.clear();
  ZR_Wireframe frame{};
  EXPECT_EQ(ZR_GenerateWireframe(nullptr, nullptr, nullptr, 1, 0, 0, &frame), 3);
  EXPECT_EQ(ZR_GenerateWireframe(nullptr, world, nullptr, 1, 0, 0, nullptr), 3);
  EXPECT_EQ(ZR_AllocWireframe(-1, 0, &frame), 516);
  EXPECT_EQ(ZR_DisposeWireframe(&frame), 0);
  EXPECT_EQ(ZR_DisposeWireframe(nullptr), 3);
  i32 count = 5;
  EXPECT_EQ(ZR_GetWireframeLoop(&frame, 0, &count), nullptr);
  EXPECT_EQ(count, 0);
}

}  // namespace
