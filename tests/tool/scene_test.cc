// Scene files: what is read, and what is said about mistakes.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "scene.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

using testing::HasSubstr;

TEST(Scene, IsReadWhole) {
  const Scene scene = parse_scene(R"({
    "size": [960, 540], "background": [0.25, 0.5, 1, 0.5], "frames": "3-9", "depth": "float",
    "layers": [
      { "name": "solid", "colour": "#ff800080", "size": [20, 10], "mode": "Screen", "keep_alpha": true,
        "field": "odd", "seed": -7 },
      { "image": "media/a.png", "opacity": 0.25,
        "position": [ { "frame": 2, "value": [0, -1.5] }, { "frame": 4, "value": [10, 0] } ],
        "matte": { "image": "/b.png", "kind": "inverted-luma", "position": [3, 4] } } ] })",
                                  "folder/scene.json");
  EXPECT_EQ(scene.width, 960);
  EXPECT_EQ(scene.height, 540);
  EXPECT_EQ(scene.background.alpha, 0.5f);
  EXPECT_EQ(scene.background.red, 0.25f);
  EXPECT_EQ(scene.background.blue, 1.0f);
  EXPECT_EQ(scene.frames.first, 3);
  EXPECT_EQ(scene.frames.last, 9);
  EXPECT_EQ(scene.depth, 32);
  ASSERT_EQ(scene.layers.size(), 2u);
  const Layer &solid = scene.layers[0], &image = scene.layers[1];
  EXPECT_EQ(solid.image, "");
  EXPECT_EQ(solid.colour.red, 1.0f);
  EXPECT_FLOAT_EQ(solid.colour.alpha, 128.0f / 255.0f);
  EXPECT_EQ(solid.width, 20);
  EXPECT_EQ(solid.mode, 6);
  EXPECT_TRUE(solid.keep_alpha);
  EXPECT_EQ(solid.field, 2);
  EXPECT_EQ(solid.seed, -7);
  EXPECT_EQ(image.image, "folder/media/a.png") << "relative to the scene";
  EXPECT_EQ(image.opacity.at(1), 0.25);
  EXPECT_EQ(image.placement.position.at(3).x, 5.0);
  EXPECT_EQ(image.placement.position.at(3).y, -0.75);
  ASSERT_TRUE(image.matte.has_value());
  EXPECT_EQ(image.matte->image, "/b.png");
  EXPECT_EQ(image.matte->kind, 3u);
  EXPECT_EQ(image.matte->placement.position.at(1).y, 4.0);
}

TEST(Scene, HasDefaults) {
  const Scene scene = parse_scene(R"({"size":[8,4],"layers":[{"colour":[1,1,1]}]})", "s.json");
  EXPECT_EQ(scene.depth, 8);
  EXPECT_EQ(scene.frames.count(), 1);
  EXPECT_EQ(scene.background.alpha, 0.0f);
  const Layer& solid = scene.layers.at(0);
  EXPECT_EQ(solid.mode, 2);
  EXPECT_EQ(solid.width, 8);
  EXPECT_EQ(solid.height, 4);
  EXPECT_EQ(solid.opacity.at(5), 1.0);
  EXPECT_EQ(solid.colour.alpha, 1.0f);
}

struct Mistake {
  std::string text;
  const char* message;  // a part of it, with line and column where the text has them
};
void expect_told(const std::vector<Mistake>& mistakes, const std::string& before, const std::string& behind) {
  for (const Mistake& mistake : mistakes) {
    const std::string text = before + mistake.text + behind;
    try {
      parse_scene(text, "s.json");
      ADD_FAILURE() << "accepted: " << text;
    } catch (const ToolError& error) {
      EXPECT_EQ(error.code(), kExitBadInput);
      EXPECT_THAT(error.what(), HasSubstr(mistake.message));
      EXPECT_THAT(error.what(), testing::Not(HasSubstr("\n")));
    }
  }
}
constexpr char kLayer[] = "{\"size\":[8,8],\n \"layers\":[ {", kBlack[] = "\"colour\":\"#000000\", ";

