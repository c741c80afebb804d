// Linear light on lanes: tables, and rows of vectors.
#if defined(ZR_COMPOSITE_LINEAR_LANES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZR_COMPOSITE_LINEAR_LANES_INL_H
#undef ZR_COMPOSITE_LINEAR_LANES_INL_H
#else
#define ZR_COMPOSITE_LINEAR_LANES_INL_H
#endif

#include "simd/lane_row-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zr {
namespace HWY_NAMESPACE {

template <class T>
struct PixelMath : Primitive<T> {
  using Wide = Number<T>;
};

// Entries i and i + 1 of a table in one word.
HWY_INLINE Ints entry_pair(const u16* table, Ints i) {
  return hn::GatherOffset(Tag<i32>(), reinterpret_cast<const i32*>(table), shifted_left<1>(i).v);
}
HWY_INLINE Ints second_of(Ints pair) {
  const hn::Rebind<u32, Tag<i32>> unsigned_tag;
  return hn::BitCast(Tag<i32>(), hn::ShiftRight<16>(hn::BitCast(unsigned_tag, pair.v)));
}
HWY_INLINE Ints capped(Ints v) { return hn::Min(v.v, Ints(32768).v); }

// The last entry is read with the first of the other table behind it.
HWY_INLINE Ints to_linear_16(Ints channel, const u16* to_linear) {
  const Ints t = capped(channel) * 255, between = masked(t, 0x7fff);
  const Ints pair = entry_pair(to_linear, shifted_right<15>(t)), low = masked(pair, 65535);
  return low + shifted_right<15>(between * (second_of(pair) - low) + 16384);
}
// White takes all of the last step: nothing behind the table is read.
HWY_INLINE Ints from_linear_16(Ints channel, const u16* from_linear) {
  const Ints v = capped(channel), i = hn::Min(shifted_right<3>(v).v, Ints(4095).v), between = v - shifted_left<3>(i);
  const Ints pair = entry_pair(from_linear, i), low = masked(pair, 65535);
  return low + shifted_right<3>(between * (second_of(pair) - low) + 4);
}
HWY_INLINE Ints widen_8_to_16(Ints v) {
  const hn::Rebind<u32, Tag<i32>> unsigned_tag;
  const Ints t = v * 0x808080 + 33200;
  return hn::BitCast(Tag<i32>(), hn::ShiftRight<16>(hn::BitCast(unsigned_tag, t.v)));
}
HWY_INLINE Ints narrow_16_to_8(Ints v) { return shifted_right<15>(v * 255 + 16384); }

// Runs block(src, dst) for each vector of pixels, and for the rest on copies.
template <class From, class To, class Block>
HWY_INLINE void in_vectors(i32 n, const From* src, To* dst, Block block) {
  constexpr i32 lanes = lane_count();
  i32 i = 0;
  for (; i + lanes <= n; i += lanes) block(src + i, dst + i);
  if (i >= n) return;
  From in[lanes] = {};
  To out[lanes];
  std::memcpy(in, src + i, static_cast<std::size_t>(n - i) * sizeof(From));
  block(in, out);
  std::memcpy(dst + i, out, static_cast<std::size_t>(n - i) * sizeof(To));
}

}  // namespace HWY_NAMESPACE
}  // namespace zr
HWY_AFTER_NAMESPACE();

#endif
