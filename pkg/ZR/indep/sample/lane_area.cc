// Box means along a row, on lanes: all pixels of a row share their source rows, unless it is turned.
#include <bit>

#include "sample/ZR_AreaSample_StraightT.h"
#include "sample/lane_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "sample/lane_area.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "sample/lane_box_axis-inl.h"
#include "sample/lane_box_columns-inl.h"
#include "sample/lane_copies-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// 0 where the divisor is.
HWY_INLINE Doubles unless_zero(Doubles divisor, Doubles v) {
  const auto zero = hn::Zero(Tag<f64>());
  return {hn::IfThenZeroElse(hn::Eq(divisor.low, zero), v.low), hn::IfThenZeroElse(hn::Eq(divisor.high, zero), v.high)};
}
HWY_INLINE Doubles lesser(Doubles v, f64 limit) {  // NaN stays
  const auto most = hn::Set(Tag<f64>(), limit);
  return {hn::IfThenElse(hn::Gt(v.low, most), most, v.low), hn::IfThenElse(hn::Gt(v.high, most), most, v.high)};
}
// Alpha, and colours times alpha, each product rounded as single numbers are.
template <class T>
struct BoxSums {
  Doubles sum[4];

  HWY_INLINE BoxSums() {
    for (Doubles& s : sum) s = 0.0;
  }
  // area(v): v times the area of the pixel that the box covers.
  template <class Area>
  HWY_INLINE void add(const Raw<T>& p, Area area) {
    if constexpr (std::is_same_v<T, ZR_Pixel8>) {
      const hn::Rebind<u32, Tag<i32>> d;
      const hn::RepartitionToNarrow<decltype(d)> narrow;
      const Ints alpha = channel_of<0>(p);
      const auto product = [&](Ints c) HWY_ATTR {  // fits 16 bits
        const auto low = hn::Mul(hn::BitCast(narrow, alpha.v), hn::BitCast(narrow, c.v));
        return to_double(Ints(hn::BitCast(Tag<i32>(), low)));
      };
      sum[0] = sum[0] + area(to_double(alpha));
      sum[1] = sum[1] + area(product(channel_of<1>(p)));
      sum[2] = sum[2] + area(product(channel_of<2>(p)));
      sum[3] = sum[3] + area(product(channel_of<3>(p)));
    } else {
      const auto channel = [&](auto k) HWY_ATTR {
        if constexpr (std::is_same_v<T, ZR_PixelFloat>)
          return to_double(as_floats(p.w[decltype(k)::value]));
        else
          return to_double(channel_of<decltype(k)::value>(p));
      };
      const Doubles alpha = channel(std::integral_constant<int, 0>());
      sum[0] = sum[0] + area(alpha);
      sum[1] = sum[1] + area(alpha * channel(std::integral_constant<int, 1>()));
      sum[2] = sum[2] + area(alpha * channel(std::integral_constant<int, 2>()));
      sum[3] = sum[3] + area(alpha * channel(std::integral_constant<int, 3>()));
    }
  }
  // Over the area of the whole box.
  HWY_INLINE Raw<T> mean(f64 quarter_area) const {
    constexpr f64 white = Depth<T>::white;
    const Doubles alpha = lesser(sum[0] * 0.25 / quarter_area, white), inverse = Doubles(1.0) / sum[0];
    const auto colour = [&](i32 k) HWY_ATTR { return unless_zero(sum[0], sum[k] * inverse); };
    if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
      return {{as_ints(narrowed(unless_zero(sum[0], alpha))), as_ints(narrowed(colour(1))),
               as_ints(narrowed(colour(2))), as_ints(narrowed(colour(3)))}};
    } else {
      const auto channel = [&](Doubles v) HWY_ATTR { return fitting_int(lesser(v + 0.5, white)); };
      return packed<T>(channel(alpha), channel(colour(1)), channel(colour(2)), channel(colour(3)));
    }
  }
};

// Two rows of neighbouring pairs: each destination pixel is the mean of a square of four whole pixels.
template <class T>
class Pairs {
 public:
  static constexpr bool one_phase = true;

