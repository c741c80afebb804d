// Composited rows: the plan of a row and its failures.
#include <ZR/composite.h>

#include <algorithm>
#include <cstring>
#include <limits>
#include <vector>

#include "composite/ground_rows.h"
#include "support/born_library.h"
#include "support/edge_rows.h"
#include "support/gamma_tables.h"
#include "support/thrown.h"
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

template <class T>
std::vector<T> run(const ZR_BlendingMode<T>& mode, const ZR_LinearBlendingTables* tables, const std::vector<T>& src,
                   const std::vector<T>* mask, const std::vector<T>& dst) {
  const ZR_BlendModeDescriptor<T> plan(mode, mask != nullptr, tables);
  std::vector<T> row = dst;
  std::vector<zr::Channel<T>> scratch(dst.size());
  EXPECT_EQ(ZR_BlendPipeline<T>(nullptr, static_cast<i32>(dst.size()), &plan, src.data(), mask ? mask->data() : nullptr,
                                scratch.data(), row.data()),
            0);
  return row;
}
template <class T>
class RowsAt : public BornLibrary {};
using Depths = testing::Types<ZR_Pixel8, ZR_Pixel16, ZR_PixelFloat>;
TYPED_TEST_SUITE(RowsAt, Depths);
using Rows = BornLibrary;

// A plan for masked rows takes a row without mask as one that is open everywhere.
TYPED_TEST(RowsAt, AMissingMaskIsAnOpenOne) {
  using T = TypeParam;
  std::mt19937 random(4711);
  std::vector<T> src(2), dst(2);
  fill_edgy(random, 2, src.data()), fill_edgy(random, 2, dst.data());
  for (i32 mode = -3; mode <= 40; ++mode) {
    if (mode == -1) continue;
    const ZR_BlendingMode<T> m = record<T>(mode, white<T>);
    const ZR_BlendModeDescriptor<T> plan(m, true, nullptr);
    std::vector<T> d = dst;
    zr::Channel<T> scratch[2];
    ASSERT_EQ(ZR_BlendPipeline<T>(nullptr, 2, &plan, src.data(), nullptr, scratch, d.data()), 0);
    const std::vector<T> plain = run<T>(m, nullptr, src, nullptr, dst);
    EXPECT_TRUE(same_pixel(d[0], plain[0]) && same_pixel(d[1], plain[1])) << mode;
  }
}

TYPED_TEST(RowsAt, GroundRowsReadFromAnotherRowToo) {
  using T = TypeParam;
  std::mt19937 random(4711);
  std::vector<T> src(19);
  fill_edgy(random, 19, src.data());
  for (auto* row : {zr::white_fade_row<T>, zr::white_unfade_row<T>, zr::grey_fade_row<T>, zr::grey_unfade_row<T>}) {
    std::vector<T> in_place = src, twice = src, apart(19, T{});
    EXPECT_EQ(row(19, nullptr, in_place.data()), 0);
    EXPECT_EQ(row(19, twice.data(), twice.data()), 0);
    EXPECT_EQ(row(19, src.data(), apart.data()), 0);
    for (size_t i = 0; i < 19; ++i)
      EXPECT_TRUE(same_pixel(in_place[i], apart[i]) && same_pixel(twice[i], apart[i])) << i;
  }
}

TYPED_TEST(RowsAt, EmptyRowsAreNotTouched) {
  using T = TypeParam;
  const ZR_LinearBlendingTables gamma = gamma_tables(2.2);
  for (i32 mode = -3; mode <= 40; ++mode) {
    if (mode == -1) continue;
    const ZR_BlendModeDescriptor<T> plan(record<T>(mode, white<T>, true), mode & 1, mode & 2 ? &gamma : nullptr);
    for (const i32 n : {0, -1, std::numeric_limits<i32>::min()})
      EXPECT_EQ(ZR_BlendPipeline<T>(nullptr, n, &plan, nullptr, nullptr, nullptr, nullptr), 0) << mode;
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
  const ZR_LinearBlendingTables gamma = gamma_tables(2.2);
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
    const auto plan = [] { ZR_BlendModeDescriptor<ZR_Pixel8>(record<ZR_Pixel8>(XferAdd, 255), false, nullptr); };
    EXPECT_EQ(thrown_by(plan), ZR_Err_Internal) << slot;
    EXPECT_EQ(caught.take_verification(), "Something went wrong attempting get the blending function.");
  }
}

}  // namespace
