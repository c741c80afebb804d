// Masks as a rectangle composite applies them: over a clear destination the opaque source takes on the
// mask's own value as alpha, so that every pixel shows what it was masked with.
#include <ZR/transfer_mode.h>
#include <gtest/gtest.h>

#include <utility>

#include "support/born_library.h"
#include "support/mask_model.h"
#include "support/worlds.h"

namespace {

template <class T>
class Masks : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(Masks, Depths);

TYPED_TEST(Masks, FourKindsAtAllOffsets) {
  using T = TypeParam;
  constexpr auto white = static_cast<zr::Channel<T>>(zr::Depth<T>::white);
  constexpr i32 width = 7, height = 5, mask_width = 4, mask_height = 3;
  TestWorld<T> src(width, height), matte(mask_width, mask_height), dst(width, height);
  src.fill({white, white, 0, white});
  matte.randomise(31);
  const ZR_CompositeModePlus mode(XferInFront, 1.0f, nullptr, false, 0);
  const GX_LRect rect = {0, 0, width, height};
  for (u32 kind = 0; kind < 4; ++kind)
    for (i32 oy = -mask_height; oy <= height; ++oy)
      for (i32 ox = -mask_width; ox <= width; ++ox) {
        const ZR_MaskWorld mask = {*matte.layer(), ox, oy, kind};
        dst.clear();
        ASSERT_EQ(ZR_TransferRect(nullptr, 0, 0, 0, &rect, src, &mode, nullptr, &mask, 0, 0, dst), 0);
        for (i32 y = 0; y < height; ++y)
          for (i32 x = 0; x < width; ++x) {
            const bool in = x >= ox && x < ox + mask_width && y >= oy && y < oy + mask_height;
            const zr::Channel<T> expected = in                ? mask_value(matte.at(x - ox, y - oy), kind)
                                            : (kind & 1) != 0 ? white
                                                              : zr::Channel<T>{0};
            ASSERT_EQ(dst.at(x, y).alpha, expected)
                << "kind " << kind << " at " << ox << ',' << oy << " pixel " << x << ',' << y;
          }
      }
  EXPECT_TRUE(dst.guards_intact() && matte.guards_intact());
}

}  // namespace