  // Whether the boxes of a run are such squares, and all rows lie inside.
  static bool fit(const SampleRun& run, const ZR_SampPB& params) {
    constexpr i32 two_pixels = 0x20000;
    const auto whole = [](i32 middle) { return (middle & 65535) == 32768; };
    const i32 top = run.y >> 16;
    return run.step_x == two_pixels && params.x_radius == two_pixels / 2 && params.y_radius == two_pixels / 2 &&
           whole(run.x) && whole(run.y) && top >= 0 && top + 1 < std::min(params.src->height, 32767);
  }
  HWY_INLINE Pairs(const SampleRun& run, const ZR_LayerDef& src)
      : at_(static_cast<const char*>(src.data) + static_cast<std::ptrdiff_t>(run.y >> 16) * src.row_bytes +
            static_cast<std::ptrdiff_t>(run.x >> 16) * i32{sizeof(T)}),
        row_bytes_(src.row_bytes) {}
  HWY_INLINE void next() { at_ += 2 * lane_count() * i32{sizeof(T)}; }

  HWY_INLINE const f32* row(i32 y) const { return reinterpret_cast<const f32*>(at_ + y * std::ptrdiff_t{row_bytes_}); }
  // The four pixels of each square in reading order.
  HWY_INLINE void load(Raw<T> (&square)[4]) const {
    load_row(at_, square[0], square[1]);
    load_row(at_ + row_bytes_, square[2], square[3]);
  }

 private:
  static HWY_INLINE void load_row(const char* from, Raw<T>& left, Raw<T>& right) {
    const Tag<i32> d;
    const Raw<T> low = load_pixels<T>(from), high = load_pixels<T>(from + lane_count() * i32{sizeof(T)});
    for (i32 i = 0; i < Raw<T>::words; ++i) {
      left.w[i] = hn::ConcatEven(d, high.w[i].v, low.w[i].v);
      right.w[i] = hn::ConcatOdd(d, high.w[i].v, low.w[i].v);
    }
  }
  const char* at_;
  i32 row_bytes_;
};

// Means of squares of opaque pixels: what the quotient of sums comes to. 255 * s / 1020, rounded by doubles, is
// s / 4 rounded half up for all sums of four bytes; with a white of 32768 both quotients are exact.
template <class T>
HWY_INLINE Raw<T> opaque_means(const Raw<T> (&square)[4]) {
  const auto mean = [&](auto k) HWY_ATTR {
    constexpr int c = decltype(k)::value;
    const Ints rounded = shifted_right<2>((channel_of<c>(square[0]) + channel_of<c>(square[1])) +
                                          (channel_of<c>(square[2]) + channel_of<c>(square[3])) + 2);
    return pick(rounded > i32{Depth<T>::white}, i32{Depth<T>::white}, rounded);
  };
  return packed<T>(mean(std::integral_constant<int, 0>()), mean(std::integral_constant<int, 1>()),
                   mean(std::integral_constant<int, 2>()), mean(std::integral_constant<int, 3>()));
}

// A vector of every other float pixel.
template <class D>
HWY_INLINE hn::Vec<D> load_every_other(D d, const f32* from) {
  if constexpr (hn::MaxLanes(D()) == 4) {
    return hn::LoadU(d, from);
  } else {
    const hn::Half<D> half;
    return hn::Combine(d, load_every_other(half, from + 2 * hn::MaxLanes(half)), load_every_other(half, from));
  }
}
// The same means of float pixels, whose channels stay side by side. False, with dst written in part, where a pixel
// is not opaque.
HWY_INLINE bool opaque_means(const Pairs<ZR_PixelFloat>& at, ZR_PixelFloat* dst) {
  constexpr i32 pixels = lane_count() / 4;
  const Tag<f32> d;
  const auto is_alpha = hn::Eq(hn::And(hn::Iota(Tag<i32>(), 0), hn::Set(Tag<i32>(), 3)), hn::Zero(Tag<i32>()));
  const auto colours = hn::Not(hn::RebindMask(d, is_alpha));
  for (i32 i = 0; i < lane_count(); i += pixels) {
    Doubles total = 0.0;
    auto opaque = colours;  // is not asked of colours
    bool all_opaque = true;
    for (i32 k = 0; k < 4; ++k) {
      const Floats v = load_every_other(d, at.row(k / 2) + (2 * i + k % 2) * 4);
      all_opaque = all_opaque && hn::AllTrue(d, hn::Or(opaque, hn::Eq(v.v, hn::Set(d, 1.0f))));
      total = total + to_double(v);
    }
    if (!all_opaque) return false;
    hn::StoreU(narrowed(total * 0.25).v, d, reinterpret_cast<f32*>(dst + i));
  }
  return true;
}

