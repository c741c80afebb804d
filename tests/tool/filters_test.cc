// Filters of the tool from outside: results on small pictures, and mistakes in one line.
#include <OpenImageIO/imageio.h>

#include <algorithm>
#include <nlohmann/json.hpp>

#include "tool_run.h"

namespace zr::tool {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;

class Filters : public ToolRun {
 protected:
  using Pixels = std::vector<ZR_Pixel8>;
  void write(const std::string& name, i32 width, const Pixels& pixels) {
    const Hostkit host;
    OwnedWorld world(width, static_cast<i32>(pixels.size()) / width, 8);
    for (size_t i = 0; i < pixels.size(); ++i)
      world.row<ZR_Pixel8>(static_cast<i32>(i) / width)[static_cast<i32>(i) % width] = pixels[i];
    save_image(world, output_format_of(name), false, folder / name);
  }
  std::vector<int> after(const std::string& arguments, char channel) {
    EXPECT_EQ(run(arguments + " -o out.png --force"), 0) << arguments << ": " << err;
    return channel_of("out.png", channel);
  }
  static ZR_Pixel8 grey(int value, int alpha = 255) {
    const u8 v = static_cast<u8>(value);
    return {static_cast<u8>(alpha), v, v, v};
  }
};

TEST_F(Filters, BadCallsAreOneLineAndLeaveNothing) {
  write("in.png", 2, {grey(0), grey(255)});
  write("clear.png", 2, {grey(0, 0), grey(9, 0)});
  std::string wide = "1";
  for (int i = 0; i < 100; ++i) wide += " 1";
  expect_refused("", {
                         {"blur in.png -o out/a.png", 2, "--radius is required"},
                         {"blur in.png -o out/a.png --radius nan", 2,
                          "--radius is \"nan\"; it must be a number of pixels, 0 to 30000"},
                         {"blur in.png -o out/a.png --radius -1", 2, "--radius is \"-1\""},
                         {"blur in.png -o out/a.png --radius 1e9 --box", 2, "--radius is \"1e9\""},
                         {"blur in.png -o out/a.png --radius 3px", 2, "--radius is \"3px\""},
                         {"blur in.png -o out/a.png --radius 2 --iterations 3", 2, "--iterations requires --box"},
                         {"blur in.png -o out/a.png --radius 2 --box --iterations 0", 2, "a whole number 1 to 100"},
                         {"blur in.png -o out/a.png --radius 2 --channels arx", 2, "--channels is \"arx\""},
                         {"blur in.png -o out/a.png --radius 2 --gaussian --box", 2, "excludes"},
                         {"blur in.png -o out/a.png --radius 15000 --grow", 2, "would have 30002 x 30001 pixels"},
                         {"blur none.png -o out/a.png --radius 2", 3, "none.png does not exist"},
                         {"blur in.png -o in.png --radius 2 --force", 3, "is one of the files that are read"},
                         {"blur in.png -o out/a.gif --radius 2", 2, "must end in \".png\""},
                         {"convolve in.png -o out/a.png --kernel ' ;'", 2, "--kernel is empty"},
                         {"convolve in.png -o out/a.png --kernel '1 2 1; 2 4; 1 2 1'", 2,
                          "has 2 numbers in row 2, but 3 in the first"},
                         {"convolve in.png -o out/a.png --kernel '1 1; 1 1'", 2,
                          "is 2 x 2; it must be one row, one column or a square"},
                         {"convolve in.png -o out/a.png --kernel '1 1 1; 1 1 1; 1 1 1; 1 1 1; 1 1 1'", 2, "is 3 x 5"},
                         {"convolve in.png -o out/a.png --kernel '" + wide + "'", 2, "is 101 x 1"},
                         {"convolve in.png -o out/a.png --kernel '1 x 1'", 2, "has \"x\" among its taps"},
                         {"convolve in.png -o out/a.png --kernel '1 0.5 1'", 2, "has \"0.5\" among its taps"},
                         {"convolve in.png -o out/a.png --kernel 65536", 2, "a whole number -65535 to 65535"},
                         {"convolve in.png -o out/a.png --kernel 1 --channels ''", 2, "--channels"},
                         {"guess-alpha in.png none.png", 3, "guess-alpha: none.png does not exist"},
                         {"unmatte clear.png -o out/a.png", 1, "Unable to guess alpha channel"},
                         {"unmatte in.png -o out/a.png --colour '#ff00ff80'", 2, "it must be auto or \"#rrggbb\""},
                         {"view in.png -o out/a.exr", 2, "openexr holds depth \"float\""},
                         {"view in.png -o out/a.png --flat --colour2 '#ffffff'", 2, "--colour2 is for --checker"},
                         {"view in.png -o out/a.png --colour white", 2, "--colour is \"white\""},
                         {"wireframe in.png -o out/a.png --step 0", 2, "a whole number of rows, 1 to 30000"},
                         {"wireframe in.png -o out/a.png --background '#000000'", 2, "--background requires --alone"},
                     });
}

TEST_F(Filters, BlursSpreadAlongTheChosenDirection) {
  const ZR_Pixel8 none = grey(0, 0), dot = {240, 200, 0, 0};
  write("dot.png", 3, {none, none, none, none, dot, none, none, none, none});
  EXPECT_THAT(after("blur dot.png --radius 1 --box --horizontal", 'a'), ElementsAre(0, 0, 0, 80, 80, 80, 0, 0, 0));
  EXPECT_THAT(after("blur dot.png --radius 1 --box --vertical", 'a'), ElementsAre(0, 80, 0, 0, 80, 0, 0, 80, 0));
  EXPECT_THAT(after("blur dot.png --radius 1 --box", 'a'), testing::Each(27));
  EXPECT_THAT(after("blur dot.png --radius 1 --box", 'r'),
              testing::Each(testing::AllOf(testing::Ge(196), testing::Le(204))))
      << "no black comes in from what is transparent";
  EXPECT_THAT(after("blur dot.png --radius 1 --box --channels r --horizontal", 'a'),
              ElementsAre(0, 0, 0, 0, 240, 0, 0, 0, 0));
  const std::vector<int> grown = after("blur dot.png --radius 1 --box --grow --horizontal", 'a');
  EXPECT_THAT(grown, ElementsAre(0, 0, 0, 0, 0, 0, 80, 80, 80, 0, 0, 0, 0, 0, 0)) << "5 x 3";
  EXPECT_EQ(after("blur dot.png --radius 0", 'r'), channel_of("dot.png", 'r'));
  write("flat.png", 3, {grey(90), grey(90), grey(90)});
  EXPECT_THAT(after("blur flat.png --radius 1 --box --horizontal", 'a'), ElementsAre(170, 255, 170));
  EXPECT_THAT(after("blur flat.png --radius 1.5 --keep-edges", 'a'), testing::Each(255));
  EXPECT_THAT(after("blur flat.png --radius 1.5 --keep-edges", 'g'), testing::Each(90));
}

TEST_F(Filters, KernelsAreAppliedAsTheyStand) {
  write("in.png", 3, {grey(10), grey(50), grey(90), grey(20), grey(60), grey(100), grey(30), grey(70), grey(110)});
  const struct {
    const char* arguments;
    std::vector<int> greys;
  } rows[] = {
      {"--kernel '0 0 1'", {50, 90, 0, 60, 100, 0, 70, 110, 0}},  // not mirrored
      {"--kernel '1;0;0'", {0, 0, 0, 10, 50, 90, 20, 60, 100}},
      {"--kernel '1 2 1;2 4 2,;1 2 1;'", {15, 40, 45, 25, 60, 65, 22, 50, 52}},
      {"--kernel '-1 0 1'", {50, 80, 0, 60, 80, 0, 70, 80, 0}},  // no alpha is taken from a sum of 0
      {"--kernel '3' --no-normalise --channels g", {0, 0, 1, 0, 0, 1, 0, 0, 1}},
      {"--kernel '999' --no-normalise --channels g", {39, 195, 255, 78, 234, 255, 117, 255, 255}},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(after("convolve in.png " + std::string(row.arguments), 'g'), row.greys) << row.arguments;
    EXPECT_THAT(channel_of("out.png", 'a'), testing::Each(255)) << row.arguments;
  }
  EXPECT_THAT(channel_of("out.png", 'r'), ElementsAre(10, 50, 90, 20, 60, 100, 30, 70, 110))
      << "the other channels stay";
  write("edge.png", 3, {{255, 200, 0, 0}, {0, 0, 255, 0}, {0, 0, 255, 0}});
  EXPECT_THAT(after("convolve edge.png --kernel '1 1 1'", 'r'), ElementsAre(198, 198, 0))
      << "66 of 255, divided by alpha 85";
  EXPECT_THAT(after("convolve edge.png --kernel '1 1 1' --straight", 'g'), ElementsAre(85, 170, 170));
}

// A disc of one colour with a soft edge, mixed with `matte`, or straight without one.
TEST_F(Filters, MattesAreGuessedAndTakenAway) {
  const auto disc = [&](const ZR_Pixel8* matte) {
    Pixels pixels;
    for (int i = 0; i < 64; ++i) {
      const int dx = i % 8 * 2 - 7, dy = i / 8 * 2 - 7;
      const u8 a = static_cast<u8>(std::clamp(255 - (dx * dx + dy * dy - 12) * 6, 0, 255));
      const auto mixed = [&](int colour, int ground) {
        return static_cast<u8>((colour * a + ground * (255 - a) + 127) / 255);
      };
      pixels.push_back(matte == nullptr ? ZR_Pixel8{a, static_cast<u8>(a > 0 ? 210 + i % 3 : i), 60, 20}
                                        : ZR_Pixel8{a, mixed(210 + i % 3, matte->red), mixed(60, matte->green),
                                                    mixed(20, matte->blue)});
    }
    return pixels;
  };
  const ZR_Pixel8 black = {255, 0, 0, 0}, white = {255, 255, 255, 255}, blue = {255, 20, 40, 230};
  write("straight.png", 8, disc(nullptr));
  write("black.png", 8, disc(&black));
  write("white.png", 8, disc(&white));
  write("blue.png", 8, disc(&blue));
  write("clear.png", 1, {grey(4, 0)});
  write("opaque.png", 2, {grey(4), grey(5)});
  {  // The same bytes in a file that says what they are: they are not divided by alpha on the way in.
    const Hostkit host;
    const OwnedWorld world = load_image(folder / "black.png", 8, "test");
    OIIO::ImageSpec layout(8, 8, 4, OIIO::TypeUInt8);
    std::vector<u8> bytes;
    for (int i = 0; i < 64; ++i) {
      const ZR_Pixel8 p = world.row<ZR_Pixel8>(i / 8)[i % 8];
      bytes.insert(bytes.end(), {p.red, p.green, p.blue, p.alpha});
    }
    const auto output = OIIO::ImageOutput::create(folder / "marked.tif");
    ASSERT_TRUE(output->open(folder / "marked.tif", layout) && output->write_image(OIIO::TypeUInt8, bytes.data()) &&
                output->close());
  }
  ASSERT_EQ(run("guess-alpha straight.png black.png white.png blue.png clear.png opaque.png marked.tif --json"), 0)
      << err;
  std::vector<std::string> told;
  for (const auto& one : nlohmann::json::parse(out))
    told.push_back(one["alpha"].get<std::string>() +
                   (one["matte"].is_null() ? "" : ' ' + one["matte"].get<std::string>()));
  EXPECT_THAT(told, ElementsAre("straight", "premultiplied #000000", "premultiplied #ffffff", "premultiplied #1428e6",
                                "unknown", "premultiplied #000000", "premultiplied #000000"));
  EXPECT_TRUE(nlohmann::json::parse(out)[5]["opaque"]);
  EXPECT_EQ(nlohmann::json::parse(out)[6]["file_says"], "associated");

  for (const std::string call :
       {"black.png", "white.png", "blue.png", "blue.png --colour '#1428e6'", "marked.tif", "blue.png --depth 16"}) {
    const std::vector<int> red = after("unmatte " + call, 'r'), alpha = channel_of("out.png", 'a');
    for (size_t i = 0; i < red.size(); ++i) {
      if (alpha[i] == 0) {
        EXPECT_EQ(red[i], 0) << call;
      }
      if (alpha[i] >= 60) {
        EXPECT_NEAR(red[i], 210 + static_cast<int>(i % 3), 4) << call << " pixel " << i;
      }
    }
  }
  EXPECT_EQ(after("unmatte straight.png", 'r'), channel_of("straight.png", 'r'));
  EXPECT_THAT(out, HasSubstr("straight already"));
}

TEST_F(Filters, ViewsAndOutlinesAreDrawn) {
  Pixels pixels(12 * 9, grey(0, 0));
  pixels[0] = grey(77);
  write("in.png", 12, pixels);
  const auto at = [](const std::vector<int>& all, int x, int y) { return all[static_cast<size_t>(y * 12 + x)]; };
  const std::vector<int> checker = after("view in.png --colour '#ff0000' --colour2 '#640000'", 'r');
  EXPECT_THAT(
      (std::vector{at(checker, 0, 0), at(checker, 7, 0), at(checker, 8, 0), at(checker, 0, 8), at(checker, 8, 8)}),
      ElementsAre(77, 100, 255, 255, 100));
  EXPECT_THAT(channel_of("out.png", 'a'), testing::Each(255));
  EXPECT_EQ(after("view in.png --flat --colour '#323200'", 'g')[1], 50);
  EXPECT_EQ(after("view in.png --tint --colour '#ff000080'", 'r')[1], 128) << "half of what hides there, which is 0";

  for (int y = 2; y < 6; ++y)
    for (int x = 3; x < 8; ++x) pixels[static_cast<size_t>(y * 12 + x)] = grey(1);
  pixels[0] = grey(0, 0);
  write("box.png", 12, pixels);
  const std::vector<int> outline = after("wireframe box.png --alone --colour '#ffffff'", 'a');
  for (int y = 0; y < 9; ++y)
    for (int x = 0; x < 12; ++x) {
      const bool inside = x >= 3 && x <= 8 && y >= 2 && y <= 6, on = x == 3 || x == 8 || y == 2 || y == 6;
      EXPECT_EQ(at(outline, x, y), inside && on ? 255 : 0) << x << ' ' << y;
    }
  EXPECT_THAT(out, HasSubstr("1 outline, 4 points"));
}

TEST_F(Filters, EffectsOfALayerAreTheCommands) {
  const auto scene = [&](const std::string& layer, const std::string& depth = "8") {
    folder.write("s.json", R"({"size":[9,9],"depth":)" + depth + R"(,"layers":[{"image":"in.png",)" + layer + "}]}");
  };
  Pixels pixels(25, grey(0, 0));
  for (size_t i : {7u, 11u, 12u, 13u, 17u}) pixels[i] = {200, static_cast<u8>(10 * i), 255, 40};
  write("in.png", 5, pixels);
  scene(R"("position":[2,2],"effects":[{"effect":"blur","radius":2}])");
  ASSERT_EQ(run("render s.json -o out.png"), 0) << err;
  const std::vector<int> rendered = channel_of("out.png", 'a'), red = channel_of("out.png", 'r');
  EXPECT_EQ(after("blur in.png --radius 2 --grow", 'a'), rendered) << "the layer grows around its place";
  EXPECT_EQ(channel_of("out.png", 'r'), red);
  scene(R"("effects":[{"effect":"blur","shape":"box","keep_edges":true,
            "radius":[{"frame":1,"value":0},{"frame":3,"value":1}]}])");
  ASSERT_EQ(run("render s.json -o f.#.png --frames 1-3"), 0) << err;
  EXPECT_EQ(channel_of("f.1.png", 'a')[0], 0);
  EXPECT_EQ(channel_of("f.3.png", 'a')[0], 0);
  EXPECT_GT(channel_of("f.2.png", 'a')[10], 0) << "half the radius already spreads";
  for (const std::string depth : {"8", "16", "\"float\""}) {
    const std::string file = depth == "\"float\"" ? "f.exr" : "l.png";
    scene(R"("effects":[{"effect":"lut","red":[1,0],"green":[0,0.2]},{"effect":"fill","colour":"#0000ff"},
             {"effect":"lut","rgb":[0.2,1],"blue":[0.4,0.6]}])",
          depth);
    ASSERT_EQ(run("render s.json --force -o " + file), 0) << err;
    EXPECT_EQ(channel_of(file, 'r')[12], 51) << depth;
    EXPECT_EQ(channel_of(file, 'b')[12], 153) << depth;
    scene(R"("effects":[{"effect":"fill","colour":"#ff0000","keep_alpha":true},{"effect":"premultiply"},
             {"effect":"convolve","kernel":[[0,0,0],[0,1,0],[0,0,0]]}])",
          depth);
    ASSERT_EQ(run("render s.json --force -o " + file), 0) << err;
    EXPECT_NEAR(channel_of(file, 'r')[20], 200, 1) << depth;
    EXPECT_EQ(channel_of(file, 'a')[20], 200) << depth;
  }
}

}  // namespace
}  // namespace zr::tool
