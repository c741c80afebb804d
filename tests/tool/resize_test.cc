// zr resize from outside: sizes, edges, mistakes in one line.
#include <OpenImageIO/imageio.h>

#include "tool_run.h"

namespace zr::tool {
namespace {

class Resize : public ToolRun {
 protected:
  Resize() {  // 6 x 4: a grey that grows to the right, opaque
    std::vector<u8> values;
    for (int i = 0; i < 24; ++i) values.push_back(static_cast<u8>(40 * (i % 6)));
    const auto output = OIIO::ImageOutput::create(folder / "in.png");
    EXPECT_TRUE(output->open(folder / "in.png", {6, 4, 1, OIIO::TypeUInt8}) &&
                output->write_image(OIIO::TypeUInt8, values.data()) && output->close());
  }
};

TEST_F(Resize, SizesAndValues) {
  const struct {
    std::string arguments;
    size_t height;
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
    ASSERT_EQ(run("resize in.png -o out.png --force " + row.arguments), 0) << err;
    std::vector<int> greys = channel_of("out.png", 'g');
    ASSERT_EQ(greys.size(), row.greys.size() * row.height) << row.arguments;
    greys.erase(greys.begin(), greys.end() - static_cast<std::ptrdiff_t>(row.greys.size()));  // but the last row
    EXPECT_EQ(greys, row.greys) << row.arguments;
    EXPECT_THAT(channel_of("out.png", 'a'), testing::Each(255)) << row.arguments;
  }
}

TEST_F(Resize, MistakesInOneLine) {
  expect_refused(
      "resize in.png ",
      {
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
      });
}

}  // namespace
}  // namespace zr::tool
