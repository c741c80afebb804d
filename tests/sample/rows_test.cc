// Rows of samples against the samplers of one pixel: the same bits at every width, on worlds of every kind that ends
// at unreadable memory.
#include <sys/mman.h>
#include <unistd.h>

#include <cmath>
#include <limits>

#include "sample/pictures.h"
#include "sample/sample_functions.h"
#include "support/born_library.h"

namespace {

// A world whose last row, or whose first one where rows go upwards, touches a page that cannot be read.
template <class T>
class EdgeWorld {
 public:
  static constexpr i32 width = 180, height = 40;

  explicit EdgeWorld(bool upside_down) {
    const auto page = static_cast<size_t>(sysconf(_SC_PAGESIZE));
    const size_t bytes = sizeof(T) * width * height;
    inner_ = (bytes + page - 1) / page * page;
    size_ = inner_ + 2 * page;
    map_ = static_cast<u8*>(mmap(nullptr, size_, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0));
    mprotect(map_, page, PROT_NONE);
    mprotect(map_ + page + inner_, page, PROT_NONE);
    u8* const first = map_ + page + (upside_down ? 0 : inner_ - bytes);
    layer_.row_bytes = static_cast<i32>(sizeof(T)) * width * (upside_down ? -1 : 1);
    layer_.data = upside_down ? first + bytes - sizeof(T) * width : first;
    layer_.width = width, layer_.height = height;
  }
  EdgeWorld(const EdgeWorld&) = delete;
  ~EdgeWorld() { munmap(map_, size_); }
  T& at(i32 x, i32 y) {
    return reinterpret_cast<T*>(static_cast<u8*>(layer_.data) + static_cast<ptrdiff_t>(y) * layer_.row_bytes)[x];
  }
  ZR_LayerDef* layer() { return &layer_; }

