// Composited rows: every mode against a plain second telling, the differences from single pixels by hand, the
// plan of a row and its failures.
#include <ZR/composite.h>

#include <limits>

#include "composite/ground_rows.h"
#include "composite/random_pixels.h"
#include "composite/row_model.h"
#include "support/born_library.h"
#include "world/slot_table.h"

namespace {

template <class T>
ZR_BlendingMode<T> record(i32 mode, zr::Channel<T> opacity, bool keep_alpha = false, i32 seed = 0) {
  ZR_BlendingMode<T> m;
  m.mode = mode;
  m.seed = seed;
  m.opacity = opacity;
  m.keep_alpha = keep_alpha;
  return m;
}
template <class T>
constexpr auto white = static_cast<zr::Channel<T>>(zr::Depth<T>::white);

// A row with guard pixels around it, and its run through the pipeline.
template <class T>
struct GuardedRow {
  std::vector<T> all;
  explicit GuardedRow(const std::vector<T>& row) : all(row.size() + 4) {
    std::memset(all.data(), 0x5a, all.size() * sizeof(T));
    std::copy(row.begin(), row.end(), all.begin() + 2);
  }
  T* data() { return all.data() + 2; }
  std::vector<T> row() const { return {all.begin() + 2, all.end() - 2}; }
  bool intact() const {
    const auto* bytes = reinterpret_cast<const u8*>(all.data());
    const size_t size = all.size() * sizeof(T), edge = 2 * sizeof(T);
    const auto kept = [](u8 b) { return b == 0x5a; };
    return std::all_of(bytes, bytes + edge, kept) && std::all_of(bytes + size - edge, bytes + size, kept);
  }
};

template <class T>
std::vector<T> run(const ZR_BlendingMode<T>& mode, const ZR_LinearBlendingTables* tables, const std::vector<T>& src,
                   const std::vector<T>* mask, const std::vector<T>& dst) {
  const ZR_BlendModeDescriptor<T> plan(mode, mask != nullptr, tables);
  GuardedRow<T> row(dst);
  std::vector<zr::Channel<T>> scratch(dst.size());
  EXPECT_EQ(ZR_BlendPipeline<T>(nullptr, static_cast<i32>(dst.size()), &plan, src.data(), mask ? mask->data() : nullptr,
                                scratch.data(), row.data()),
            0);
  EXPECT_TRUE(row.intact());
  return row.row();
}
template <class T>
T run_pixel(i32 mode, const T& src, const T& dst, bool keep_alpha = false) {
  return run<T>(record<T>(mode, white<T>, keep_alpha), nullptr, {src}, nullptr, {dst})[0];
}
template <class T>
bool same(const T& a, const T& b) {
  return std::memcmp(&a, &b, sizeof(T)) == 0;
}
template <class T>
std::string text(const T& p) {
  std::string out;
  for (const auto c : {p.alpha, p.red, p.green, p.blue}) out += std::to_string(c) + " ";
  return out;
}

template <class T>
class RowsAt : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(RowsAt, Depths);
using Rows = BornLibrary;

// ------------------------------------------------------------------------------ against the second telling

TYPED_TEST(RowsAt, EveryModeWithAndWithoutMaskTablesAndKeptAlpha) {
  using T = TypeParam;
  RandomPixels<T> random;
  const ZR_LinearBlendingTables gamma = model::gamma_tables(2.2);
  for (i32 mode = -3; mode <= 40; ++mode) {
    if (mode == -1) continue;
    for (int round = 0; round < 240; ++round) {
      const bool masked = round & 1, linear = round & 2, keep = round & 4;
      const auto opacity = round % 3 == 0 ? white<T> : round % 17 == 0 ? zr::Channel<T>{0} : random.alpha();
      const i32 seed = static_cast<i32>(random.random());
      std::vector<T> src, mask, dst;
      for (int i = round % 23; i > 0; --i) {
        src.push_back(random.pixel());
        dst.push_back(random.pixel());
        mask.push_back(random.pixel());
      }
      const ZR_LinearBlendingTables* tables = linear ? &gamma : nullptr;
      std::vector<T> expected = dst;
      model::composite_row<T>({mode, seed, opacity, keep}, tables, src, masked ? &mask : nullptr, expected);
      const std::vector<T> got =
          run<T>(record<T>(mode, opacity, keep, seed), tables, src, masked ? &mask : nullptr, dst);
      for (size_t i = 0; i < dst.size(); ++i)
        ASSERT_TRUE(same(got[i], expected[i]))
            << "mode " << mode << (masked ? " masked" : "") << (linear ? " linear" : "") << (keep ? " keep" : "")
            << " opacity " << +opacity << ": " << text(src[i]) << "onto " << text(dst[i]) << "gives " << text(got[i])
            << "and not " << text(expected[i]);
    }
  }
}

// A plan for masked rows takes a row without mask as one that is open everywhere.
TYPED_TEST(RowsAt, AMissingMaskIsAnOpenOne) {
  using T = TypeParam;
  RandomPixels<T> random;
  const std::vector<T> src{random.pixel(), random.pixel()}, dst{random.pixel(), random.pixel()};
  for (i32 mode = -3; mode <= 40; ++mode) {
    if (mode == -1) continue;
    const ZR_BlendingMode<T> m = record<T>(mode, white<T>);
    const ZR_BlendModeDescriptor<T> plan(m, true, nullptr);
    std::vector<T> d = dst;
    zr::Channel<T> scratch[2];
    ASSERT_EQ(ZR_BlendPipeline<T>(nullptr, 2, &plan, src.data(), nullptr, scratch, d.data()), 0);
    const std::vector<T> plain = run<T>(m, nullptr, src, nullptr, dst);
    EXPECT_TRUE(same(d[0], plain[0]) && same(d[1], plain[1])) << mode;
  }
}

// ------------------------------------------------------------------------------ by hand

TEST_F(Rows, GroundModesPayTheirRoundingOnEveryPixel) {
  // The source is clear, and yet 100 under alpha 3 goes to white ground and back as 85.
  const ZR_Pixel8 kept = run_pixel<ZR_Pixel8>(XferMultiply, {0, 9, 9, 9}, {3, 100, 255, 0});
  EXPECT_TRUE(same<ZR_Pixel8>(kept, {3, 85, 255, 0})) << text(kept);
  // And where nothing is, the ground's own colour appears.
  const ZR_Pixel16 black = run_pixel<ZR_Pixel16>(XferAdd, {0, 9, 9, 9}, {0, 1, 2, 3});
  EXPECT_TRUE(same<ZR_Pixel16>(black, {0, 32768, 32768, 32768})) << text(black);
  const ZR_Pixel16 pale = run_pixel<ZR_Pixel16>(XferMultiply, {0, 9, 9, 9}, {0, 1, 2, 3});
  EXPECT_TRUE(same<ZR_Pixel16>(pale, {0, 0, 0, 0})) << text(pale);
  const ZR_PixelFloat grey = run_pixel<ZR_PixelFloat>(XferOverlay, {0, 9, 9, 9}, {0, 1, 0, 0.5f});
  EXPECT_TRUE(same<ZR_PixelFloat>(grey, {0, 1.5f, 1.5f, 1.5f})) << text(grey);
}

TEST_F(Rows, WhereRowsDifferFromPixels) {
  // Multiply is one product here and a difference of two there: 1 * 16384 is a half, which goes down.
  EXPECT_EQ((run_pixel<ZR_Pixel16>(XferMultiply, {32768, 1, 0, 0}, {32768, 16384, 0, 0}).red), 0);
  ZR_Pixel16 alone{32768, 16384, 0, 0};
  ZR_Get_Xfer1_table16(XferMultiply)({32768, 1, 0, 0}, nullptr, &alone);
  EXPECT_EQ(alone.red, 1);
  // The source's luma of 131 beats the 130 of the destination as stored, but not the 131 of both composited.
  const ZR_Pixel8 source{100, 131, 131, 131}, onto{100, 184, 88, 208};
  ZR_Pixel8 single = onto;
  ZR_Get_Xfer1_table8(XferLighterColor)(source, nullptr, &single);
  EXPECT_TRUE(same<ZR_Pixel8>(single, {161, 150, 115, 160})) << text(single);
  const ZR_Pixel8 row = run_pixel<ZR_Pixel8>(XferLighterColor, source, onto);
  EXPECT_TRUE(same<ZR_Pixel8>(row, {161, 163, 105, 179})) << text(row);
}

TEST_F(Rows, KeptAlphaIsPutBackAfterTheUnion) {
  // 100 of 128 is 50 on black; with 60 more under a full alpha, 110 stands, and the old alpha comes back.
  const ZR_Pixel8 d = run_pixel<ZR_Pixel8>(XferAdd, {255, 60, 255, 0}, {128, 100, 255, 0}, true);
  EXPECT_TRUE(same<ZR_Pixel8>(d, {128, 110, 255, 0})) << text(d);
  // Modes that work on alpha take no notice.
  EXPECT_EQ((run_pixel<ZR_Pixel8>(XferMultiplyAlpha, {128, 0, 0, 0}, {255, 1, 1, 1}, true).alpha), 128);
  EXPECT_EQ((run_pixel<ZR_Pixel8>(XferKeyProtect, {7, 9, 9, 9}, {255, 1, 1, 1}, true).alpha), 7);
}

// Where the order of three factors shows: main functions of 8-bit pixels take the mask first, unions last.
TEST_F(Rows, OrderOfMaskAndOpacity) {
  const std::vector<ZR_Pixel8> src{{127, 0, 0, 0}}, mask{{128, 0, 0, 0}};
  EXPECT_EQ(run(record<ZR_Pixel8>(XferCopy, 2), nullptr, src, &mask, {{0, 0, 0, 0}})[0].alpha, 1);
  ZR_Pixel8 d{0, 0, 0, 0};
  zr::union_alpha_row<ZR_Pixel8>(1, src.data(), 2, mask.data(), &d);
  EXPECT_EQ(d.alpha, 1) << "127 * 2 is 1, and 128 of it 1";
  const std::vector<ZR_Pixel8> other{{2, 0, 0, 0}}, low{{127, 0, 0, 0}};
  EXPECT_EQ(run(record<ZR_Pixel8>(XferCopy, 128), nullptr, other, &low, {{0, 0, 0, 0}})[0].alpha, 1);
  zr::union_alpha_row<ZR_Pixel8>(1, other.data(), 128, low.data(), &(d = {0, 0, 0, 0}));
  EXPECT_EQ(d.alpha, 0) << "2 * 128 is 1, and 127 of it 0";
}

TEST_F(Rows, MatteMix) {
  const auto mixed = [](u8 k, ZR_Pixel8 s, ZR_Pixel8 d) {
    const std::vector<ZR_Pixel8> mask{{k, 0, 0, 0}};
    return run(record<ZR_Pixel8>(XferMatteMix, 0), nullptr, {s}, &mask, {d})[0];
  };
  EXPECT_TRUE(same<ZR_Pixel8>(mixed(128, {0, 1, 2, 3}, {0, 4, 5, 6}), {0, 4, 5, 6})) << "nothing of nothing";
  EXPECT_TRUE(same<ZR_Pixel8>(mixed(255, {7, 1, 2, 3}, {9, 4, 5, 6}), {7, 1, 2, 3}));
  EXPECT_TRUE(same<ZR_Pixel8>(mixed(0, {7, 1, 2, 3}, {9, 4, 5, 6}), {9, 4, 5, 6}));
  EXPECT_TRUE(same<ZR_Pixel8>(mixed(51, {255, 255, 0, 10}, {255, 0, 255, 10}), {255, 51, 204, 10}));
}

TEST_F(Rows, DissolveSteps) {
  const auto dissolved = [](u8 alpha, u8 opacity, i32 seed, size_t n) {
    const std::vector<ZR_Pixel8> src(n, {alpha, 1, 2, 3}), dst(n, {0, 0, 0, 0});
    return run<ZR_Pixel8>(record<ZR_Pixel8>(XferDissolve, opacity, false, seed), nullptr, src, nullptr, dst);
  };
  for (const ZR_Pixel8& p : dissolved(255, 0, 5, 40)) EXPECT_EQ(p.alpha, 0);
  int drawn = 0;
  for (const ZR_Pixel8& p : dissolved(64, 255, 5, 4000)) drawn += p.alpha == 255;
  EXPECT_NEAR(drawn, 4000 * 65 / 256, 120);
  // Clear pixels in front move the seed by one each, as a caller's seed would.
  std::vector<ZR_Pixel8> src(50, {90, 1, 2, 3}), dst(50, {0, 0, 0, 0});
  for (size_t i = 0; i < 7; ++i) src[i].alpha = 0;
  const auto late = run<ZR_Pixel8>(record<ZR_Pixel8>(XferDissolve, 255, false, 1000), nullptr, src, nullptr, dst);
  const auto early = dissolved(90, 255, 1007, 43);
  for (size_t i = 0; i < 43; ++i) EXPECT_TRUE(same(late[i + 7], early[i])) << i;
}

TYPED_TEST(RowsAt, GroundRowsReadFromAnotherRowToo) {
  using T = TypeParam;
  RandomPixels<T> random;
  std::vector<T> src(19);
  for (T& p : src) p = random.pixel();
  for (auto* row : {zr::white_fade_row<T>, zr::white_unfade_row<T>, zr::grey_fade_row<T>, zr::grey_unfade_row<T>}) {
    std::vector<T> in_place = src, twice = src, apart(19, T{});
    EXPECT_EQ(row(19, nullptr, in_place.data()), 0);
    EXPECT_EQ(row(19, twice.data(), twice.data()), 0);
    EXPECT_EQ(row(19, src.data(), apart.data()), 0);
    for (size_t i = 0; i < 19; ++i) EXPECT_TRUE(same(in_place[i], apart[i]) && same(twice[i], apart[i])) << i;
  }
}

TYPED_TEST(RowsAt, EmptyRowsAreNotTouched) {
  using T = TypeParam;
  const ZR_LinearBlendingTables gamma = model::gamma_tables(2.2);
  for (i32 mode = -3; mode <= 40; ++mode) {
    if (mode == -1) continue;
    const ZR_BlendModeDescriptor<T> plan(record<T>(mode, white<T>, true), mode & 1, mode & 2 ? &gamma : nullptr);
    for (const i32 n : {0, -1, std::numeric_limits<i32>::min()})
      EXPECT_EQ(ZR_BlendPipeline<T>(nullptr, n, &plan, nullptr, nullptr, nullptr, nullptr), 0) << mode;
  }
}

// Channels that are no colours: nothing is read or written outside the row; sanitizers watch.
TYPED_TEST(RowsAt, IllegalChannelsDoNoHarm) {
  using T = TypeParam;
  using Channel = zr::Channel<T>;
  std::vector<Channel> values{0, 1, white<T>};
  if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
    const f32 inf = std::numeric_limits<f32>::infinity();
    values.insert(values.end(), {std::nanf(""), inf, -inf, 3e38f, -3e38f, -1.0f, 1e-44f});
  } else {
    values.push_back(static_cast<Channel>(~Channel{0}));
    values.push_back(static_cast<Channel>(white<T> + 1));
  }
  std::mt19937 random{3};
  const auto any = [&] { return values[random() % values.size()]; };
  const ZR_LinearBlendingTables gamma = model::gamma_tables(2.2);
  for (i32 mode = -3; mode <= 40; ++mode) {
    if (mode == -1) continue;
    for (int round = 0; round < 8; ++round) {
      std::vector<T> src, dst, mask;
      for (int i = 0; i < 200; ++i) {
        for (auto* row : {&src, &dst, &mask}) row->push_back({any(), any(), any(), any()});
      }
      run<T>(record<T>(mode, any(), round & 1), round & 2 ? &gamma : nullptr, src, round & 4 ? &mask : nullptr, dst);
    }
  }
}