// The sums of products of both halves of each lane, of which none needs more than 16 bits.
using Words = hn::Repartition<i16, Tag<i32>>;
HWY_INLINE Ints pair_products(hn::Vec<Words> a, hn::Vec<Words> b) {
  const Tag<i32> d;
#if HWY_ARCH_X86
  auto others = hn::Zero(d);
  return hn::ReorderWidenMulAccumulate(d, a, b, hn::Zero(d), others);
#else
  const Ints products = hn::BitCast(d, hn::Mul(a, b));
  return masked(products, 65535) + shifted_right_unsigned<16>(products);
#endif
}

// Means of four 8-bit pixels whose alphas differ. Sums of channels lie side by side as single numbers, exact ones; the
// quotients are off by less than 6u of 255 from what doubles give. False, with dst written in part, where that may
// tell.
HWY_INLINE bool weighted_means(const Pairs<ZR_Pixel8>& at, ZR_Pixel8* dst) {
  constexpr i32 pixels = lane_count() / 4;
  const Words words;
  const hn::Repartition<u8, Words> bytes;
  // Channels of a pair of pixels together, and their alphas to each; 1 to alpha itself.
  alignas(16) static constexpr u8 pair[16] = {0, 1, 8, 9, 2, 3, 10, 11, 4, 5, 12, 13, 6, 7, 14, 15};
  alignas(16) static constexpr u8 alphas[16] = {128, 128, 128, 128, 0, 1, 8, 9, 0, 1, 8, 9, 0, 1, 8, 9};
  alignas(16) static constexpr i16 one[8] = {1, 1, 0, 0, 0, 0, 0, 0};
  alignas(16) static constexpr f32 quarter[4] = {0.25f, 0, 0, 0}, doubt[4] = {0, 0x1p-13f, 0x1p-13f, 0x1p-13f};
  const Tag<f32> numbers;
  const auto is_alpha = hn::Gt(hn::LoadDup128(numbers, quarter), hn::Zero(numbers));
  const auto sums_of = [&](i32 row, i32 i) HWY_ATTR {
    const u8* const from = reinterpret_cast<const u8*>(at.row(row)) + 8 * i;
    const auto v = hn::BitCast(bytes, hn::PromoteTo(words, hn::LoadU(hn::Rebind<u8, Words>(), from)));
    const auto factors = hn::TableLookupBytesOr0(v, hn::LoadDup128(bytes, alphas));
    const auto channels = hn::TableLookupBytes(v, hn::LoadDup128(bytes, pair));
    return pair_products(hn::BitCast(words, channels), hn::Or(hn::BitCast(words, factors), hn::LoadDup128(words, one)));
  };
  FloatRounding rounding;
  for (i32 i = 0; i < lane_count(); i += pixels) {
    const Floats sums = to_float(sums_of(0, i) + sums_of(1, i));
    const Floats inverse = inverse_of(at_least(hn::Broadcast<0>(sums.v), 0.5f));
    const Floats by = hn::IfThenElse(is_alpha, hn::LoadDup128(numbers, quarter), inverse.v);
    store_channels(rounding.nearest(sums, by, hn::LoadDup128(numbers, doubt)), dst + i);
  }
  return none(rounding.unsure());
}

template <class T>
HWY_INLINE Ints alpha_bits(const Raw<T>& p) {
  if constexpr (std::is_same_v<T, ZR_PixelFloat>)
    return p.w[0];
  else
    return channel_of<0>(p);
}

