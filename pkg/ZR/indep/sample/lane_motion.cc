// Nearest pixels along a row, standing still and in motion, and sums of rows in motion, on lanes.
#include "sample/lane_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "sample/lane_motion.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "sample/lane_motion-inl.h"
#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

// The pixel of each position. Distances fit 32 bits.
template <class T>
HWY_INLINE Raw<T> pixels_at(const ZR_LayerDef& src, Ints x, Ints y) {
  const Tag<i32> d;
  constexpr i32 size = sizeof(T);
  const Ints offset = shifted_right<16>(y) * src.row_bytes + shifted_right<16>(x) * size;
  const auto* const data = static_cast<const char*>(src.data);
  Raw<T> p;
  if constexpr (sizeof(T) == 4) {
    p.w[0] = hn::GatherOffset(d, reinterpret_cast<const i32*>(data), offset.v);
  } else {
    const HalfInts half;
    const hn::Rebind<i64, Tag<f64>> wide;
    const auto low = hn::PromoteTo(wide, hn::LowerHalf(half, offset.v));
    const auto high = hn::PromoteTo(wide, hn::UpperHalf(half, offset.v));
    if constexpr (sizeof(T) == 8) {
      gather_pairs(data, low, high, &p.w[0], &p.w[1]);
    } else {
      alignas(64) i64 offsets[lane_count()];
      hn::Store(low, wide, offsets);
      hn::Store(high, wide, offsets + lane_count() / 2);
      gather_blocks(data, offsets, p.w);
    }
  }
  return p;
}

// The same of floats, copied as they lie in memory. Returns their alphas in some order.
HWY_INLINE Ints copy_together(const ZR_LayerDef& src, Ints x, Ints y, ZR_PixelFloat* dst) {
  const HalfInts half;
  const hn::Rebind<i64, Tag<f64>> wide;
  constexpr i32 part = lane_count() / 4;
  const Ints offset = shifted_right<16>(y) * src.row_bytes + shifted_right<16>(x) * i32{sizeof(ZR_PixelFloat)};
  alignas(64) i64 offsets[lane_count()];
  hn::Store(hn::PromoteTo(wide, hn::LowerHalf(half, offset.v)), wide, offsets);
  hn::Store(hn::PromoteTo(wide, hn::UpperHalf(half, offset.v)), wide, offsets + lane_count() / 2);
  Ints v[4];
  for (i32 k = 0; k < 4; ++k) {
    v[k] = load_pixels(Tag<i32>(), static_cast<const char*>(src.data), offsets + k * part);
    hn::StoreU(v[k].v, Tag<i32>(), reinterpret_cast<i32*>(dst + k * part));
  }
  return alphas_together(v);
}

template <class T>
i32 nearest_vectors(const SampleRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  constexpr i32 lanes = lane_count();
  const ZR_LayerDef& src = *params.src;
  const Ints place = hn::Iota(Tag<i32>(), 0);
  Ints x = Ints(run.x) + place * run.step_x, y = Ints(run.y) + place * run.step_y;
  AlphaSums<T, RowSum<T>> alphas(sum);
  i32 i = 0;
  for (; run.count - i >= lanes; i += lanes) {
    if constexpr (std::is_same_v<T, ZR_PixelFloat>)
      alphas.add(copy_together(src, x, y, dst + i), dst + i);
    else
      alphas.add(put(pixels_at<T>(src, x, y), dst + i), dst + i);
    x = x + Ints(wrap_mul(run.step_x, lanes)), y = y + Ints(wrap_mul(run.step_y, lanes));
  }
  alphas.flush();
  return i;
}

template <class T>
i32 nearest_motion(const MotionRun& run, const ZR_SampPB& params, RowSum<T>* sum, T* dst) {
  return motion_vectors<T, false>(run, sum, dst,
                                  [&](Ints x, Ints y) HWY_ATTR { return pixels_at<T>(*params.src, x, y); });
}

template <class T>
const LaneNearest<T>* nearest_rows() {
  static constexpr LaneNearest<T> rows = {&nearest_vectors<T>, &nearest_motion<T>};
  return &rows;
}

// ---------------------------------------------------------------------------------------- sums

// A row of sums is one record of lanes after the other.
template <class T>
std::size_t bytes_of_sums(i32 count) {
  constexpr i32 lanes = lane_count();
  return (static_cast<std::size_t>(count) + lanes - 1) / lanes * sizeof(MotionSums<T>);
}
template <class T>
HWY_INLINE MotionSums<T> sums_at(const void* place) {
  MotionSums<T> sums;
  std::memcpy(static_cast<void*>(&sums), place, sizeof sums);
  return sums;
}
template <class T>
HWY_INLINE Raw<T> raw(const T* p) {
  const Tag<i32> d;
  const i32* const words = reinterpret_cast<const i32*>(p);
  Raw<T> r;
  if constexpr (Raw<T>::words == 1)
    r.w[0] = hn::LoadU(d, words);
  else if constexpr (Raw<T>::words == 2)
    hn::LoadInterleaved2(d, words, r.w[0].v, r.w[1].v);
  else
    hn::LoadInterleaved4(d, words, r.w[0].v, r.w[1].v, r.w[2].v, r.w[3].v);
  return r;
}

template <class T>
void add_samples(i32 count, const T* samples, void* sums) {
  constexpr i32 lanes = lane_count();
  T rest[lanes] = {};
  char* place = static_cast<char*>(sums);
  for (i32 i = 0; i < count; i += lanes, place += sizeof(MotionSums<T>)) {
    const T* from = samples + i;
    if (count - i < lanes)
      from = static_cast<T*>(std::memcpy(rest, from, static_cast<std::size_t>(count - i) * sizeof(T)));
    MotionSums<T> all = sums_at<T>(place);
    all.add(raw(from));
    std::memcpy(place, static_cast<const void*>(&all), sizeof all);
  }
}

template <class T>
void mean_samples(i32 count, i32 samples, const void* sums, RowSum<T>* sum, T* dst) {
  constexpr i32 lanes = lane_count();
  const char* place = static_cast<const char*>(sums);
  AlphaSums<T, RowSum<T>> alphas(sum);
  i32 i = 0;
  for (; count - i >= lanes; i += lanes, place += sizeof(MotionSums<T>))
    alphas.add(put(sums_at<T>(place).mean(samples), dst + i), dst + i);
  alphas.flush();
  if (i == count) return;
  T rest[lanes];
  store(sums_at<T>(place).mean(samples), rest);
  for (i32 k = 0; i < count; ++i, ++k) {
    dst[i] = rest[k];
    *sum += rest[k].alpha;
  }
}

template <class T>
const LaneMotionSums<T>* motion_sums() {
  static constexpr LaneMotionSums<T> rows = {&bytes_of_sums<T>, &add_samples<T>, &mean_samples<T>};
  return &rows;
}

ZR_ROWS_OF_DEPTHS(const LaneNearest, nearest_rows)
ZR_ROWS_OF_DEPTHS(const LaneMotionSums, motion_sums)

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_ROWS(const LaneNearest, nearest_rows)
ZR_LANE_ROWS(const LaneMotionSums, motion_sums)
#endif
