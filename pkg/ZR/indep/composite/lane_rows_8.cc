// Row functions of lanes, for 8-bit pixels, and the choice between them and single numbers.
#include "composite/mode_row.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "composite/lane_rows_8.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "composite/lane_rows-inl.h"
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {
template const InnerRows<ZR_Pixel8>& lane_rows<ZR_Pixel8, false>();
template const InnerRows<ZR_Pixel8>& lane_rows<ZR_Pixel8, true>();
template const InnerRows<ZR_Pixel8>* lane_whole_rows<ZR_Pixel8>();
}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "composite/inner_rows_choice.h"
ZR_CHOOSE_INNER_ROWS(ZR_Pixel8)
#endif
