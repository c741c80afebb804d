// Box means along a row, on lanes: all pixels of a row share their source rows.
#include "sample/ZR_AreaSample_StraightT.h"
#include "sample/lane_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "sample/lane_area.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "sample/lane_samples-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

HWY_INLINE Doubles to_double(Floats v) {
  const Tag<f64> d;
  const HalfFloats half;
  return {hn::PromoteTo(d, hn::LowerHalf(half, v.v)), hn::PromoteTo(d, hn::UpperHalf(half, v.v))};
}
// 0 where the divisor is.
HWY_INLINE Doubles unless_zero(Doubles divisor, Doubles v) {
  const auto zero = hn::Zero(Tag<f64>());
  return {hn::IfThenZeroElse(hn::Eq(divisor.low, zero), v.low), hn::IfThenZeroElse(hn::Eq(divisor.high, zero), v.high)};
}
HWY_INLINE Doubles lesser(Doubles v, f64 limit) {  // NaN stays
  const auto most = hn::Set(Tag<f64>(), limit);
  return {hn::IfThenElse(hn::Gt(v.low, most), most, v.low), hn::IfThenElse(hn::Gt(v.high, most), most, v.high)};
}
HWY_INLINE i32 least_of(Ints v) { return hn::GetLane(hn::MinOfLanes(Tag<i32>(), v.v)); }
HWY_INLINE i32 most_of(Ints v) { return hn::GetLane(hn::MaxOfLanes(Tag<i32>(), v.v)); }

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

// The box of each lane across a row: pixels from `first` on, of which the first and the last may be partial.
struct LaneAxis {
  Ints first, last, before, behind;  // the last pixel counted from the first one
  i32 whole_end, end;                // pixels up to here are whole in all lanes; no lane has more than so many

  HWY_INLINE LaneAxis(Ints from, Ints to)
      : first(shifted_right<16>(from)),
        last(shifted_right<16>(to) - first),
        before(Ints(0x10000) - masked(from, 65535)),
        behind(masked(to, 65535)),
        whole_end(least_of(last)),
        end(most_of(last + pick(behind == 0, 0, 1))) {}
  HWY_INLINE Ints width(i32 k) const { return k == 0 ? before : pick(last > k, 0x10000, pick(last == k, behind, 0)); }
};

template <class T>
i32 box_vectors(const SampleRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
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

template <class T>
LaneRowFunc<T>* box_row() {
  if constexpr (gains_from_lanes<T>)
    return &box_vectors<T>;
  else
    return nullptr;
}
template LaneRowFunc<ZR_Pixel8>* box_row<ZR_Pixel8>();
template LaneRowFunc<ZR_Pixel16>* box_row<ZR_Pixel16>();
template LaneRowFunc<ZR_PixelFloat>* box_row<ZR_PixelFloat>();

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class T>
LaneRowFunc<T>* lane_box_row() {
  ZR_RETURN_BEST(box_row<T>());
  return nullptr;
}
template LaneRowFunc<ZR_Pixel8>* lane_box_row<ZR_Pixel8>();
template LaneRowFunc<ZR_Pixel16>* lane_box_row<ZR_Pixel16>();
template LaneRowFunc<ZR_PixelFloat>* lane_box_row<ZR_PixelFloat>();

}  // namespace zr
#endif