 private:
  size_t inner_, size_;
  u8* map_;
  ZR_LayerDef layer_{};
};

enum class Filling { opaque, clear, colour_under_clear, equal, random, cut_out, edges, flat };

template <class T>
void fill(EdgeWorld<T>& world, Filling filling, std::mt19937& random) {
  using C = zr::Channel<T>;
  constexpr bool is_float = std::is_same_v<T, ZR_PixelFloat>;
  constexpr C white = static_cast<C>(zr::Depth<T>::white);
  const auto any = [&]() -> C {
    if constexpr (is_float)
      return static_cast<f32>(random() >> 8) * 0x1p-24f;
    else
      return static_cast<C>(random() % (u32{white} + 1));
  };
  const auto edge = [&]() -> C {
    if constexpr (is_float) {
      constexpr f32 inf = std::numeric_limits<f32>::infinity(), nan = std::numeric_limits<f32>::quiet_NaN();
      const f32 values[] = {0, -0.0f, 1, 1.5f, -0.5f, 1e-30f, 1e-17f, 3e38f, inf, -inf, nan, 1e-42f};
      return values[random() % std::size(values)];
    } else {
      const u32 values[] = {0, 1, 2, white / 2u, white - 1u, white, std::numeric_limits<C>::max()};
      return static_cast<C>(values[random() % std::size(values)]);
    }
  };
  const T plain = {any(), any(), any(), any()};
  for (i32 y = 0; y < world.height; ++y)
    for (i32 x = 0; x < world.width; ++x) {
      T& p = world.at(x, y) = {any(), any(), any(), any()};
      if (filling == Filling::opaque) p.alpha = white;
      if (filling == Filling::clear) p = T{};
      if (filling == Filling::colour_under_clear) p.alpha = 0;
      if (filling == Filling::equal) p.alpha = plain.alpha;
      if (filling == Filling::cut_out && (x + y) % 40 != 0) p.alpha = (x + y) % 40 < 20 ? white : C{0};
      if (filling == Filling::edges) p = {edge(), edge(), edge(), edge()};
      if (filling == Filling::flat && x * y % 37 != 0) p = plain;
    }
}

struct Line {
  i32 x, y, step_x, step_y;  // from the first pixel that the sampler may read around
};
constexpr Line lines[] = {{0x4321, 0x1234, 0xb3a1, 0x6789}, {0x8000, 0, 0x10000, 0},     {0, 0x5555, 0x8000, 0},
                          {0, 0, 0x8000, 0x4000},           {0xffff, 0xffff, 1, 0x5fff}, {0x8000, 0x8000, 0, 0},
                          {0, 0, 0x10000, 0x8000},          {0x0f00, 0x71, 0x20000, 3}};

std::string text_of(const zr::SampleRun& run, size_t i) {
  return "pixel " + std::to_string(i) + " of " + std::to_string(run.count) + " from " + std::to_string(run.x) + ',' +
         std::to_string(run.y) + " by " + std::to_string(run.step_x) + ',' + std::to_string(run.step_y);
}

// Returns what one pixel after the other gives for what the row function has done, and a pixel behind it.
template <class T>
std::vector<T> compare_run(zr::LaneRowFunc<T>* row, zr::SampleFunc<T>* single, const zr::SampleRun& run,
                           const ZR_SampPB& params) {
  std::vector<T> got(static_cast<size_t>(run.count) + 1, T{7, 7, 7, 7}), expected = got;
  zr::RowSum<T> sum = 5, expected_sum = 5;
  const i32 done = row != nullptr ? row(run, params, &sum, got.data()) : 0;
  EXPECT_TRUE(done >= 0 && done <= run.count && (row == nullptr || run.count - done < 16));
  for (i32 i = 0; i < done; ++i) {
    T& one = expected[static_cast<size_t>(i)];
    single(nullptr, run.x + i * run.step_x, run.y + i * run.step_y, &params, &one);
    expected_sum += one.alpha;
  }
  [&] {
    for (size_t i = 0; i < got.size(); ++i) ASSERT_TRUE(same_pixel(got[i], expected[i])) << text_of(run, i);
    ASSERT_TRUE(sum == expected_sum || sum != sum) << text_of(run, 0);
  }();
  return expected;
}

template <class T>
void compare(ZR_LayerDef* layer, i32 quality, const Line& line, bool backwards, i32 count) {
  ZR_SampPB params{};
  params.src = layer;
  const auto set = zr::sample_functions<T>(quality);
  const i32 before = quality == 2 ? 1 : 0, behind = quality == 2 ? 2 : 1;
  zr::SampleRun run = {count, (before << 16) + line.x, (before << 16) + line.y, line.step_x, line.step_y};
  // As far to the lower right as the run goes, or from there back: neighbours at the world's last pixel.
  const auto last = [&](i32 start, i32 step) { return start + (count - 1) * step; };
  const auto room = [&](i32 size, i32 end) { return ((size - behind) << 16) - 1 - end; };
  const i32 room_x = room(layer->width, last(run.x, run.step_x)), room_y = room(layer->height, last(run.y, run.step_y));
  if (room_x < 0 || room_y < 0) return;
  if (backwards) {
    run.x = last(run.x, run.step_x) + (room_x & ~0xffff), run.step_x = -run.step_x;
    run.y = last(run.y, run.step_y) + (room_y & ~0xffff), run.step_y = -run.step_y;
  }
  std::vector<T> expected = compare_run(zr::no_clip_row(set), set.no_clipping, run, params);
  if (testing::Test::HasFatalFailure()) return;
  if (run.step_x != 0x10000 || run.step_y != 0) return;
  zr::AlphaSum<T> span_sum = 5, one_by_one = 5;
  std::vector<T> span = expected;
  set.span(nullptr, count, run.x, run.y, &params, &span_sum, span.data());
  for (i32 i = 0; i < count; ++i) {  // a span of one pixel is not done in vectors
    T& one = expected[static_cast<size_t>(i)];
    set.span(nullptr, 1, run.x + (i << 16), run.y, &params, &one_by_one, &one);
  }
  for (size_t i = 0; i < span.size(); ++i) ASSERT_TRUE(same_pixel(span[i], expected[i])) << text_of(run, i);
  ASSERT_TRUE(span_sum == one_by_one || span_sum != span_sum) << text_of(run, 0);
}

struct Box {
  i32 x_radius, y_radius, step_x, y;
};
constexpr Box boxes[] = {{0x159a3, 0x13333, 0x2b347, 0x95678}, {0x10000, 0x10000, 0x20000, 0x98000},
                         {0x8001, 0x58000, 0x4321, 0},         {0x38000, 0x8001, -0x10001, 40 << 16},
                         {0x1c000, 0x20000, 0, 0x11111},       {0x10000, 0x10000, -0x20000, -100 << 16},
                         {0x10000, 0x10000, 0x20000, 0x8000}};

template <class T>
void compare_boxes(ZR_LayerDef* layer, const Box& box, i32 start, i32 count) {
  ZR_SampPB params{};
  params.src = layer, params.x_radius = box.x_radius, params.y_radius = box.y_radius;
  const auto set = zr::sample_functions<T>(1);
  zr::SampleRun run = {count, start, box.y, box.step_x, 0};
  const zr::PixelRange inside = zr::boxes_inside(run, params);
  run.x += inside.first * run.step_x, run.count = inside.end - inside.first;
  compare_run(zr::box_row(set), set.area, run, params);
}

TEST_F(BornLibrary, SampledRowsEqualSinglePixels) {
  each_depth([]<class T>() {
    std::mt19937 random(42);
    for (const bool upside_down : {false, true}) {
      EdgeWorld<T> world(upside_down);
      for (const Filling filling : {Filling::opaque, Filling::clear, Filling::colour_under_clear, Filling::equal,
                                    Filling::random, Filling::cut_out, Filling::edges, Filling::flat}) {
        fill(world, filling, random);
        SCOPED_TRACE(static_cast<int>(filling));
        for (const i32 quality : {1, 2})
          for (const Line& line : lines)
            for (const bool backwards : {false, true})
              for (i32 count = 1; count <= 70; ++count) {
                compare<T>(world.layer(), quality, line, backwards, count);
                if (testing::Test::HasFatalFailure()) return;
              }
        for (const Box& box : boxes)
          for (i32 count = 1; count <= 70; ++count) {
            i32 from = static_cast<i32>(random() % 0x80000) - 0x40000;
            if (count % 4 != 0 && box.x_radius == 0x10000) from = (from & ~0xffff) + 0x8000;  // whole pixels
            compare_boxes<T>(world.layer(), box, box.step_x < 0 ? (EdgeWorld<T>::width << 16) - from : from, count);
            if (testing::Test::HasFatalFailure()) return;
          }
      }
    }
  });
}

// Rows of a replaced sampler are that sampler's.
TEST_F(BornLibrary, AReplacedSamplerHasNoRows) {
  const auto mine = [](const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, ZR_Pixel16*) -> i32 { return 0; };
  i32 (*const routine)(const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, ZR_Pixel16*) = mine;
  const SlotOverride replaced(ZR_Slot_bilinear_no_clip16, reinterpret_cast<void*>(routine));
  EXPECT_EQ(zr::no_clip_row(zr::sample_functions<ZR_Pixel16>(1)), nullptr);
  EXPECT_EQ(zr::no_clip_row(zr::sample_functions<ZR_Pixel16>(2)) == nullptr,
            zr::no_clip_row(zr::sample_functions<ZR_Pixel8>(1)) == nullptr);
}

}  // namespace
