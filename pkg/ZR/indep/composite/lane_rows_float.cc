// Row functions of lanes, for float pixels, and the choice between them and single numbers.
#include "composite/mode_row.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "composite/lane_rows_float.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES
#include "composite/lane_rows-inl.h"
HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {
template const InnerRows<ZR_PixelFloat>& lane_rows<ZR_PixelFloat, false>();
template const InnerRows<ZR_PixelFloat>& lane_rows<ZR_PixelFloat, true>();
template const InnerRows<ZR_PixelFloat>* lane_whole_rows<ZR_PixelFloat>();
}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
#include "composite/inner_rows_choice.h"
ZR_CHOOSE_INNER_ROWS(ZR_PixelFloat)
#endif
