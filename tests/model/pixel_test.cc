// Per-pixel transfer functions against the model.
#include "model/compare.h"

namespace model {
namespace {

template <class D>
struct Functions;
template <>
struct Functions<Eight> {
  static constexpr auto none = ZR_Get_Xfer1_table8;
  static constexpr auto one = ZR_Get_Xfer1_Opacity_table8;
  static constexpr auto two = ZR_Get_Xfer1_Opacity2_table8;
};
template <>
struct Functions<Sixteen> {
  static constexpr auto none = ZR_Get_Xfer1_table16;
  static constexpr auto one = ZR_Get_Xfer1_Opacity_table16;
  static constexpr auto two = ZR_Get_Xfer1_Opacity2_table16;
};
template <>
struct Functions<Float> {
  static constexpr auto none = ZR_Get_Xfer1_tableF;
  static constexpr auto one = ZR_Get_Xfer1_Opacity_tableF;
  static constexpr auto two = ZR_Get_Xfer1_Opacity2_tableF;
};

template <class D>
void check(i32 mode, const typename D::Pixel& s, const typename D::Pixel& d, const std::vector<typename D::V>& opacity,
           const ZR_LinearBlendingTables* tables, Complaints& complaints) {
  Px<D> target = load<D>(d);
  transfer_pixel<D>(mode, load<D>(s), tables, opacity, target);
  const typename D::Pixel expected = store(target);
  typename D::Pixel got = d;
  const auto o = [&opacity](size_t i) { return static_cast<typename D::Channel>(opacity[i]); };
  if (opacity.empty())
    Functions<D>::none(mode)(s, tables, &got);
  else if (opacity.size() == 1)
    Functions<D>::one(mode)(s, tables, o(0), &got);
  else
    Functions<D>::two(mode)(s, tables, o(0), o(1), &got);
  if (same<D>(expected, got)) return;
  std::string what = "  source   " + text<D>(s) + "\n  dest     " + text<D>(d);
  for (const auto v : opacity) what += "\n  opacity  " + text(v);
  complaints.add(std::string(D::name) + " mode " + mode_name(mode) + (tables != nullptr ? ", linear light" : ""),
                 what + "\n  expected " + text<D>(expected) + "\n  got      " + text<D>(got));
}

// All pairs of channels in each mode, at alphas and opacities that reach every form.
TEST(ModelPixels, Eight) {
  struct Case {
    u8 source_alpha, dest_alpha;
    std::vector<i32> opacity;
    bool linear;
  };
  const Case cases[] = {
      {255, 255, {}, false},  {255, 100, {}, false},    {100, 255, {}, false},        {100, 77, {255}, false},
      {1, 1, {}, false},      {254, 254, {254}, false}, {200, 0, {}, false},          {0, 128, {}, false},
      {128, 127, {3}, false}, {255, 33, {128}, false},  {90, 170, {128, 201}, false}, {250, 140, {}, true}};
  Complaints complaints;
  for (i32 mode = 0; mode <= 40; ++mode)
    for (const Case& c : cases)
      for (i32 s = 0; s < 256; ++s)
        for (i32 d = 0; d < 256; ++d) {
          const auto u = [](i32 v) { return static_cast<u8>(v); };
          check<Eight>(mode, {c.source_alpha, u(s), u(d), u(s * 7 + d)}, {c.dest_alpha, u(d), u(s), u(s ^ (d * 3))},
                       c.opacity, c.linear ? test_tables(0) : nullptr, complaints);
        }
}

template <class D>
void random_pixels(i32 count, Range range, u32 seed) {
  Random random(seed);
  Complaints complaints;
  for (i32 mode = 0; mode <= 40; ++mode)
    for (i32 i = 0; i < count; ++i) {
      auto s = random.pixel<D>(range), d = random.pixel<D>(range);
      if (random.one_in(4)) d.red = s.red;
      if (mode == key_protect && random.one_in(3)) {
        d.red = d.green = 0;
        if (random.one_in(4)) d.blue = 0, d.green = static_cast<typename D::Channel>(D::white);
      }
      std::vector<typename D::V> opacity;
      for (i32 n = random.in(0, 2); n > 0; --n) opacity.push_back(random.one_in(3) ? D::white : random.channel<D>());
      const auto* tables = random.one_in(3) ? test_tables(random.word()) : nullptr;
      check<D>(mode, s, d, opacity, tables, complaints);
    }
}
TEST(ModelPixels, EightAtRandomAlphas) { random_pixels<Eight>(20000, Range::legal, 1); }
TEST(ModelPixels, Sixteen) { random_pixels<Sixteen>(30000, Range::legal, 2); }
TEST(ModelPixels, Float) { random_pixels<Float>(30000, Range::legal, 3); }
TEST(ModelPixels, FloatOutsideOfZeroToOne) { random_pixels<Float>(30000, Range::wild, 4); }

// Infinities, NaN and numbers too small to divide by, in each place.
TEST(ModelPixels, FloatThatIsNoNumber) {
  const f32 inf = INFINITY, values[] = {0, -0.0f, 1, 0.4f, 0.5f, -1, 3, 1e-40f, 3e38f, inf, -inf, NAN};
  Complaints complaints;
  for (i32 mode = 0; mode <= 40; ++mode)
    for (const f32 sa : {0.0f, 0.3f, 1.0f, 1e-40f, inf, -0.5f, f32{NAN}})
      for (const f32 da : {0.0f, 0.6f, 1.0f, 1e-40f, inf, f32{NAN}})
        for (const f32 s : values)
          for (const f32 d : values) {
            check<Float>(mode, {sa, s, s, s}, {da, d, d, d}, {}, nullptr, complaints);
            check<Float>(mode, {sa, s, d, 0.2f}, {da, d, 0.7f, s}, {}, nullptr, complaints);
          }
}

TEST(ModelPixels, RandAndTransferFlags) {
  for (const u32 seed : {0u, 1u, 44487u, 44488u, 0x7fffffffu, 0x80000000u, 0xffffffffu, 123456789u}) {
    u32 ours = seed, theirs = seed;
    for (int i = 0; i < 1000; ++i) {
      const i32 expected = rand(ours);
      ASSERT_EQ(ZR_Rand(&theirs), expected) << "seed " << seed << ", step " << i;
      ASSERT_EQ(theirs, ours) << "seed " << seed << ", step " << i;
    }
  }
  const std::vector<i32> flagged = {-3, 0, 1, 2, 4, 5, 6, 7, 9, 10, 11, 12, 13, 14, 15, 16, 22, 25, 37, 38};
  for (i32 mode = -100; mode <= 100; ++mode) {
    const bool is = std::find(flagged.begin(), flagged.end(), mode) != flagged.end();
    EXPECT_EQ(ZR_GetTransferFlags(mode), is ? 1 : 0) << "mode " << mode;
  }
  EXPECT_EQ(ZR_GetTransferFlags(INT32_MIN), 0);
  EXPECT_EQ(ZR_GetTransferFlags(INT32_MAX), 0);
}

}  // namespace
}  // namespace model
