// Tables and names of the transfer modes.
#include <ZR/transfer_mode.h>

#include "support/born_library.h"

namespace {

using Modes = BornLibrary;

TEST_F(Modes, SlotsBehindTheModesAreNull) {
  for (i32 mode = 0; mode < 44; ++mode) {
    EXPECT_EQ(ZR_Get_Xfer1_table8(mode) != nullptr, mode <= 40) << mode;
    EXPECT_EQ(ZR_Get_Xfer1_Opacity2_tableF(mode) != nullptr, mode <= 40) << mode;
    EXPECT_EQ(ZR_Get_Xfer1_Opacity_table16(mode), ZRp_G_Xfer1_Opacity_table16[mode]);
  }
}

TEST_F(Modes, NamesAreFoundInEveryForm) {
  i32 count = 0;
  const ZR_TransferModeInfo* list = ZR_ListTransferModes(&count);
  ASSERT_EQ(count, 43);
  for (i32 i = 0; i < count; ++i) {
    EXPECT_STREQ(ZR_TransferModeName(list[i].mode), list[i].name);
    for (const char* name : {list[i].name, list[i].name + 4, list[i].short_name}) {
      i32 mode = -99;
      EXPECT_TRUE(ZR_FindTransferMode(name, &mode)) << name;
      EXPECT_EQ(mode, list[i].mode) << name;
    }
  }
  EXPECT_STREQ(ZR_TransferModeName(23), "XferColorDodge");
  struct Case {
    const char* name;
    i32 mode;  // -99: none
  };
  for (const Case& c : {Case{"in-front", 2},
                        {"IN FRONT", 2},
                        {"infront", 2},
                        {"xfer_color_dodge_w", 27},
                        {"multiply-not-alpha-luma", 20},
                        {"", -99},
                        {"xfer", -99},
                        {"scree", -99},
                        {"screens", -99},
                        {"-", -99}}) {
    i32 mode = -99;
    EXPECT_EQ(ZR_FindTransferMode(c.name, &mode), c.mode != -99) << c.name;
    EXPECT_EQ(mode, c.mode) << c.name;
  }
  for (const i32 mode : {-1, -4, 41}) EXPECT_EQ(ZR_TransferModeName(mode), nullptr);
}

}  // namespace
