// Samplers at a few thousand positions, spans, boxes and tables of box means.
#include <ZR/summed_area.h>

#include "verify/depth_calls.h"
#include "verify/operation.h"

namespace zr::tool {
namespace {

constexpr i32 kWidth = 43, kHeight = 37;
constexpr i32 kPositions = 2000;
constexpr i32 kOne = 1 << 16;

struct Position {
  i32 x, y;
};
// Whole, half and any fractions; inside by `margin` pixels, or with a negative margin also outside.
Position any_position(Random& random, i32 margin) {
  const auto one = [&](i32 size) {
    const i32 span = size - 2 * margin - 1;  // so that a fraction still has its right neighbour
    const i32 whole = margin + static_cast<i32>(random.below(static_cast<u32>(span)));
    constexpr i32 kFractions[] = {0, 0x8000, 1, 0xffff, 0x7fff};
    const u32 choice = random.below(16);
    return whole * kOne + (choice < 5 ? kFractions[choice] : static_cast<i32>(random.below(kOne)));
  };
  const i32 x = one(kWidth);
  return {x, one(kHeight)};
}

ZR_SampPB params_of(ZR_LayerDef* src, i32 x_radius = 0, i32 y_radius = 0) {
  ZR_SampPB params{};
  params.src = src;
  params.x_radius = x_radius;
  params.y_radius = y_radius;
  params.area = static_cast<i32>((static_cast<i64>(x_radius) * y_radius * 4) >> 16);
  return params;
}

// Calls body(position, params, one) for the positions and digests each result.
template <class T, class Body>
void at_positions(Digest& digest, i32 margin, Content content, Body body) {
  Canvas<T> src(kWidth, kHeight, content, 30);
  const ZR_SampPB params = params_of(&src);
  Random random(31);
  std::vector<T> results(kPositions);
  for (T& result : results) {
    const Position at = any_position(random, margin);
    digest.number(body(at, params, &result));
  }
  digest.pixels<T>(results);
}

template <class T>
using Point = i32 (*)(const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, T*);
template <class T>
using Plus = i32 (*)(const ZR_ProgressInfo*, i32, i32, const ZR_SampPB*, u8*, T*);
template <class T>
using Translate = i32 (*)(const ZR_ProgressInfo*, i32, i32, const f64*, const ZR_SampPB*, T*);
template <class T>
using AlphaSum = std::conditional_t<std::is_same_v<T, ZR_PixelFloat>, f32, u32>;
template <class T>
using Span = i32 (*)(const ZR_ProgressInfo*, i32, i32, i32, const ZR_SampPB*, AlphaSum<T>*, T*);

template <class T>
void points(Digest& digest, Point<T> sample, i32 margin, Content content) {
  at_positions<T>(digest, margin, content, [&](Position at, const ZR_SampPB& params, T* result) {
    return sample(nullptr, at.x, at.y, &params, result);
  });
}
template <class T>
void pluses(Digest& digest, Plus<T> sample, Content content) {
  at_positions<T>(digest, -4, content, [&](Position at, const ZR_SampPB& params, T* result) {
    u8 all_in = 9;
    const i32 error = sample(nullptr, at.x, at.y, &params, &all_in, result);
    return error * 256 + all_in;
  });
}
template <class T>
void translates(Digest& digest, Translate<T> sample, Content content) {
  at_positions<T>(digest, 2, content, [&](Position at, const ZR_SampPB& params, T* result) {
    f64 weights[4];
    ZR_SubpixelSampleComputeWeight(static_cast<u16>(at.x & 0xffff), static_cast<u16>(at.y & 0xffff), weights);
    return sample(nullptr, at.x, at.y, weights, &params, result);
  });
}

template <class T>
void spans(Digest& digest, Span<T> sample, Content content) {
  Canvas<T> src(kWidth, kHeight, content, 32);
  const ZR_SampPB params = params_of(&src);
  Random random(33);
  for (i32 i = 0; i < 150; ++i) {
    const Position at = any_position(random, 3);
    const i32 room = kWidth - 4 - (at.x >> 16);
    const i32 count = 1 + static_cast<i32>(random.below(static_cast<u32>(room > 0 ? room : 1)));
    AlphaSum<T> sum = 0;
    std::vector<T> results(static_cast<size_t>(count));
    digest.number(sample(nullptr, count, at.x, at.y, &params, &sum, results.data()));
    digest.pixels<T>(results);
    if constexpr (std::is_same_v<T, ZR_PixelFloat>)
      digest.floats({&sum, 1});
    else
      digest.bytes(&sum, sizeof sum);
  }
}

// Boxes thinner than a pixel, wide, high and larger than the picture.
template <class T>
void boxes(Digest& digest, Point<T> sample, Content content) {
  struct Radii {
    i32 x, y;
  };
  constexpr Radii radii[] = {{kOne / 2, kOne / 2}, {kOne, kOne},         {kOne / 4, 3 * kOne}, {5 * kOne / 2, kOne / 3},
                             {0x19a3b, 0x2c0f1},   {9 * kOne, 7 * kOne}, {kOne / 3, kOne / 5}};
  Canvas<T> src(kWidth, kHeight, content, 34);
  Random random(35);
  for (const Radii& radius : radii) {
    const ZR_SampPB params = params_of(&src, radius.x, radius.y);
    std::vector<T> results(200);
    for (T& result : results) {
      const Position at = any_position(random, -4);
      digest.number(sample(nullptr, at.x, at.y, &params, &result));
    }
    digest.pixels<T>(results);
  }
}

void four_at_once(Digest& digest) {
  Canvas<ZR_Pixel8> src(kWidth, kHeight, Content::mixed, 36);
  const ZR_SampPB params = params_of(&src);
  Random random(37);
  for (i32 i = 0; i < 500; ++i) {
    i32 places[8];
    f64 weights[16];
    for (int k = 0; k < 4; ++k) {
      const Position at = any_position(random, 1);
      places[2 * k] = at.x;
      places[2 * k + 1] = at.y;
      ZR_SubpixelSampleComputeWeight(static_cast<u16>(at.x & 0xffff), static_cast<u16>(at.y & 0xffff), weights + 4 * k);
    }
    ZR_Pixel8 results[8] = {};
    digest.number(ZR_SubpixelSampleNoClip_Straight_4(nullptr, places, &params, results));
    digest.number(ZR_SubpixelSampleTranslateNoClip_Straight_4(nullptr, places, weights, &params, results + 4));
    digest.pixels<ZR_Pixel8>(results);
  }
}

template <class T, class Entry>
void table_means(Digest& digest, const ZR_SummedAreaTable& table, const Entry* entries) {
  Random random(39);
  std::vector<T> results(2);
  for (i32 i = 0; i < 300; ++i) {
    const i32 left = static_cast<i32>(random.below(kWidth)) - 3, top = static_cast<i32>(random.below(kHeight)) - 3;
    const i32 right = left + 1 + static_cast<i32>(random.below(20)),
              bottom = top + 1 + static_cast<i32>(random.below(9));
    ZR_SummedAreaTable_SampleDraft(table.Width(), table.Height(), entries, left, top, right, bottom, &results[0]);
    const auto moved = [&](i32 edge) { return static_cast<f32>(edge) + static_cast<f32>(random.below(256)) / 256.0f; };
    const f32 from_x = moved(left), from_y = moved(top), to_x = moved(right), to_y = moved(bottom);
    ZR_SummedAreaTable_SampleAA(table.Width(), table.Height(), entries, from_x, from_y, to_x, to_y, &results[1]);
    digest.pixels<T>(results);
  }
}

template <class T>
void summed_area(Digest& digest, Content content) {
  Canvas<T> src(kWidth, kHeight, content, 38);
  const size_t channels = static_cast<size_t>(kWidth) * kHeight * 4;
  for (const bool use_double : {false, true}) {
    const ZR_SummedAreaTable table(&src, use_double);
    if (table.UsesDouble()) {
      digest.doubles({&table.DoubleTable()->alpha, channels});
      table_means<T>(digest, table, table.DoubleTable());
    } else if constexpr (!std::is_same_v<T, ZR_PixelFloat>) {
      digest.floats({&table.FloatTable()->alpha, channels});
      table_means<T>(digest, table, table.FloatTable());
    }
  }
}

}  // namespace

void add_sample_operations(Operations& list) {
  add_all_with_hostile(list, "sample-nearest", []<class T>(Digest& digest, Content content) {
    points<T>(digest, pick<T>(&ZR_NNSample, &ZR_NNSample16, &ZR_NNSampleFloat), -4, content);
  });
  add_all_with_hostile(list, "sample-bilinear", []<class T>(Digest& digest, Content content) {
    points<T>(digest, pick<T>(&ZR_SubpixelSample_Straight, &ZR_SubpixelSample_Straight16, &ZR_SubpixelBilinearFloat),
              -4, content);
  });
  add_all_with_hostile(list, "sample-bilinear-plus", []<class T>(Digest& digest, Content content) {
    pluses<T>(digest,
              pick<T>(&ZR_SubpixelSamplePlus_Straight, &ZR_SubpixelSamplePlus_Straight16,
                      &ZR_SubpixelSpanSampleAllInBilinearFloat),
              content);
  });
  add_all_with_hostile(list, "sample-bilinear-no-clip", []<class T>(Digest& digest, Content content) {
    points<T>(digest,
              pick<T>(&ZR_SubpixelSampleNoClip_Straight, &ZR_SubpixelSampleNoClip_Straight16,
                      &ZR_SubpixelNoClipBilinearFloat),
              1, content);
  });
  add_all_with_hostile(list, "sample-bilinear-translate", []<class T>(Digest& digest, Content content) {
    translates<T>(digest,
                  pick<T>(&ZR_SubpixelSampleTranslateNoClip_Straight, &ZR_SubpixelSampleTranslateNoClip_Straight16,
                          &ZR_SubpixelSampleTranslateNoClipBilinearFloat),
                  content);
  });
  add_all_with_hostile(list, "sample-bilinear-span", []<class T>(Digest& digest, Content content) {
    spans<T>(digest,
             pick<T>(&ZR_SubpixelSpanSampleTranslateNoClip_Straight, &ZR_SubpixelSpanSampleTranslateNoClip_Straight16,
                     &ZR_SubpixelSpanSampleBilinearFloat),
             content);
  });
  add_for<ZR_Pixel8>(list, "sample-bilinear-four", []<class>(Digest& digest) { four_at_once(digest); });
  add_for<ZR_Pixel8>(list, "sample-bilinear-premul", []<class T>(Digest& digest) {
    points<T>(digest, &ZR_SubpixelSample_Premul, -4, Content::premul);
  });
  add_all_with_hostile(list, "sample-bicubic", []<class T>(Digest& digest, Content content) {
    points<T>(digest, pick<T>(&ZR_SubpixelBicubic8, &ZR_SubpixelBicubic16, &ZR_SubpixelBicubicFloat), -4, content);
  });
  add_all_with_hostile(list, "sample-bicubic-plus", []<class T>(Digest& digest, Content content) {
    pluses<T>(digest,
              pick<T>(&ZR_SubpixelSpanSampleAllInBicubic8, &ZR_SubpixelSpanSampleAllInBicubic16,
                      &ZR_SubpixelSpanSampleAllInBicubicFloat),
              content);
  });
  add_all_with_hostile(list, "sample-bicubic-no-clip", []<class T>(Digest& digest, Content content) {
    points<T>(digest, pick<T>(&ZR_SubpixelNoClipBicubic8, &ZR_SubpixelNoClipBicubic16, &ZR_SubpixelNoClipBicubicFloat),
              3, content);
  });
  add_all_with_hostile(list, "sample-bicubic-translate", []<class T>(Digest& digest, Content content) {
    translates<T>(digest,
                  pick<T>(&ZR_SubpixelSampleTranslateNoClipBicubic8, &ZR_SubpixelSampleTranslateNoClipBicubic16,
                          &ZR_SubpixelSampleTranslateNoClipBicubicFloat),
                  content);
  });
  add_all_with_hostile(list, "sample-bicubic-span", []<class T>(Digest& digest, Content content) {
    spans<T>(
        digest,
        pick<T>(&ZR_SubpixelSpanSampleBicubic8, &ZR_SubpixelSpanSampleBicubic16, &ZR_SubpixelSpanSampleBicubicFloat),
        content);
  });
  add_with_hostile<ZR_Pixel8, ZR_Pixel16>(list, "sample-area", []<class T>(Digest& digest, Content content) {
    boxes<T>(digest, pick<T>(&ZR_AreaSample_Straight, &ZR_AreaSample_Straight16), content);
  });
  add_for<ZR_Pixel8>(list, "sample-area-premul",
                     []<class T>(Digest& digest) { boxes<T>(digest, &ZR_AreaSample_Premul, Content::premul); });
  add_all_with_hostile(list, "sample-area-bilinear", []<class T>(Digest& digest, Content content) {
    boxes<T>(digest, &ZR_AreaSample_CPlusPlus<T, 1>, content);
  });
  add_all_with_hostile(list, "sample-area-bicubic", []<class T>(Digest& digest, Content content) {
    boxes<T>(digest, &ZR_AreaSample_CPlusPlus<T, 2>, content);
  });
  add_all_with_hostile(list, "summed-area",
                       []<class T>(Digest& digest, Content content) { summed_area<T>(digest, content); });
  add_all_with_hostile(list, "horizontal-sums", []<class T>(Digest& digest, Content content) {
    Canvas<T> src(kWidth, kHeight, content, 40);
    const ZR_HorizontalSumTable<T> table(&src, 50, 40, 1.5, 3.5, 2.0, 1.0, 1.0, 0.0, false, nullptr, nullptr);
    digest.number(table.PaddingX());
    for (i32 y = 0; y < kHeight; ++y)
      digest.pixels(std::span<const ZR_PixelFloat>(table.Row(y), static_cast<size_t>(table.Entries())));
  });
}

}  // namespace zr::tool
