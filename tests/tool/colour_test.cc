// The program and colour: profiles in files, conversions, linear light, mistakes in one line.
#include <OpenImageIO/imageio.h>

#include <array>
#include <cstdio>
#include <nlohmann/json.hpp>

#include <jpeglib.h>

#include "tool_run.h"

namespace zr::tool {
namespace {

std::string icc(const std::string& name) { return ZR_TEST_DATA "/icc/" + name + ".icc"; }

class Colour : public ToolRun {
 protected:
  // A picture of one pixel.
  void picture(const std::string& name, const std::vector<u8>& pixel, const std::string& profile = "") {
    OIIO::ImageSpec spec(1, 1, static_cast<int>(pixel.size()), OIIO::TypeUInt8);
    if (!profile.empty())
      spec.attribute("ICCProfile", OIIO::TypeDesc(OIIO::TypeDesc::UINT8, static_cast<int>(profile.size())),
                     profile.data());
    const auto output = OIIO::ImageOutput::create(folder / name);
    ASSERT_TRUE(output->open(folder / name, spec) && output->write_image(OIIO::TypeUInt8, pixel.data()));
    output->close();
  }
  std::array<int, 3> pixel(const std::string& name) {
    return {channel_of(name, 'r')[0], channel_of(name, 'g')[0], channel_of(name, 'b')[0]};
  }
};

TEST_F(Colour, KnownValueAndProfileComeOutInEveryFormatThatHoldsOne) {
  picture("red.png", {255, 0, 0});
  for (const std::string name : {"p3.png", "p3.tif"}) {
    ASSERT_EQ(run("convert red.png -o " + name + " --to display-p3"), 0) << err;
    const std::array<int, 3> got = pixel(name);  // of sRGB's red: 0.9176, 0.2003, 0.1386
    EXPECT_NEAR(got[0], 234, 1);
    EXPECT_NEAR(got[1], 51, 1);
    EXPECT_NEAR(got[2], 35, 1);
    ASSERT_EQ(run("info " + name + " --json"), 0) << err;
    EXPECT_EQ(nlohmann::json::parse(out).at(0).at("profile"), "Display P3");
    // The profile that was written is believed when the file is read.
    ASSERT_EQ(run("convert " + name + " -o back.png --to srgb --force"), 0) << err;
    EXPECT_NEAR(pixel("back.png")[0], 255, 1);
    EXPECT_NEAR(pixel("back.png")[1], 0, 3);
  }
}

TEST_F(Colour, SceneConvertsImagesAndBlendsInLinearLight) {
  picture("p3.png", {234, 51, 35}, slurp(icc("DisplayP3-v4")));
  folder.write("image.json", R"({"size":[1,1],"working_space":"srgb","layers":[{"image":"p3.png"}]})");
  ASSERT_EQ(run("render image.json -o image.png"), 0) << err;
  EXPECT_NEAR(pixel("image.png")[0], 255, 1);
  EXPECT_NEAR(pixel("image.png")[1], 0, 4);
  // Half of white over black: 128 stored, and the value whose light is a half, 188.
  for (const auto& [linear, grey] : {std::pair{"false", 128}, {"true", 188}}) {
    folder.write("s.json",
                 std::string(R"({"size":[1,1],"background":"#000000","working_space":"srgb","linear_light":)") +
                     linear + R"(,"layers":[{"colour":"#ffffff","opacity":0.5}]})");
    ASSERT_EQ(run("render s.json -o s.png --force"), 0) << err;
    EXPECT_NEAR(pixel("s.png")[1], grey, 1) << linear;
  }
}

TEST_F(Colour, MistakesAreOneLine) {
  picture("red.png", {255, 0, 0});
  picture("grey.png", {99}, slurp(icc("sGrey-v4")));
  folder.write("bad.icc", "no profile");
  expect_refused("",
                 {
                     {"convert red.png -o o.png --to srbg", 2, "the nearest is \"srgb\""},
                     {"convert red.png -o o.png --to bad.icc", 3, "bad.icc is no usable ICC profile"},
                     {"convert red.png -o o.png --to none.icc", 3, "none.icc does not exist"},
                     {"convert red.png -o o.png --to " + icc("sGrey-v4"), 3, "is a grey profile; an RGB one is needed"},
                     {"convert grey.png -o o.png --to srgb", 3, "carries a grey profile"},
                     {"convert red.png -o o.png --to srgb --from " + icc("CGATS001Compat-v2-micro"), 2, "is not CMYK"},
                     {"display red.png -o o.png --profile bad.icc", 3, "no usable ICC profile"},
                     {"display red.png -o o.png --profile srgb --simulate " + icc("CGATS001Compat-v2-micro"), 3,
                      "cannot be simulated"},
                     {"info bad.icc", 3, "bad.icc is no readable image"},
                 });
}

TEST_F(Colour, DisplayCutsOffWhatTheSimulatedDeviceCannotShow) {
  picture("green.png", {0, 255, 0}, slurp(icc("DisplayP3-v4")));
  const std::string line = "display green.png --profile display-p3 --working display-p3 -o ";
  ASSERT_EQ(run(line + "plain.png"), 0) << err;
  EXPECT_NEAR(pixel("plain.png")[0], 0, 1);
  for (const std::string depth : {"8", "float"}) {
    const std::string name = depth + ".tif";
    ASSERT_EQ(run(line + name + " --simulate srgb --depth " + depth), 0) << err;
    const std::array<int, 3> got = pixel(name);  // sRGB's green: 0.4584, 0.9852, 0.2983
    EXPECT_NEAR(got[0], 117, 1);
    EXPECT_NEAR(got[1], 251, 1);
    EXPECT_NEAR(got[2], 76, 1);
  }
}

// 8 x 8 pixels of one ink; such files hold the absence of ink.
void write_ink_jpeg(const std::string& file, const u8 (&ink)[4], const std::string& profile) {
  jpeg_compress_struct state{};
  jpeg_error_mgr errors{};
  state.err = jpeg_std_error(&errors);
  jpeg_create_compress(&state);
  std::FILE* const stream = std::fopen(file.c_str(), "wb");
  jpeg_stdio_dest(&state, stream);
  state.image_width = state.image_height = 8;
  state.input_components = 4;
  state.in_color_space = JCS_CMYK;
  jpeg_set_defaults(&state);
  jpeg_set_quality(&state, 100, TRUE);
  jpeg_start_compress(&state, TRUE);
  jpeg_write_icc_profile(&state, reinterpret_cast<const JOCTET*>(profile.data()),
                         static_cast<unsigned>(profile.size()));
  u8 values[32];
  for (size_t i = 0; i < sizeof values; ++i) values[i] = static_cast<u8>(255 - ink[i % 4]);
  for (JSAMPROW row = values; state.next_scanline < 8;) jpeg_write_scanlines(&state, &row, 1);
  jpeg_finish_compress(&state);
  jpeg_destroy_compress(&state);
  std::fclose(stream);
}

TEST_F(Colour, InkComesInThroughItsProfile) {
  const std::string profile = slurp(icc("CGATS001Compat-v2-micro"));
  OIIO::ImageSpec spec(1, 1, 4, OIIO::TypeUInt8);
  spec.channelnames = {"C", "M", "Y", "K"};
  spec.alpha_channel = -1;
  spec.attribute("oiio:ColorSpace", "CMYK");
  spec.attribute("tiff:ColorSpace", "CMYK");
  spec.attribute("ICCProfile", OIIO::TypeDesc(OIIO::TypeDesc::UINT8, static_cast<int>(profile.size())), profile.data());
  const u8 cyan[4] = {255, 0, 0, 0};
  const auto output = OIIO::ImageOutput::create(folder / "ink.tif");
  ASSERT_TRUE(output->open(folder / "ink.tif", spec) && output->write_image(OIIO::TypeUInt8, cyan) && output->close());
  write_ink_jpeg(folder / "ink.jpg", cyan, profile);
  for (const std::string name : {"ink.tif", "ink.jpg"}) {
    folder.write("s.json", R"({"size":[1,1],"working_space":"srgb","layers":[{"image":")" + name + R"("}]})");
    ASSERT_EQ(run("render s.json -o s.png --force"), 0) << err;
    const std::array<int, 3> got = pixel("s.png");  // printed cyan, not the 0, 255, 255 of a screen
    EXPECT_LT(got[0], 20) << name;
    EXPECT_NEAR(got[1], 174, 3) << name;
    EXPECT_NEAR(got[2], 239, 3) << name;
  }
}

}  // namespace
}  // namespace zr::tool
