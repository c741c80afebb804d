// Pictures placed through matrices: scenes, zr transform and zr sheet.
#include <cmath>
#include <functional>

#include "scene.h"
#include "tool_run.h"

namespace zr::tool {
namespace {

using Place = std::function<ZR_Pixel8(i32 x, i32 y)>;

bool equal(const ZR_Pixel8& a, const ZR_Pixel8& b) {
  return a.alpha == b.alpha && a.red == b.red && a.green == b.green && a.blue == b.blue;
}

class Placed : public ToolRun {
 protected:
  // Opaque noise of 9 by 6 in noise.png.
  Placed() : noise_(9, 6, 8) {
    u32 state = 7;
    for (i32 y = 0; y < 6; ++y)
      for (i32 x = 0; x < 9; ++x) {
        state = state * 1664525u + 1013904223u;
        noise_.row<ZR_Pixel8>(y)[x] = {255, static_cast<u8>(state >> 24), static_cast<u8>(state >> 16),
                                       static_cast<u8>(state >> 8)};
      }
    save_image(noise_, output_format_of("noise.png"), false, folder / "noise.png");
  }
  ZR_Pixel8 noise(i32 x, i32 y) const {
    const bool inside = x >= 0 && x < 9 && y >= 0 && y < 6;
    return inside ? noise_.row<ZR_Pixel8>(y)[x] : ZR_Pixel8{0, 0, 0, 0};
  }
  OwnedWorld picture(const std::string& name) const { return load_image(folder / name, 8, "test"); }
  void expect_picture(const std::string& name, i32 width, i32 height, const std::string& what, const Place& pixel) {
    const OwnedWorld got = picture(name);
    ASSERT_EQ(got.width(), width) << what;
    ASSERT_EQ(got.height(), height) << what;
    for (i32 y = 0; y < height; ++y)
      for (i32 x = 0; x < width; ++x)
        ASSERT_TRUE(equal(got.row<ZR_Pixel8>(y)[x], pixel(x, y))) << what << " at " << x << ", " << y;
  }
  // The alphas of a row of a scene of 20 by 4 with one white layer.
  std::vector<int> alphas(const std::string& layer, i32 row, const std::string& more = "") {
    folder.write("s.json", R"({"size":[20,4],"layers":[{"colour":"#ffffff",)" + layer + "}]" + more + "}");
    EXPECT_EQ(run("render s.json -o s.png --force --frames 2"), 0) << err;
    const OwnedWorld got = picture("s.png");
    std::vector<int> alphas;
    for (i32 x = 0; x < got.width(); ++x) alphas.push_back(got.row<ZR_Pixel8>(row)[x].alpha);
    return alphas;
  }
  const Hostkit host;
  OwnedWorld noise_;
};

TEST_F(Placed, ALayerMovedByWholePixelsIsACopy) {
  for (const std::string quality : {"draft", "bilinear", "bicubic"}) {
    for (const std::string keys :
         {R"("position":[3,-2])", R"("position":[8,1],"anchor":[5,3],"scale":1,"rotation":720,"skew":[0,0])",
          R"("matrix":[1,0,3,0,1,-2,0,0,1])", R"("position":[3,-2],"motion_blur":true)"}) {
      folder.write("s.json",
                   R"({"size":[13,7],"quality":")" + quality + R"(","layers":[{"image":"noise.png",)" + keys + "}]}");
      ASSERT_EQ(run("render s.json -o s.png --force"), 0) << err;
      expect_picture("s.png", 13, 7, quality + keys, [&](i32 x, i32 y) { return noise(x - 3, y + 2); });
    }
  }
}

TEST_F(Placed, QuarterTurnsOnlyRearrangePixels) {
  const struct {
    const char* options;
    i32 width, height;
    Place pixel;
  } cases[] = {
      {"--rotate 90", 6, 9, [&](i32 x, i32 y) { return noise(y, 5 - x); }},
      {"--rotate -90", 6, 9, [&](i32 x, i32 y) { return noise(8 - y, x); }},
      {"--rotate 540", 9, 6, [&](i32 x, i32 y) { return noise(8 - x, 5 - y); }},
      {"--scale -1,1", 9, 6, [&](i32 x, i32 y) { return noise(8 - x, y); }},
      {"--matrix 0,-1,6,1,0,0,0,0,1", 6, 9, [&](i32 x, i32 y) { return noise(y, 5 - x); }},
      {"--translate 5,-7", 9, 6, [&](i32 x, i32 y) { return noise(x, y); }},
      {"--size 12x10 --translate 1,0", 12, 10, [&](i32 x, i32 y) { return noise(x - 2, y - 2); }},
      {"--scale 2 --quality draft", 18, 12, [&](i32 x, i32 y) { return noise(x / 2, y / 2); }},
  };
  for (const auto& one : cases) {
    for (const std::string quality : {"draft", "bilinear", "bicubic"}) {
      if (std::string(one.options).find("quality") != std::string::npos && quality != "draft") continue;
      const std::string more =
          std::string(one.options).find("quality") == std::string::npos ? " --quality " + quality : "";
      ASSERT_EQ(run(std::string("transform noise.png -o t.png --force ") + one.options + more), 0) << err;
      expect_picture("t.png", one.width, one.height, one.options + more, one.pixel);
    }
  }
}

TEST_F(Placed, RotationAndScaleFollowTheirKeyframes) {
  folder.write("s.json", R"({"size":[9,9],"layers":[{"image":"noise.png","anchor":[3,3],"position":[3,3],
      "rotation":[{"frame":1,"value":0},{"frame":4,"value":135},{"frame":6,"value":180}]}]})");
  ASSERT_EQ(run("render s.json -o s.#.png --frames 1-6"), 0) << err;
  expect_picture("s.1.png", 9, 9, "no turn", [&](i32 x, i32 y) { return noise(x, y); });
  expect_picture("s.3.png", 9, 9, "a quarter", [&](i32 x, i32 y) { return noise(y, 5 - x); });
  expect_picture("s.6.png", 9, 9, "a half", [&](i32 x, i32 y) { return noise(5 - x, 5 - y); });
}

