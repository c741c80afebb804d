// Point samplers, in three depths, against plain models and at the borders where they must differ.
#include "sample/sample_functions.h"

#include "sample/models.h"
#include "support/born_library.h"

namespace {

using PointSamplers = BornLibrary;

// How far a quality reads to the left and above, and to the right and below.
struct Reach {
  i32 before, behind;
};
constexpr Reach reach_of(i32 quality) { return quality == 2 ? Reach{1, 2} : Reach{0, 1}; }

template <class T>
bool reads_inside(const ZR_LayerDef& layer, i32 quality, i32 x, i32 y) {
  const Reach reach = reach_of(quality);
  return (x >> 16) >= reach.before && (y >> 16) >= reach.before && (x >> 16) + reach.behind < layer.width &&
         (y >> 16) + reach.behind < layer.height;
}

TEST_F(PointSamplers, EqualTheirModel) {
  each_depth([]<class T>() {
    for (const auto& picture : pictures<T>())
      for (const i32 quality : {1, 2}) {
        const auto set = zr::sample_functions<T>(quality);
        size_t unclipped = 0;
        // Many on one 8-bit world: the order of additions shows in one sample of tens of thousands.
        const size_t count = sizeof(T) == 4 && picture->layer.width == 17 ? 250000 : 2000;
        for (const auto& [x, y] : positions(picture->layer, count, 11)) {
          const auto where = [&, at = std::array{x, y}] {
            return testing::Message() << picture->name << " q" << quality << " at " << at[0] << ", " << at[1];
          };
          const T expected = point_model(*picture, quality, x, y);
          T got;
          ASSERT_EQ(set.clipping(nullptr, x, y, &picture->params, &got), 0);
          ASSERT_TRUE(same_pixel(got, expected)) << where();
          u8 all_in = 7;
          ASSERT_EQ(set.inside_flag(nullptr, x, y, &picture->params, &all_in, &got), 0);
          ASSERT_TRUE(same_pixel(got, expected)) << where();
          const bool whole = ((x | y) & 0xffff) == 0;
          const bool in = reads_inside<T>(picture->layer, quality, x, y);
          ASSERT_EQ(all_in, in && (quality == 2 ? (x >> 16) > 1 && (y >> 16) > 1 : is_float<T> || !whole));
          if (!in) continue;
          ++unclipped;
          ASSERT_EQ(set.no_clipping(nullptr, x, y, &picture->params, &got), 0);
          ASSERT_TRUE(same_pixel(got, expected)) << where();
          if (quality == 2 && !is_float<T>) continue;  // another rule, below
          f64 w[4];
          ZR_SubpixelSampleComputeWeight(static_cast<u16>(x), static_cast<u16>(y), w);
          ASSERT_EQ(set.translate(nullptr, x, y, w, &picture->params, &got), 0);
          ASSERT_TRUE(same_pixel(got, bilinear_model(*picture, x, y, w))) << where();
        }
        EXPECT_GE(unclipped, picture->layer.width > 8 ? 100u : 0u);
        EXPECT_TRUE(picture->world.guards_intact());
      }
  });
}

TEST_F(PointSamplers, SpansEqualSinglePixelsAndSumTheirAlpha) {
  each_depth([]<class T>() {
    for (const auto& picture : pictures<T>())
      for (const i32 quality : {1, 2}) {
        const auto set = zr::sample_functions<T>(quality);
        const Reach reach = reach_of(quality);
        const i32 count = picture->layer.width - reach.before - reach.behind;
        if (count < 1 || picture->layer.height <= reach.before + reach.behind) continue;
        for (const i32 fraction : {0, 1, 0x4321, 0x8000, 0xffff}) {
          const i32 x = (reach.before << 16) + fraction, y = (reach.before << 16) + (fraction ^ 0x1357);
          std::vector<T> got(static_cast<size_t>(count) + 1, T{1, 2, 3, 4});
          zr::AlphaSum<T> sum = 3, expected_sum = 3;
          ASSERT_EQ(set.span(nullptr, 0, x, y, &picture->params, &sum, got.data()), 0);
          ASSERT_EQ(set.span(nullptr, -5, x, y, &picture->params, &sum, got.data()), 0);
          ASSERT_TRUE(sum == 3 && same_pixel(got[0], T{1, 2, 3, 4})) << "a count below 1 does nothing";
          ASSERT_EQ(set.span(nullptr, count, x, y, &picture->params, &sum, got.data()), 0);
          for (i32 i = 0; i < count; ++i) {
            const T expected = point_model(*picture, quality, x + (i << 16), y);
            ASSERT_TRUE(same_pixel(got[static_cast<size_t>(i)], expected)) << picture->name << " pixel " << i;
            expected_sum += expected.alpha;
          }
          EXPECT_EQ(sum, expected_sum);
          EXPECT_TRUE(same_pixel(got.back(), T{1, 2, 3, 4})) << "one pixel too many";
        }
      }
  });
}

void nearest(i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel8* dst) { ZR_NNSample(nullptr, x, y, params, dst); }
void nearest(i32 x, i32 y, const ZR_SampPB* params, ZR_Pixel16* dst) { ZR_NNSample16(nullptr, x, y, params, dst); }
void nearest(i32 x, i32 y, const ZR_SampPB* params, ZR_PixelFloat* dst) {
  ZR_NNSampleFloat(nullptr, x, y, params, dst);
}
TEST_F(PointSamplers, NearestTakesHalvesToTheRightAndDown) {
  each_depth([]<class T>() {
    for (const auto& picture : pictures<T>())
      for (const auto& [x, y] : positions(picture->layer, 2000, 3)) {
        T got;
        nearest(x, y, &picture->params, &got);
        const f64 column = std::floor(x / 65536.0 + 0.5), row = std::floor(y / 65536.0 + 0.5);
        ASSERT_TRUE(same_pixel(got, picture->at(static_cast<i64>(column), static_cast<i64>(row))))
            << picture->name << " at " << x << ", " << y;
      }
  });
}

TEST_F(PointSamplers, FourAtATimeHaveNoBranches) {
  for (const auto& picture : pictures<ZR_Pixel8>()) {
    std::vector<std::array<i32, 2>> inside = positions(picture->layer, 3000, 5);
    std::erase_if(inside, [&](const auto& at) { return !reads_inside<ZR_Pixel8>(picture->layer, 1, at[0], at[1]); });
    for (size_t first = 0; first + 4 <= inside.size(); first += 4) {
      const i32* const xy = inside[first].data();
      f64 w[16];
      for (size_t i = 0; i < 4; ++i)
        ZR_SubpixelSampleComputeWeight(static_cast<u16>(xy[2 * i]), static_cast<u16>(xy[2 * i + 1]), w + 4 * i);
      ZR_Pixel8 got[4], translated[4];
      ASSERT_EQ(ZR_SubpixelSampleNoClip_Straight_4(nullptr, xy, &picture->params, got), 0);
      ASSERT_EQ(ZR_SubpixelSampleTranslateNoClip_Straight_4(nullptr, xy, w, &picture->params, translated), 0);
      for (size_t i = 0; i < 4; ++i) {
        const auto [x, y] = inside[first + i];
        ASSERT_TRUE(same_pixel(got[i], bilinear_model(*picture, x, y, nullptr, false))) << picture->name;
        ASSERT_TRUE(same_pixel(translated[i], bilinear_model(*picture, x, y, w + 4 * i, false))) << picture->name;
      }
    }
  }
}

TEST_F(PointSamplers, PremultipliedIsPlainInIntegers) {
  for (const auto& picture : pictures<ZR_Pixel8>())
    for (const auto& [x, y] : positions(picture->layer, 3000, 23)) {
      ZR_Pixel8 got;
      ASSERT_EQ(ZR_SubpixelSample_Premul(nullptr, x, y, &picture->params, &got), 0);
      const i64 fx = x & 0xffff, fy = y & 0xffff;
      const i64 w10 = (65536 - fy) * fx / 65536, w01 = fy * (65536 - fx) / 65536, w11 = fy * fx / 65536;
      const i64 w[4] = {65536 - w10 - w01 - w11, w10, w01, w11};
      std::array<i64, 4> sums{};
      ZR_Pixel8 p[4];
      for (i32 n = 0; n < 4; ++n) {
        const i64 column = (x >> 16) + (n & 1), row = (y >> 16) + (n >> 1);
        p[n] = picture->at(column, row);
        for (size_t k = 0; k < 4; ++k) sums[k] += w[n] * numbers<i64>(p[n])[k];
      }
      for (i64& v : sums) v = (v + 32768) >> 16;
      ASSERT_TRUE(same_pixel(got, pixel_of<ZR_Pixel8>(sums))) << picture->name << " at " << x << ", " << y;
    }
}

// Alpha is limited to 1 on every scale, so an uneven neighbourhood gives alpha 0 or 1 and sums in their low bits.
template <class T>
T translate_bicubic(const T (&pixels)[4], f64 fraction) {
  TestWorld<T> world(2, 2);
  for (i32 i = 0; i < 4; ++i) world.at(i & 1, i >> 1) = pixels[i];
  ZR_SampPB params{};
  params.src = world;
  f64 w[4];
  const u16 f = static_cast<u16>(fraction * 65536);
  ZR_SubpixelSampleComputeWeight(f, f, w);
  T out;
  zr::sample_functions<T>(2).translate(nullptr, f, f, w, &params, &out);
  return out;
}
TEST_F(PointSamplers, BicubicTranslateKeepsItsScale) {
  // Equal alphas: four neighbours, rounded.
  EXPECT_TRUE(
      same_pixel(translate_bicubic<ZR_Pixel8>({{9, 10, 0, 255}, {9, 20, 0, 255}, {9, 30, 0, 0}, {9, 41, 0, 0}}, 0.5),
                 ZR_Pixel8{9, 25, 0, 128}));
  // 0.25 * (200 * 2 + 100 * 4) = 200; 0.25 * 200 * 250 + 0.25 * 100 * 255 = 18875 = 0x49bb.
  EXPECT_TRUE(same_pixel(translate_bicubic<ZR_Pixel8>({{200, 2, 250, 0}, {100, 4, 255, 0}, {}, {}}, 0.5),
                         ZR_Pixel8{1, 200, 0xbb, 0}));
  EXPECT_TRUE(same_pixel(translate_bicubic<ZR_Pixel8>({{1, 200, 0, 0}, {}, {}, {}}, 0.5), ZR_Pixel8{0, 200, 0, 0}));
  EXPECT_TRUE(
      same_pixel(translate_bicubic<ZR_Pixel16>({{32768, 16, 40000, 0}, {}, {}, {}}, 0.5), ZR_Pixel16{1, 0, 0, 0}));
  EXPECT_TRUE(same_pixel(translate_bicubic<ZR_Pixel16>({{200, 30, 0, 0}, {0, 1, 1, 1}, {}, {}}, 0.5),
                         ZR_Pixel16{1, 1500, 0, 0}));
}

TEST_F(PointSamplers, TheSetFollowsTheSlotsAndTheQuality) {
  const auto mark = [](const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, ZR_Pixel8* dst) -> i32 {
    *dst = {1, 2, 3, 4};
    return 0;
  };
  i32 (*const routine)(const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, ZR_Pixel8*) = mark;
  const SlotOverride replaced(ZR_Slot_bilinear_straight8, reinterpret_cast<void*>(routine));
  ZR_SampleFunctionSet set;
  for (const auto& [quality, bicubic] :
       {std::pair{0, false}, {1, false}, {2, true}, {3, true}, {4, false}, {-1, false}, {-2, false}}) {
    ZR_GetSampleFunctionSet8(quality, &set);
    EXPECT_EQ(reinterpret_cast<void*>(set.clipping),
              bicubic ? reinterpret_cast<void*>(&ZR_SubpixelBicubic8) : reinterpret_cast<void*>(routine));
    ZR_GetSampleFunctionSetFloat(quality, &set);
    EXPECT_EQ(reinterpret_cast<void*>(set.clipping), bicubic ? reinterpret_cast<void*>(&ZR_SubpixelBicubicFloat)
                                                             : reinterpret_cast<void*>(&ZR_SubpixelBilinearFloat));
    EXPECT_EQ(ZR_GetSampleQualityPixelSupport(quality), bicubic ? 2 : quality == 1 ? 1 : 0);
  }
  // The area sampler of quality 1 walks thin boxes with what the slot holds.
  Picture<ZR_Pixel8> picture(4, 4, Alpha::opaque, false, 1);
  picture.params.x_radius = picture.params.y_radius = 32768;
  ZR_Pixel8 out;
  EXPECT_EQ(ZR_AreaSample_Straight(nullptr, 0, 0, &picture.params, &out), 0);
  EXPECT_TRUE(same_pixel(out, ZR_Pixel8{1, 2, 3, 4}));
  const SlotOverride emptied(ZR_Slot_bilinear_straight8, nullptr);
  EXPECT_EQ(ZR_AreaSample_Straight(nullptr, 0, 0, &picture.params, &out), 3);
}

// Rows of a replaced sampler are that sampler's.
TEST_F(PointSamplers, AReplacedSamplerHasNoRows) {
  const auto mine = [](const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, ZR_Pixel16*) -> i32 { return 0; };
  i32 (*const routine)(const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, ZR_Pixel16*) = mine;
  const SlotOverride replaced(ZR_Slot_bilinear_no_clip16, reinterpret_cast<void*>(routine));
  EXPECT_EQ(zr::no_clip_row(zr::sample_functions<ZR_Pixel16>(1)), nullptr);
  EXPECT_EQ(zr::no_clip_row(zr::sample_functions<ZR_Pixel16>(2)) == nullptr,
            zr::no_clip_row(zr::sample_functions<ZR_Pixel8>(1)) == nullptr);
}

}  // namespace
