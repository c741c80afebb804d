// The composite calls for holders of the plain mode record.
#include "support/born_library.h"

namespace {

struct Seen {
  const ZR_ProgressInfo* progress;
  i32 quality, field, x, y;
  u32 flags;
  const void *rect, *src, *tables, *mask, *dst, *matrices;
  bool operator==(const Seen&) const = default;
} G_seen;
ZR_CompositeModePlus G_mode;

i32 see_transfer_rect(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, const GX_LRect* rect,
                      ZR_LayerDef* src, const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                      const ZR_MaskWorld* mask, i32 x, i32 y, ZR_LayerDef* dst) {
  G_seen = {progress, quality, field, x, y, flags, rect, src, tables, mask, dst, nullptr};
  G_mode = *mode;
  return 4711;
}

i32 see_transform_world(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                        const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                        const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                        const GX_LRect* rect, ZR_LayerDef* dst) {
  G_seen = {progress, quality, field, count, src2dst, flags, rect, src, tables, mask, dst, matrices};
  G_mode = *mode;
  return 4712;
}

class Adapters : public BornLibrary {
 protected:
  void expect_mode(const ZR_CompositeMode& plain, f32 opacity) {
    EXPECT_EQ(G_mode.opacity, opacity);
    EXPECT_EQ(G_mode.keep_alpha, plain.keep_alpha != 0);
    EXPECT_EQ(G_mode.xfer, plain.xfer);
    EXPECT_EQ(G_mode.rand_seed, plain.rand_seed);
    EXPECT_EQ(G_mode.tables, nullptr);
  }
  ZR_ProgressInfo progress{};
  GX_LRect rect{};
  ZR_LayerDef src{}, dst{};
  ZR_MaskWorld mask{};
  GX_Matrix3 matrix{};
};

TEST_F(Adapters, GoThroughTheirSlotsWithAnExtendedRecord) {
  const SlotOverride transfer(ZR_Slot_transfer_rect, reinterpret_cast<void*>(&see_transfer_rect)),
      transform(ZR_Slot_transform_world, reinterpret_cast<void*>(&see_transform_world));
  const ZR_CompositeMode one{9, -5, 128, 0, 16448}, other{2, 1, 255, 7, 32768};
  EXPECT_EQ(transfer_rect_adapter(&progress, 1, 6, 2, &rect, &src, &one, &mask, -3, 8, &dst), 4711);
  EXPECT_EQ(G_seen, (Seen{&progress, 1, 2, -3, 8, 6, &rect, &src, nullptr, &mask, &dst, nullptr}));
  expect_mode(one, 16448 / 32768.0f);
  EXPECT_EQ(transform_world_adapter(&progress, 1, 6, 2, &src, &other, &mask, &matrix, 5, true, &rect, &dst), 4712);
  EXPECT_EQ(G_seen, (Seen{&progress, 1, 2, 5, 1, 6, &rect, &src, nullptr, &mask, &dst, &matrix}));
  expect_mode(other, 1.0f);
}

TEST_F(Adapters, WithoutAModeTheyRefuse) {
  EXPECT_EQ(transfer_rect_adapter(nullptr, 1, 0, 0, &rect, &src, nullptr, nullptr, 0, 0, &dst), 3);
  EXPECT_EQ(caught.take_message(), "bad parameter passed to effect callback");
  EXPECT_EQ(transform_world_adapter(nullptr, 1, 0, 0, &src, nullptr, nullptr, &matrix, 1, true, &rect, &dst), 3);
}

}  // namespace
