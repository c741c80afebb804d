// The viewer's blit in parts and slices against the whole: styles, orders, depths, clipping, odd alphas.
#include <ZR/viewer_blit.h>

#include <cmath>

#include "support/born_library.h"
#include "support/worlds.h"

namespace {

struct Call {
  i32 style;
  bool reverse;
  GX_LPoint position, check;
  ZR_PixelFloat first, second;
  GX_LRect rect;
};

template <class T>
class ViewerBlit : public BornLibrary {
 protected:
  void run(const Call& call, TestWorld<T>& src, TestWorld<ZR_Pixel8>& dst) {
    const ZR_WorldX<T> from(src, false);
    ZR_WorldX<ZR_Pixel8> to(dst, false);
    ZR_SpecialCasePixelBlit(&from, call.position, static_cast<ZR_SpecialCaseBlitStyle>(call.style), call.reverse,
                            call.check, call.first, call.second, call.rect, &to);
  }
};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(ViewerBlit, Depths);

i32 G_slices;
i32 five_slices(i32 iterations, void* refcon, ZR_GenericFunc fn) {
  EXPECT_EQ(iterations, -1);
  for (i32 i = 4; i >= 0; --i, ++G_slices) EXPECT_EQ(fn(refcon, i, i, 5), 0);
  return 0;
}

TYPED_TEST(ViewerBlit, AllStylesOrdersAndPlaces) {
  using T = TypeParam;
  TestWorld<T> src(75, 21);
  src.randomise(6);
  for (i32 x = 0; x < 70; ++x) src.at(x, 3).alpha = src.at(x, 4).alpha = 0;
  for (i32 x = 0; x < 70; ++x) src.at(x, 5).alpha = static_cast<zr::Channel<T>>(zr::Depth<T>::white);
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    constexpr f32 odd[] = {NAN, -0.25f, 1.5f, 1e30f, -1e30f, INFINITY, -0.0f, 1e-40f};
    for (i32 x = 0; x < 64; ++x) src.at(x, 6) = {odd[x % 8], odd[x / 8], 0.5f, odd[(x + 3) % 8]};
  }
  const ZR_PixelFloat grey = {0.6f, 0.5f, 0.5f, 0.5f}, orange = {0.25f, 1, 0.6f, 0.1f}, black = {0.75f, 0, 0, 0.001f},
                      above = {1.5f, 1.25f, 0, 0};
  const GX_LRect all = {0, 0, 75, 21}, inner = {3, 2, 60, 15}, over = {-9, -4, 200, 100},
                 wild = {INT32_MIN, 1, 40, INT32_MAX};
  i32 drawn = 0;
  G_slices = 0;
  for (const i32 style : {0, 1, 2, 77, -1})
    for (const bool reverse : {false, true})
      for (const auto& [one, other] : {std::pair{grey, orange}, {orange, grey}, {black, above}, {above, black}})
        for (const GX_LRect& rect : {all, inner, over}) {
          const Call call = {style, reverse, {drawn % 3, drawn % 5}, {drawn - 70, 5 - drawn}, one, other, rect};
          TestWorld<ZR_Pixel8> dst(75, 21), whole(75, 21), expected(75, 21);
          for (TestWorld<ZR_Pixel8>* const world : {&dst, &whole, &expected}) world->fill({9, 8, 7, 6});
          // All of the source in its place, in one slice; styles that are none are flat.
          Call plain = {style == 1 || style == 2 ? style : 0, reverse, {0, 0}, call.check, one, other, all};
          plain.check.x -= call.position.x, plain.check.y -= call.position.y;
          this->run(plain, src, whole);
          for (i32 y = 0; y < 21; ++y)
            for (i32 x = 0; x < 75; ++x) {
              const i32 sx = x - rect.left + call.position.x, sy = y - rect.top + call.position.y;
              if (x < rect.left || x >= rect.right || y < rect.top || y >= rect.bottom || sx >= 75 || sy >= 21)
                continue;
              expected.at(x, y) = whole.at(sx, sy);
            }
          const SlotOverride threads(ZR_Slot_iterate_generic, reinterpret_cast<void*>(&five_slices));
          this->run(call, src, dst);
          ASSERT_TRUE(dst == expected) << "style " << style << ", reverse " << reverse << ", call " << drawn;
          ASSERT_TRUE(dst.guards_intact());
          ++drawn;
        }
  EXPECT_EQ(G_slices, 5 * drawn);
  TestWorld<ZR_Pixel8> dst(75, 21);
  const TestWorld<ZR_Pixel8> untouched(dst);
  this->run({1, false, {-1, 0}, {0, 0}, grey, orange, all}, src, dst);
  this->run({1, false, {0, INT32_MAX}, {0, 0}, grey, orange, all}, src, dst);
  this->run({1, false, {0, 0}, {0, 0}, grey, orange, {5, 5, 5, 9}}, src, dst);
  this->run({1, false, {0, 0}, {0, 0}, grey, orange, {9, 5, 5, 9}}, src, dst);
  this->run({1, false, {0, 0}, {0, 0}, grey, orange, wild}, src, dst);
  EXPECT_TRUE(dst == untouched);
  ZR_SpecialCasePixelBlit(nullptr, {0, 0}, ZR_BlitStyle_Flat, false, {0, 0}, grey, orange, all, nullptr);
}

}  // namespace