TEST_F(Placed, ReducingTakesMeansAndAHalfPixelMixesTwo) {
  ASSERT_EQ(run("transform noise.png -o t.png --scale 0.3333333333333333,0.5"), 0) << err;
  const OwnedWorld small = picture("t.png");
  ASSERT_EQ(small.width(), 3);
  ASSERT_EQ(small.height(), 3);
  int sum = 0;
  for (i32 y = 2; y < 4; ++y)
    for (i32 x = 3; x < 6; ++x) sum += noise(x, y).green;
  EXPECT_NEAR(small.row<ZR_Pixel8>(1)[1].green, sum / 6.0, 1.0);
  ASSERT_EQ(run("transform noise.png -o u.png --translate 0.5,0"), 0) << err;
  const OwnedWorld moved = picture("u.png");
  ASSERT_EQ(moved.width(), 10);
  EXPECT_NEAR(moved.row<ZR_Pixel8>(2)[0].alpha, 128, 1);
  EXPECT_EQ(moved.row<ZR_Pixel8>(2)[0].red, noise(0, 2).red) << "the edge fades, its colour does not";
  EXPECT_NEAR(moved.row<ZR_Pixel8>(2)[4].red, (noise(3, 2).red + noise(4, 2).red) / 2.0, 1.0);
}

TEST_F(Placed, MotionBlurIsEvenOnBothSidesOfTheFrame) {
  // Four pixels wide, eight pixels a frame, in the middle at frame 2.
  const std::string moving =
      R"("size":[4,4],"position":[{"frame":1,"value":[0,0]},{"frame":3,"value":[16,0]}],"motion_blur":)";
  EXPECT_THAT(alphas(moving + "false", 1), testing::Contains(255).Times(4));
  for (const std::string samples : {"2", "9", "16", "40"}) {
    const std::vector<int> row =
        alphas(moving + R"({"shutter_angle":180,"shutter_phase":-90,"samples":)" + samples + "}", 1);
    int sum = 0;
    for (size_t x = 0; x < 10; ++x) {
      EXPECT_NEAR(row[x], row[19 - x], 2) << samples << " at " << x;
      EXPECT_LE(row[x], row[std::min(x + 1, size_t{9})] + 1) << samples << ": rises to the middle";
      sum += row[x] + row[19 - x];
    }
    EXPECT_NEAR(sum, 4 * 255, 16) << "the light stays, spread over four pixels more";
    EXPECT_EQ(row[5], 0);
    EXPECT_GT(row[6], 0);
  }
  const std::vector<int> early = alphas(moving + R"({"shutter_angle":90,"shutter_phase":-90})", 1);
  EXPECT_GT(early[6], 0);
  EXPECT_EQ(early[13], 0) << "closes at the frame";
}

