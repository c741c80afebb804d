// Runs of like pixels, on vectors of bytes.
#include "filter/guess_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "filter/lane_guess_rows.cc"
#include <hwy/foreach_target.h>

#include "simd/lanes-inl.h"
#if ZR_HAS_LANES

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

using Bytes = hn::ScalableTag<u8>;
using Words = hn::Repartition<u32, Bytes>;
using ByteVector = hn::Vec<Bytes>;

HWY_INLINE ByteVector load_pixels(const ZR_Pixel8* p) { return hn::LoadU(Bytes(), reinterpret_cast<const u8*>(p)); }
HWY_INLINE ByteVector every_pixel(u32 word) { return hn::BitCast(Bytes(), hn::Set(Words(), word)); }
HWY_INLINE bool any_bit(ByteVector v) {
  const auto words = hn::BitCast(Words(), v);
  return !hn::AllTrue(Words(), hn::Eq(words, hn::Zero(Words())));
}

i32 covered_run(const ZR_Pixel8* row, i32 n, u8 least, bool* vary, bool* exceed) {
  constexpr i32 pixels = lane_count();
  alignas(16) static constexpr u8 alphas[16] = {0, 0, 0, 0, 4, 4, 4, 4, 8, 8, 8, 8, 12, 12, 12, 12};
  const Bytes d;
  const auto spread = hn::LoadDup128(d, alphas);
  const auto lowest = hn::Set(d, least);
  const auto colours = every_pixel(0xffffff00u);
  auto differing = hn::Zero(d), above = hn::Zero(d);
  auto before = load_pixels(row - 1);
  i32 i = 0;
  for (; i <= n - pixels; i += pixels) {
    const auto p = load_pixels(row + i);
    const auto alpha = hn::TableLookupBytes(p, spread);
    if (any_bit(hn::Xor(hn::Max(alpha, lowest), alpha))) break;
    differing = hn::Or(differing, hn::Xor(p, before));
    above = hn::Or(above, hn::Xor(hn::Max(p, alpha), alpha));
    if (i + pixels <= n - pixels) before = load_pixels(row + i + pixels - 1);
  }
  *vary |= any_bit(hn::And(differing, colours));
  *exceed |= any_bit(above);
  return i;
}

i32 same_run(const ZR_Pixel8* row, i32 n) {
  constexpr i32 pixels = lane_count();
  u32 word;
  std::memcpy(&word, row - 1, sizeof word);
  const auto like = every_pixel(word);
  i32 i = 0;
  for (; i <= n - pixels; i += pixels)
    if (any_bit(hn::Xor(load_pixels(row + i), like))) break;
  return i;
}

const GuessRuns* guess_runs() {
  static constexpr GuessRuns runs = {&covered_run, &same_run};
  return &runs;
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();
#endif

#if HWY_ONCE
ZR_LANE_CHOICE(const GuessRuns*, guess_runs)
#endif