// ------------------------------------------------------------------------------ the plan

// The variant of the getter that a plan asks, and what for.
struct Asked {
  i32 variant, mode;
  bool operator==(const Asked&) const = default;
};
std::vector<Asked> asked;
template <i32 variant>
i32 recording_getter(i32 mode, ZR_InnerBlendingFunc<ZR_Pixel16>* out) {
  asked.push_back({variant, mode});
  *out = [](i32, const ZR_BlendingMode<ZR_Pixel16>*, const ZR_LinearBlendingTables*, const ZR_Pixel16*,
            const ZR_Pixel16*, ZR_Pixel16*) -> i32 { return variant; };
  return 0;
}

TEST_F(Rows, ThePlanAsksTheSlotOfItsVariantTwice) {
  const auto address = [](auto* f) { return reinterpret_cast<void*>(f); };
  const SlotOverride plain(ZR_Slot_inner_blend16, address(&recording_getter<10>));
  const SlotOverride linear(ZR_Slot_inner_blend_linear16, address(&recording_getter<11>));
  const SlotOverride mask(ZR_Slot_inner_blend_mask16, address(&recording_getter<12>));
  const SlotOverride both(ZR_Slot_inner_blend_mask_linear16, address(&recording_getter<13>));
  const ZR_LinearBlendingTables gamma = model::gamma_tables(2.2);
  for (const i32 i : {0, 1, 2, 3}) {
    asked.clear();
    const ZR_BlendModeDescriptor<ZR_Pixel16> plan(record<ZR_Pixel16>(XferHue, 5), i & 2, i & 1 ? &gamma : nullptr);
    EXPECT_EQ(asked, (std::vector<Asked>{{10 + i, XferHue}, {10 + i, XferBehind}}));
    EXPECT_EQ(plan.tables, i & 1 ? &gamma : nullptr);
    ZR_Pixel16 pixel{};
    EXPECT_EQ(ZR_BlendPipeline<ZR_Pixel16>(nullptr, 1, &plan, &pixel, nullptr, nullptr, &pixel), 10 + i);
  }
}

