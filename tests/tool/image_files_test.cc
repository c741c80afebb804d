// Pictures in files: what other programs find in them, and what comes back.
#include <OpenImageIO/imageio.h>
#include <ZR/hostkit.h>
#include <gtest/gtest.h>

#include <cmath>
#include <set>

#include "file_values.h"
#include "image_files.h"
#include "support/temporary_folder.h"
#include "tool_error.h"

namespace zr::tool {
namespace {

TEST(FileValues, SixteenBitsSurviveTheWayOutAndInForEveryValue) {
  std::set<u16> files;
  for (u32 v = 0; v <= 32768; ++v) {
    const u16 world = static_cast<u16>(v), file = file16_from_world16(world);
    ASSERT_EQ(file, static_cast<u16>(std::floor(v * 65535.0 / 32768.0 + 0.5))) << v;
    ASSERT_EQ(world16_from_file16(file), world) << v;
    files.insert(file);
  }
  EXPECT_EQ(files.size(), 32769u);
  EXPECT_EQ(file16_from_world16(32768), 65535);
}

TEST(FileValues, EveryFileValueIsTakenToTheNearest) {
  for (u32 v = 0; v <= 65535; ++v) {
    const u16 file = static_cast<u16>(v);
    ASSERT_EQ(world16_from_file16(file), static_cast<u16>(std::floor(v * 32768.0 / 65535.0 + 0.5))) << v;
    ASSERT_EQ(world_from_file<ZR_Pixel8>(file), static_cast<u8>(std::floor(v / 257.0 + 0.5))) << v;
    ASSERT_LE(std::abs(static_cast<i32>(file16_from_world16(world16_from_file16(file))) - static_cast<i32>(v)), 1) << v;
  }
}

TEST(FileValues, FloatsAreClampedToIntegerWorldsOnly) {
  EXPECT_EQ(world_from_file<ZR_Pixel8>(2.0f), 255);
  EXPECT_EQ(world_from_file<ZR_Pixel16>(-1.0f), 0);
  EXPECT_EQ(world_from_file<ZR_Pixel16>(std::nanf("")), 0);
  EXPECT_EQ(world_from_file<ZR_PixelFloat>(2.0f), 2.0f);
  EXPECT_EQ(world_from_file<ZR_PixelFloat>(u8{255}), 1.0f);
  EXPECT_EQ(world_from_file<ZR_PixelFloat>(u16{65535}), 1.0f);
}

class ImageFiles : public testing::Test {
 protected:
  struct Picture {
    OIIO::ImageSpec spec;
    std::vector<f32> values;  // as stored, scaled to 0..1
  };
  // Reads a file as another program would, without any conversion of alpha.
  static Picture stored(const std::string& file) {
    OIIO::ImageSpec wish;
    wish.attribute("oiio:UnassociatedAlpha", 1);
    const auto input = OIIO::ImageInput::open(file, &wish);
    if (!input) throw std::runtime_error(file);
    Picture picture{input->spec(), {}};
    picture.values.resize(static_cast<size_t>(picture.spec.width * picture.spec.height * picture.spec.nchannels));
    input->read_image(0, 0, 0, picture.spec.nchannels, OIIO::TypeFloat, picture.values.data());
    return picture;
  }
  template <class Value>
  std::string file(const std::string& name, int channels, OIIO::TypeDesc type, bool straight,
                   const std::vector<Value>& values) {
    OIIO::ImageSpec spec(static_cast<int>(values.size()) / channels, 1, channels, type);
    if (channels == 2) spec.channelnames = {"Y", "A"}, spec.alpha_channel = 1;
    if (straight) spec.attribute("oiio:UnassociatedAlpha", 1);
    const std::string path = folder / name;
    const auto output = OIIO::ImageOutput::create(path);
    EXPECT_TRUE(output->open(path, spec) && output->write_image(OIIO::BaseTypeFromC<Value>::value, values.data()) &&
                output->close())
        << output->geterror();
    return path;
  }
  template <class Pixel>
  static void expect_pixel(const OwnedWorld& world, i32 x, Pixel expected) {
    const Pixel got = world.row<Pixel>(0)[x];
    EXPECT_TRUE(got.alpha == expected.alpha && got.red == expected.red && got.green == expected.green &&
                got.blue == expected.blue)
        << "pixel " << x << ": " << +got.alpha << ' ' << +got.red << ' ' << +got.green << ' ' << +got.blue;
  }
  // Every alpha with a few colours, also under alpha 0.
  template <class Pixel>
  static OwnedWorld ramp() {
    OwnedWorld world(256, 300, Depth<Pixel>::bits);
    for (i32 y = 0; y < world.height(); ++y) {
      for (i32 x = 0; x < world.width(); ++x) {
        const auto share = [](i32 part, i32 whole) {
          return static_cast<Channel<Pixel>>(Depth<Pixel>::white * static_cast<Wide<Pixel>>(part) /
                                             static_cast<Wide<Pixel>>(whole));
        };
        world.row<Pixel>(y)[x] = {share(x, 255), share(y, 299), share((x * 7 + y) % 256, 255), share(255 - x, 255)};
      }
    }
    return world;
  }
  template <class Pixel>
  void expect_round_trip(const std::string& name) {
    const OwnedWorld world = ramp<Pixel>();
    const std::string path = folder / name;
    save_image(world, output_format_of(path), false, path);
    const OwnedWorld back = load_image(path, Depth<Pixel>::bits, "test");
    ASSERT_EQ(back.width(), world.width());
    ASSERT_EQ(back.height(), world.height());
    for (i32 y = 0; y < world.height(); ++y)
      ASSERT_EQ(std::memcmp(world.row<Pixel>(y), back.row<Pixel>(y), sizeof(Pixel) * 256), 0) << name << " row " << y;
  }

