// The slot table after birth, and what replacing a slot does.
#include <ZR/composite.h>
#include <ZR/copy_bits.h>
#include <ZR/module.h>
#include <ZR/summed_area.h>

#include <bitset>

#include "support/born_library.h"
#include "support/worlds.h"
#include "world/premul_rows.h"

namespace {

struct Range {
  int first, last;
};
// Slots with a routine; every other one is null.
constexpr Range filled[] = {{2, 10},  {17, 28}, {31, 32}, {35, 48}, {51, 58},
                            {60, 65}, {68, 68}, {70, 78}, {81, 89}, {92, 117}};

using Slots = BornLibrary;

TEST_F(Slots, HoldARoutineWhereTheLibraryHasOneAndNullElsewhere) {
  std::bitset<ZR_SlotCount> expected;
  for (const Range& range : filled)
    for (int slot = range.first; slot <= range.last; ++slot) expected.set(static_cast<size_t>(slot));
  for (size_t slot = 0; slot < ZR_SlotCount; ++slot) {
    const char* const name = ZR_GetSlotName(static_cast<i32>(slot));
    EXPECT_EQ(ZRp_G_OverFuncs[slot] != nullptr, expected[slot]) << "slot " << slot << ' ' << (name ? name : "");
    EXPECT_EQ(name != nullptr, expected[slot] || slot <= ZR_Slot_module1) << "slot " << slot;
  }
  EXPECT_EQ(ZR_GetSlotName(-1), nullptr);
  EXPECT_EQ(ZR_GetSlotName(ZR_SlotCount), nullptr);
}

// Routines with an exported name or with a name agreed between floors stand in the slot of that number.
TEST_F(Slots, HoldTheRoutineOfTheirName) {
  const auto at = [](int slot) { return reinterpret_cast<void*>(ZRp_G_OverFuncs[slot]); };
  const auto address = [](auto* routine) { return reinterpret_cast<void*>(routine); };
  const struct {
    int slot;
    void* routine;
  } cases[] = {
      {2, address(&ZR_NNSample)},
      {3, address(&ZR_SubpixelSample_Straight)},
      {4, address(&ZR_SubpixelSample_Premul)},
      {5, address(&ZR_AreaSample_CPlusPlus<ZR_Pixel8, 1>)},
      {6, address(&ZR_AreaSample_Premul)},
      {57, address(&ZR_SubpixelSampleComputeWeight)},
      {58, address(&ZR_SubpixelSampleTranslateNoClip_Straight)},
      {60, address(&ZR_SubpixelSamplePlus_Straight)},
      {61, address(&ZR_SubpixelSampleNoClip_Straight)},
      {63, address(&ZR_NNSample16)},
      {64, address(&ZR_SubpixelSample_Straight16)},
      {65, address(&ZR_AreaSample_CPlusPlus<ZR_Pixel16, 1>)},
      {68, address(&ZR_SubpixelSampleTranslateNoClip_Straight16)},
      {70, address(&ZR_SubpixelSamplePlus_Straight16)},
      {71, address(&ZR_SubpixelSampleNoClip_Straight16)},
      {83, address(&ZR_SubpixelSampleNoClip_Straight_4)},
      {84, address(&ZR_SubpixelSampleTranslateNoClip_Straight_4)},
      {86, address(&ZR_SubpixelSpanSampleTranslateNoClip_Straight)},
      {87, address(&ZR_SubpixelSpanSampleTranslateNoClip_Straight16)},
      {23, address(&ZR_CopyBits_Draft_Static)},
      {24, address(&ZR_CopyBits_HQ_Straight_Static)},
      {25, address(&ZR_CopyBits_HQ_Premul_Static)},
      {26, address(&ZR_FastBlur_Straight)},
      {27, address(&ZR_FastBlur_Premul)},
      {28, address(&ZR_Convolve)},
      {31, address(&ZR_TransferRect_S)},
      {32, address(&ZR_TransformWorld_S)},
      {52, address(&ZR_PremulRect_S)},
      {53, address(&ZR_IterateGeneric_Static)},
      {35, address(&zr::premul_row<ZR_Pixel8>)},
      {36, address(&zr::unmul_row<ZR_Pixel8>)},
      {72, address(&zr::premul_row<ZR_Pixel16>)},
      {73, address(&zr::unmul_row<ZR_Pixel16>)},
      {106, address(&zr::premul_row<ZR_PixelFloat>)},
      {107, address(&zr::unmul_row<ZR_PixelFloat>)},
      {94, address(&ZR_GetInnerBlendingFunc<ZR_Pixel8, false, false>)},
      {95, address(&ZR_GetInnerBlendingFunc<ZR_Pixel16, false, false>)},
      {96, address(&ZR_GetInnerBlendingFunc<ZR_PixelFloat, false, false>)},
      {97, address(&ZR_GetInnerBlendingFunc<ZR_Pixel8, true, false>)},
      {98, address(&ZR_GetInnerBlendingFunc<ZR_Pixel16, true, false>)},
      {99, address(&ZR_GetInnerBlendingFunc<ZR_PixelFloat, true, false>)},
      {100, address(&ZR_GetInnerBlendingFunc<ZR_Pixel8, false, true>)},
      {101, address(&ZR_GetInnerBlendingFunc<ZR_Pixel16, false, true>)},
      {102, address(&ZR_GetInnerBlendingFunc<ZR_PixelFloat, false, true>)},
      {103, address(&ZR_GetInnerBlendingFunc<ZR_Pixel8, true, true>)},
      {104, address(&ZR_GetInnerBlendingFunc<ZR_Pixel16, true, true>)},
      {105, address(&ZR_GetInnerBlendingFunc<ZR_PixelFloat, true, true>)},
  };
  for (const auto& one : cases) EXPECT_EQ(at(one.slot), one.routine) << "slot " << one.slot;
}

TEST_F(Slots, OverrideTakesNumbersFrom1To117) {
  void* const mark = reinterpret_cast<void*>(&ZR_Hypot);
  for (const i32 slot : {-1, 0, 118, 119, INT32_MIN, INT32_MAX}) EXPECT_EQ(ZR_SetOverrideFunc(slot, mark), 3) << slot;
  EXPECT_EQ(ZRp_G_OverFuncs[0], nullptr);
  for (i32 slot = 1; slot <= 117; ++slot) {
    const ZR_SlotFunc before = ZRp_G_OverFuncs[slot];
    EXPECT_EQ(ZR_SetOverrideFunc(slot, mark), 0);
    EXPECT_EQ(reinterpret_cast<void*>(ZRp_G_OverFuncs[slot]), mark) << slot;
    ZRp_G_OverFuncs[slot] = before;
  }
}

// Each export goes through the slot of its number: that slot's routine alone is called, with the arguments.
template <i32 result, class... Arguments>
i32 answer(Arguments...) {
  return result;
}
template <i32 result, class... Arguments>
void* answering(i32 (*)(Arguments...)) {
  return reinterpret_cast<void*>(&answer<result, Arguments...>);
}

TEST_F(Slots, ExportsJumpThroughThem) {
  const SlotOverride overrides[] = {
      {ZR_Slot_iterate, answering<1042>(&ZR_Iterate)},
      {ZR_Slot_iterate_origin, answering<1043>(&ZR_IterateOrigin)},
      {ZR_Slot_iterate_lut, answering<1044>(&ZR_IterateLUT)},
      {ZR_Slot_open_destination, answering<1045>(&ZR_OpenDestination)},
      {ZR_Slot_close_destination, answering<1046>(&ZR_CloseDestination)},
      {ZR_Slot_iterate_generic, answering<1053>(&ZR_IterateGeneric)},
      {ZR_Slot_transfer_rect, answering<1031>(&ZR_TransferRect)},
      {ZR_Slot_transfer_rect_plus, answering<1020>(&ZR_TransferRectPlus)},
      {ZR_Slot_composite_rect_draft_straight, answering<1007>(&ZR_CompositeRectDraft_Straight)},
      {ZR_Slot_composite_rect_draft_premul, answering<1008>(&ZR_CompositeRectDraft_Premul)},
      {ZR_Slot_composite_rect_best_straight, answering<1009>(&ZR_CompositeRectBest_Straight)},
      {ZR_Slot_composite_rect_best_premul, answering<1010>(&ZR_CompositeRectBest_Premul)},
      {ZR_Slot_premul_rect, answering<1052>(&ZR_PremulRect)},
      {ZR_Slot_area_straight8, answering<1005>(&ZR_AreaSample_Straight)},
      {ZR_Slot_area_straight16, answering<1065>(&ZR_AreaSample_Straight16)},
  };
  EXPECT_EQ(ZR_Iterate(nullptr, 0, 0, nullptr, nullptr, nullptr, nullptr, nullptr), 1042);
  EXPECT_EQ(ZR_IterateOrigin(nullptr, 0, 0, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr), 1043);
  EXPECT_EQ(ZR_IterateLUT(nullptr, 0, 0, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr), 1044);
  EXPECT_EQ(ZR_OpenDestination(nullptr, nullptr), 1045);
  EXPECT_EQ(ZR_CloseDestination(nullptr, nullptr), 1046);
  EXPECT_EQ(ZR_IterateGeneric(1, nullptr, nullptr), 1053);
  EXPECT_EQ(ZR_TransferRect(nullptr, 0, 0, 0, nullptr, nullptr, nullptr, nullptr, nullptr, 0, 0, nullptr), 1031);
  EXPECT_EQ(ZR_TransferRectPlus(nullptr, 0, 0, 0, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, 0, 0, nullptr),
            1020);
  EXPECT_EQ(ZR_CompositeRectDraft_Straight(nullptr, nullptr, 0, nullptr, 0, 0, 0, 0, nullptr), 1007);
  EXPECT_EQ(ZR_CompositeRectDraft_Premul(nullptr, nullptr, 0, nullptr, 0, 0, 0, 0, nullptr), 1008);
  EXPECT_EQ(ZR_CompositeRectBest_Straight(nullptr, nullptr, 0, nullptr, 0, 0, 0, 0, nullptr), 1009);
  EXPECT_EQ(ZR_CompositeRectBest_Premul(nullptr, nullptr, 0, nullptr, 0, 0, 0, 0, nullptr), 1010);
  EXPECT_EQ(ZR_PremulRect(nullptr, 0, nullptr, nullptr), 1052);
  EXPECT_EQ(ZR_AreaSample_Straight(nullptr, 0, 0, nullptr, nullptr), 1005);
  EXPECT_EQ(ZR_AreaSample_Straight16(nullptr, 0, 0, nullptr, nullptr), 1065);
}

TEST_F(Slots, AnEmptiedSlotFailsItsExport) {
  const SlotOverride none(ZR_Slot_iterate_generic, nullptr);
  EXPECT_EQ(ZR_IterateGeneric(1, nullptr, [](void*, i32, i32, i32) { return i32{0}; }), 3);
}

TEST_F(Slots, DestinationBodiesClearTheirRecord) {
  struct {
    void* words[5];
  } record;
  int first = 0;
  void* const mark = &record;
  std::fill(std::begin(record.words), std::end(record.words), mark);
  EXPECT_EQ(ZR_OpenDestination(&first, &record), 0);
  EXPECT_EQ(record.words[0], &first);
  for (int i = 1; i < 4; ++i) EXPECT_EQ(record.words[i], nullptr);
  EXPECT_EQ(record.words[4], mark) << "32 bytes and no more";
  std::fill(std::begin(record.words), std::end(record.words), mark);
  EXPECT_EQ(ZR_CloseDestination(&first, &record), 0);
  for (int i = 0; i < 4; ++i) EXPECT_EQ(record.words[i], nullptr);
  EXPECT_EQ(record.words[4], mark);
}

}  // namespace
