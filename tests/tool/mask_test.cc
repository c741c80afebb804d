// Masks of the tool from outside: values of shapes and modes on small pictures, and mistakes in one line.
#include "tool_run.h"

namespace zr::tool {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;

class Masks : public ToolRun {
 protected:
  std::vector<int> mask(const std::string& arguments) {
    EXPECT_EQ(run("mask -o out.png --force " + arguments), 0) << arguments << ": " << err;
    return channel_of("out.png", 'r');
  }
};

TEST_F(Masks, BadCallsAreOneLineAndLeaveNothing) {
  expect_refused(
      "mask -o out/a.png ",
      {
          {"--size 9x9", 2, "there is no shape"},
          {"--rectangle '1 1 2 2'", 2, "one of a picture, --size and --like"},
          {"in.png --size 9x9 --rectangle '1 1 2 2'", 2, "one of a picture, --size and --like"},
          {"--size 9 --rectangle '1 1 2 2'", 2, "--size is \"9\"; it must be WIDTHxHEIGHT"},
          {"--size 9x9 --rectangle '1 1 2'", 2, "--rectangle \"1 1 2\" begins with 3 numbers"},
          {"--size 9x9 --rectangle '1 1 0 2'", 2, "has no area"},
          {"--size 9x9 --rectangle '1 1 nan 2'", 2, "begins with 2 numbers"},
          {"--size 9x9 --ellipse '1 1 1e7 2'", 2, "\"1e7\"; it must be a number -1000000 to 1000000"},
          {"--size 9x9 --polygon '1,1 2,2 3'", 2, "x,y of 3 to 1000 points"},
          {"--size 9x9 --ellipse '1 1 2 2 fether 3'", 2, "unknown word \"fether\"; the nearest is \"feather\""},
          {"--size 9x9 --ellipse '1 1 2 2 feather'", 2, "lacks the number after \"feather\""},
          {"--size 9x9 --ellipse '1 1 2 2 feather 1001'", 2, "a number 0 to 1000"},
          {"--size 9x9 --ellipse '1 1 2 2 opacity 1.5'", 2, "opacity \"1.5\"; it must be a number 0 to 1"},
          {"--size 9x9 --ellipse '1 1 2 2 mode substract'", 2, "the nearest is \"subtract\""},
          {"--size 9x9 --ellipse '1 1 2 2' --fade 2", 2, "--fade is \"2\""},
          {"--size 9x9 --ellipse '1 1 2 2' --depth float", 2, "a mask without a picture has 8 or 16"},
          {"--like none.png --ellipse '1 1 2 2'", 3, "none.png does not exist"},
          {"none.png --ellipse '1 1 2 2'", 3, "none.png does not exist"},
      });
}

// One row of six pixels each.
TEST_F(Masks, HoldWhatShapesCoverAndModesMakeOfIt) {
  const struct {
    const char* arguments;
    std::vector<int> values;
  } rows[] = {
      {"--rectangle '1 0 2.5 1'", {0, 255, 255, 128, 0, 0}},
      {"--rectangle '-9 -9 10.25 9.5'", {128, 32, 0, 0, 0, 0}},
      {"--rectangle '7 0 9 9'", {0, 0, 0, 0, 0, 0}},
      {"--rectangle '1 0 4 1 opacity 0.2' --invert", {255, 204, 204, 204, 204, 255}},
      {"--rectangle '1 0 4 1' --invert --fade 0.2", {51, 0, 0, 0, 0, 51}},
      {"--polygon '0,0 4,0 4,4 0,4'", {255, 255, 255, 255, 0, 0}},
      {"--polygon '0,0 4,0 4,9 0,9 0,0 1,0 1,9 3,9 3,0 1,0'", {255, 0, 0, 255, 0, 0}},
      {"--polygon '6,-3 6,3 0,0'", {64, 191, 255, 255, 255, 255}},
      {"--ellipse '-2000 -1000 2003.5 2001'", {255, 255, 255, 127, 0, 0}},
      {"--rectangle '0 0 4 1 opacity 0.6' --rectangle '2 0 4 1 opacity 0.6'", {153, 153, 214, 214, 153, 153}},
      {"--rectangle '0 0 4 1 opacity 0.6' --rectangle '2 0 4 1 opacity 0.6 mode add'", {153, 153, 255, 255, 153, 153}},
      {"--rectangle '0 0 4 1' --rectangle '2 0 4 1 opacity 0.6 mode subtract'", {255, 255, 102, 102, 0, 0}},
      {"--rectangle '0 0 4 1' --rectangle '2 0 4 1 opacity 0.6 mode intersect'", {0, 0, 153, 153, 0, 0}},
      {"--rectangle '0 0 4 1' --rectangle '2 0 4 1 opacity 0.6 mode lighten'", {255, 255, 255, 255, 153, 153}},
      {"--rectangle '0 0 4 1' --rectangle '2 0 4 1 opacity 0.6 mode darken'", {0, 0, 153, 153, 0, 0}},
      {"--rectangle '0 0 4 1' --rectangle '2 0 4 1 opacity 0.6 mode difference'", {255, 255, 102, 102, 153, 153}},
      {"--rectangle '0 0 4 1' --rectangle '99 0 4 1 mode intersect'", {0, 0, 0, 0, 0, 0}},
      {"--rectangle '1 0 2 1 mode subtract'", {255, 0, 0, 255, 255, 255}},
  };
  for (const auto& row : rows) EXPECT_EQ(mask("--size 6x1 " + std::string(row.arguments)), row.values) << row.arguments;
  EXPECT_THAT(mask("--size 3x1 --ellipse '0 0 1 1' --rectangle '0 0 3 1 mode subtract' --ellipse '1 -9 1 20'"),
              ElementsAre(0, testing::Gt(250), 0))
      << "in the order of the line, not kind by kind";
}

TEST_F(Masks, FeathersAreTheBlursOfPictures) {
  for (const char* depth : {"8", "16"}) {
    const std::string at = std::string(" --depth ") + depth;
    mask("--size 40x30 --rectangle '12 9 14 8'" + at);
    ASSERT_EQ(run("mask out.png -o alpha.png --force --rectangle '12 9 14 8'"), 0) << err;
    ASSERT_EQ(run("blur alpha.png -o out.png --force --radius 5.5 --channels a"), 0) << err;
    const std::vector<int> blurred = channel_of("out.png", 'a');
    const std::vector<int> feathered = mask("--size 40x30 --rectangle '12 9 14 8 feather 5.5'" + at);
    for (size_t i = 0; i < blurred.size(); ++i) EXPECT_NEAR(feathered[i], blurred[i], 2) << depth << ' ' << i;
  }
  EXPECT_THAT(mask("--size 6x1 --rectangle '-90 -90 200 200 feather 9'"), testing::Each(255))
      << "edges of the mask are not edges of the shape";
}

TEST_F(Masks, CutPicturesAndLayers) {
  mask("--size 6x1 --rectangle '0 0 3 1 opacity 0.4' --rectangle '3 0 3 1'");
  ASSERT_EQ(run("convert out.png -o in.png --to srgb"), 0) << err;
  ASSERT_EQ(run("mask in.png -o out.png --force --rectangle '2 0 2.6 1'"), 0) << err;
  EXPECT_THAT(channel_of("out.png", 'a'), ElementsAre(0, 0, 255, 255, 153, 0));
  std::ofstream(folder / "s.json") << R"({"size":[6,2],"layers":[
    {"image":"in.png","mask":[{"shape":"rectangle","box":[2,0,2.6,1]}]}, {"image":"in.png","position":[0,1]}]})";
  ASSERT_EQ(run("render s.json -o out.png --force"), 0) << err;
  EXPECT_THAT(channel_of("out.png", 'a'), ElementsAre(0, 0, 255, 255, 153, 0, 255, 255, 255, 255, 255, 255))
      << "the other layer's picture stays whole";
}

