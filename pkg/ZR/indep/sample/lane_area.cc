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
#include "sample/lane_squares-inl.h"

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

template <class T>
i32 square_vectors(const SampleRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  return sample_vectors<T, Pairs<T>>(run, *params.src, sum, dst, [&](const Pairs<T>& at, T* out) HWY_ATTR {
    at.fetch_ahead();
    const Alphas alphas = at.alphas();
    if (alphas == Alphas::clear) return put(Raw<T>{}, out);
    if (alphas == Alphas::white) {
      opaque_means(at, out);
      return Ints(std::bit_cast<i32>(Depth<T>::white));
    }
    Ints means;
    if (weighted_means(at, out, &means)) return means;
    Raw<T> square[4];
    at.load(square);
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
