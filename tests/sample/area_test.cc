// Area samples and summed-area tables against means taken pixel by pixel.
#include <ZR/summed_area.h>

#include "sample/models.h"
#include "sample/sample_functions.h"
#include "support/born_library.h"
#include "support/thrown.h"

namespace {

using Area = BornLibrary;

// 16.16 length that [from, to] and pixel n have in common.
i64 overlap(i64 position, i64 radius, i64 n) {
  const i64 from = std::max(position - radius, n * 65536 - 32768), to = std::min(position + radius, n * 65536 + 32768);
  return std::max<i64>(0, to - from);
}

// Calls sample(x, y, width, height) for the point samples or pixels of a box; an axis of at most a pixel is one sample.
template <class Sample>
void walk(const ZR_LayerDef& layer, const ZR_SampPB& params, i32 x, i32 y, Sample&& sample) {
  const bool wide = params.x_radius > 32768, high = params.y_radius > 32768;
  for (i32 row = high ? -1 : 0; row < (high ? layer.height + 1 : 1); ++row)
    for (i32 column = wide ? -1 : 0; column < (wide ? layer.width + 1 : 1); ++column)
      sample(wide ? column * 65536 : x, high ? row * 65536 : y,
             wide ? overlap(x, params.x_radius, column) : 2 * static_cast<i64>(params.x_radius),
             high ? overlap(y, params.y_radius, row) : 2 * static_cast<i64>(params.y_radius));
}

struct Radii {
  i32 x, y;
};
constexpr Radii radii[] = {{32768, 32768}, {20000, 3},      {0, 32768},       {88473, 88473}, {65536, 65536},
                           {32769, 12345}, {32768, 200000}, {1 << 22, 30000}, {77777, 32769}, {3 << 16, 5 << 15}};

template <class T>
T area_model(const Picture<T>& picture, i32 quality, i32 x, i32 y) {
  const ZR_SampPB& params = picture.params;
  const bool direct = params.x_radius > 32768 && params.y_radius > 32768;
  f64 sums[4] = {};
  walk(picture.layer, params, x, y, [&](i32 sample_x, i32 sample_y, i64 width, i64 height) {
    const T p = direct ? picture.at(sample_x >> 16, sample_y >> 16) : point_model(picture, quality, sample_x, sample_y);
    const auto c = numbers<f64>(p);
    for (size_t k = 0; k < 4; ++k)
      sums[k] += (k == 0 ? c[0] : c[k] * c[0]) * (static_cast<f64>(width * height) * 0x1p-32);
  });
  const f64 total = sums[0], inverse = 1 / total;
  if (total == 0) return T{};
  constexpr f64 white = zr::Depth<T>::white;
  std::array<f64, 4> out = {std::fmin(white, total * 0.25 / (params.x_radius / 65536.0 * (params.y_radius / 65536.0)))};
  for (size_t k = 1; k < 4; ++k) out[k] = sums[k] * inverse;
  if (!is_float<T>)
    for (f64& v : out) v = std::floor(v + 0.5);
  return pixel_of<T>(out);
}

TEST_F(Area, StraightSamplesEqualTheirModel) {
  each_depth([]<class T>() {
    for (const auto& picture : pictures<T>())
      for (const Radii& r : radii)
        for (const i32 quality : {1, 2}) {
          picture->params.x_radius = r.x, picture->params.y_radius = r.y;
          const auto set = zr::sample_functions<T>(quality);
          for (const auto& [x, y] : positions(picture->layer, 400, 31)) {
            T got;
            ASSERT_EQ(set.area(nullptr, x, y, &picture->params, &got), 0);
            const T expected = area_model(*picture, quality, x, y);
            const auto from = numbers<f64>(got), to = numbers<f64>(expected);
            for (size_t k = 0; k < 4; ++k)
              ASSERT_NEAR(from[k], to[k], is_float<T> ? 1e-5 * (1 + std::fabs(to[k])) : 0)
                  << picture->name << " q" << quality << " radii " << r.x << ", " << r.y << " at " << x << ", " << y;
          }
        }
  });
}

TEST_F(Area, PremultipliedSamplesEqualTheirModel) {
  for (const auto& picture : pictures<ZR_Pixel8>())
    for (const Radii& r : radii) {
      ZR_SampPB& params = picture->params;
      params.x_radius = r.x, params.y_radius = r.y;
      params.area = static_cast<i32>((4 * static_cast<i64>(r.x) * r.y) >> 16);
      const u32 divisor = static_cast<u32>((params.area + 128) >> 8);
      for (const auto& [x, y] : positions(picture->layer, 400, 37)) {
        ZR_Pixel8 got, p;
        ASSERT_EQ(ZR_AreaSample_Premul(nullptr, x, y, &params, &got), 0);
        std::array<u32, 4> sums{};
        walk(picture->layer, params, x, y, [&](i32 sample_x, i32 sample_y, i64 width, i64 height) {
          ZR_SubpixelSample_Premul(nullptr, sample_x, sample_y, &params, &p);  // of a whole position: the pixel
          for (size_t k = 0; k < 4; ++k)
            sums[k] += static_cast<u32>(numbers<i64>(p)[k] * ((width * height / 65536) << 8) / 65536);
        });
        for (u32& v : sums) v = divisor == 0 ? 0 : std::min(255u, (v + divisor / 2) / divisor);
        if (sums[0] == 0) sums = {};
        ASSERT_TRUE(same_pixel(got, pixel_of<ZR_Pixel8>(sums)))
            << picture->name << " radii " << r.x << ", " << r.y << " at " << x << ", " << y;
      }
    }
}

// The mean over [left, right] x [top, bottom] in edges of pixels, each result within a half and `slack`.
template <class T>
void expect_mean(const Picture<T>& picture, const f64 (&box)[4], const T& got, f64 slack) {
  const auto [left, top, right, bottom] = box;
  constexpr f64 white = zr::Depth<T>::white;
  const auto common = [](f64 from, f64 to, i32 n) { return std::fmax(0, std::fmin(to, n + 1) - std::fmax(from, n)); };
  f64 sums[4] = {};
  for (i32 y = 0; y < picture.layer.height; ++y)
    for (i32 x = 0; x < picture.layer.width; ++x) {
      const auto c = numbers<f64>(picture.at(x, y));
      const f64 weight = common(left, right, x) * common(top, bottom, y);
      for (size_t k = 0; k < 4; ++k) sums[k] += weight * c[0] * (k == 0 ? 1 : c[k]);
    }
  const bool nothing = sums[0] <= 1e-9 * white || right <= left || bottom <= top;
  const auto result = numbers<f64>(got);
  for (size_t k = 0; k < 4; ++k) {
    f64 expected = nothing ? 0 : k == 0 ? sums[0] / ((right - left) * (bottom - top)) : sums[k] / sums[0];
    expected = std::fmax(0, std::fmin(white, expected));
    if (k > 0 && nothing) break;  // colour of what the corners' rounding left
    // Colour under a faint alpha is known only as well as the alpha is.
    const f64 unsure = k == 0 ? slack : slack * (1 + 0.02 * white * (right - left) * (bottom - top) / sums[0]);
    ASSERT_NEAR(result[k], expected, (is_float<T> ? 0 : 0.5) + unsure * white)
        << picture.name << " channel " << k << " box " << left << ", " << top << ", " << right << ", " << bottom;
  }
}

template <class T, class Entry>
void check_table(const Picture<T>& picture, const Entry* table, f64 slack) {
  const i32 w = picture.layer.width, h = picture.layer.height;
  ASSERT_NE(table, nullptr);
  std::mt19937 random(41);
  const auto edge = [&](i32 size) { return static_cast<i32>(random() % static_cast<u32>(size + 6)) - 3; };
  for (int round = 0; round < 300; ++round) {
    const i32 box[4] = {edge(w), edge(h), edge(w), edge(h)};
    T got{1, 2, 3, 4};
    ZR_SummedAreaTable_SampleDraft(w, h, table, box[0], box[1], box[2], box[3], &got);
    expect_mean(picture, {1.0 * box[0], 1.0 * box[1], 1.0 * box[2], 1.0 * box[3]}, got, slack);
    f32 edges[4];
    for (size_t i = 0; i < 4; ++i) edges[i] = static_cast<f32>(box[i]) + static_cast<f32>(random() >> 8) * 0x1p-24f;
    ZR_SummedAreaTable_SampleAA(w, h, table, edges[0], edges[1], edges[2], edges[3], &got);
    if ((edges[2] - edges[0]) * (edges[3] - edges[1]) < 0.05f) continue;  // the 1e-5 at the far border tells
    expect_mean(picture, {edges[0] + 0.5, edges[1] + 0.5, edges[2] + 0.5, edges[3] + 0.5}, got, slack + 5e-4);
  }
}

TEST_F(Area, TablesAverageAnyBox) {
  each_depth([]<class T>() {
    for (const auto& picture : pictures<T>()) {
      ZR_WorldX<T> world(&picture->layer, true);
      const ZR_SummedAreaTable exact(&world, true), plain(&world, false);
      EXPECT_TRUE(exact.UsesDouble());
      EXPECT_EQ(plain.UsesDouble(), is_float<T>);
      check_table(*picture, exact.DoubleTable(), is_float<T> ? 1e-6 : 1e-9);
      if (!is_float<T>) check_table(*picture, plain.FloatTable(), 2e-5);
    }
  });
}

TEST_F(Area, TablesFailWithoutMemory) {
  TestWorld<ZR_Pixel8> picture(3, 2);
  ZR_WorldX<ZR_Pixel8> world(picture, true);
  u64 nth = 1;
  for (bool failed = true; failed; ++nth) {
    HB_FailNthAllocation(nth);
    const i32 code = thrown_by([&] { const ZR_SummedAreaTable none(&world, false); });
    failed = code != 0;
    EXPECT_TRUE(code == 0 || code == 4) << code;
    EXPECT_EQ(caught.take_message() != "", failed);
  }
  HB_FailNthAllocation(0);
  EXPECT_GT(nth, 3u);  // the table and a row at least
}

TEST_F(Area, HorizontalSumsReachBeyondTheWorld) {
  each_depth([]<class T>() {
    Picture<T> picture(6, 3, Alpha::opaque, true, 9);
    ZR_WorldX<T> world(&picture.layer, true);
    // A box of 2 by 1, doubled and turned by a right angle: 2 wide and 4 high.
    const ZR_HorizontalSumTable<T> table(&world, 5, 3, 0.5, 1.0, 0.5, 2.0, 2.0, 90.0, true, nullptr, nullptr);
    EXPECT_EQ(table.OutputWidth(), 3);
    EXPECT_EQ(table.OutputHeight(), 2);
    ASSERT_GE(table.PaddingX(), 2);  // the cosine of a right angle is not quite 0
    ASSERT_LE(table.PaddingX(), 3);
    EXPECT_GE(table.PaddingY(), 4);
    for (i32 y = 0; y < 3; ++y)
      for (i32 from = -table.PaddingX(); from <= 6; ++from)
        for (i32 to = from; to <= 6 + table.PaddingX(); ++to) {
          f64 red = 0, alpha = 0;
          for (i32 x = from; x < to; ++x) {
            const f64 a = picture.at(x, y).alpha / static_cast<f64>(zr::Depth<T>::white);
            alpha += a, red += a * picture.at(x, y).red / static_cast<f64>(zr::Depth<T>::white);
          }
          const ZR_PixelFloat* const row = table.Row(y) + table.PaddingX();
          ASSERT_NEAR(row[to].alpha - row[from].alpha, alpha, 1e-5);
          ASSERT_NEAR(row[to].red - row[from].red, red, 1e-5) << from << ".." << to;
        }
    for (const f64 bad : {std::nan(""), std::numeric_limits<f64>::infinity(), 1e9})
      EXPECT_THROW(ZR_HorizontalSumTable<T>(&world, 5, 3, 1, bad, 1, 1, 1, 0, false, nullptr, nullptr), i32);
  });
}

}  // namespace
