// How the boxes of a vector of destination pixels lie along a row of the source.
#if defined(ZR_SAMPLE_LANE_BOX_AXIS_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_SAMPLE_LANE_BOX_AXIS_INL_H
#undef ZR_SAMPLE_LANE_BOX_AXIS_INL_H
#else
#define ZR_SAMPLE_LANE_BOX_AXIS_INL_H
#endif

#include "sample/lane_samples-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

HWY_INLINE i32 least_of(Ints v) { return hn::GetLane(hn::MinOfLanes(Tag<i32>(), v.v)); }
HWY_INLINE i32 most_of(Ints v) { return hn::GetLane(hn::MaxOfLanes(Tag<i32>(), v.v)); }

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

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
