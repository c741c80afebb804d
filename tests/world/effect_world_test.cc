// Effect worlds, chunks and the small services: results, texts, counts, and memory that runs short.
#include <HB/hb.h>
#include <ZR/errors.h>
#include <ZR/vec_pixel.h>
#include <ZR/world.h>

#include <cmath>
#include <cstring>
#include <string>

#include "support/born_library.h"
#include "world/effect_world.h"

namespace {

constexpr i32 code_of(const char (&name)[5]) {
  return static_cast<i32>((static_cast<u32>(name[0]) << 24) | (static_cast<u32>(name[1]) << 16) |
                          (static_cast<u32>(name[2]) << 8) | static_cast<u32>(name[3]));
}

class EffectWorlds : public BornLibrary {
 protected:
  void expect_report(u32 code, const std::string& text) {
    ASSERT_EQ(caught.messages().size(), 1u);
    EXPECT_EQ(caught.messages().back().code, code);
    EXPECT_EQ(caught.take_message(), text);
  }
};

TEST_F(EffectWorlds, LiveUntilTheyAreDisposedOnce) {
  for (const i32 depth : {8, 16, 32})
    for (const bool raster : {false, true}) {
      ZR_LayerDef record;
      std::memset(&record, 0xee, sizeof record);
      ASSERT_EQ(ZR_NewEffectWorld(nullptr, 13, 7, depth, true, raster, &record), 0);
      EXPECT_EQ(record.dispose_tag, 0xaaaabbbbu);
      EXPECT_EQ(record.raster != nullptr, raster);
      EXPECT_EQ(record.extent.right, 13);
      EXPECT_EQ(ZR_G_LiveWorlds, 1);
      i32 told = 0;
      EXPECT_EQ(ZR_GetEffectWorldDepth(nullptr, &record, &told), 0);
      EXPECT_EQ(told, depth);
      EXPECT_EQ(static_cast<const u8*>(record.data)[6 * record.row_bytes + 13 * depth / 2 - 1], 0);
      ZR_LayerDef copy = record;
      copy.dispose_tag = 0;
      EXPECT_EQ(ZR_DisposeEffectWorld(nullptr, &copy), ZR_Err_BadParam);
      expect_report(0x250003, "effects modules should only dispose worlds they have allocated");
      EXPECT_EQ(ZR_DisposeEffectWorld(nullptr, &record), 0);
      EXPECT_EQ(ZR_G_LiveWorlds, 0);
      const ZR_LayerDef zero = {};
      EXPECT_EQ(std::memcmp(&record, &zero, sizeof zero), 0);
      EXPECT_EQ(ZR_DisposeEffectWorld(nullptr, &record), ZR_Err_BadParam) << "a second time";
      expect_report(0x250003, "effects modules should only dispose worlds they have allocated");
    }
  EXPECT_EQ(ZR_DisposeEffectWorld(nullptr, nullptr), ZR_Err_BadParam);
  expect_report(0x250003, "invalid parameter");
}

TEST_F(EffectWorlds, RefusalsLeaveTheRecordAlone) {
  ZR_LayerDef record, untouched;
  std::memset(&record, 0xee, sizeof record);
  untouched = record;
  EXPECT_EQ(ZR_NewEffectWorld(nullptr, 0, 0, 99, true, true, nullptr), 0) << "no record: nothing is done";
  for (const i32 depth : {0, 24, 65544}) EXPECT_EQ(ZR_NewEffectWorld(nullptr, 5, 5, depth, false, false, &record), 3);
  EXPECT_TRUE(caught.quiet());
  EXPECT_EQ(ZR_NewEffectWorld(nullptr, 5, 30001, 8, false, false, &record), ZR_Err_BadParam);
  expect_report(0x250066, "invalid image buffer size (5x30001).");
  EXPECT_EQ(std::memcmp(&record, &untouched, sizeof record), 0);
}

TEST_F(EffectWorlds, WhicheverAllocationFailsNothingIsLeft) {
  for (const i32 depth : {8, 16, 32})
    for (const bool raster : {false, true})
      for (u64 nth = 1;; ++nth) {
        RS_PurgeFramePool();
        HB_MemoryStats before, after;
        HB_GetMemoryStats(&before);
        HB_FailNthAllocation(nth);
        ZR_LayerDef record = {};
        const i32 error = ZR_NewEffectWorld(nullptr, 640, 480, depth, true, raster, &record);
        HB_FailNthAllocation(0);
        if (error == 0) {
          EXPECT_GT(nth, 2u) << "at least the world and its frame";
          EXPECT_EQ(ZR_DisposeEffectWorld(nullptr, &record), 0);
          break;
        }
        EXPECT_EQ(error, ZR_Err_OutOfMemory) << "allocation " << nth;
        EXPECT_EQ(record.owner, nullptr);
        EXPECT_EQ(ZR_G_LiveWorlds, 0);
        HB_GetMemoryStats(&after);
        EXPECT_EQ(after.live_blocks, before.live_blocks) << "allocation " << nth;
        EXPECT_LE(caught.messages().size(), 1u) << "reported once at most";
        caught.clear();
      }
}

TEST_F(EffectWorlds, FlagsOfTheCallbackSurfaceGiveEightOrSixteenBits) {
  struct Case {
    i32 flags, depth;
  };
  for (const Case& c : {Case{0, 8}, {1, 8}, {2, 16}, {3, 16}, {4, 8}, {7, 16}}) {
    ZR_LayerDef record = {};
    ASSERT_EQ(zr::new_world_from_flags(nullptr, 4, 4, c.flags, &record), 0);
    EXPECT_EQ(ZRp_WorldDepth(&record), c.depth);
    EXPECT_EQ(record.raster, nullptr) << "no raster form";
    EXPECT_EQ(ZR_G_LastWorldStatus, 0);
    EXPECT_EQ(ZR_DisposeEffectWorld(nullptr, &record), 0);
  }
  ZR_LayerDef record = {};
  EXPECT_EQ(zr::new_world_from_flags(nullptr, -4, 4, 0, &record), ZR_Err_BadParam);
  EXPECT_EQ(ZR_G_LastWorldStatus, ZR_Err_BadParam);
}

TEST_F(EffectWorlds, PixelDataIsGivenToTheFunctionOfTheDepthOnly) {
  using Getter = i32 (*)(ZR_LayerDef*, void*, void**);
  const Getter getters[] = {ZR_GetPixelData8, ZR_GetPixelData16, ZR_GetPixelDataFloat};
  const char* const texts[] = {"bad parameter passed to ZR_GetPixelData8", "bad parameter passed to ZR_GetPixelData8",
                               "bad parameter passed to ZR_GetPixelDataFloat"};
  char pixels[16], others[16];
  for (u32 format = 0; format < 3; ++format)
    for (u32 getter = 0; getter < 3; ++getter) {
      ZR_LayerDef world = {};
      world.flags = format << 24;
      world.data = pixels;
      void* out = &world;
      EXPECT_EQ(getters[getter](&world, nullptr, &out), 0);
      EXPECT_EQ(out, format == getter ? pixels : nullptr);
      EXPECT_EQ(getters[getter](&world, others, &out), 0);
      EXPECT_EQ(out, format == getter ? others : nullptr);
    }
  for (u32 getter = 0; getter < 3; ++getter) {
    void* out = pixels;
    EXPECT_EQ(getters[getter](nullptr, others, &out), ZR_Err_BadParam);
    EXPECT_EQ(out, nullptr);
    EXPECT_EQ(caught.take_message(), texts[getter]);
  }
}

TEST_F(EffectWorlds, RasterRecordsKeepAZeroExtent) {
  alignas(16) char pixels[256];
  RS_World frame = {3, 2, 64, 0, 32, 0, pixels};
  RS_World* handle = &frame;
  ZR_LayerDef record;
  std::memset(&record, 0xee, sizeof record);
  ASSERT_EQ(ZR_EffectWorldFromRSWorld(&handle, &record), 0);
  EXPECT_EQ(record.flags, 0x1000001u);
  EXPECT_EQ(record.data, pixels);
  EXPECT_EQ(record.row_bytes, 32);
  EXPECT_EQ(record.width, 3);
  EXPECT_EQ(record.height, 2);
  EXPECT_EQ(record.raster, &handle);
  EXPECT_EQ(record.owner, nullptr);
  EXPECT_EQ(record.extent.right, 0);
  EXPECT_EQ(ZR_DepthOfRSWorld(&handle), 16);
  for (const i16 bits : {i16{24}, i16{33}, i16{67}, i16{0}}) {
    frame.bits_per_pixel = bits;
    const ZR_LayerDef untouched = record;
    EXPECT_EQ(ZR_EffectWorldFromRSWorld(&handle, &record), ZR_Err_Internal);
    EXPECT_EQ(caught.take_verification(), "ZR_Worlds can only be 128, 64 or 32 bits per pixel");
    EXPECT_EQ(std::memcmp(&record, &untouched, sizeof record), 0);
  }
}

TEST_F(EffectWorlds, ChunksOfEveryTypeAreBornLockedAndZeroed) {
  struct Case {
    i32 type;
    u16 bytes;
  };
  for (const Case& c : {Case{code_of("FLT4"), 4},
                        {code_of("LON4"), 4},
                        {code_of("FIX4"), 4},
                        {code_of("UFX4"), 4},
                        {code_of("DBL8"), 8},
                        {code_of("SHT2"), 2},
                        {code_of("UST2"), 2},
                        {code_of("CHR1"), 1},
                        {code_of("UBT1"), 1},
                        {code_of("RBG "), 3},
                        {code_of("RGB "), 1},
                        {0, 1}}) {
    u16 size = 0;
    EXPECT_EQ(ZR_ChunkDataSize(c.type, &size), 0);
    EXPECT_EQ(size, c.bytes);
    ZR_Chunk chunk;
    std::memset(&chunk, 0xee, sizeof chunk);
    ASSERT_EQ(ZR_NewChunk(5, 3, 2, c.type, &chunk), 0);
    EXPECT_EQ(chunk.reserved0[7], 0xeeeeeeeeeeeeeeeeu) << "not written";
    EXPECT_EQ(chunk.row_bytes, 10 * c.bytes);
    ASSERT_NE(chunk.data, nullptr);
    for (i32 i = 0; i < 30 * c.bytes; ++i) ASSERT_EQ(static_cast<u8*>(chunk.data)[i], 0);
    EXPECT_EQ(ZR_G_LiveChunks, 1);
    EXPECT_EQ(ZR_UnlockChunk(&chunk), 0);
    EXPECT_EQ(chunk.data, nullptr);
    EXPECT_EQ(ZR_UnlockChunk(&chunk), ZR_Err_BadParam) << "a second time";
    expect_report(0x25004a, "invalid parameter");
    EXPECT_EQ(ZR_LockChunk(&chunk), 0);
    EXPECT_EQ(chunk.data, *chunk.handle);
    EXPECT_EQ(ZR_DisposeChunk(&chunk), 0);
    const ZR_Chunk zero = {};
    EXPECT_EQ(std::memcmp(&chunk, &zero, sizeof zero), 0);
    EXPECT_EQ(ZR_LockChunk(&chunk), ZR_Err_BadParam);
    expect_report(0x25004a, "invalid parameter");
    EXPECT_EQ(ZR_DisposeChunk(&chunk), 0) << "a chunk without a handle";
    EXPECT_EQ(ZR_G_LiveChunks, 0);
  }
}

TEST_F(EffectWorlds, ChunksRefuseBadSizesAndSurviveShortMemory) {
  ZR_Chunk chunk = {};
  struct Case {
    i32 width, height, channels;
  };
  for (const Case& c : {Case{0, 1, 1}, {1, 0, 1}, {1, 1, 0}, {-1, 1, 1}, {0x7fffffff, 1, 2}, {0x10000000, 1, 1}}) {
    EXPECT_EQ(ZR_NewChunk(c.width, c.height, c.channels, code_of("DBL8"), &chunk), ZR_Err_BadParam);
    expect_report(0x25004a, "invalid parameter");
  }
  EXPECT_EQ(ZR_NewChunk(1, 1, 1, 0, nullptr), ZR_Err_BadParam);
  expect_report(0x25004a, "invalid parameter");
  EXPECT_EQ(ZR_DisposeChunk(nullptr), ZR_Err_BadParam);
  expect_report(0x25004a, "invalid parameter");
  for (u64 nth = 1;; ++nth) {
    HB_MemoryStats before, after;
    HB_GetMemoryStats(&before);
    HB_FailNthAllocation(nth);
    const i32 error = ZR_NewChunk(100, 100, 4, code_of("DBL8"), &chunk);
    HB_FailNthAllocation(0);
    if (error == 0) {
      EXPECT_GT(nth, 1u);
      EXPECT_EQ(ZR_DisposeChunk(&chunk), 0);
      break;
    }
    EXPECT_EQ(error, ZR_Err_OutOfMemory);
    EXPECT_EQ(chunk.handle, nullptr);
    EXPECT_EQ(chunk.data, nullptr);
    EXPECT_EQ(ZR_G_LiveChunks, 0);
    HB_GetMemoryStats(&after);
    EXPECT_EQ(after.live_blocks, before.live_blocks);
    EXPECT_NE(caught.take_message().find("out of memory for channel chunk"), std::string::npos);
  }
}

TEST_F(EffectWorlds, ServicesAnswerAsPlugInsKnowThem) {
  EXPECT_EQ(ZR_Hypot(3, -4), 5.0);
  EXPECT_TRUE(std::isinf(ZR_Hypot(1e200, 1e200))) << "no scaling";
  EXPECT_EQ(ZR_OverrideStdFuncs(), ZR_Err_BadSelector);
  expect_report(0x25002f, "Obsolete routine");
  EXPECT_EQ(ZR_ReportBadCallbackParam(0x123), ZR_Err_Internal);
  expect_report(0x250123, "bad parameter passed to effect callback");
  EXPECT_EQ(ZR_FreeUpSomeMemory(), 0);
}

TEST_F(EffectWorlds, AppCallbackHandsOutSharedTables) {
  const void* table = nullptr;
  EXPECT_EQ(ZR_AppCallback(nullptr, 2, &table), 0);
  EXPECT_EQ(table, ZRp_G_fcm_table);
  EXPECT_EQ(ZR_AppCallback(nullptr, 3, &table), 0);
  EXPECT_EQ(table, ZRp_G_fcd_table);
  EXPECT_EQ(ZR_AppCallback(nullptr, 6), 0);
  EXPECT_EQ(ZR_AppCallback(nullptr, 7), 0);
  const void *trig4 = nullptr, *trig5 = nullptr;
  EXPECT_EQ(ZR_AppCallback(nullptr, 4, &trig4), 0);
  EXPECT_EQ(ZR_AppCallback(nullptr, 5, &trig5), 0);
  EXPECT_NE(trig4, nullptr);
  EXPECT_EQ(trig4, trig5);
  EXPECT_EQ(ZR_AppCallback(nullptr, 8), 0);
  EXPECT_EQ(ZR_AppCallback(nullptr, 9), 0);
  for (const i32 selector : {-1, 0, 1, 10, 11}) {
    table = &trig4;
    EXPECT_EQ(ZR_AppCallback(nullptr, selector, &table), 0);
    EXPECT_EQ(table, &trig4);
  }
}

TEST_F(EffectWorlds, VectorConstantsAreSetByBirth) {
  EXPECT_EQ(ZR_G_FloatRamp[255], 255.0f);
  if (HB_G_CPU_DataP[2] == 0) return;
  EXPECT_EQ(ZR_G_viLoWordMask[3], 0xffffu);
  EXPECT_EQ(ZR_G_viLoByteMask32[3], 0xffu);
  EXPECT_EQ(ZR_G_vi128_32[3], 128u);
  EXPECT_EQ(ZR_G_AlphaMask32[0] & ~ZR_G_BGRMask32[0], ~0u);
  EXPECT_EQ(ZR_G_BGRMask32[3] & ~ZR_G_AlphaMask32[3], ~0u);
  EXPECT_EQ(ZR_G_vfHalf[3], 0.5f);
  EXPECT_EQ(ZR_G_vf255[3], 255.0f);
  EXPECT_EQ(ZR_G_vdHalf[1], 0.5);
  EXPECT_EQ(ZR_G_vd32768[1], 32768.0);
  // Mask k keeps k pixels of a block.
  EXPECT_EQ(VecPixel<ZR_Pixel8>::GetMask32()[4 * 3 + 2], ~0u);
  EXPECT_EQ(VecPixel<ZR_Pixel8>::GetMask32()[4 * 3 + 3], 0u);
  EXPECT_EQ(VecPixel<ZR_Pixel16>::GetMask32()[4 * 1 + 1], ~0u);
  EXPECT_EQ(VecPixel<ZR_Pixel16>::GetMask32()[4 * 1 + 2], 0u);
  EXPECT_EQ(VecPixel<ZR_PixelFloat>::GetMask32()[4 * 1 + 3], ~0u);
}

}  // namespace