  Hostkit host{[] {
    HostkitOptions options;
    options.threads = 3;
    return options;
  }()};
  TemporaryFolder folder;
};

TEST_F(ImageFiles, StraightFormatsGiveBackEveryPixelAlsoUnderAlphaZero) {
  expect_round_trip<ZR_Pixel8>("a.png");
  expect_round_trip<ZR_Pixel16>("b.png");
  expect_round_trip<ZR_Pixel8>("c.tif");
  expect_round_trip<ZR_Pixel16>("d.tiff");
  expect_round_trip<ZR_PixelFloat>("e.tif");
}

TEST_F(ImageFiles, OthersFindStraightAlphaInPngAndTiffAndAssociatedInExr) {
  OwnedWorld world(2, 1, 32);
  world.row<ZR_PixelFloat>(0)[0] = {0.5f, 1.0f, 0.5f, 4.0f};
  world.row<ZR_PixelFloat>(0)[1] = {0.0f, 1.0f, 1.0f, 1.0f};
  for (const char* name : {"a.tif", "a.exr"}) save_image(world, output_format_of(name), false, folder / name);
  const Picture tiff = stored(folder / "a.tif"), exr = stored(folder / "a.exr");
  EXPECT_EQ(tiff.values, (std::vector<f32>{1, 0.5f, 4, 0.5f, 1, 1, 1, 0}));
  EXPECT_EQ(tiff.spec.get_int_attribute("oiio:UnassociatedAlpha"), 1) << "marked in the file";
  EXPECT_EQ(exr.values, (std::vector<f32>{0.5f, 0.25f, 2, 0.5f, 0, 0, 0, 0}));
  EXPECT_EQ(exr.spec.format, OIIO::TypeFloat);
  EXPECT_EQ(exr.spec.alpha_channel, 3);

  save_image(world, output_format_of("h.exr"), true, folder / "h.exr");
  EXPECT_EQ(stored(folder / "h.exr").spec.format, OIIO::TypeHalf);
  expect_pixel<ZR_PixelFloat>(load_image(folder / "h.exr", 32, "test"), 0, {0.5f, 1.0f, 0.5f, 4.0f});

  OwnedWorld deep(1, 1, 16);
  deep.row<ZR_Pixel16>(0)[0] = {16384, 32768, 1, 0};
  save_image(deep, output_format_of("d.png"), false, folder / "d.png");
  const Picture png = stored(folder / "d.png");
  EXPECT_EQ(png.spec.format, OIIO::TypeUInt16);
  EXPECT_EQ(png.values, (std::vector<f32>{1.0f, 2 / 65535.0f, 0, 32768 / 65535.0f}));
}

TEST_F(ImageFiles, EveryKindOfPictureIsRead) {
  const std::string grey = file<u8>("g.png", 1, OIIO::TypeUInt8, true, {0, 51, 255});
  expect_pixel<ZR_Pixel8>(load_image(grey, 8, "test"), 1, {255, 51, 51, 51});
  const std::string grey_alpha = file<u16>("ga.png", 2, OIIO::TypeUInt16, true, {65535, 0, 13107, 32768});
  expect_pixel<ZR_Pixel16>(load_image(grey_alpha, 16, "test"), 0, {0, 32768, 32768, 32768});
  expect_pixel<ZR_Pixel16>(load_image(grey_alpha, 16, "test"), 1, {16384, 6554, 6554, 6554});
  const std::string rgb = file<u8>("rgb.png", 3, OIIO::TypeUInt8, true, {1, 2, 255});
  expect_pixel<ZR_Pixel8>(load_image(rgb, 8, "test"), 0, {255, 1, 2, 255});
  expect_pixel<ZR_Pixel16>(load_image(rgb, 16, "test"), 0, {32768, 129, 257, 32768});
  const std::string associated = file<u8>("as.tif", 4, OIIO::TypeUInt8, false, {100, 50, 0, 100, 9, 9, 9, 0});
  expect_pixel<ZR_Pixel8>(load_image(associated, 8, "test"), 0, {100, 255, 128, 0});
  expect_pixel<ZR_Pixel8>(load_image(associated, 8, "test"), 1, {0, 9, 9, 9});
  const std::string half = file<f32>("h.exr", 4, OIIO::TypeHalf, false, {0.5f, 2, 0, 0.5f, 1, 0, 0, 0});
  expect_pixel<ZR_PixelFloat>(load_image(half, 32, "test"), 0, {0.5f, 1, 4, 0});
  expect_pixel<ZR_PixelFloat>(load_image(half, 32, "test"), 1, {0, 1, 0, 0});
  expect_pixel<ZR_Pixel8>(load_image(half, 8, "test"), 0, {128, 255, 255, 0});
}

TEST_F(ImageFiles, AnExrStandsInItsDisplayWindow) {
  OIIO::ImageSpec spec(2, 1, 4, OIIO::TypeFloat);
  spec.x = 3, spec.y = 1, spec.full_width = 4, spec.full_height = 3;
  const std::string path = folder / "w.exr";
  const std::vector<f32> values = {1, 1, 1, 1, 0.5f, 0.5f, 0.5f, 1};
  const auto output = OIIO::ImageOutput::create(path);
  ASSERT_TRUE(output->open(path, spec) && output->write_image(OIIO::TypeFloat, values.data()) && output->close());
  const OwnedWorld world = load_image(path, 32, "test");
  ASSERT_EQ(world.width(), 4);
  ASSERT_EQ(world.height(), 3);
  EXPECT_EQ(world.row<ZR_PixelFloat>(1)[3].red, 1.0f);
  EXPECT_EQ(world.row<ZR_PixelFloat>(1)[2].alpha, 0.0f);
  EXPECT_EQ(world.row<ZR_PixelFloat>(0)[3].alpha, 0.0f);
}

TEST_F(ImageFiles, FormatsRefuseDepthsThatTheyCannotHold) {
  EXPECT_THROW(output_format_of("a.jpg"), ToolError);
  EXPECT_THROW(output_format_of("png"), ToolError);
  EXPECT_EQ(std::string(output_format_of("a.PNG").name), "png");
  EXPECT_THROW(require_depth(output_format_of("a.png"), 32, "a.png"), ToolError);
  EXPECT_THROW(require_depth(output_format_of("a.exr"), 16, "a.exr"), ToolError);
  EXPECT_NO_THROW(require_depth(output_format_of("a.tif"), 32, "a.tif"));
}

}  // namespace
}  // namespace zr::tool