template <class T>
i32 square_vectors(const SampleRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  return sample_vectors<T, Pairs<T>>(run, *params.src, sum, dst, [&](const Pairs<T>& at, T* out) HWY_ATTR {
    if constexpr (std::is_same_v<T, ZR_PixelFloat>)
      if (opaque_means(at, out)) return Ints(std::bit_cast<i32>(1.0f));
    Raw<T> square[4];
    at.load(square);
    const Ints alphas[] = {alpha_bits(square[0]), alpha_bits(square[1]), alpha_bits(square[2]), alpha_bits(square[3])};
    const Ints any = (alphas[0] | alphas[1]) | (alphas[2] | alphas[3]);
    const Bools<i32> clear = any == 0;
    if constexpr (std::is_same_v<T, ZR_PixelFloat>) {
      if (all(clear)) return put(Raw<T>{}, out);
    } else {
      const Ints every = (alphas[0] & alphas[1]) & (alphas[2] & alphas[3]);
      const Bools<i32> opaque = any == i32{Depth<T>::white} && every == i32{Depth<T>::white};
      if (all(opaque || clear)) return put(pick(opaque, opaque_means(square), Raw<T>{}), out);
    }
    if constexpr (std::is_same_v<T, ZR_Pixel8>)
      if (weighted_means(at, out)) return channel_of<0>(load_pixels<T>(out));
    BoxSums<T> sums;
    for (const Raw<T>& p : square) sums.add(p, [](Doubles v) HWY_ATTR { return v; });
    return put(sums.mean(1.0), out);
  });
}

template <class T>
i32 scattered_boxes(const SampleRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  const ZR_LayerDef& src = *params.src;
  BoxAxis down(run.y, params.y_radius);
  down.clip(src.height);
  const f64 quarter_area = (params.x_radius / 65536.0) * (params.y_radius / 65536.0);
  return sample_vectors<T, Scattered<T>>(run, src, sum, dst, [&](const Scattered<T>& at, T* out) HWY_ATTR {
    const LaneAxis across(at.x() - params.x_radius + 32768, at.x() + params.x_radius + 32768);
    const Columns<T> columns(across.first);
    BoxSums<T> sums;
    const auto row = [&](i32 y, u32 height) HWY_ATTR {
      const char* const pixels = static_cast<const char*>(src.data) + static_cast<std::ptrdiff_t>(y) * src.row_bytes;
      const auto partial = [&](i32 k) HWY_ATTR {
        const Ints width = across.width(k);
        const Doubles area = to_double(width) * (static_cast<f64>(height) * 0x1p-32);
        Raw<T> p = columns.at(pixels, k);
        if constexpr (std::is_same_v<T, ZR_PixelFloat>)  // what is not covered may be no number
          p = pick(width == 0, Raw<T>{}, p);
        sums.add(p, [&](Doubles v) HWY_ATTR { return area * v; });
      };
      partial(0);
      const f64 full = static_cast<f64>(height) * 0x1p-16;
      if (height == 0x10000)
        for (i32 k = 1; k < across.whole_end; ++k)
          sums.add(columns.at(pixels, k), [](Doubles v) HWY_ATTR { return v; });
      else
        for (i32 k = 1; k < across.whole_end; ++k)
          sums.add(columns.at(pixels, k), [&](Doubles v) HWY_ATTR { return Doubles(full) * v; });
      for (i32 k = across.whole_end; k < across.end; ++k) partial(k);
    };
    if (!down.empty())
      down.walk(row, [&](i32 first, i32 end) HWY_ATTR {
        for (i32 y = first; y < end; ++y) row(y, 0x10000u);
      });
    return put(sums.mean(quarter_area), out);
  });
}

// Boxes that lie anywhere, pixel by pixel in reading order as the sampler takes them: those that a lane's box does not
// cover add nothing.
template <class T>
i32 turned_boxes(const SampleRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  const ZR_LayerDef& src = *params.src;
  const f64 quarter_area = (params.x_radius / 65536.0) * (params.y_radius / 65536.0);
  return sample_vectors<T, Scattered<T>>(run, src, sum, dst, [&](const Scattered<T>& at, T* out) HWY_ATTR {
    constexpr i32 together = sizeof(T) == 4 ? 2 : 1;  // pixels of a read
    const LaneAxis across(at.x() - params.x_radius + 32768, at.x() + params.x_radius + 32768);
    const LaneAxis down(at.y() - params.y_radius + 32768, at.y() + params.y_radius + 32768);
    Scattered<T> corner(src);
    corner.move_to(shifted_left<16>(across.first), shifted_left<16>(down.first));
    BoxSums<T> sums;
    for (i32 j = 0; j < down.end; ++j) {
      const Ints height = down.width(j);
      const Doubles part = to_double(height) * 0x1p-32;
      for (i32 k = 0; k < across.end; k += together) {
        Raw<T> p[together];
        corner.row(k, j, p);
        for (i32 i = 0; i < together; ++i) {
          const Ints width = across.width(k + i);
          const Doubles area = part * to_double(width);
          if constexpr (std::is_same_v<T, ZR_PixelFloat>)  // what is not covered may be no number
            p[i] = pick(width == 0 || height == 0, Raw<T>{}, p[i]);
          sums.add(p[i], [&](Doubles v) HWY_ATTR { return area * v; });
        }
      }
    }
    return put(sums.mean(quarter_area), out);
  });
}

