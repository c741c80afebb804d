// Sums of small boxes along a row of integer pixels, taken down the columns first: rows are read side by side and
// nothing is gathered. All sums are whole multiples of 2^-32 below 2^21, so that doubles hold them exactly and their
// order does not matter.
#if defined(ZR_SAMPLE_LANE_BOX_COLUMNS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SAMPLE_LANE_BOX_COLUMNS_INL_H
#undef ZR_SAMPLE_LANE_BOX_COLUMNS_INL_H
#else
#define ZR_SAMPLE_LANE_BOX_COLUMNS_INL_H
#endif

#include "sample/lane_samples-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// Columns and destination pixels that one stretch of a row works on: both arrays stay in the first cache.
inline constexpr i32 box_columns = 512;

using Words16 = hn::ScalableTag<u16>;

alignas(16) inline constexpr u16 alpha_lanes[8] = {0xffff, 0, 0, 0, 0xffff, 0, 0, 0};

// The four channels of pixels in 16-bit lanes as the sums take them: alpha, and colours times alpha.
class Products8 {
 public:
  static constexpr f64 colour_unit = 1.0;
  HWY_INLINE bool fit() const { return true; }
  HWY_INLINE hn::Vec<Words16> load(const ZR_Pixel8* from) {
    const Words16 d;
    const hn::Repartition<u8, Words16> bytes;
    alignas(16) static constexpr u8 first_of_four[16] = {0, 1, 0, 1, 0, 1, 0, 1, 8, 9, 8, 9, 8, 9, 8, 9};
    alignas(16) static constexpr u16 one[8] = {1, 0, 0, 0, 1, 0, 0, 0};
    const auto v = hn::PromoteTo(d, hn::LoadU(hn::Rebind<u8, Words16>(), reinterpret_cast<const u8*>(from)));
    const auto alpha = hn::TableLookupBytes(hn::BitCast(bytes, v), hn::LoadDup128(bytes, first_of_four));
    return hn::Mul(v,
                   hn::Or(hn::AndNot(hn::LoadDup128(d, alpha_lanes), hn::BitCast(d, alpha)), hn::LoadDup128(d, one)));
  }
};
// Opaque pixels: colours times white are colours in units of white. Others do not fit.
class Products16 {
 public:
  static constexpr f64 colour_unit = 32768.0;
  HWY_INLINE Products16() : differs_(hn::Zero(Words16())) {}
  HWY_INLINE bool fit() const {
    const Words16 d;
    return hn::AllTrue(d, hn::Eq(hn::And(differs_, hn::LoadDup128(d, alpha_lanes)), hn::Zero(d)));
  }
  HWY_INLINE hn::Vec<Words16> load(const ZR_Pixel16* from) {
    const Words16 d;
    const auto v = hn::LoadU(d, reinterpret_cast<const u16*>(from));
    differs_ = hn::Or(differs_, hn::Xor(v, hn::Set(d, u16{32768})));
    return v;
  }

 private:
  hn::Vec<Words16> differs_;
};
template <class T>
using Products = std::conditional_t<std::is_same_v<T, ZR_Pixel8>, Products8, Products16>;

