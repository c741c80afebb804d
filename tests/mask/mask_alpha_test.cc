// Masks merged into the alpha of worlds, and alphas pulled toward a value.
#include <ZR/mask_alpha.h>
#include <ZR/world.h>

#include "mask/masks.h"
#include "support/thrown.h"
#include "support/worlds.h"

namespace {

constexpr i32 width = 41, height = 29;

struct MergeCase {
  const char* name;
  i32 x, y;
  GX_LRect clip;  // none where it is empty
  GX_LRect area;  // the same
};
constexpr MergeCase merges[] = {
    {"over all", -3, -2, {}, {}},
    {"inside", 7, 5, {}, {}},
    {"of an area", -2, 4, {}, {5, 3, 30, 17}},
    {"clipped", 4, 3, {2, 1, 9, 7}, {}},
    {"of an area beyond the world", 4, 3, {-9, -9, 90, 90}, {-10, -10, 100, 100}},
    {"that do not meet", 90, 0, {}, {2, 2, 20, 20}},
    {"clipped away", 0, 0, {200, 0, 210, 10}, {}},
    {"far off", INT32_MAX, INT32_MIN, {}, {}},
};

using MaskAlpha = BornLibrary;

TEST_F(MaskAlpha, IsTheStatedStepsForEveryPairOfDepths) {
  const auto run = [&]<class T, class C>() {
    const Mask<C> mask(50, 19, 5);
    for (const MergeCase& one : merges) {
      TestWorld<T> world(width, height);
      world.randomise(8);
      TestWorld<T> result = world;
      const bool clips = one.clip.right > 0, part = one.area.right > 0;
      const auto inside = [&](i32 x, i32 y) {
        return !part || (x >= one.area.left && x < one.area.right && y >= one.area.top && y < one.area.bottom);
      };
      bool any = false;
      for (const bool second : {false, true})
        for (i32 y = 0; y < height; ++y)
          for (i32 x = 0; x < width; ++x) {
            const i64 mx = i64{x} - one.x, my = i64{y} - one.y;
            bool counts = mx >= 0 && mx < mask.width && my >= 0 && my < mask.height;
            if (clips)
              counts =
                  counts && mx >= one.clip.left && mx < one.clip.right && my >= one.clip.top && my < one.clip.bottom;
            if (!inside(x, y)) continue;
            any = any || counts;
            if (!second) continue;
            if (!any) result.at(x, y) = T{};
            auto& alpha = result.at(x, y).alpha;
            using A = zr::Channel<T>;
            if (counts)
              alpha = static_cast<A>(
                  Plain<A>::mul(alpha, at_depth<A>(mask.at(static_cast<i32>(mx), static_cast<i32>(my)))));
            else
              alpha = 0;
          }
      ZR_WorldX<T> typed(world.layer(), false);
      ZR_MergeMaskAlpha(nullptr, one.x, one.y, clips ? &one.clip : nullptr, &mask, part ? &one.area : nullptr, &typed);
      EXPECT_EQ(world, result) << one.name << ", " << depth_of<C> << " onto " << typed.GetBitDepth();
      EXPECT_TRUE(world.guards_intact());
    }
  };
  const auto onto = [&]<class T>() { run.template operator()<T, u8>(), run.template operator()<T, u16>(); };
  onto.operator()<ZR_Pixel8>();
  onto.operator()<ZR_Pixel16>();
  onto.operator()<ZR_PixelFloat>();
}

TEST_F(MaskAlpha, ThrowsWhatStopsIt) {
  TestWorld<ZR_Pixel8> world(width, height);
  world.randomise(2);
  const TestWorld<ZR_Pixel8> before = world;
  ZR_WorldX<ZR_Pixel8> typed(world.layer(), false);
  const Mask<u8> mask(50, 50, 1);
  const Mask<f32> real(50, 50, 1);
  const ZR_ProgressInfo stop = {nullptr, [](void*) -> i32 { return 31; }, nullptr};
  const auto thrown = [&](const ZR_ProgressInfo* progress, const ZR_UnoBuffer* of, ZR_World* into) {
    return thrown_by([&] { ZR_MergeMaskAlpha(progress, 0, 0, nullptr, of, nullptr, into); });
  };
  EXPECT_EQ(thrown(&stop, &mask, &typed), 31);
  EXPECT_EQ(thrown(nullptr, &real, &typed), 3);
  EXPECT_EQ(caught.take_verification(), "Unexpected bitdepth in ZRp_MergeMaskAlphaScanIter()");
  EXPECT_EQ(thrown(nullptr, &mask, nullptr), 3);
  EXPECT_EQ(world, before);
}

}  // namespace
