// The program from outside: pictures, exit codes, one line for a mistake, nothing left behind.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <nlohmann/json.hpp>
#include <sstream>
#include <thread>

#include <ZR/hostkit.h>

#include "image_files.h"
#include "temporary_folder.h"

namespace zr::tool {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

struct Outcome {
  int code = -1;
  std::string out, err;
  long lines() const { return std::count(err.begin(), err.end(), '\n'); }
};

std::string slurp(const std::string& file) {
  std::ifstream stream(file, std::ios::binary);
  return {std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
}

class Program : public testing::Test {
 protected:
  // Starts the program in `folder`; largest_file (bytes) stands in for a full disk.
  pid_t start(const std::vector<std::string>& arguments, rlim_t largest_file = RLIM_INFINITY) {
    const pid_t child = fork();
    if (child != 0) return child;
    if (chdir(folder.path().c_str()) != 0) _exit(99);
    (void)!freopen((streams / "out").c_str(), "wb", stdout);
    (void)!freopen((streams / "err").c_str(), "wb", stderr);
    if (largest_file != RLIM_INFINITY) {
      signal(SIGXFSZ, SIG_IGN);
      const rlimit limit{largest_file, largest_file};
      setrlimit(RLIMIT_FSIZE, &limit);
    }
    std::vector<char*> line;
    std::string program = ZR_TOOL_PROGRAM;
    line.push_back(program.data());
    std::vector<std::string> copies = arguments;
    for (std::string& one : copies) line.push_back(one.data());
    line.push_back(nullptr);
    execv(program.c_str(), line.data());
    _exit(98);
  }
  Outcome finish(pid_t child) {
    int status = 0;
    waitpid(child, &status, 0);
    Outcome outcome;
    outcome.code = WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
    outcome.out = slurp(streams / "out");
    outcome.err = slurp(streams / "err");
    return outcome;
  }
  Outcome run(const std::vector<std::string>& arguments) { return finish(start(arguments)); }

  TemporaryFolder folder, streams;
};

constexpr const char* kSmall = R"({"size":[8,4],"layers":[{"colour":"#ff0000"}]})";

struct BadCall {
  const char* scene;
  std::vector<std::string> arguments;  // after "render s.json"
  int code;
  const char* message;
};
class BadInput : public Program, public testing::WithParamInterface<BadCall> {};
TEST_P(BadInput, IsOneLineAndLeavesNothing) {
  folder.write("s.json", GetParam().scene);
  folder.write("text.png", "no picture at all");
  folder.write("cut.png",
               slurp(std::filesystem::path(ZR_DEMO_SCENE).parent_path() / "media/balloon.png").substr(0, 9000));
  folder.write("cut.jpg", slurp(std::filesystem::path(ZR_DEMO_SCENE).parent_path() / "media/cat.jpg").substr(0, 20000));
  const std::vector<std::string> before = folder.files();
  std::vector<std::string> arguments = {"render", "s.json"};
  arguments.insert(arguments.end(), GetParam().arguments.begin(), GetParam().arguments.end());
  const Outcome outcome = run(arguments);
  EXPECT_EQ(outcome.code, GetParam().code);
  EXPECT_EQ(outcome.lines(), 1) << outcome.err;
  EXPECT_THAT(outcome.err, testing::StartsWith("zr: "));
  EXPECT_THAT(outcome.err, HasSubstr(GetParam().message));
  EXPECT_EQ(outcome.out, "");
  EXPECT_EQ(folder.files(), before);
  EXPECT_FALSE(std::filesystem::exists(folder / "out")) << "no folder is left either";
}
#define IMAGE(name) R"({"size":[8,8],"layers":[{"image":")" name R"("}]})"
INSTANTIATE_TEST_SUITE_P(
    Render, BadInput,
    testing::Values(
        BadCall{IMAGE("none.png"), {"-o", "out/a.png"}, 3, "layers[0].image: none.png does not exist"},
        BadCall{IMAGE("text.png"), {"-o", "out/a.png"}, 3, "text.png is no readable image"},
        BadCall{IMAGE("cut.png"), {"-o", "out/a.png"}, 3, "cut.png cannot be read"},
        BadCall{IMAGE("cut.jpg"), {"-o", "out/a.png"}, 3, "cut.jpg cannot be read"},
        BadCall{
            R"({"size":[8,8],"layers":[{"colour":"#ffffff","mode":"sceen"}]})", {"-o", "out/a.png"}, 2, "\"screen\""},
        BadCall{R"({"size":[8,8],"layers":[{"colour":"#ffffff","opacity":1.01}]})", {"-o", "out/a.png"}, 2, "0 to 1"},
        BadCall{R"({"size":[8,0],"layers":[]})", {"-o", "out/a.png"}, 2, "size[1] is 0"},
        BadCall{"{\n \"size\" [8,8]}", {"-o", "out/a.png"}, 2, "s.json:2:9: not valid JSON"},
        BadCall{kSmall, {"-o", "text.png/a.png"}, 3, "text.png is a file, not a folder"},
        BadCall{kSmall, {"-o", "/proc/zr/a.png"}, 3, "/proc/zr"},
        BadCall{kSmall, {"-o", "out/a.#.png", "--frames", "9-3"}, 2, "\"9-3\", which runs backwards"},
        BadCall{kSmall, {"-o", "out/a.png", "--frames", "1-3"}, 2, "out/a.####.png"},
        BadCall{kSmall, {"-o", "out/a.png", "--depth", "12"}, 2, "--depth is \"12\"; it must be 8, 16 or float"},
        BadCall{kSmall, {"-o", "out/a.png", "--depth", "float"}, 2, "write \".tif\" or \".exr\""},
        BadCall{kSmall, {"-o", "out/a.exr"}, 2, "openexr holds depth \"float\", not \"8\""},
        BadCall{kSmall, {"-o", "out/a.gif"}, 2, "must end in \".png\""},
        BadCall{kSmall, {"-o", "out/a.png", "--threads", "-1"}, 2, "--threads"},
        BadCall{kSmall, {"-o", "out/a.png", "--thread", "1"}, 2, "the nearest is \"--threads\""},
        BadCall{kSmall, {"-o", "out/a.png", "--memory", "much"}, 2, "--memory is \"much\""},
        BadCall{kSmall, {}, 2, "--output is required"},
        BadCall{kSmall, {"-o", "s.json.png", "--memory", "64"}, 4, "above the --memory limit of 64 B"},
        BadCall{R"({"size":[30000,30000],"layers":[]})", {"-o", "out/a.png", "--memory", "1G"}, 4, "needs 3.4 GiB"},
        BadCall{IMAGE("text.png"), {"-o", "text.png", "--force"}, 3, "is one of the files that are read"}));
#undef IMAGE

TEST_F(Program, PictureIsTheComposite) {
  folder.write("s.json", R"({"size":[4,2],"background":"#808080","quality":"draft","layers":[
      {"colour":"#ff8000","size":[2,2],"mode":"multiply","position":[{"frame":1,"value":[0,0]},{"frame":3,"value":[3,0]}]},
      {"colour":"#0000ff","opacity":[{"frame":1,"value":0},{"frame":3,"value":1}],"field":"odd"}]})");
  const Outcome outcome = run({"render", "s.json", "-o", "f.##.png", "--frames", "1-2"});
  ASSERT_EQ(outcome.code, 0) << outcome.err;
  EXPECT_THAT(folder.files(), ElementsAre("f.01.png", "f.02.png", "s.json"));
  const Hostkit host;
  const OwnedWorld first = load_image(folder / "f.01.png", 8, "test"),
                   second = load_image(folder / "f.02.png", 8, "test");
  const auto rgb = [](const OwnedWorld& world, i32 x, i32 y) {
    const ZR_Pixel8 pixel = world.row<ZR_Pixel8>(y)[x];
    return std::vector<int>{pixel.alpha, pixel.red, pixel.green, pixel.blue};
  };
  EXPECT_THAT(rgb(first, 0, 0), ElementsAre(255, 128, 64, 0));
  EXPECT_THAT(rgb(first, 2, 0), ElementsAre(255, 128, 128, 128));
  EXPECT_THAT(rgb(first, 1, 1), ElementsAre(255, 128, 64, 0)) << "opacity 0 changes nothing";
  EXPECT_THAT(rgb(second, 1, 0), ElementsAre(255, 128, 128, 128)) << "draft rounds 1.5 to 2";
  EXPECT_THAT(rgb(second, 2, 0), ElementsAre(255, 128, 64, 0));
  EXPECT_THAT(rgb(second, 0, 1), ElementsAre(255, 64, 64, 192)) << "half blue on odd rows";
}

TEST_F(Program, MattesShapeALayerByTheirKind) {
  const Hostkit host;
  OwnedWorld matte(2, 1, 8);
  matte.row<ZR_Pixel8>(0)[0] = {255, 0, 0, 0};
  matte.row<ZR_Pixel8>(0)[1] = {51, 255, 255, 255};
  save_image(matte, output_format_of("m.png"), false, folder / "m.png");
  struct Case {
    const char* kind;
    std::vector<int> alpha;  // of a white layer on nothing, four columns, the matte on the middle two
  };
  for (const Case& one : {Case{"alpha", {0, 255, 51, 0}}, Case{"inverted-alpha", {255, 0, 204, 255}},
                          Case{"luma", {0, 0, 51, 0}}, Case{"inverted-luma", {255, 255, 204, 255}}}) {
    folder.write("s.json", std::string(R"({"size":[4,1],"layers":[{"colour":"#ffffff","matte":{"image":"m.png",)") +
                               R"("position":[1,0],"kind":")" + one.kind + "\"}}]}");
    ASSERT_EQ(run({"render", "s.json", "-o", "a.png", "--force"}).code, 0);
    const OwnedWorld picture = load_image(folder / "a.png", 8, "test");
    std::vector<int> alpha;
    for (i32 x = 0; x < 4; ++x) alpha.push_back(picture.row<ZR_Pixel8>(0)[x].alpha);
    EXPECT_EQ(alpha, one.alpha) << one.kind;
  }
}

TEST_F(Program, DepthsAgreeAndThreadsDoNotMatter) {
  const auto render = [&](const std::string& name, const std::string& depth, const std::string& threads) {
    const Outcome outcome =
        run({"render", ZR_DEMO_SCENE, "-o", name, "--frames", "40", "--depth", depth, "--threads", threads});
    EXPECT_EQ(outcome.code, 0) << outcome.err;
  };
  render("a.png", "8", "1");
  render("b.png", "8", "4");
  render("c.png", "16", "2");
  render("d.exr", "float", "2");
  EXPECT_EQ(slurp(folder / "a.png"), slurp(folder / "b.png"));
  const Hostkit host;
  const OwnedWorld eight = load_image(folder / "a.png", 8, "test"), deep = load_image(folder / "c.png", 8, "test"),
                   real = load_image(folder / "d.exr", 8, "test");
  i64 distance_deep = 0, distance_real = 0;
  for (i32 y = 0; y < eight.height(); ++y) {
    for (i32 x = 0; x < eight.width(); ++x) {
      const i32 green = eight.row<ZR_Pixel8>(y)[x].green;
      distance_deep += std::abs(green - deep.row<ZR_Pixel8>(y)[x].green);
      distance_real += std::abs(green - real.row<ZR_Pixel8>(y)[x].green);
    }
  }
  const i64 pixels = static_cast<i64>(eight.width()) * eight.height();
  EXPECT_LT(distance_deep, pixels) << "less than one step of 255 in the mean";
  EXPECT_LT(distance_real, pixels);
}

TEST_F(Program, NothingIsReplacedUnlessForced) {
  folder.write("s.json", kSmall);
  folder.write("f.3.png", "precious");
  const Outcome refused = run({"render", "s.json", "-o", "f.#.png", "--frames", "1-3"});
  EXPECT_EQ(refused.code, 3);
  EXPECT_THAT(refused.err, HasSubstr("f.3.png exists already; --force replaces it"));
  EXPECT_THAT(folder.files(), ElementsAre("f.3.png", "s.json")) << "checked for all frames before any work";
  EXPECT_EQ(slurp(folder / "f.3.png"), "precious");
  EXPECT_EQ(run({"render", "s.json", "-o", "f.#.png", "--frames", "1-3", "--force"}).code, 0);
  EXPECT_NE(slurp(folder / "f.3.png"), "precious");
}

TEST_F(Program, InterruptLeavesWholeFramesOnly) {
  const std::string demo = std::filesystem::path(ZR_DEMO_SCENE).string();
  for (const int signal_number : {SIGINT, SIGTERM}) {
    const pid_t child = start({"render", demo, "-o", "out/f.####.tif", "--frames", "1-5000", "--force"});
    for (int i = 0; i < 600 && !std::filesystem::exists(folder / "out/f.0002.tif"); ++i)
      std::this_thread::sleep_for(std::chrono::milliseconds(50));
    kill(child, signal_number);
    const Outcome outcome = finish(child);
    EXPECT_EQ(outcome.code, 130);
    EXPECT_EQ(outcome.err, "zr: interrupted\n");
    const Hostkit host;
    for (const std::string& name : folder.files()) {
      EXPECT_THAT(name, testing::EndsWith(".tif"));
      EXPECT_NO_THROW(load_image(folder / name, 8, "test")) << name;
    }
    std::filesystem::remove_all(folder / "out");
  }
}

TEST_F(Program, AFullDiskIsAnErrorInEveryFormat) {
  // Noise does not compress: the files want far more than the limit, or just more.
  const Hostkit host;
  OwnedWorld noise(64, 64, 8);
  u32 state = 1;
  for (i32 y = 0; y < 64; ++y)
    for (i32 x = 0; x < 64; ++x)
      for (int i = 0; i < 4; ++i)
        reinterpret_cast<u8*>(noise.row<ZR_Pixel8>(y) + x)[i] =
            static_cast<u8>((state = state * 1664525u + 1013904223u) >> 24);
  save_image(noise, output_format_of("noise.png"), false, folder / "noise.png");
  folder.write("s.json", R"({"size":[64,64],"layers":[{"image":"noise.png"}]})");
  for (const char* name : {"a.png", "a.tif", "a.exr"}) {
    const std::string depth = std::string(name) == "a.exr" ? "float" : "8";
    ASSERT_EQ(run({"render", "s.json", "-o", name, "--depth", depth}).code, 0);
    const auto whole = static_cast<rlim_t>(std::filesystem::file_size(folder / name));
    std::filesystem::remove(folder / name);
    for (const rlim_t limit : {rlim_t{4096}, whole - 1}) {
      const Outcome outcome = finish(start({"render", "s.json", "-o", name, "--depth", depth}, limit));
      EXPECT_EQ(outcome.code, 3) << name << ' ' << limit;
      EXPECT_EQ(outcome.lines(), 1) << outcome.err;
      EXPECT_THAT(folder.files(), ElementsAre("noise.png", "s.json"));
    }
  }
}

TEST_F(Program, ProgressForMachinesIsOneObjectAFrame) {
  folder.write("s.json", kSmall);
  const Outcome outcome = run({"render", "s.json", "-o", "f.#.png", "--frames", "4-6", "--progress=json", "--stats"});
  ASSERT_EQ(outcome.code, 0) << outcome.err;
  EXPECT_EQ(outcome.err, "");
  std::istringstream lines(outcome.out);
  std::string line;
  for (int i = 0; i < 3; ++i) {
    ASSERT_TRUE(std::getline(lines, line));
    const auto object = nlohmann::json::parse(line);
    EXPECT_EQ(object.at("frame"), 4 + i);
    EXPECT_EQ(object.at("done"), 1 + i);
    EXPECT_EQ(object.at("total"), 3);
    EXPECT_EQ(object.at("file"), "f." + std::to_string(4 + i) + ".png");
    EXPECT_GE(object.at("seconds_left").get<double>(), 0.0);
  }
  ASSERT_TRUE(std::getline(lines, line));
  EXPECT_EQ(nlohmann::json::parse(line).at("stats").at("frames"), 3);
  EXPECT_FALSE(std::getline(lines, line));
  EXPECT_EQ(run({"render", "s.json", "-o", "g.png", "--progress=off"}).out, "");
}

TEST_F(Program, HelpTellsOptionsRangesAndExitCodes) {
  const Outcome help = run({"help", "render"});
  EXPECT_EQ(help.code, 0);
  for (const char* part : {"--frames", "8|16|float", "0..1024", "--force", "Examples:", "130", "associated"})
    EXPECT_THAT(help.out, HasSubstr(part));
  EXPECT_THAT(run({"help", "scene"}).out, HasSubstr("keep_alpha"));
  EXPECT_THAT(run({"list", "modes"}).out, HasSubstr("soft-light"));
  EXPECT_THAT(run({"list", "formats"}).out, HasSubstr(".exr"));
  EXPECT_THAT(run({"list", "cpu"}).out, HasSubstr("threads"));
  EXPECT_EQ(run({"list", "moods"}).code, 2);
}

TEST_F(Program, GalleryShowsEveryMode) {
  ASSERT_EQ(run({"gallery", "-o", "modes.png"}).code, 0);
  const Hostkit host;
  const OwnedWorld picture = load_image(folder / "modes.png", 8, "test");
  for (i32 y = 0; y < picture.height(); ++y)
    for (i32 x = 0; x < picture.width(); ++x) ASSERT_EQ(picture.row<ZR_Pixel8>(y)[x].alpha, 255) << x << ' ' << y;
  EXPECT_EQ(run({"gallery", "-o", "modes.png"}).code, 3) << "no overwrite";
}

}  // namespace
}  // namespace zr::tool