TEST_F(Placed, MotionBlurFollowsATurnBetweenFrames) {
  // Nearly a full turn while the shutter is open: what lies between the first and the last matrix counts.
  const std::vector<int> row = alphas(
      R"("size":[8,1],"anchor":[0,0.5],"position":[10,2],
         "rotation":[{"frame":2,"value":0},{"frame":3,"value":360}],
         "motion_blur":{"shutter_angle":355,"shutter_phase":0,"samples":60})",
      1);
  EXPECT_GT(row[4], 0) << "left of the pivot";
  EXPECT_GT(row[15], 0) << "and right of it";
  EXPECT_LT(row[15], 200);
}

TEST_F(Placed, FieldsLeaveTheOtherRowsAlone) {
  const struct {
    const char *scene, *layer, *option;
    std::vector<int> alpha;  // of the four rows
  } cases[] = {
      {"none", "all", "", {255, 255, 255, 255}},
      {"upper", "all", "", {255, 0, 255, 0}},
      {"lower", "all", "", {0, 255, 0, 255}},
      {"upper", "even", "", {255, 0, 255, 0}},
      {"upper", "odd", "", {0, 0, 0, 0}},
      {"none", "odd", "", {0, 255, 0, 255}},
      {"upper", "all", "--field lower", {0, 255, 0, 255}},
      {"upper", "all", "--field none", {255, 255, 255, 255}},
  };
  for (const auto& one : cases) {
    for (const std::string turned : {"", R"(,"rotation":45,"scale":50)"}) {
      folder.write("s.json",
                   std::string(R"({"size":[2,4],"field":")") + one.scene +
                       R"(","layers":[{"colour":"#ffffff","size":[20,40],"anchor":[9,9],"position":[1,2],"field":")" +
                       one.layer + '"' + turned + "}]}");
      ASSERT_EQ(run(std::string("render s.json -o s.png --force ") + one.option), 0) << err;
      const OwnedWorld got = picture("s.png");
      for (i32 y = 0; y < 4; ++y)
        EXPECT_EQ(got.row<ZR_Pixel8>(y)[1].alpha, one.alpha[static_cast<size_t>(y)])
            << one.scene << ' ' << one.layer << ' ' << one.option << turned << " row " << y;
    }
  }
}

TEST_F(Placed, AMatteIsPlacedByTheSameKeys) {
  const std::vector<int> plain = alphas(R"("matte":{"image":"noise.png","position":[4,0]})", 1);
  EXPECT_THAT(plain, testing::Contains(255).Times(9));
  const std::vector<int> wide =
      alphas(R"("matte":{"image":"noise.png","scale":[2,1],"position":[10,0],"anchor":[4.5,0],"quality":"draft"})", 1);
  EXPECT_THAT(wide, testing::Contains(255).Times(18));
  EXPECT_EQ(wide[0], 0);
  const std::vector<int> open =
      alphas(R"("matte":{"image":"noise.png","rotation":90,"position":[10,-2],"kind":"inverted-alpha"})", 1);
  EXPECT_THAT(open, testing::Contains(0).Times(6)) << "stands on its side";
}

TEST(Placement, StandardsOfTheSceneReachItsLayersAndMattes) {
  const Scene scene = parse_scene(R"({"size":[8,8],"quality":"draft","motion_blur":{"samples":5,"shutter_angle":90},
    "layers":[ {"image":"a","matte":{"image":"b","quality":"bicubic"}},
               {"image":"a","motion_blur":{"samples":9},"quality":"bilinear",
                "position":[{"frame":0,"value":[0,0]},{"frame":10,"value":[40,20]}]},
               {"image":"a","motion_blur":false,"scale":3,"rotation":90,"anchor":[2,1],"position":[10,20]} ]})",
                                  "s.json");
  const auto& layers = scene.layers;
  EXPECT_EQ(layers[0].placement.quality, 0);
  EXPECT_EQ(layers[0].matte->placement.quality, 2);
  EXPECT_EQ(layers[0].matte->placement.motion_blur->samples, 5);
  const std::vector<GX_Matrix3> moving = layers[1].placement.matrices_of(5);
  ASSERT_EQ(moving.size(), 9u);
  EXPECT_DOUBLE_EQ(moving.front().m[0][2], 19) << "a quarter of a frame early";
  EXPECT_DOUBLE_EQ(moving.back().m[1][2], 10) << "90 degrees later";
  const std::vector<GX_Matrix3> still = layers[2].placement.matrices_of(5);
  ASSERT_EQ(still.size(), 1u);
  const auto& m = still[0].m;
  const std::vector<double> got = {m[0][0], m[0][1], m[0][2], m[1][0], m[1][1], m[1][2]};
  EXPECT_EQ(got, (std::vector<double>{0, -3, 13, 3, 0, 14})) << "turned right, so that x runs down";
}