// Boxes whose sums can be taken down the columns first, a stretch of the row at a time.
template <class T>
class BoxStretches {
 public:
  HWY_INLINE BoxStretches(const SampleRun& run, const ZR_SampPB& params)
      : params_(params), down_(run.y, params.y_radius), length_(2 * i64{params.x_radius}) {
    down_.clip(params.src->height);
    const i64 height = down_.length(), columns = (length_ >> 16) + 2;
    // 32 pixels, so that the sums are exact. The positions of a stretch stay within the columns' 16 bits.
    if (run.step_x < 0x8000 || height <= 0 || length_ * height > i64{32} << 32 || columns >= box_columns) return;
    pixels_ = static_cast<i32>(((box_columns - columns) << 16) / run.step_x) / lane_count() * lane_count();
  }
  bool fit() const { return pixels_ > 0; }
  i32 pixels() const { return std::min(pixels_, box_columns); }

  // False where the pixels under the boxes do not fit.
  HWY_INLINE bool write(const SampleRun& run, f64 quarter_area, RowSum<T>* sum, T* dst) const {
    HWY_ALIGN f64 columns[4 * box_columns];
    HWY_ALIGN f64 sums[4 * box_columns];
    const i32 from = run.x - params_.x_radius + 32768, first = from >> 16;
    const i32 to = from + (run.count - 1) * run.step_x + static_cast<i32>(length_);
    const i32 count = std::max(((to + 65535) >> 16) - first, static_cast<i32>(hn::MaxLanes(Words16())) / 4);
    if (first + count > params_.src->width || !sum_columns<T>(*params_.src, down_, first, count, columns)) return false;
    sum_boxes(columns, run, from & 65535, static_cast<i32>(length_), Products<T>::colour_unit, sums);
    write_vectors(run.count, BoxTotals(sums), sum, dst, [&](const BoxTotals& at, T* out) HWY_ATTR {
      BoxSums<T> totals;
      at.load(totals.sum);
      return put(totals.mean(quarter_area), out);
    });
    return true;
  }

 private:
  const ZR_SampPB& params_;
  BoxAxis down_;
  i64 length_;
  i32 pixels_ = 0;  // of the destination, a whole number of vectors
};

template <class T>
i32 box_vectors(const SampleRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  if (run.step_y != 0) return turned_boxes(run, params, sum, dst);
  if (Pairs<T>::fit(run, params)) return square_vectors(run, params, sum, dst);
  if constexpr (!std::is_same_v<T, ZR_PixelFloat>) {
    const BoxStretches<T> stretches(run, params);
    if (stretches.fit()) {
      const f64 quarter_area = (params.x_radius / 65536.0) * (params.y_radius / 65536.0);
      i32 done = 0;
      while (run.count - done >= lane_count()) {
        const i32 count = std::min(stretches.pixels(), (run.count - done) / lane_count() * lane_count());
        const SampleRun part = {count, run.x + done * run.step_x, run.y, run.step_x, 0};
        if (!stretches.write(part, quarter_area, sum, dst + done)) scattered_boxes(part, params, sum, dst + done);
        done += count;
      }
      return done;
    }
  }
  return scattered_boxes(run, params, sum, dst);
}

template <class T>
LaneRowFunc<T>* box_row() {
  if constexpr (gains_from_lanes<T>)
    return &box_vectors<T>;
  else
    return nullptr;
}
ZR_ROWS_OF_DEPTHS(LaneRowFunc, box_row)

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_ROWS(LaneRowFunc, box_row)
#endif
