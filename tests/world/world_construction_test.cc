// Worlds of three depths: sizes, frames, references and sub-worlds, failures with their texts, ownership.
#include <ZR/world.h>

#include <cstdint>
#include <limits>
#include <memory>
#include <new>

#include "support/born_library.h"
#include "support/odd_world.h"
#include "support/thrown.h"
#include "support/worlds.h"

namespace {

using std::unique_ptr;

bool same(const GX_LRect& a, const GX_LRect& b) {
  return a.left == b.left && a.top == b.top && a.right == b.right && a.bottom == b.bottom;
}

class WorldFailures : public BornLibrary {};

TEST_F(WorldFailures, SizesOutsideTheLimitsAreReportedWithBothNumbers) {
  struct Case {
    i32 width, height;
    const char* text;
  };
  for (const Case& size : {Case{0, 10, "invalid image buffer size (0x10)."},
                           {30001, 1, "invalid image buffer size (30001x1)."},
                           {1, -1, "invalid image buffer size (1x-1)."},
                           {7, 30001, "invalid image buffer size (7x30001)."}}) {
    for (const i16 depth : {i16{8}, i16{16}, i16{32}})
      for (const i32 flags : {0, 4}) {
        EXPECT_EQ(thrown_by([&] { ZR_World::New(size.width, size.height, depth, flags); }), ZR_Err_BadParam);
        ASSERT_EQ(caught.messages().size(), 1u);
        EXPECT_EQ(caught.messages().back().code, 0x250066u);
        EXPECT_EQ(caught.take_message(), size.text);
      }
  }
  EXPECT_EQ(thrown_by([] { ZR_World::New(5, 5, 24, 0); }), ZR_Err_Internal);
  EXPECT_EQ(thrown_by([] {
              ZR_World::New({std::numeric_limits<i32>::min(), 0, std::numeric_limits<i32>::max(), 9}, 8, 0);
            }),
            ZR_Err_BadParam);
  caught.clear();
  unique_ptr<ZR_World> edge(ZR_World::New({-5, 7, 29995, 8}, 8, 0));  // the position does not count
  EXPECT_EQ(edge->width, 30000);
  EXPECT_EQ(edge->height, 1);
  EXPECT_TRUE(caught.quiet());
}

TEST_F(WorldFailures, UnknownFormatsAndOwnersOfUnknownDepth) {
  OddWorld odd;
  ZR_LayerDef owned = {}, plain = {};
  owned.owner = &odd;
  plain.flags = 0x7000000;
  EXPECT_EQ(ZRp_WorldDepth(&plain), 8);
  EXPECT_EQ(caught.verifications().back().code, 0x2503e7u);
  EXPECT_EQ(caught.take_verification(), "Unknown pixel format");
  EXPECT_EQ(ZRp_WorldDepth(&owned), 24);
  EXPECT_TRUE(caught.quiet());
  EXPECT_EQ(thrown_by([&] { ZR_World::NewReference(&owned); }), ZR_Err_Internal);
  EXPECT_EQ(caught.take_verification(), "Unexpected bitdepth in ZR_World::NewReference(ZR_EffectWorld)");
  EXPECT_EQ(thrown_by([&] { odd.FillOutEffectWorld(&plain); }), ZR_Err_Internal);
  EXPECT_EQ(caught.take_verification(), "Unknown pixel format");
  ZR_WorldX<ZR_Pixel8> world(4, 4, 0);
  EXPECT_EQ(thrown_by([&] { world.CopyRect(&odd, {0, 0, 4, 4}, 0, 0); }), ZR_Err_Internal);
  EXPECT_EQ(caught.take_verification(), "Src and dest bitdepths are different in ZR_World::CopyRect");
  const char* const between = "Unknown bit depth in ZR_World::CopyRectPossiblyDifferentBitdepths";
  EXPECT_EQ(thrown_by([&] { world.CopyRectPossiblyDifferentBitdepth(&odd, {0, 0, 0, 0}, false, 0, 0, nullptr); }), 3);
  EXPECT_EQ(caught.verifications().back().code, 0x25006eu);
  EXPECT_EQ(caught.take_verification(), between);
  EXPECT_EQ(thrown_by([&] { world.CopyRectPossiblyDifferentBitdepthWithField(&odd, {0, 0, 4, 4}, 1); }), 3);
  EXPECT_EQ(caught.take_verification(), between);
  EXPECT_EQ(thrown_by([&] { world.GetRSWorld(); }), ZR_Err_NoRasterWorld);
  char pixels[64];
  EXPECT_EQ(thrown_by([&] { ZR_World::NewReference(pixels, 2, 2, 12, 16); }), ZR_Err_Internal);
}

template <class T>
class Worlds : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(Worlds, Depths);

TYPED_TEST(Worlds, OwnedFramesAreAlignedPaddedCountedAndGuardedByAGutter) {
  using T = TypeParam;
  constexpr i32 pixel = sizeof(T);
  for (const i32 width : {1, 2, 3, 4, 7, 16, 100})
    for (const i32 height : {1, 2, 9}) {
      const i32 before = ZR_G_LiveWorlds;
      unique_ptr<ZR_WorldX<T>> world(new ZR_WorldX<T>(width, height, 2 + ZR_WorldFlag_Clear));
      EXPECT_EQ(ZR_G_LiveWorlds, before + 1);
      EXPECT_FALSE(world->IsReference());
      EXPECT_FALSE(world->HasRSWorld());
      EXPECT_EQ(world->GetBitDepth(), pixel * 2);
      EXPECT_EQ(world->PixelSize(), pixel);
      EXPECT_EQ(world->row_bytes, (width * pixel + 15) / 16 * 16);
      EXPECT_EQ(reinterpret_cast<std::uintptr_t>(world->data) % 16, 0u);
      EXPECT_EQ(ZRp_WorldDepth(world.get()), pixel * 2);
      EXPECT_EQ(world->owner, world.get());
      EXPECT_TRUE(same(world->extent, {0, 0, width, height}));
      constexpr T zero = {};
      for (i32 y = 0; y < height; ++y)
        for (i32 x = 0; x < width; ++x) EXPECT_EQ(std::memcmp(world->At(x, y), &zero, sizeof zero), 0);

      EXPECT_FALSE(world->SubWorldSafetyGutterHasBeenOverWritten());
      std::memset(static_cast<void*>(world->At(width - 1, height - 1)), 0xff, sizeof(T));
      EXPECT_FALSE(world->SubWorldSafetyGutterHasBeenOverWritten());
      const i32 gutter = world->row_bytes - pixel;
      char* const start = reinterpret_cast<char*>(world->At(width, height - 1));
      for (const i32 byte : {0, gutter / 2, gutter - 1, gutter}) {
        if (byte >= gutter && gutter > 0) {  // the byte behind it is no longer the gutter's
          start[byte] = 1;
          EXPECT_FALSE(world->SubWorldSafetyGutterHasBeenOverWritten());
        } else if (gutter > 0) {
          start[byte] = 1;
          EXPECT_TRUE(world->SubWorldSafetyGutterHasBeenOverWritten()) << byte;
          start[byte] = 0x55;
        }
      }
    }
}

TYPED_TEST(Worlds, RasterFramesBelongToTheWorldAndAreSeenByViews) {
  using T = TypeParam;
  unique_ptr<ZR_World> world(ZR_World::New(7, 5, static_cast<i16>(sizeof(T) * 2), 5));
  ASSERT_TRUE(world->HasRSWorld());
  RS_World** const raster = world->GetRSWorld();
  EXPECT_EQ((*raster)->bits_per_pixel, static_cast<i16>(sizeof(T) * 8));
  EXPECT_GT((*raster)->lock_count, 0u);
  EXPECT_EQ(world->data, (*raster)->base);
  EXPECT_EQ(world->row_bytes, (*raster)->row_bytes);
  EXPECT_FALSE(world->IsReference());
  EXPECT_FALSE(world->SubWorldSafetyGutterHasBeenOverWritten());
  EXPECT_EQ(thrown_by([&] { world->ShrinkToSubRect({0, 0, 2, 2}); }), ZR_Err_Internal);
  EXPECT_EQ(this->caught.take_verification(), "Can't Shrink a ZR_World which is backed by a RS_World");

  const unique_ptr<ZR_World> whole(ZR_World::NewReference(raster));
  EXPECT_EQ(whole->raster, raster);
  EXPECT_EQ(whole->GetBitDepth(), world->GetBitDepth());
  EXPECT_TRUE(whole->IsReference());
  EXPECT_TRUE(same(whole->extent, {0, 0, 7, 5}));
  const unique_ptr<ZR_World> part(ZR_World::NewReference(raster, GX_Rect{2, 1, 4, 6}));
  EXPECT_FALSE(part->HasRSWorld());
  EXPECT_EQ(part->width, 5);
  EXPECT_EQ(part->height, 2);
  EXPECT_EQ(part->data, static_cast<ZR_WorldX<T>*>(world.get())->At(1, 2));
  EXPECT_TRUE(same(part->extent, {0, 0, 5, 2}));
}

TYPED_TEST(Worlds, SubWorldsClipTheirExtentAndTakeAnyRectangle) {
  using T = TypeParam;
  TestWorld<T> pixels(10, 8);
  pixels.layer()->host_word = 77;
  unique_ptr<ZR_World> parent(ZR_World::NewReference(pixels.layer()));
  EXPECT_EQ(parent->host_word, 0u) << "a wrapper takes the pixels and their extent, nothing else";
  parent->host_word = 77;
  parent->extent = {2, 1, 9, 6};
  struct Case {
    GX_LRect rect, extent;
  };
  constexpr i32 low = std::numeric_limits<i32>::min(), high = std::numeric_limits<i32>::max();
  for (const Case& c :
       {Case{{0, 0, 10, 8}, {2, 1, 9, 6}},
        {{3, 2, 5, 4}, {0, 0, 2, 2}},
        {{-4, -1, 3, 20}, {6, 2, 7, 7}},
        {{9, 7, 10, 8}, {0, 0, 0, -1}},  // beside the extent: inverted, and left so
        {{low, high, high, low}, {i32(2u - 0x80000000u), 0, i32(9u - 0x80000000u), i32(0x80000000u - 0x7fffffffu)}}}) {
    const unique_ptr<ZR_World> sub(ZR_World::NewReference(parent.get(), c.rect));
    EXPECT_TRUE(same(sub->extent, c.extent)) << c.rect.left;
    EXPECT_EQ(reinterpret_cast<u64>(sub->data),
              reinterpret_cast<u64>(parent->data) +
                  static_cast<u64>(i64{c.rect.left} * i64{sizeof(T)} + i64{c.rect.top} * parent->row_bytes));
    EXPECT_EQ(sub->row_bytes, parent->row_bytes);
    EXPECT_EQ(sub->host_word, 77u);
    EXPECT_EQ(sub->flags, parent->flags);
    EXPECT_EQ(sub->owner, sub.get());
    EXPECT_TRUE(sub->IsReference());
  }
  const unique_ptr<ZR_World> small(ZR_World::NewReference(parent.get(), GX_Rect{1, 2, 5, 7}));
  EXPECT_EQ(small->width, 5);
  EXPECT_EQ(small->height, 4);
  EXPECT_EQ(small->data, &pixels.at(2, 1));
}

TYPED_TEST(Worlds, ShrinkingAndReReferencingCheckTheirRectangle) {
  using T = TypeParam;
  ZR_WorldX<T> world(10, 8, 0), other(10, 8, 0);
  const GX_LRect outside[] = {{-1, 0, 5, 5}, {0, 0, 11, 5}, {0, -1, 5, 5}, {0, 0, 5, 9}};
  for (const GX_LRect& rect : outside) {
    EXPECT_EQ(thrown_by([&] { world.ShrinkToSubRect(rect); }), ZR_Err_Internal);
    EXPECT_EQ(this->caught.take_verification(), "bad sub rect in ShrinkToSubRect");
  }
  T* const at = world.At(3, 2);
  world.ShrinkToSubRect({3, 2, 9, 7});
  EXPECT_EQ(world.data, at);
  EXPECT_EQ(world.width, 6);
  EXPECT_EQ(world.height, 5);
  EXPECT_TRUE(same(world.extent, {0, 0, 6, 5}));
  EXPECT_FALSE(world.IsReference()) << "still the owner of the whole frame";
  EXPECT_FALSE(world.SubWorldSafetyGutterHasBeenOverWritten());

  unique_ptr<ZR_World> reference(ZR_World::NewReference(&other, GX_LRect{0, 0, 10, 8}));
  for (const GX_LRect& rect : outside) {
    EXPECT_EQ(thrown_by([&] { reference->ReReference(&other, rect); }), ZR_Err_Internal);
    EXPECT_EQ(this->caught.take_verification(), "bad sub rect in ReReference");
  }
  EXPECT_EQ(thrown_by([&] { reference->ReReference(reference.get(), {0, 0, 1, 1}); }), ZR_Err_Internal);
  EXPECT_EQ(this->caught.take_verification(), "can't ReReference self");
  OddWorld odd;
  EXPECT_EQ(thrown_by([&] { reference->ReReference(&odd, {-1, 0, 1, 1}); }), ZR_Err_Internal);
  EXPECT_EQ(this->caught.take_verification(), "can't change bit depth in ReReference") << "told first";
  reference->host_word = 5;
  reference->ReReference(&world, {1, 1, 3, 4});
  EXPECT_EQ(reference->data, world.At(1, 1));
  EXPECT_EQ(reference->host_word, world.host_word);
  EXPECT_EQ(reference->owner, reference.get());
}

TYPED_TEST(Worlds, RefersToTellsByAddressAlone) {
  using T = TypeParam;
  ZR_WorldX<T> whole(10, 8, 0), stranger(10, 8, 0);
  const auto part = [&](i32 left, i32 top, i32 right, i32 bottom) {
    return unique_ptr<ZR_World>(ZR_World::NewReference(&whole, GX_LRect{left, top, right, bottom}));
  };
  EXPECT_TRUE(part(2, 3, 5, 6)->RefersTo(&whole));
  EXPECT_TRUE(part(0, 0, 10, 8)->RefersTo(&whole));
  EXPECT_TRUE(part(9, 7, 15, 9)->RefersTo(&whole)) << "columns are not looked at";
  EXPECT_FALSE(part(0, 8, 2, 9)->RefersTo(&whole));
  EXPECT_FALSE(part(-1, 0, 2, 2)->RefersTo(&whole));
  EXPECT_FALSE(part(0, 0, 11, 2)->RefersTo(&whole));
  EXPECT_FALSE(whole.RefersTo(&whole)) << "an owner refers to nothing";
  ZR_WorldX<T> other_pitch(whole.data, 4, 4, whole.row_bytes * 2), same_pitch(whole.data, 4, 4, whole.row_bytes);
  EXPECT_FALSE(other_pitch.RefersTo(&whole));
  EXPECT_TRUE(same_pitch.RefersTo(&whole));
}

TYPED_TEST(Worlds, RecordsOfAWorldAndDeadWorlds) {
  using T = TypeParam;
  alignas(ZR_WorldX<T>) unsigned char storage[sizeof(ZR_WorldX<T>)];
  const i32 before = ZR_G_LiveWorlds;
  auto* const world = new (storage) ZR_WorldX<T>(5, 4, 0);
  world->extent = {1, 1, 3, 3};
  world->host_word = 9;
  ZR_LayerDef record;
  std::memset(&record, 0xee, sizeof record);
  world->FillOutEffectWorld(nullptr);
  world->FillOutEffectWorld(&record);
  EXPECT_EQ(record.flags, zr::Depth<T>::layer_flags);
  EXPECT_EQ(record.data, world->data);
  EXPECT_EQ(record.row_bytes, world->row_bytes);
  EXPECT_EQ(record.width, 5);
  EXPECT_EQ(record.height, 4);
  EXPECT_TRUE(same(record.extent, {1, 1, 3, 3}));
  EXPECT_EQ(record.owner, world);
  EXPECT_EQ(record.host_word, 0u);
  EXPECT_EQ(record.dispose_tag, 0u);
  {
    ZR_WorldX<T> wrapper(&record, false);
    EXPECT_TRUE(wrapper.IsReference());
    EXPECT_EQ(wrapper.owner, &wrapper);
    EXPECT_EQ(wrapper.raster, nullptr);
    EXPECT_TRUE(same(wrapper.extent, {1, 1, 3, 3}));
  }
  const auto* const tag = reinterpret_cast<const volatile u32*>(
      storage + (reinterpret_cast<unsigned char*>(&world->dispose_tag) - storage));
  EXPECT_EQ(ZR_G_LiveWorlds, before + 1);
  world->~ZR_WorldX<T>();
  EXPECT_EQ(*tag, 57005u);
  EXPECT_EQ(ZR_G_LiveWorlds, before);
}

TYPED_TEST(Worlds, ReleasedPixelsBelongToTheTaker) {
  using T = TypeParam;
  const i32 before = ZR_G_LiveWorlds;
  unique_ptr<ZR_WorldX<T>> keeper(new ZR_WorldX<T>(6, 3, 1));
  {
    ZR_WorldX<T> giver(6, 3, 1);
    std::swap(giver.allocation, keeper->allocation);
    std::swap(static_cast<ZR_LayerDef&>(giver).data, static_cast<ZR_LayerDef&>(*keeper).data);
    const u64 frame = giver.allocation;
    giver.ReleaseOwnership();
    EXPECT_EQ(ZR_G_LiveWorlds, before + 1);
    EXPECT_TRUE(giver.IsReference());
    giver.ReleaseOwnership();  // nothing left to give
    EXPECT_EQ(ZR_G_LiveWorlds, before + 1);
    giver.allocation = frame;  // taken back, so that it is freed
    ++ZR_G_LiveWorlds;
  }
  EXPECT_EQ(ZR_G_LiveWorlds, before + 1);
}

}  // namespace