TEST(Scene, MistakesAreToldWithTheirPlace) {
  expect_told(
      {
          {"", "s.json:1:1: not valid JSON"},
          {"{\n\"size\": [1,\n  oops] }", "s.json:3:3: not valid JSON"},
          {R"({"size":[8,8],"layers":[],})", "s.json:1:27: not valid JSON"},
          {R"({"size":[8,8],"layers":[])", "not valid JSON"},
          {"[]", "s.json:1:1: the scene is a list of 0"},
          {"{\n \"size\":[1e999,8]}", "s.json:2:10: a number is too large"},
          {R"({"layers":[]})", R"(the scene lacks "size")"},
          {R"({"size":[8,8]})", R"(the scene lacks "layers")"},
          {R"({"size":[8,8],"size":[8,8],"layers":[]})", R"("size" stands twice)"},
          {R"({"size":[0,8],"layers":[]})", "s.json:1:10: size[0] is 0; it must be a whole number 1 to 30000"},
          {R"({"size":[8,30001],"layers":[]})", "s.json:1:12: size[1] is 30001"},
          {R"({"size":[8,-5],"layers":[]})", "size[1] is -5"},
          {R"({"size":8,"layers":[]})", "s.json:1:9: size is 8"},
          {R"({"size":[8,1e300],"layers":[]})", "size[1] is 1e+300"},
          {R"({"size":[8,8],"layers":{}})", "layers is an object"},
          {R"({"size":[8,8],"layers":[],"frames":[5,2]})", "frames runs backwards"},
          {R"({"size":[8,8],"layers":[],"frames":"5-2"})", R"(s.json:1:36: frames is "5-2", which runs backwards)"},
          {R"({"size":[8,8],"layers":[],"depth":12})", R"(depth is 12; it must be 8, 16 or "float")"},
          {R"({"size":[8,8],"layers":[],"depht":8})",
           R"(s.json:1:27: the scene has an unknown key "depht"; the nearest is "depth")"},
          {R"({"size":[8,8],"layers":[],"field":"even"})", R"(must be "none", "upper" or "lower")"},
      },
      "", "");
}