// Steps that note their letter; the one that is told to fails.
std::string steps;
char failing_step;
i32 step(char letter) {
  steps += letter;
  return letter == failing_step ? 71 : 0;
}

TEST_F(Rows, StepsInTheirOrderUntilOneFails) {
  using T = ZR_Pixel8;
  ZR_BlendModeDescriptor<T> plan(record<T>(XferAdd, 255, true), false, nullptr);
  plan.fade = [](i32, const T*, T*) { return step('f'); };
  plan.unfade = [](i32, const T*, T*) { return step('u'); };
  plan.main = [](i32, const ZR_BlendingMode<T>*, const ZR_LinearBlendingTables*, const T*, const T*, T* d) -> i32 {
    d->alpha = 200;
    return step('m');
  };
  plan.first_pass = [](i32, const ZR_BlendingMode<T>*, const ZR_LinearBlendingTables*, const T*, const T*, T*) {
    return step('b');
  };
  plan.union_alpha = [](i32, const T*, u8, const T*, T*) { return step('a'); };
  const auto run_failing = [&](char letter) {
    steps.clear();
    failing_step = letter;
    T d{9, 0, 0, 0};
    u8 scratch = 0;
    const i32 error = ZR_BlendPipeline<T>(nullptr, 1, &plan, &d, nullptr, &scratch, &d);
    EXPECT_EQ(error, letter == '-' ? 0 : 71) << letter;
    return steps + std::to_string(d.alpha);
  };
  EXPECT_EQ(run_failing('-'), "fmau9");
  EXPECT_EQ(run_failing('f'), "f9");
  EXPECT_EQ(run_failing('m'), "fm200") << "alpha is put back only where all went well";
  EXPECT_EQ(run_failing('a'), "fma200");
  EXPECT_EQ(run_failing('u'), "fmau200");
  plan.use_fade = plan.use_union_alpha = 0;
  plan.use_first_pass = 1;
  EXPECT_EQ(run_failing('-'), "bm9");
  EXPECT_EQ(run_failing('b'), "b9");
}

