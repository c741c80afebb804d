// Lines of the scan blurs: exact sums, divided once. Plain loops in the shape that compilers vectorise, compiled once
// for each instruction set; nothing here depends on which one it is.
#include "mask/scan_lines.h"

#include <algorithm>
#include <cstring>
#include <type_traits>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "mask/scan_lines.cc"
#include <hwy/foreach_target.h>
#include <hwy/highway.h>

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

constexpr i32 block = 256;

// numerator / divisor, rounded to nearest, of whole numbers below 2^50. The half that is added keeps an exact
// quotient away from the next integer by more than doubles round.
template <class C>
void divide_block(i32 n, f64 divisor, const f64* numerator, C* dst) {
  const f64 factor = 1.0 / divisor, half = static_cast<f64>(static_cast<i64>(divisor) / 2) + 0.5;
  for (i32 i = 0; i < n; ++i) dst[i] = static_cast<C>(static_cast<i32>((numerator[i] + half) * factor));
}

// ------------------------------------------------------------------------------ boxes

// Value at a position, 0 outside the line.
template <class C>
HWY_INLINE u32 value_at(const ScanLine<C>& line, i64 position) {
  return position >= 0 && position < line.length ? line.src[position] : 0u;
}

template <class C>
void blur_box(const ScanLine<C>& line, const ScanBox& box) {
  const i64 reach = box.reach;
  u32 sum = 0;
  for (i64 i = std::max<i64>(line.first - reach, 0), end = std::min<i64>(line.first + reach, line.length); i < end; ++i)
    sum += line.src[i];
  u32 sums[block], edges[block];
  f64 numerator[block];
  for (i32 at = line.first; at < line.end; at += block) {
    const i32 n = std::min(line.end - at, block);
    // What leaves is the outermost value behind, after the sum was taken; what enters is the one ahead.
    const bool inside = at - reach >= 0 && at + n + reach <= line.length;
    if (inside) {
      const C *const behind = line.src + (at - reach), *const ahead = line.src + (at + reach);
      for (i32 i = 0; i < n; ++i) {
        sum += ahead[i];
        sums[i] = sum;
        sum -= behind[i];
      }
      for (i32 i = 0; i < n; ++i) edges[i] = u32{behind[i]} + ahead[i];
    } else {
      for (i32 i = 0; i < n; ++i) {
        const u32 behind = value_at(line, at + i - reach), ahead = value_at(line, at + i + reach);
        sum += ahead;
        sums[i] = sum;
        sum -= behind;
        edges[i] = behind + ahead;
      }
    }
    for (i32 i = 0; i < n; ++i) numerator[i] = sums[i] * box.scale - edges[i] * box.shortfall;
    divide_block(n, box.divisor, numerator, line.dst + at);
  }
}
template void blur_box(const ScanLine<u8>&, const ScanBox&);
template void blur_box(const ScanLine<u16>&, const ScanBox&);

// ------------------------------------------------------------------------------ bells

// Taps whose products of 16 bits fit 32 together.
constexpr i32 taps_together = 128;

// Adds the taps first..end-1 of one side (`side` 1 or -1) to the sums of n positions that all have them.
template <class C>
void add_taps(const C* middle, i32 n, i32 side, i32 first, i32 end, const i32* weight, f64* sums) {
  u32 part[block];
  for (i32 tap = first; tap < end;) {
    std::memset(part, 0, sizeof part);
    for (const i32 stop = std::min(end, tap + taps_together); tap < stop; ++tap) {
      const C* const values = middle + static_cast<std::ptrdiff_t>(tap) * side;
      const u32 w = static_cast<u32>(weight[tap]);
      for (i32 i = 0; i < n; ++i) part[i] += w * values[i];
    }
    for (i32 i = 0; i < n; ++i) sums[i] += part[i];
  }
}

template <class C>
void blur_bell(const ScanLine<C>& line, const ScanBell& bell) {
  f64 sums[block];
  for (i32 at = line.first; at < line.end; at += block) {
    const i32 n = std::min(line.end - at, block);
    const C* const middle = line.src + at;
    for (i32 i = 0; i < n; ++i) sums[i] = u32{middle[i]} * 255u;
    // Taps that all positions of the block have on a side; the others are added one by one.
    const i32 behind = std::min(bell.reach, at) + 1, ahead = std::min(bell.reach, line.length - at - n) + 1;
    add_taps(middle, n, -1, 1, behind, bell.weight, sums);
    add_taps(middle, n, 1, 1, ahead, bell.weight, sums);
    for (i32 tap = behind; tap <= std::min(bell.reach, at + n - 1); ++tap)
      for (i32 i = std::max(tap - at, 0); i < n; ++i) sums[i] += bell.weight[tap] * middle[i - tap];
    for (i32 tap = ahead; tap <= std::min(bell.reach, line.length - at - 1); ++tap)
      for (i32 i = 0; i < std::min(n, line.length - at - tap); ++i) sums[i] += bell.weight[tap] * middle[i + tap];
    divide_block(n, bell.divisor, sums, line.dst + at);
  }
}
template void blur_bell(const ScanLine<u8>&, const ScanBell&);
template void blur_bell(const ScanLine<u16>&, const ScanBell&);

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
#include "simd/variant.h"

namespace zr {

template <class C>
void box_line(const ScanLine<C>& line, const ScanBox& box) {
  ZR_RETURN_BEST(blur_box(line, box));
  HWY_STATIC_DISPATCH(blur_box)(line, box);
}
template void box_line(const ScanLine<u8>&, const ScanBox&);
template void box_line(const ScanLine<u16>&, const ScanBox&);

template <class C>
void bell_line(const ScanLine<C>& line, const ScanBell& bell) {
  ZR_RETURN_BEST(blur_bell(line, bell));
  HWY_STATIC_DISPATCH(blur_bell)(line, bell);
}
template void bell_line(const ScanLine<u8>&, const ScanBell&);
template void bell_line(const ScanLine<u16>&, const ScanBell&);

}  // namespace zr
#endif