TEST_F(Masks, OfLayersNameLayerAndShapeInMistakes) {
  const struct {
    const char* shape;
    const char* message;
  } mistakes[] = {
      {"{\"shape\":\"circle\",\"box\":[0,0,1,1]}", "layers[0].mask[1].shape is \"circle\""},
      {"{\"box\":[0,0,1,1]}", "layers[0].mask[1] lacks \"shape\""},
      {"{\"shape\":\"ellipse\"}", "layers[0].mask[1] (ellipse) lacks \"box\""},
      {"{\"shape\":\"ellipse\",\"box\":[0,0,1]}", "layers[0].mask[1].box is a list of 3"},
      {"{\"shape\":\"ellipse\",\"box\":[0,0,-1,1]}", "layers[0].mask[1].box has no area"},
      {"{\"shape\":\"ellipse\",\"box\":[0,0,1,1],\"fether\":1}", "layers[0].mask[1] (ellipse) has an unknown key"},
      {"{\"shape\":\"polygon\",\"points\":[[0,0],[1,1]]}", "layers[0].mask[1].points is a list of 2"},
      {"{\"shape\":\"polygon\",\"points\":[[0,0],[1,1],[1,\"x\"]]}", "layers[0].mask[1].points[2][1] is \"x\""},
      {"{\"shape\":\"rectangle\",\"box\":[0,0,1,1],\"feather\":-1}", "layers[0].mask[1].feather is -1"},
      {"{\"shape\":\"rectangle\",\"box\":[0,0,1,1],\"mode\":\"ad\"}", "layers[0].mask[1].mode is an unknown mask mode"},
  };
  for (const auto& mistake : mistakes) {
    std::ofstream(folder / "s.json") << R"({"size":[6,2],"layers":[{"colour":"#ffffff","mask":[
      {"shape":"rectangle","box":[0,0,1,1]},)"
                                     << mistake.shape << "]}]}";
    EXPECT_EQ(run("render s.json -o out.png"), 2) << mistake.shape;
    EXPECT_THAT(err, HasSubstr(mistake.message));
  }
}

}  // namespace
}  // namespace zr::tool