TEST(Scene, MistakesOfLayersAreToldWithTheirPlace) {
  expect_told(
      {
          {"", "layers[0] must have either"},
          {R"("colour":[1,1,1],"image":"a.png")", "layers[0] must have either"},
          {R"("image":"a.png","size":[1,1])", "layers[0].size is for solids"},
          {R"("image":5)", "s.json:2:22: layers[0].image is 5"},
          {R"("image":"")", "the name of an image file"},
          {R"("colour":"#12345")", R"(layers[0].colour is "#12345")"},
          {R"("colour":[0,2,0])", "layers[0].colour[1] is 2; it must be a number 0 to 1"},
          {"\"name\":\"\xC3\xA4\xC3\xB6 ]}\\\"{\", \"colour\":\"#000000\", \"seed\": 0.5",
           "s.json:2:61: layers[0].seed is 0.5"},
      },
      kLayer, "} ]}");
  expect_told(
      {
          {R"("opacity": 1.5)", "s.json:2:45: layers[0].opacity is 1.5; it must be a number 0 to 1"},
          {R"("opacity": -0.1)", "layers[0].opacity is -0.1"},
          {R"("opacity": "1")", R"(layers[0].opacity is "1")"},
          {R"("opacity": [])", "layers[0].opacity is a list of 0"},
          {R"("opacity": [{"frame":1,"value":2}])", "layers[0].opacity[0].value is 2"},
          {R"("opacity": [{"frame":1}])", R"(layers[0].opacity[0] lacks "value")"},
          {R"("opacity": [{"frame":5,"value":0},{"frame":5,"value":1}])",
           "layers[0].opacity[1].frame is 5; it must be above the frame before it, 5"},
          {R"("position": [1,2,3])", "layers[0].position is a list of 3"},
          {R"("position": [1,1e9])", "layers[0].position[1] is 1000000000"},
          {R"("mode": "sceen")", R"(unknown transfer mode "sceen"; the nearest is "screen")"},
          {R"("mode": 6)", "layers[0].mode is 6"},
          {R"("keep_alpha": 1)", "layers[0].keep_alpha is 1; it must be true or false"},
          {R"("field": "upper")", R"(must be "all", "even" or "odd")"},
          {R"("seed": 2147483648)", "layers[0].seed is 2147483648"},
          {R"("scale": 1001)", "layers[0].scale is 1001; it must be a number -1000 to 1000"},
          {R"("scale": [1,2,3])", "layers[0].scale is a list of 3"},
          {R"("rotation": [1,2])", "layers[0].rotation is a list of 2"},
          {R"("rotation": [{"frame":1,"value":"30"}])", R"(s.json:2:66: layers[0].rotation[0].value is "30")"},
          {R"("skew": [0,90])", "layers[0].skew[1] is 90; it must be a number -89 to 89"},
          {R"("anchor": 5)", "layers[0].anchor is 5; it must be [x, y]"},
          {R"("matrix": [1,0,0,0,1,0])", "layers[0].matrix is a list of 6"},
          {R"("matrix": [1,0,0,0,1,0,0.1,0,1])", "layers[0].matrix[6] is 0.1"},
          {R"("matrix": [1,0,0,0,1,0,0,0,1], "scale": 2)", R"(layers[0].scale cannot stand beside "matrix")"},
          {R"("quality": "best")", R"(is "best"; it must be "draft", "bilinear" or "bicubic")"},
          {R"("motion_blur": 16)", "layers[0].motion_blur is 16; it must be true"},
          {R"("motion_blur": {"samples":1})", "motion_blur.samples is 1; it must be a whole number 2 to 1024"},
          {R"("motion_blur": {"shutter_angle":721})", "shutter_angle is 721"},
          {R"("motion_blur": {"shutter":1})", R"(unknown key "shutter")"},
          {R"("matte": {"image":"a","scale":"x"})", R"(layers[0].matte.scale is "x")"},
          {R"("matte": {})", R"(layers[0].matte lacks "image")"},
          {R"("matte": {"image":"a","kind":"lumma"})", R"(layers[0].matte.kind is "lumma")"},
      },
      std::string(kLayer) + kBlack, "} ]}");
}

TEST(Scene, MistakesOfEffectsAreTold) {
  expect_told(
      {
          {R"("effect":"blurr")", R"(layers[0].effects[0].effect is an unknown effect "blurr"; the nearest is "blur")"},
          {R"("radius":1)", R"(layers[0].effects[0] lacks "effect")"},
          {R"("effect":"blur")", R"(layers[0].effects[0] (blur) lacks "radius")"},
          {R"("effect":"blur","radius":-1)", "effects[0].radius is -1; it must be a number 0 to 30000"},
          {R"("effect":"blur","radius":1,"raduis":2)",
           R"(layers[0].effects[0] (blur) has an unknown key "raduis"; the nearest is "radius")"},
          {R"("effect":"blur","radius":1,"iterations":2)", R"(iterations is for the shape "box")"},
          {R"("effect":"blur","radius":1,"channels":"argbb")", R"(channels is "argbb"; it must be one to)"},
          {R"("effect":"blur","radius":1,"keep_edges":true,"grow":true)", R"(beside "keep_edges")"},
          {R"("effect":"convolve","kernel":"1 1")", "layers[0].effects[0].kernel is 2 x 1"},
          {R"("effect":"convolve","kernel":[[1],[1,1]])", "kernel has 2 numbers in row 2"},
          {R"("effect":"convolve","kernel":[[0.5]])", "kernel[0][0] is 0.5; it must be a whole number"},
          {R"("effect":"lut")", "layers[0].effects[0] (lut) has no curve"},
          {R"("effect":"lut","rgb":[1])", "must be a list of 2 to 256 numbers"},
          {R"("effect":"fill","colour":"red")", R"(effects[0].colour is "red")"},
          {R"("effect":"premultiply","direction":"on")", R"(must be "forward" or "back")"},
      },
      std::string(kLayer) + kBlack + "\"effects\": [{", "}]} ]}");
}

TEST(SceneHelp, NamesEveryKeyThatIsAccepted) {
  const std::string help = scene_help();
  for (const char* key : {"background", "keep_alpha", "position", "opacity", "field", "seed", "matte", "kind", "anchor",
                          "rotation", "motion_blur", "shutter_angle"})
    EXPECT_THAT(help, HasSubstr(key));
}

}  // namespace
}  // namespace zr::tool