TEST_F(Placed, MistakesAreOneLineAndLeaveNothing) {
  expect_refused("", {
                         {"transform noise.png -o o.png --scale 0", 2, "neither scale may be 0"},
                         {"transform noise.png -o o.png --scale 1,2,3", 2, "--scale is \"1,2,3\"; it must be"},
                         {"transform noise.png -o o.png --scale nan", 2, "-1000 to 1000"},
                         {"transform noise.png -o o.png --rotate 1e9", 2, "-360000 to 360000"},
                         {"transform noise.png -o o.png --skew 90", 2, "-89 to 89"},
                         {"transform noise.png -o o.png --skew 45,45", 2, "flattens"},
                         {"transform noise.png -o o.png --translate 5", 2, "two numbers"},
                         {"transform noise.png -o o.png --size 10x40000", 2, "WIDTHxHEIGHT, each 1 to 30000"},
                         {"transform noise.png -o o.png --scale 1000 --size 0x5", 2, "--size is \"0x5\""},
                         {"transform noise.png -o o.png --scale 1000,999 --skew 80", 2, "a side has at most 30000"},
                         {"transform noise.png -o o.png --matrix 1,0,0,0,1,0,0,1,1", 2, "the last row 0,0,1"},
                         {"transform noise.png -o o.png --matrix 1,0,0,0,1,0,0,0,1 --rotate 5", 2, "excludes"},
                         {"transform noise.png -o o.png --background red", 2, "#rrggbb"},
                         {"transform noise.png -o o.png --quality best", 2, "best"},
                         {"sheet noise.png noise.png -o o.png --width 8", 2, "--width"},
                         {"sheet noise.png none.png -o o.png", 3, "none.png does not exist"},
                         {"render noise.png -o o.png --field even", 2, "--field"},
                     });
}

TEST_F(Placed, ASheetHoldsEveryPictureInOrder) {
  ASSERT_EQ(run("transform noise.png -o red.png --scale 8 --background '#ff0000' --translate 900,0 --size 72x48"), 0);
  ASSERT_EQ(run("transform noise.png -o blue.png --background '#0000ff' --translate 900,0 --size 40x80"), 0);
  ASSERT_EQ(run("sheet red.png blue.png red.png -o sheet.png --width 36 --plain"), 0) << err;
  const OwnedWorld sheet = picture("sheet.png");  // two columns of 36 by 24, 12 pixels between
  ASSERT_EQ(sheet.width(), 12 + 2 * 48);
  ASSERT_EQ(sheet.height(), 12 + 2 * 36);
  EXPECT_EQ(sheet.row<ZR_Pixel8>(12)[12].red, 255);
  EXPECT_EQ(sheet.row<ZR_Pixel8>(24)[60 + 18].blue, 255);
  EXPECT_NE(sheet.row<ZR_Pixel8>(24)[60].blue, 255) << "a tall picture is fitted inside";
  EXPECT_EQ(sheet.row<ZR_Pixel8>(48)[12].red, 255) << "the third begins the second row";
}

}  // namespace
}  // namespace zr::tool
