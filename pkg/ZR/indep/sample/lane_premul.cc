// Samples of premultiplied 8-bit pixels along a row, on lanes.
#include "sample/ZR_AreaSample_StraightT.h"
#include "sample/lane_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "sample/lane_premul.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "sample/lane_box_axis-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// The upper half of products that fill 32 bits.
HWY_INLINE Ints upper_half(Ints a, Ints b) { return shifted_right_unsigned<16>(a * b); }

// The four weights are whole numbers that add up to 65536: single precision holds all their sums with bytes.
template <class Neighbours>
i32 premul_points(const SampleRun& run, const ZR_SampPB& params, u64* sum, ZR_Pixel8* dst) {
  constexpr i32 one = 65536;
  return sample_vectors<ZR_Pixel8, Neighbours>(
      run, *params.src, sum, dst, [&](const Neighbours& at, ZR_Pixel8* out) HWY_ATTR {
        const Ints x = at.fraction_x(), y = at.fraction_y();
        const Ints right = upper_half(Ints(one) - y, x), below = upper_half(y, Ints(one) - x), far = upper_half(y, x);
        const Ints whole[4] = {Ints(one) - right - (below + far), right, below, far};
        Raw<ZR_Pixel8> upper[2], lower[2];
        at.row(0, 0, upper);
        at.row(0, 1, lower);
        const Raw<ZR_Pixel8> p[4] = {upper[0], upper[1], lower[0], lower[1]};
        Floats w[4];
        for (i32 i = 0; i < 4; ++i) w[i] = to_float(whole[i]) * 0x1p-16f;
        const auto channel = [&](auto k) HWY_ATTR {
          constexpr int c = decltype(k)::value;
          Floats v = 0.5f;
          for (i32 i = 0; i < 4; ++i) v = v + w[i] * to_float(channel_of<c>(p[i]));
          return fitting_int(v);
        };
        return put(
            packed<ZR_Pixel8>(channel(std::integral_constant<int, 0>()), channel(std::integral_constant<int, 1>()),
                              channel(std::integral_constant<int, 2>()), channel(std::integral_constant<int, 3>())),
            out);
      });
}
i32 premul_row(const SampleRun& run, const ZR_SampPB& params, u64* sum, ZR_Pixel8* dst) {
  if (Windowed<ZR_Pixel8, 2>::suits(run)) return premul_points<Windowed<ZR_Pixel8, 2>>(run, params, sum, dst);
  return premul_points<Scattered<ZR_Pixel8>>(run, params, sum, dst);
}

// Channels in 1/256, each pixel's part rounded down by itself.
class PremulSums {
 public:
  HWY_INLINE PremulSums() {
    for (Ints& s : sum_) s = 0;
    even_ = odd_ = 0;
  }
  HWY_INLINE void add_whole(const Raw<ZR_Pixel8>& p) {
    even_ = even_ + masked(p.w[0], 0xff00ff);
    odd_ = odd_ + masked(shifted_right<8>(p.w[0]), 0xff00ff);
    if (++held_ == 256) flush();  // more would not fit
  }
  // weight: of 65536.
  HWY_INLINE void add(const Raw<ZR_Pixel8>& p, Ints weight) {
    sum_[0] = sum_[0] + shifted_right<8>(channel_of<0>(p) * weight);
    sum_[1] = sum_[1] + shifted_right<8>(channel_of<1>(p) * weight);
    sum_[2] = sum_[2] + shifted_right<8>(channel_of<2>(p) * weight);
    sum_[3] = sum_[3] + shifted_right<8>(channel_of<3>(p) * weight);
  }
  // The quotients of sums below 2^30, to the nearest integer. Half of 1 more in the dividend keeps what is off by a
  // few 2^-52 apart from the integers.
  HWY_INLINE Raw<ZR_Pixel8> mean(i32 divisor) {
    flush();
    const f64 inverse = 1.0 / divisor;
    Ints c[4];
    for (i32 k = 0; k < 4; ++k)
      c[k] = hn::Min(fitting_int((to_double(sum_[k] + divisor / 2) + 0.5) * inverse).v, Ints(255).v);
    return pick(c[0] == 0, Raw<ZR_Pixel8>{}, packed<ZR_Pixel8>(c[0], c[1], c[2], c[3]));
  }

 private:
  HWY_INLINE void flush() {
    sum_[0] = sum_[0] + shifted_left<8>(masked(even_, 65535));
    sum_[1] = sum_[1] + shifted_left<8>(masked(odd_, 65535));
    sum_[2] = sum_[2] + shifted_left<8>(shifted_right_unsigned<16>(even_));
    sum_[3] = sum_[3] + shifted_left<8>(shifted_right_unsigned<16>(odd_));
    even_ = odd_ = 0;
    held_ = 0;
  }

  Ints sum_[4], even_, odd_;  // whole pixels, two channels of 16 bits in each lane
  i32 held_ = 0;
};

i32 premul_boxes(const SampleRun& run, const ZR_SampPB& params, u64* sum, ZR_Pixel8* dst) {
  const ZR_LayerDef& src = *params.src;
  BoxAxis down(run.y, params.y_radius);
  down.clip(src.height);
  const i64 pixels = ((2 * i64{params.x_radius} >> 16) + 2) * ((2 * i64{params.y_radius} >> 16) + 2);
  const i32 divisor = (params.area >> 8) + ((params.area >> 7) & 1);
  if (pixels > 1 << 14 || params.area < 0 || divisor == 0) return 0;
  using At = Scattered<ZR_Pixel8>;
  return sample_vectors<ZR_Pixel8, At>(run, src, sum, dst, [&](const At& at, ZR_Pixel8* out) HWY_ATTR {
    const LaneAxis across(at.x() - params.x_radius + 32768, at.x() + params.x_radius + 32768);
    const Columns<ZR_Pixel8> columns(across.first);
    PremulSums sums;
    const auto row = [&](i32 y, u32 height) HWY_ATTR {
      const char* const line = static_cast<const char*>(src.data) + static_cast<std::ptrdiff_t>(y) * src.row_bytes;
      const bool whole = height == 0x10000;
      const Ints part(static_cast<i32>(height));
      const auto partial = [&](i32 k) HWY_ATTR {
        const Ints width = across.width(k);
        sums.add(columns.at(line, k), whole ? width : upper_half(width, part));
      };
      partial(0);
      for (i32 k = 1; k < across.whole_end; ++k)
        whole ? sums.add_whole(columns.at(line, k)) : sums.add(columns.at(line, k), part);
      for (i32 k = across.whole_end; k < across.end; ++k) partial(k);
    };
    if (!down.empty())
      down.walk(row, [&](i32 first, i32 end) HWY_ATTR {
        for (i32 y = first; y < end; ++y) row(y, 0x10000u);
      });
    return put(sums.mean(divisor), out);
  });
}

const LanePremul* premul_samples() {
  static constexpr LanePremul rows = {&premul_row, &premul_boxes};
  return &rows;
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_CHOICE(const LanePremul*, premul_samples)
#endif
