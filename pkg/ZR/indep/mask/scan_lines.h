// Lines of the scan blurs, after the arguments were looked at.
#pragma once

#include <ZR/zr.h>

namespace zr {

// Positions first..end-1 of a line of `length` values, from src to dst. C is u8 or u16.
template <class C>
struct ScanLine {
  const C* src;
  C* dst;
  i32 first, end, length;
};

// A box of a radius in 16.16: full values around each position, of which the outermost, `reach` away, fall short of
// whole by `shortfall` / `scale`; the divisor is counted in the same parts.
struct ScanBox {
  i32 reach;
  f64 scale, shortfall, divisor;
};
template <class C>
void box_line(const ScanLine<C>& line, const ScanBox& box);

// Whole-numbered taps of one side, the middle first; divisor is their sum over both sides.
struct ScanBell {
  i32 reach;
  const i32* weight;
  i32 divisor;
};
template <class C>
void bell_line(const ScanLine<C>& line, const ScanBell& bell);

}  // namespace zr