// The sums of columns from `first` on over the rows of `down`, in units of 2^-16: four for each pixel. False where the
// pixels do not fit.
template <class T>
HWY_INLINE bool sum_columns(const ZR_LayerDef& src, const BoxAxis& down, i32 first, i32 columns, f64* sums) {
  const Words16 d;
  constexpr i32 pixels = static_cast<i32>(hn::MaxLanes(d)) / 4;
  using D32 = hn::RepartitionToWide<Words16>;
  const D32 wide;
  const hn::Half<Words16> half;
  Products<T> products;
  // The rows that are covered in part, at most two, and those in between.
  const T* parts[2];
  u16 heights[2];
  i32 part_count = 0;
  const T* whole_row = nullptr;
  i32 whole_count = 0;
  const auto row_at = [&](i32 y) {
    return reinterpret_cast<const T*>(static_cast<const char*>(src.data) +
                                      static_cast<std::ptrdiff_t>(y) * src.row_bytes) +
           first;
  };
  down.walk([&](i32 y, u32 extent) { parts[part_count] = row_at(y), heights[part_count++] = static_cast<u16>(extent); },
            [&](i32 y, i32 end) { whole_row = row_at(y), whole_count = end - y; });
  for (i32 at = 0;; at = std::min(at + pixels, columns - pixels)) {  // the last vector overlaps the one before
    // Whole parts and parts of 2^-16, of the lower and the upper half of the lanes.
    auto low_whole = hn::Zero(wide), high_whole = low_whole, low_part = low_whole, high_part = low_whole;
    for (i32 i = 0; i < part_count; ++i) {
      const auto v = products.load(parts[i] + at), height = hn::Set(d, heights[i]);
      const auto whole = hn::MulHigh(v, height), part = hn::Mul(v, height);
      low_whole = hn::Add(low_whole, hn::PromoteTo(wide, hn::LowerHalf(half, whole)));
      high_whole = hn::Add(high_whole, hn::PromoteTo(wide, hn::UpperHalf(half, whole)));
      low_part = hn::Add(low_part, hn::PromoteTo(wide, hn::LowerHalf(half, part)));
      high_part = hn::Add(high_part, hn::PromoteTo(wide, hn::UpperHalf(half, part)));
    }
    const char* row = reinterpret_cast<const char*>(whole_row + at);
    for (i32 i = 0; i < whole_count; ++i, row += src.row_bytes) {
      const auto v = products.load(reinterpret_cast<const T*>(row));
      low_whole = hn::Add(low_whole, hn::PromoteTo(wide, hn::LowerHalf(half, v)));
      high_whole = hn::Add(high_whole, hn::PromoteTo(wide, hn::UpperHalf(half, v)));
    }
    const auto store = [&](auto whole, auto part, f64* to) HWY_ATTR {
      const Tag<i32> ints;
      const Doubles sum =
          to_double(Ints(hn::BitCast(ints, whole))) * 65536.0 + to_double(Ints(hn::BitCast(ints, part)));
      hn::StoreU(sum.low, Tag<f64>(), to);
      hn::StoreU(sum.high, Tag<f64>(), to + lane_count() / 2);
    };
    store(low_whole, low_part, sums + 4 * at);
    store(high_whole, high_part, sums + 4 * at + lane_count());
    if (!products.fit()) return false;
    if (at + pixels == columns) return true;
  }
}

// The sums of boxes from those of columns. The positions of edges are 16.16, from the first of the columns.
HWY_INLINE void sum_boxes(const f64* columns, const SampleRun& run, i32 from, i32 length, f64 colour_unit, f64* sums) {
  const hn::CappedTag<f64, 4> d;
  constexpr i32 lanes = static_cast<i32>(hn::MaxLanes(d));
  alignas(32) const f64 units[4] = {0x1p-32, colour_unit * 0x1p-32, colour_unit * 0x1p-32, colour_unit * 0x1p-32};
  for (i32 i = 0; i < run.count; ++i, from += run.step_x, sums += 4) {
    const i32 first = from >> 16, to = from + length, last = to >> 16, behind = to & 65535;
    for (i32 c = 0; c < 4; c += lanes) {
      const auto column = [&](i32 k) HWY_ATTR { return hn::LoadU(d, columns + 4 * k + c); };
      auto whole = hn::Zero(d);
      for (i32 k = first + 1; k < last; ++k) whole = hn::Add(whole, column(k));
      auto sum = hn::Add(hn::Mul(column(first), hn::Set(d, static_cast<f64>(0x10000 - (from & 65535)))),
                         hn::Mul(whole, hn::Set(d, 65536.0)));
      // Where nothing is behind, that column may be none of those.
      if (behind != 0) sum = hn::Add(sum, hn::Mul(column(last), hn::Set(d, static_cast<f64>(behind))));
      hn::StoreU(hn::Mul(sum, hn::Load(d, units + c)), d, sums + c);
    }
  }
}

// Such sums as the neighbours of vectors of destination pixels.
class BoxTotals {
 public:
  explicit HWY_INLINE BoxTotals(const f64* sums) : at_(sums) {}
  HWY_INLINE void next() { at_ += 4 * lane_count(); }
  HWY_INLINE void load(Doubles (&sum)[4]) const {
    const Tag<f64> d;
    hn::LoadInterleaved4(d, at_, sum[0].low, sum[1].low, sum[2].low, sum[3].low);
    hn::LoadInterleaved4(d, at_ + 2 * lane_count(), sum[0].high, sum[1].high, sum[2].high, sum[3].high);
  }

 private:
  const f64* at_;
};

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
