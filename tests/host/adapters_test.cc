// The composite calls for holders of the plain mode record.
#include "support/born_library.h"

namespace {

struct Seen {
  int calls = 0;
  const ZR_ProgressInfo* progress;
  i32 quality, field, x, y;
  u32 flags;
  const void *rect, *src, *tables, *mask, *dst, *matrices;
  ZR_CompositeModePlus mode;
} G_seen;

i32 see_transfer_rect(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, const GX_LRect* rect,
                      ZR_LayerDef* src, const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                      const ZR_MaskWorld* mask, i32 x, i32 y, ZR_LayerDef* dst) {
  G_seen.calls++;
  G_seen.progress = progress, G_seen.quality = quality, G_seen.flags = flags, G_seen.field = field;
  G_seen.rect = rect, G_seen.src = src, G_seen.mode = *mode, G_seen.tables = tables, G_seen.mask = mask;
  G_seen.x = x, G_seen.y = y, G_seen.dst = dst;
  return 4711;
}

i32 see_transform_world(const ZR_ProgressInfo* progress, i32 quality, u32 flags, i32 field, ZR_LayerDef* src,
                        const ZR_CompositeModePlus* mode, const ZR_LinearBlendingTables* tables,
                        const ZR_MaskWorld* mask, const GX_Matrix3* matrices, i32 count, bool src2dst,
                        const GX_LRect* rect, ZR_LayerDef* dst) {
  G_seen.calls++;
  G_seen.progress = progress, G_seen.quality = quality, G_seen.flags = flags, G_seen.field = field;
  G_seen.rect = rect, G_seen.src = src, G_seen.mode = *mode, G_seen.tables = tables, G_seen.mask = mask;
  G_seen.matrices = matrices, G_seen.x = count, G_seen.y = src2dst, G_seen.dst = dst;
  return 4712;
}

class Adapters : public BornLibrary {
 protected:
  void SetUp() override {
    BornLibrary::SetUp();
    G_seen = {};
    G_seen.tables = &progress;  // anything but null
  }
  ZR_ProgressInfo progress{};
  GX_LRect rect{};
  ZR_LayerDef src{}, dst{};
  ZR_MaskWorld mask{};
  GX_Matrix3 matrix{};
};

TEST_F(Adapters, TransferRectGoesThroughItsSlotWithAnExtendedRecord) {
  const SlotOverride slot(ZR_Slot_transfer_rect, reinterpret_cast<void*>(&see_transfer_rect));
  for (const u8 keep_alpha : {u8{0}, u8{7}}) {
    const ZR_CompositeMode mode{9, -5, 128, keep_alpha, 16448};
    EXPECT_EQ(transfer_rect_adapter(&progress, 1, 6, 2, &rect, &src, &mode, &mask, -3, 8, &dst), 4711);
    EXPECT_EQ(G_seen.mode.opacity, 16448 / 32768.0f);
    EXPECT_EQ(G_seen.mode.keep_alpha, keep_alpha != 0);
    EXPECT_EQ(G_seen.mode.xfer, 9);
    EXPECT_EQ(G_seen.mode.rand_seed, -5);
    EXPECT_EQ(G_seen.mode.tables, nullptr);
    EXPECT_EQ(G_seen.tables, nullptr);
  }
  EXPECT_EQ(G_seen.progress, &progress);
  EXPECT_EQ(G_seen.quality, 1);
  EXPECT_EQ(G_seen.flags, 6u);
  EXPECT_EQ(G_seen.field, 2);
  EXPECT_EQ(G_seen.rect, &rect);
  EXPECT_EQ(G_seen.src, &src);
  EXPECT_EQ(G_seen.mask, &mask);
  EXPECT_EQ(G_seen.x, -3);
  EXPECT_EQ(G_seen.y, 8);
  EXPECT_EQ(G_seen.dst, &dst);
}

TEST_F(Adapters, TransformWorldGoesThroughItsSlot) {
  const ZR_CompositeMode mode{2, 1, 255, 1, 32768};
  const SlotOverride slot(ZR_Slot_transform_world, reinterpret_cast<void*>(&see_transform_world));
  EXPECT_EQ(transform_world_adapter(&progress, 1, 6, 2, &src, &mode, &mask, &matrix, 5, true, &rect, &dst), 4712);
  EXPECT_EQ(G_seen.calls, 1);
  EXPECT_EQ(G_seen.progress, &progress);
  EXPECT_EQ(G_seen.quality, 1);
  EXPECT_EQ(G_seen.flags, 6u);
  EXPECT_EQ(G_seen.field, 2);
  EXPECT_EQ(G_seen.src, &src);
  EXPECT_EQ(G_seen.mode.xfer, 2);
  EXPECT_EQ(G_seen.mode.opacity, 1.0f);
  EXPECT_EQ(G_seen.mode.tables, nullptr);
  EXPECT_EQ(G_seen.tables, nullptr);
  EXPECT_EQ(G_seen.mask, &mask);
  EXPECT_EQ(G_seen.matrices, &matrix);
  EXPECT_EQ(G_seen.x, 5);
  EXPECT_EQ(G_seen.y, 1);
  EXPECT_EQ(G_seen.rect, &rect);
  EXPECT_EQ(G_seen.dst, &dst);
}

TEST_F(Adapters, WithoutAModeTheyRefuse) {
  EXPECT_EQ(transfer_rect_adapter(nullptr, 1, 0, 0, &rect, &src, nullptr, nullptr, 0, 0, &dst), 3);
  EXPECT_EQ(caught.take_message(), "bad parameter passed to effect callback");
  EXPECT_EQ(transform_world_adapter(nullptr, 1, 0, 0, &src, nullptr, nullptr, &matrix, 1, true, &rect, &dst), 3);
}

}  // namespace
