// The program from outside: pictures, exit codes, one line for a mistake, nothing left behind.
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

#include "tool_run.h"

namespace zr::tool {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

class Program : public ToolRun {
 protected:
  // Starts the program in `folder`; largest_file (bytes) stands in for a full disk.
  pid_t start(std::vector<std::string> arguments, rlim_t largest_file = RLIM_INFINITY) {
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
    arguments.insert(arguments.begin(), ZR_TOOL_PROGRAM);
    std::vector<char*> line;
    for (std::string& one : arguments) line.push_back(one.data());
    line.push_back(nullptr);
    execv(line[0], line.data());
    _exit(98);
  }
  // The exit code, or the signal below 0.
  int finish(pid_t child) {
    int status = 0;
    waitpid(child, &status, 0);
    out = slurp(streams / "out");
    err = slurp(streams / "err");
    return WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
  }
};

constexpr const char* kSmall = R"({"size":[8,4],"layers":[{"colour":"#ff0000"}]})";

TEST_F(Program, BadInputIsOneLineAndLeavesNothing) {
  const auto media = std::filesystem::path(ZR_DEMO_SCENE).parent_path() / "media";
  folder.write("text.png", "no picture at all");
  folder.write("cut.png", slurp(media / "balloon.png").substr(0, 9000));
  folder.write("cut.jpg", slurp(media / "cat.jpg").substr(0, 20000));
  const auto image = [](const std::string& name) { return R"({"size":[8,8],"layers":[{"image":")" + name + R"("}]})"; };
  const struct {
    std::string scene, arguments;
    int code;
    const char* message;
  } calls[] = {
      {image("none.png"), "-o out/a.png", 3, "layers[0].image: none.png does not exist"},
      {image("text.png"), "-o out/a.png", 3, "text.png is no readable image"},
      {image("cut.png"), "-o out/a.png", 3, "cut.png cannot be read"},
      {image("cut.jpg"), "-o out/a.png", 3, "cut.jpg cannot be read"},
      {R"({"size":[8,8],"layers":[{"colour":"#ffffff","mode":"sceen"}]})", "-o out/a.png", 2, "\"screen\""},
      {R"({"size":[8,8],"layers":[{"colour":"#ffffff","opacity":1.01}]})", "-o out/a.png", 2, "0 to 1"},
      {R"({"size":[8,0],"layers":[]})", "-o out/a.png", 2, "size[1] is 0"},
      {"{\n \"size\" [8,8]}", "-o out/a.png", 2, "s.json:2:9: not valid JSON"},
      {kSmall, "-o text.png/a.png", 3, "text.png is a file, not a folder"},
      {kSmall, "-o /proc/zr/a.png", 3, "/proc/zr"},
      {kSmall, "-o out/a.#.png --frames 9-3", 2, "\"9-3\", which runs backwards"},
      {kSmall, "-o out/a.png --frames 1-3", 2, "out/a.####.png"},
      {kSmall, "-o out/a.png --depth 12", 2, "--depth is \"12\"; it must be 8, 16 or float"},
      {kSmall, "-o out/a.png --depth float", 2, "write \".tif\" or \".exr\""},
      {kSmall, "-o out/a.exr", 2, "openexr holds depth \"float\", not \"8\""},
      {kSmall, "-o out/a.gif", 2, "must end in \".png\""},
      {kSmall, "-o out/a.png --threads -1", 2, "--threads"},
      {kSmall, "-o out/a.png --thread 1", 2, "the nearest is \"--threads\""},
      {kSmall, "-o out/a.png --memory much", 2, "--memory is \"much\""},
      {kSmall, "", 2, "--output is required"},
      {kSmall, "-o s.json.png --memory 64", 4, "above the --memory limit of 64 B"},
      {R"({"size":[30000,30000],"layers":[]})", "-o out/a.png --memory 1G", 4, "needs 3.4 GiB"},
      {image("text.png"), "-o text.png --force", 3, "is one of the files that are read"},
  };
  for (const auto& call : calls) {
    folder.write("s.json", call.scene);
    expect_refused("render s.json ", {{call.arguments, call.code, call.message}});
    EXPECT_THAT(err, testing::StartsWith("zr: "));
    EXPECT_FALSE(std::filesystem::exists(folder / "out")) << "no folder is left either";
  }
}

TEST_F(Program, PictureIsTheComposite) {
  folder.write("s.json", R"({"size":[4,2],"background":"#808080","quality":"draft","layers":[
      {"colour":"#ff8000","size":[2,2],"mode":"multiply","position":[{"frame":1,"value":[0,0]},{"frame":3,"value":[3,0]}]},
      {"colour":"#0000ff","opacity":[{"frame":1,"value":0},{"frame":3,"value":1}],"field":"odd"}]})");
  ASSERT_EQ(run("render s.json -o f.##.png --frames 1-2"), 0) << err;
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
    ASSERT_EQ(run("render s.json -o a.png --force"), 0);
    const OwnedWorld picture = load_image(folder / "a.png", 8, "test");
    std::vector<int> alpha;
    for (i32 x = 0; x < 4; ++x) alpha.push_back(picture.row<ZR_Pixel8>(0)[x].alpha);
    EXPECT_EQ(alpha, one.alpha) << one.kind;
  }
}

