// zr resize from outside: sizes, edges, mistakes in one line.
#include <OpenImageIO/imageio.h>
#include <ZR/hostkit.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <fstream>

#include "image_files.h"
#include "temporary_folder.h"

namespace zr::tool {
namespace {

class Resize : public testing::Test {
 protected:
  Resize() {  // 6 x 4: a grey that grows to the right, opaque
    std::vector<u8> values;
    for (int i = 0; i < 24; ++i) values.push_back(static_cast<u8>(40 * (i % 6)));
    const auto output = OIIO::ImageOutput::create(folder / "in.png");
    EXPECT_TRUE(output->open(folder / "in.png", {6, 4, 1, OIIO::TypeUInt8}) &&
                output->write_image(OIIO::TypeUInt8, values.data()) && output->close());
  }
  int run(const std::string& arguments) {
    const std::string line = "cd " + folder.path() + " && " ZR_TOOL_PROGRAM " resize in.png " + arguments +
                             " >/dev/null 2>" + (folder / "err");
    const int status = std::system(line.c_str());
    std::ifstream stream(folder / "err", std::ios::binary);
    err = {std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
    return WEXITSTATUS(status);
  }
  std::vector<int> greys_of_a_row(const std::string& name, i32 height) {
    const Hostkit host;
    const OwnedWorld world = load_image(folder / name, 8, "test");
    EXPECT_EQ(world.height(), height);
    std::vector<int> greys;
    for (i32 x = 0; x < world.width(); ++x) {
      const ZR_Pixel8 p = world.row<ZR_Pixel8>(world.height() - 1)[x];
      EXPECT_EQ(p.alpha, 255) << "column " << x;
      greys.push_back(p.green);
    }
    return greys;
  }
  TemporaryFolder folder;
  std::string err;
};

TEST_F(Resize, SizesAndValues) {
  const struct {
    std::string arguments;
    i32 height;
    std::vector<int> greys;
  } rows[] = {
      {"6x4", 4, {0, 40, 80, 120, 160, 200}},
      {"3x", 2, {20, 100, 180}},  // means of two pixels
      {"2", 1, {40, 160}},
      {"x2", 2, {20, 100, 180}},
      {"50% --quality draft", 2, {40, 120, 200}},
      {"200%", 8, {0, 10, 30, 50, 70, 90, 110, 130, 150, 170, 190, 200}},  // the edge's own colour beyond the edge
      {"3x5", 5, {20, 100, 180}},
      {"12x4 --quality draft", 4, {0, 0, 40, 40, 80, 80, 120, 120, 160, 160, 200, 200}},
      {"0.5%", 1, {100}},
      {"1x300 --depth 16", 300, {100}},
  };
  for (const auto& row : rows) {
    ASSERT_EQ(run("-o out.png --force " + row.arguments), 0) << err;
    EXPECT_EQ(greys_of_a_row("out.png", row.height), row.greys) << row.arguments;
  }
}

TEST_F(Resize, MistakesInOneLine) {
  const struct {
    const char* arguments;
    int code;
    const char* text;
  } rows[] = {
      {"-o out.png 0x10", 2, "the size is \"0x10\"; it must be WIDTHxHEIGHT, WIDTHx, xHEIGHT or a percentage"},
      {"-o out.png x", 2, "the size is \"x\""},
      {"-o out.png 10x10x10", 2, "the size is \"10x10x10\""},
      {"-o out.png 30001x", 2, "a side has 1 to 30000 pixels"},
      {"-o out.png -- -50%", 2, "the size is \"-50%\""},
      {"-o out.png x30000", 2, "would have 45000 x 30000 pixels"},
      {"-o out.png 10x10 --quality good", 2, "--quality"},
      {"-o out.jpg 10x10", 2, "out.jpg"},
      {"-o in.png 10x10", 3, "in.png"},
      {"-o out.png", 2, "size"},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(run(row.arguments), row.code) << row.arguments << ": " << err;
    EXPECT_THAT(err, testing::HasSubstr(row.text)) << row.arguments;
    EXPECT_EQ(std::count(err.begin(), err.end(), '\n'), 1) << err;
  }
}

}  // namespace
}  // namespace zr::tool
