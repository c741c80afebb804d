// Layers drawn through matrices: against the model, where a call stops, and what goes through which slot.
#include <gtest/gtest.h>

#include <random>

#include "copy/transform_model.h"
#include "support/born_library.h"
#include "support/gamma_tables.h"

namespace {

GX_Matrix3 product(const GX_Matrix3& first, const GX_Matrix3& then) {
  GX_Matrix3 out;
  GX_ConcatMatrix(&first, &then, &out);
  return out;
}
GX_Matrix3 moved(f64 x, f64 y) { return {{{1, 0, x}, {0, 1, y}, {0, 0, 1}}}; }
GX_Matrix3 scaled(f64 x, f64 y) { return {{{x, 0, 0}, {0, y, 0}, {0, 0, 1}}}; }
GX_Matrix3 turned(f64 angle) {
  return {{{std::cos(angle), -std::sin(angle), 0}, {std::sin(angle), std::cos(angle), 0}, {0, 0, 1}}};
}

class Dice {
 public:
  explicit Dice(u32 seed) : random_(seed) {}
  i32 whole(i32 low, i32 high) { return low + static_cast<i32>(random_() % static_cast<u32>(high - low + 1)); }
  f64 real(f64 low, f64 high) { return low + (high - low) * static_cast<f64>(random_()) / 4294967296.0; }
  GX_Matrix3 matrix() {
    const GX_Matrix3 away = moved(real(-9, 9), real(-9, 9));
    switch (whole(0, 12)) {
      case 12:
        return product(scaled(whole(12, 40), -whole(20, 40)), moved(-real(20, 90), real(60, 90)));  // all covered
      case 0: return moved(whole(-9, 9), whole(-9, 9));
      case 1: return away;
      case 2: return product(scaled(real(0.1, 1), real(0.1, 1)), away);
      case 3: return product(scaled(real(-4, 4), real(1, 30)), away);
      case 4: return product(scaled(1e-7, whole(0, 1)), away);  // collapsed, or singular
      case 5: return product({{{1, real(-2, 2), 0}, {real(-2, 2), 1, 0}, {0, 0, 1}}}, away);
      case 6: return product({{{1, 0, 0}, {0, 1, 0}, {real(-0.02, 0.02), real(-0.02, 0.02), 1}}}, away);
      case 7: return product(scaled(1, -1), away);
      case 8: return moved(9, whole(-9, 9) + 0.5);
      default: return product(product(turned(real(0, 7)), scaled(real(0.3, 2), real(0.3, 2))), away);
    }
  }
  std::vector<GX_Matrix3> matrices() {
    const GX_Matrix3 start = matrix();
    const auto later = [&](f64 x, f64 y, f64 angle, f64 size) {
      return product(product(product(turned(angle), scaled(size, size)), start), moved(x, y));
    };
    std::vector<GX_Matrix3> list = {start};
    const f64 x = real(-3, 3), y = whole(-3, 3), drift = whole(0, 1) == 0 ? 0 : real(0, 0.2);
    const i32 count = whole(3, 7);
    switch (whole(0, 7)) {
      case 0: return {start, start};
      case 1: return {start, later(x, y, 0, 1)};
      case 2: return {start, later(x, y, real(-1, 1), real(0.5, 2))};
      case 3:  // a line of even pace, or nearly
      case 4:
        for (i32 i = 1; i < count; ++i) list.push_back(later(x * i + drift * i * (i - 1), y * i, 0, 1));
        if (whole(0, 2) == 0) list[1].m[0][0] = list[1].m[1][0] = list[1].m[2][0] = 0;  // singular, in its place
        if (whole(0, 2) == 0) list.back().m[0][2] += real(0.6, 1.4);
        return list;
      case 5:
        for (i32 i = 1; i < count; ++i) list.push_back(later(x * i, y, 0.1 * i, 1 - 0.05 * i));
        return list;
      default: return list;
    }
  }

 private:
  std::mt19937 random_;
};

template <class T>
class Transform : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(Transform, Depths);

TYPED_TEST(Transform, AsTheModelForRandomCalls) {
  using T = TypeParam;
  Dice dice(4);
  const i32 modes[] = {XferInFront,  XferInFront, XferInFront,   XferInFront,       XferCopyFast,         XferCopy,
                       XferDissolve, XferScreen,  XferAddPremul, XferMultiplyAlpha, XferMultiplyAlphaLuma};
  const ZR_LinearBlendingTables gamma = gamma_tables(2.2);
  i32 drawn = 0;
  for (i32 round = 0; round < 3000; ++round) {
    TestWorld<T> src(dice.whole(1, 14), dice.whole(1, 14)), dst(dice.whole(1, 20), dice.whole(1, 20)),
        matte(dice.whole(1, 12), dice.whole(1, 12));
    const u32 seed = static_cast<u32>(round) * 3;
    src.randomise(seed), dst.randomise(seed + 1), matte.randomise(seed + 2);
    const bool solid = dice.whole(0, 2) == 0;
    for (i32 i = 0; solid && i < src.width() * src.height(); ++i)
      src.at(i % src.width(), i / src.width()).alpha = static_cast<zr::Channel<T>>(zr::Depth<T>::white);
    if (dice.whole(0, 3) == 0) src.turn_over(), dst.turn_over();
    const ZR_MaskWorld mask = {*matte.layer(), dice.whole(-6, 9), dice.whole(-6, 9),
                               static_cast<u32>(dice.whole(0, 3))};
    TransformCall call;
    call.quality = dice.whole(0, 3);
    call.field = dice.whole(0, 3) == 0 ? dice.whole(1, 3) : 0;
    call.mode = {modes[dice.whole(0, 10)], dice.whole(0, 2) == 0 ? 0.625f : 1.0f, nullptr, dice.whole(0, 5) == 0,
                 dice.whole(-99, 99)};
    if (dice.whole(0, 5) == 0) call.tables = &gamma;
    if (dice.whole(0, 2) == 0) call.mask = &mask;
    call.matrices = dice.matrices();
    call.src2dst = dice.whole(0, 3) != 0;
    if (dice.whole(0, 1) == 0) call.rect = {dice.whole(-4, 8), dice.whole(-4, 8), dice.whole(6, 22), dice.whole(6, 22)};
    const TestWorld<T> before = dst;
    TestWorld<T> expected = dst;
    TransformModel<T>(call, src, expected).draw();
    ASSERT_EQ(call.run(src, dst), 0);
    ASSERT_TRUE(dst == expected && dst.guards_intact() && src.guards_intact())
        << "round " << round << " quality " << call.quality << " mode " << call.mode.xfer << " field " << call.field
        << " mask " << (call.mask != nullptr ? static_cast<i32>(mask.kind) : -1) << " matrices " << call.matrices.size()
        << (call.src2dst ? " forward" : " inverse");
    drawn += !(dst == before);
  }
  EXPECT_GT(drawn, 900);
  EXPECT_TRUE(this->caught.quiet());
}

}  // namespace