// ------------------------------------------------------------------------------ failures

TYPED_TEST(RowsAt, UnknownModesAreReportedAndDrawNothing) {
  using T = TypeParam;
  for (const i32 mode : {-1, -4, 41, 44, std::numeric_limits<i32>::max(), std::numeric_limits<i32>::min()}) {
    ZR_InnerBlendingFunc<T> out = nullptr;
    EXPECT_EQ((ZR_GetInnerBlendingFunc<T, true, true>(mode, &out)), ZR_Err_UnimplementedMode) << mode;
    EXPECT_EQ(out, nullptr);
    EXPECT_EQ(this->caught.take_message(), "unimplemented blending mode.");

    const ZR_BlendModeDescriptor<T> plan(record<T>(mode, white<T>), false, nullptr);
    EXPECT_EQ(plan.main, nullptr);
    EXPECT_EQ(this->caught.take_message(), "unimplemented blending mode.");
    T pixel{1, 0, 0, 0}, source{white<T>, 0, 0, 0};
    EXPECT_EQ(ZR_BlendPipeline<T>(nullptr, 1, &plan, &source, nullptr, nullptr, &pixel), ZR_Err_UnimplementedMode);
    EXPECT_EQ(pixel.alpha, 1);
  }
}

TEST_F(Rows, AnEmptySlotEndsThePlan) {
  for (const ZR_SlotIndex slot : {ZR_Slot_inner_blend8, ZR_Slot_union_alpha_row8, ZR_Slot_unmul_row8}) {
    const SlotOverride empty(slot, nullptr);
    try {
      const ZR_BlendModeDescriptor<ZR_Pixel8> plan(record<ZR_Pixel8>(XferAdd, 255), false, nullptr);
      ADD_FAILURE() << "a plan with slot " << slot << " empty";
    } catch (const i32 code) {
      EXPECT_EQ(code, ZR_Err_Internal);
    }
    EXPECT_EQ(caught.take_verification(), "Something went wrong attempting get the blending function.");
  }
}

}  // namespace
