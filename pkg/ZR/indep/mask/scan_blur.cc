// The scan blurs of masks: one line each, by the rules of the world blurs.
#include <ZR/mask_buffer.h>

#include <algorithm>

#include "mask/scan_lines.h"
#include "mask/scan_weights_state.h"
#include "world/guard.h"

namespace zr {
namespace {

// The radius under its flags, 16.16, of up to 2^31 * 1.4.
u64 radius_under(i32 flags, i32 radius) {
  const u64 plain = static_cast<u64>(radius);
  return (flags & ZR_UnoScan_Wide) != 0 ? (plain * 7 + 2) / 5 : plain;
}

// Looks at the arguments and runs body(line, radius) where there is something to do.
template <class C, class Body>
i32 scan(i32 flags, i32 radius, i32 first, i32 last, i32 length, const C* src, C* dst, Body body) {
  if (src == nullptr || dst == nullptr) return failed_verification(ZR_Site_MaskBlur, "a scan blur has no line");
  if (radius < 0) return failed_verification(ZR_Site_MaskBlur, "a scan blur's radius is out of range");
  first = std::max(first, 0);
  last = std::min(last, length - (length > 0));
  if (length <= 0 || first > last) return ZR_Err_None;
  return body(ScanLine<C>{src, dst, first, last + 1, length}, radius_under(flags, radius));
}

// Radii that reach beyond the whole line add nothing but to the divisor, which stays exact in doubles.
template <class C>
i32 box_scan(const ScanLine<C>& line, u64 radius) {
  ScanBox box;
  box.reach = static_cast<i32>((radius + 0xffff) >> 16);
  const u64 short_of = (static_cast<u64>(box.reach) << 16) - radius;
  // World blurs count parts of 1/1024 at 8 bits.
  constexpr int dropped = sizeof(C) == 1 ? 6 : 0;
  box.scale = static_cast<f64>(65536 >> dropped);
  box.shortfall = static_cast<f64>(short_of >> dropped);
  box.divisor = (2.0 * box.reach + 1.0) * box.scale - 2 * box.shortfall;
  box_line(line, box);
  return ZR_Err_None;
}

template <class C>
i32 bell_scan(const ScanLine<C>& line, u64 radius) {
  constexpr u64 limit = u64{32767} << 16;
  if (radius > limit) return failed_verification(ZR_Site_MaskBlur, "a scan blur's radius is out of range");
  // Up to here few taps are made faster than they are looked up, and none are kept.
  if (static_cast<f64>(radius) * 1.52587890625e-5 / 2.71 <= 1.0) {
    i32 weight[4];
    const i32 reach = static_cast<i32>((radius + 0xffff) >> 16);
    free_bell_taps();
    const i32 divisor = write_bell_taps(static_cast<u32>(radius), reach, weight);
    bell_line(line, ScanBell{reach, weight, divisor});
    return ZR_Err_None;
  }
  const BellInUse bell(static_cast<u32>(radius));
  const BellTaps* const taps = bell.taps();
  if (taps == nullptr) return ZR_Err_OutOfMemory;
  bell_line(line, ScanBell{taps->reach, taps->weight(), taps->divisor});
  return ZR_Err_None;
}

}  // namespace
}  // namespace zr

i32 ZR_BoxBlurUnoScan(i32 flags, i32 radius, i32 first, i32 last, i32 length, const u8* src, u8* dst) {
  return zr::scan(flags, radius, first, last, length, src, dst, zr::box_scan<u8>);
}
i32 ZR_BoxBlurDeepUnoScan(i32 flags, i32 radius, i32 first, i32 last, i32 length, const u16* src, u16* dst) {
  return zr::scan(flags, radius, first, last, length, src, dst, zr::box_scan<u16>);
}
i32 ZR_GBlurUnoScan(i32 flags, i32 radius, i32 first, i32 last, i32 length, const u8* src, u8* dst) {
  return zr::scan(flags, radius, first, last, length, src, dst, zr::bell_scan<u8>);
}
i32 ZR_GBlurDeepUnoScan(i32 flags, i32 radius, i32 first, i32 last, i32 length, const u16* src, u16* dst) {
  return zr::scan(flags, radius, first, last, length, src, dst, zr::bell_scan<u16>);
}