TEST_F(Program, DepthsAgreeAndThreadsDoNotMatter) {
  const auto render = [&](const std::string& name, const std::string& depth, const std::string& threads) {
    EXPECT_EQ(run("render " ZR_DEMO_SCENE " -o " + name + " --frames 40 --depth " + depth + " --threads " + threads), 0)
        << err;
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
  EXPECT_EQ(run("render s.json -o f.#.png --frames 1-3"), 3);
  EXPECT_THAT(err, HasSubstr("f.3.png exists already; --force replaces it"));
  EXPECT_THAT(folder.files(), ElementsAre("f.3.png", "s.json")) << "checked for all frames before any work";
  EXPECT_EQ(slurp(folder / "f.3.png"), "precious");
  EXPECT_EQ(run("render s.json -o f.#.png --frames 1-3 --force"), 0);
  EXPECT_NE(slurp(folder / "f.3.png"), "precious");
}

TEST_F(Program, InterruptLeavesWholeFramesOnly) {
  const std::string demo = std::filesystem::path(ZR_DEMO_SCENE).string();
  for (const int signal_number : {SIGINT, SIGTERM}) {
    const pid_t child = start({"render", demo, "-o", "out/f.####.tif", "--frames", "1-5000", "--force"});
    for (int i = 0; i < 600 && !std::filesystem::exists(folder / "out/f.0002.tif"); ++i)
      std::this_thread::sleep_for(std::chrono::milliseconds(50));
    kill(child, signal_number);
    EXPECT_EQ(finish(child), 130);
    EXPECT_EQ(err, "zr: interrupted\n");
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
  for (const std::string name : {"a.png", "a.tif", "a.exr"}) {
    const std::string depth = name == "a.exr" ? "float" : "8";
    ASSERT_EQ(run("render s.json -o " + name + " --depth " + depth), 0);
    const auto whole = static_cast<rlim_t>(std::filesystem::file_size(folder / name));
    std::filesystem::remove(folder / name);
    for (const rlim_t limit : {rlim_t{4096}, whole - 1}) {
      EXPECT_EQ(finish(start({"render", "s.json", "-o", name, "--depth", depth}, limit)), 3) << name << ' ' << limit;
      EXPECT_EQ(std::count(err.begin(), err.end(), '\n'), 1) << err;
      EXPECT_THAT(folder.files(), ElementsAre("noise.png", "s.json"));
    }
  }
}

TEST_F(Program, ProgressForMachinesIsOneObjectAFrame) {
  folder.write("s.json", kSmall);
  ASSERT_EQ(run("render s.json -o f.#.png --frames 4-6 --progress=json --stats"), 0) << err;
  EXPECT_EQ(err, "");
  std::istringstream lines(out);
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
  EXPECT_EQ(run("render s.json -o g.png --progress=off"), 0);
  EXPECT_EQ(out, "");
}

TEST_F(Program, HelpTellsOptionsRangesAndExitCodes) {
  const struct {
    const char* command;
    std::vector<const char*> parts;
  } texts[] = {
      {"help render", {"--frames", "8|16|float", "0..1024", "--force", "Examples:", "130", "associated"}},
      {"help scene", {"keep_alpha"}},
      {"list modes", {"soft-light"}},
      {"list formats", {".exr"}},
      {"list cpu", {"threads"}},
  };
  for (const auto& text : texts) {
    EXPECT_EQ(run(text.command), 0) << text.command;
    for (const char* part : text.parts) EXPECT_THAT(out, HasSubstr(part)) << text.command;
  }
  EXPECT_EQ(run("list moods"), 2);
}

TEST_F(Program, GalleryShowsEveryMode) {
  ASSERT_EQ(run("gallery -o modes.png"), 0);
  const Hostkit host;
  const OwnedWorld picture = load_image(folder / "modes.png", 8, "test");
  for (i32 y = 0; y < picture.height(); ++y)
    for (i32 x = 0; x < picture.width(); ++x) ASSERT_EQ(picture.row<ZR_Pixel8>(y)[x].alpha, 255) << x << ' ' << y;
  EXPECT_EQ(run("gallery -o modes.png"), 3) << "no overwrite";
}

}  // namespace
}  // namespace zr::tool
