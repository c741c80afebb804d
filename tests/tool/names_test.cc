// Frame names and ranges, nearest names, keyframes, progress texts.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "frame_names.h"
#include "keyframes.h"
#include "mode_names.h"
#include "nearest_name.h"
#include "progress_line.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;

TEST(FrameNames, AreAsWritten) {
  const struct {
    const char* pattern;
    i32 frame;
    const char* name;
  } rows[] = {{"out/f.####.png", 7, "out/f.0007.png"},
              {"#.png", 12, "12.png"},
              {"a.##.b.tif", 123, "a.123.b.tif"},
              {"f%04d.exr", 0, "f0000.exr"},
              {"f%d.exr", 31, "f31.exr"},
              {"####", 5, "0005"},
              {"still.png", 9, "still.png"}};
  for (const auto& row : rows) EXPECT_EQ(FrameNames(row.pattern).name(row.frame), row.name);
}

TEST(FrameNames, RefusesPatternsThatAreNone) {
  for (const char* pattern : {"a.#.#.png", "a#%d.png", "%s.png", "%4d.png", "%", "%0d.png", "out.##/f.png", "%d/f.png"})
    EXPECT_THROW(FrameNames{pattern}, ToolError) << pattern;
}

TEST(FrameNames, WithoutNumberHoldOneFrameOnly) {
  EXPECT_NO_THROW(FrameNames("f.png").require_for({4, 4}));
  EXPECT_NO_THROW(FrameNames("f#.png").require_for({1, 9}));
  EXPECT_THROW(FrameNames("f.png").require_for({1, 2}), ToolError);
}

TEST(FrameRange, ReadsAFrameOrARange) {
  EXPECT_EQ(parse_frame_range("1-48", "").count(), 48);
  EXPECT_EQ(parse_frame_range("7", "").first, 7);
  EXPECT_EQ(parse_frame_range("7", "").last, 7);
  EXPECT_EQ(parse_frame_range("0-0", "").count(), 1);
  for (const char* bad : {"", "-", "1-", "-3", "3-1", "1-2-3", "a", "1 - 2", "99999999", "4294967297"})
    EXPECT_THROW(parse_frame_range(bad, "frames"), ToolError) << bad;
}

TEST(NearestNames, FindsTheSlip) {
  const std::vector<std::string> names = {"opacity", "position", "mode", "matte", "image"};
  EXPECT_EQ(nearest_names("opactiy", names, 1).front(), "opacity");
  EXPECT_EQ(nearest_names("POSITON", names, 1).front(), "position");
  EXPECT_EQ(nearest_names("mate", names, 1).front(), "matte");
  EXPECT_EQ(nearest_names("zzzzzzzz", names).size(), 1u) << "something is always named";
  EXPECT_TRUE(nearest_names("x", {}).empty());
}

TEST(ModeNames, AreFoundHoweverTheyAreWritten) {
  for (const char* name : {"soft-light", "Soft Light", "soft_light", "XferSoftLight"})
    EXPECT_EQ(find_mode(name), 8) << name;
  EXPECT_EQ(find_mode("soft"), std::nullopt);
  EXPECT_EQ(all_modes().size(), 43u);
  EXPECT_THAT(suggest_modes("sof-light"), testing::Contains("soft-light"));
  EXPECT_THAT(suggest_modes("dodge"), testing::IsSupersetOf({"color-dodge", "linear-dodge"}));
}

TEST(ModeNames, OfOtherProgramsLeadToModesThatExist) {
  for (const char* other : {"normal", "over", "plus", "min", "max", "stencil", "silhouette", "linear-add", "luminance"})
    for (const std::string& name : suggest_modes(other))
      EXPECT_TRUE(find_mode(name).has_value()) << other << ' ' << name;
  EXPECT_THAT(suggest_modes("normal"), ElementsAre("in-front"));
}

TEST(Keyed, RunsStraightBetweenKeysAndHoldsOutside) {
  const Keyed<f64> value({{10, 0.0}, {20, 1.0}, {22, 0.5}});
  EXPECT_EQ(value.at(-5), 0.0);
  EXPECT_EQ(value.at(10), 0.0);
  EXPECT_DOUBLE_EQ(value.at(13), 0.3);
  EXPECT_EQ(value.at(20), 1.0);
  EXPECT_DOUBLE_EQ(value.at(21), 0.75);
  EXPECT_EQ(value.at(22), 0.5);
  EXPECT_EQ(value.at(1000), 0.5);
}

TEST(Progress, TellsTimesInWords) {
  EXPECT_EQ(duration_text(0.84), "0.8 s");
  EXPECT_EQ(duration_text(9.96), "10 s");
  EXPECT_EQ(duration_text(59.4), "59 s");
  EXPECT_EQ(duration_text(59.6), "1 min 00 s");
  EXPECT_EQ(duration_text(185), "3 min 05 s");
  EXPECT_EQ(duration_text(7805), "2 h 10 min");
  EXPECT_DOUBLE_EQ(seconds_left(6.0, 12, 48), 18.0);
  EXPECT_EQ(seconds_left(6.0, 48, 48), 0.0);
}

}  // namespace
}  // namespace zr::tool
