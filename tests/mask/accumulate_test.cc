// Combined masks against the steps written down plainly: modes, depths, rectangles, points, opacity.
#include <cmath>

#include "mask/masks.h"

namespace {

struct Place {
  const char* name;
  GX_LRect rect;
  GX_LPoint point;
};
constexpr Place places[] = {
    {"all", {0, 0, 37, 23}, {0, 0}},
    {"inside", {3, 4, 20, 11}, {9, 6}},
    {"beyond the source", {-5, -3, 90, 80}, {-5, -3}},
    {"beyond the target", {2, 1, 30, 20}, {-4, 18}},
    {"half of the target", {0, 0, 20, 23}, {0, 0}},
    {"missing the target", {0, 0, 10, 10}, {400, 0}},
    {"empty", {8, 8, 8, 4}, {8, 8}},
    {"at the ends of numbers", {INT32_MIN, INT32_MIN, INT32_MAX, INT32_MAX}, {INT32_MIN + 3, INT32_MIN + 2}},
    {"far off", {0, 0, 5, 5}, {INT32_MAX, INT32_MIN}},
};
constexpr struct { f32 opacity, ceiling; } scales[] = {{1, 1}, {0.5f, 1}, {1, 0.25f}, {0.3f, 0.7f}, {0, 1}, {1, 0}};

// What becomes of `dst`, of which `under` are the values before.
template <class S, class D>
std::vector<D> expected(const Mask<S>& src, i32 mode, f32 opacity, f32 ceiling, const Place& at, const Mask<D>& under,
                        const Mask<D>& dst) {
  using PS = Plain<S>;
  using PD = Plain<D>;
  const f32 white = white_of<S>;
  const auto n = static_cast<typename PS::N>(sizeof(S) == 4 ? opacity : std::floor(opacity * white + 0.5f));
  const auto c = static_cast<S>(sizeof(S) == 4 ? ceiling : std::ceil(ceiling * white));
  std::vector<D> made = dst.all();
  std::vector<bool> touched(made.size());
  bool any = false;
  for (i32 y = 0; y < dst.height; ++y)
    for (i32 x = 0; x < dst.width; ++x) {
      const i64 sx = i64{x} - at.point.x + at.rect.left, sy = i64{y} - at.point.y + at.rect.top;
      if (sx < std::max(at.rect.left, 0) || sx >= std::min(at.rect.right, src.width) || x >= under.width) continue;
      if (sy < std::max(at.rect.top, 0) || sy >= std::min(at.rect.bottom, src.height) || y >= under.height) continue;
      any = true;
      const auto i = static_cast<size_t>(y * dst.width + x);
      touched[i] = true;
      const S v = src.at(static_cast<i32>(sx), static_cast<i32>(sy));
      const D s = at_depth<D>(opacity == 1 ? v : static_cast<S>(PS::mul(v, n))), d = under.at(x, y);
      const bool rises = mode == -1 && !(opacity == 1 && ceiling == 1);
      made[i] = static_cast<D>(rises ? PD::rise(s, d, at_depth<D>(c)) : PD::mode(mode, s, d));
    }
  for (size_t i = 0; i < made.size(); ++i)
    if (any && !touched[i] && (mode == 3 || mode == 5)) made[i] = 0;
  return made;
}

struct Accumulate : BornLibrary {
  template <class S, class D>
  void all_cases(i32 width, i32 height) {
    const Mask<S> src(width, height, 3);
    for (i32 mode = -2; mode <= 9; ++mode)
      for (const Place& at : places)
        for (const auto& scale : scales) {
          const bool plain = scale.opacity == 1 && scale.ceiling == 1;
          Mask<D> dst(width + 4, height - 2, 9);
          const auto result = expected(src, mode, scale.opacity, scale.ceiling, at, dst, dst);
          const i32 error = plain ? ZR_AccumulateUnoBuffers(nullptr, &src, mode, &at.rect, &at.point, &dst)
                                  : ZR_AccumulateUnoBuffers(nullptr, &src, mode, scale.opacity, scale.ceiling, &at.rect,
                                                            &at.point, &dst);
          ASSERT_EQ(error, 0);
          const auto made = dst.all();
          for (size_t i = 0; i < made.size(); ++i) {
            // Noise takes the place of rounding.
            const f64 allowed = mode == -1 && plain && sizeof(D) < 4 ? 1 : 0;
            ASSERT_LE(std::fabs(static_cast<f64>(made[i]) - static_cast<f64>(result[i])), allowed)
                << depth_of<S> << " onto " << depth_of<D> << ", mode " << mode << ", " << at.name << ", opacity "
                << scale.opacity << ", ceiling " << scale.ceiling << ", value " << i;
          }
        }
  }
};

TEST_F(Accumulate, IsTheStatedStepsAtEveryPairOfDepths) {
  all_cases<u8, u8>(37, 23);
  all_cases<u16, u16>(37, 23);
  all_cases<u8, u16>(37, 23);
  all_cases<u16, u8>(37, 23);
  all_cases<f32, f32>(37, 23);
  EXPECT_TRUE(caught.quiet());
}

TEST_F(Accumulate, TransfersReadTheSecondSourceWhereTheyWrite) {
  const auto run = [&]<class C>() {
    const Mask<C> one(37, 23, 5), other(29, 31, 6);
    for (const i32 mode : {0, 3, 5, 6})
      for (const Place& at : places) {
        Mask<C> dst(35, 25, 7);
        const auto result = expected(one, mode, 1, 1, at, other, dst);
        ASSERT_EQ(ZR_TransferUnoBuffers(nullptr, &one, &other, mode, &at.rect, &at.point, &dst), 0);
        ASSERT_EQ(dst.all(), result) << at.name << ", mode " << mode;
      }
  };
  run.operator()<u8>();
  run.operator()<u16>();
  run.operator()<f32>();
}

TEST_F(Accumulate, NoiseGoesOnFromCallToCallAndKeepsTheMean) {
  Mask<u8> src(256, 64), first(256, 64), second(256, 64);
  ZR_FillUnoBuffer(100, &src);
  ZR_FillUnoBuffer(50, &first);
  ZR_FillUnoBuffer(50, &second);
  for (Mask<u8>* one : {&first, &second}) ASSERT_EQ(ZR_AccumulateUnoBuffers(nullptr, &src, -1, nullptr, one), 0);
  EXPECT_NE(first.all(), second.all());
  f64 sum = 0;
  for (const u8 v : first.all()) sum += v;
  EXPECT_NEAR(sum / (256 * 64), 255 - 155 * 205 / 255.0, 0.02);
}

i32 iterations_seen = 0;
TEST_F(Accumulate, LargeJobsGoThroughTheIterateSlotAndStopWhenAsked) {
  const SlotOverride override(ZR_Slot_iterate_generic,
                              reinterpret_cast<void*>(+[](i32 n, void* refcon, ZR_GenericFunc fn) -> i32 {
                                iterations_seen = n;
                                return ZR_IterateGeneric_Static(n, refcon, fn);
                              }));
  const ZR_ProgressInfo stop = {nullptr, [](void*) -> i32 { return 77; }, nullptr};
  for (const i32 width : {319, 320}) {
    Mask<u8> src(width, 240, 1), dst(width, 240, 2);
    const Place all = {"", {0, 0, width, 240}, {0, 0}};
    const auto before = dst.all();
    iterations_seen = 0;
    EXPECT_EQ(ZR_AccumulateUnoBuffers(&stop, &src, 4, nullptr, &dst), 77);
    EXPECT_EQ(dst.all(), before);
    EXPECT_EQ(iterations_seen > 1, width == 320);
    const auto result = expected(src, 4, 1, 1, all, dst, dst);
    EXPECT_EQ(ZR_AccumulateUnoBuffers(nullptr, &src, 4, nullptr, &dst), 0);  // all of it, where it is
    EXPECT_EQ(dst.all(), result);
  }
}

}  // namespace
